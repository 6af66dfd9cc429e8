// SPDX-License-Identifier: Apache-2.0
// Planar YUV 4:2:0, written down as plainly as possible.
#pragma once

#include <ovrinresize.h>

#include <cstddef>
#include <cstdint>
#include <vector>

#include "reference/bands.h"
#include "reference/canvas.h"
#include "reference/quarter.h"

namespace reference {

// Three planes; `stride` is the luma row length, chroma rows lie (stride + 1) / 2 bytes apart.
struct YuvSource {
    const uint8_t* y;
    const uint8_t* u;
    const uint8_t* v;
    int64_t width, height, stride;
};

inline int64_t i420_size(int64_t w, int64_t h) {
    return w * h + 2 * ((w + 1) >> 1) * ((h + 1) >> 1);
}

inline YuvSource i420_source(const uint8_t* src, int64_t width, int64_t height) {
    const int64_t chroma = ((width + 1) >> 1) * ((height + 1) >> 1);
    return {src, src + width * height, src + width * height + chroma, width, height, width};
}

// One plane, src_w x src_h samples scaled to dst_w x dst_h. An empty source gives zeros.
inline std::vector<uint8_t> quarter_plane(const uint8_t* src, int64_t stride, int64_t src_w,
                                          int64_t src_h, int64_t dst_w, int64_t dst_h) {
    std::vector<uint8_t> dst(static_cast<size_t>(dst_w * dst_h));
    if (src_w <= 0 || src_h <= 0) return dst;
    for (int64_t j = 0; j < dst_h; ++j) {
        const uint8_t* row1 = src + near_cell(j, src_h, dst_h) * stride;
        const uint8_t* row3 = src + far_cell(j, src_h, dst_h) * stride;
        for (int64_t k = 0; k < dst_w; ++k) {
            const int64_t c1 = near_cell(k, src_w, dst_w);
            const int64_t c3 = far_cell(k, src_w, dst_w);
            dst[static_cast<size_t>(j * dst_w + k)] = static_cast<uint8_t>(
                (row1[c1] >> 2) + (row1[c3] >> 2) + (row3[c1] >> 2) + (row3[c3] >> 2));
        }
    }
    return dst;
}

// The scaled picture: luma at its own size, chroma on half of the grid.
struct YuvGrids {
    std::vector<uint8_t> y, u, v;
    int64_t width, height;       // luma
    int64_t chroma_w, chroma_h;  // chroma grids

    YuvGrids(const YuvSource& src, int64_t w, int64_t h)
        : width(w), height(h), chroma_w(grid_length(w) / 2), chroma_h(grid_length(h) / 2) {
        const int64_t src_cw = (src.width + 1) >> 1;
        const int64_t src_ch = (src.height + 1) >> 1;
        const int64_t chroma_stride = (src.stride + 1) >> 1;
        y = quarter_plane(src.y, src.stride, src.width, src.height, w, h);
        u = quarter_plane(src.u, chroma_stride, src_cw, src_ch, chroma_w, chroma_h);
        v = quarter_plane(src.v, chroma_stride, src_cw, src_ch, chroma_w, chroma_h);
    }
};

// The picture as one packed buffer: luma, then the first columns and rows of each chroma grid.
inline std::vector<uint8_t> resize_yuv(const YuvSource& src, int64_t w, int64_t h) {
    const YuvGrids grids(src, w, h);
    const int64_t cw = (w + 1) >> 1;
    const int64_t ch = (h + 1) >> 1;
    std::vector<uint8_t> dst(static_cast<size_t>(i420_size(w, h)));
    copy_block(grids.y, w, h, w, dst, 0, w);
    copy_block(grids.u, grids.chroma_w, ch, cw, dst, w * h, cw);
    copy_block(grids.v, grids.chroma_w, ch, cw, dst, w * h + cw * ch, cw);
    return dst;
}

inline void draw_yuv(const YuvSource& src, const ovrin_resize_target& target,
                     std::vector<uint8_t>& canvas) {
    const YuvGrids grids(src, target.dst_width, target.dst_height);
    const int64_t luma = int64_t{target.canvas_width} * target.canvas_height;
    const int64_t cw = (target.canvas_width + 1) >> 1;
    const int64_t ch = (target.canvas_height + 1) >> 1;
    for (size_t i = 0; i < canvas.size(); ++i) canvas[i] = i < static_cast<size_t>(luma) ? 0 : 128;

    const int64_t w = visible_width(target);
    const int64_t h = visible_height(target);
    copy_block(grids.y, grids.width, h, w, canvas,
               int64_t{target.dst_y} * target.canvas_width + target.dst_x, target.canvas_width);
    const int64_t at = ((target.dst_y + 1) >> 1) * cw + ((target.dst_x + 1) >> 1);
    copy_block(grids.u, grids.chroma_w, (h + 1) >> 1, (w + 1) >> 1, canvas, luma + at, cw);
    copy_block(grids.v, grids.chroma_w, (h + 1) >> 1, (w + 1) >> 1, canvas, luma + cw * ch + at,
               cw);
}

// Letterboxing. `src.stride` is ignored: the target gives the row length, taken as it stands by the
// single-threaded function, replaced by the width by the threaded one when it is below 1.
inline void keep_ratio_yuv_sg(YuvSource src, const ovrin_resize_target& target,
                              std::vector<uint8_t>& canvas) {
    if (!single_accepts(target)) return;
    src.stride = target.src_stride;
    draw_yuv(src, target, canvas);
}
inline void keep_ratio_yuv_tps(YuvSource src, const ovrin_resize_target& target,
                               std::vector<uint8_t>& canvas) {
    if (!threaded_accepts(target)) return;
    if (src.height < 1024 || band_count(src.height, target.dst_height) < 2) {
        keep_ratio_yuv_sg(src, target, canvas);
        return;
    }
    src.stride = target.src_stride > 0 ? target.src_stride : src.width;
    draw_yuv(src, target, canvas);
}

}  // namespace reference
