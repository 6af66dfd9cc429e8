// SPDX-License-Identifier: Apache-2.0
// Semi-planar YUV 4:2:0 (NV21), written down as plainly as possible.
#pragma once

#include <ovrinresize.h>

#include <cstddef>
#include <cstdint>
#include <vector>

#include "reference/bands.h"
#include "reference/canvas.h"
#include "reference/quarter.h"
#include "reference/yuv.h"

namespace reference {

inline int64_t even_length(int64_t bytes) {
    return (bytes + 1) & ~int64_t{1};
}

// Two planes; `stride` is the luma row length, chroma rows lie that length rounded up to even
// apart.
struct Nv21Source {
    const uint8_t* y;
    const uint8_t* vu;
    int64_t width, height, stride;
};

inline int64_t nv21_size(int64_t w, int64_t h) {
    return w * h + even_length(w) * ((h + 1) >> 1);
}

inline Nv21Source nv21_source(const uint8_t* src, int64_t width, int64_t height) {
    return {src, src + width * height, width, height, width};
}

// Chroma pairs, src_row bytes x src_rows scaled to dst_row bytes x dst_rows. Positions come from
// the lengths in bytes and count pairs.
inline std::vector<uint8_t> quarter_pairs(const uint8_t* src, int64_t stride, int64_t src_row,
                                          int64_t src_rows, int64_t dst_row, int64_t dst_rows) {
    std::vector<uint8_t> dst(static_cast<size_t>(dst_row * dst_rows));
    if (src_row <= 0 || src_rows <= 0) return dst;
    for (int64_t j = 0; j < dst_rows; ++j) {
        const uint8_t* row1 = src + near_cell(j, src_rows, dst_rows) * stride;
        const uint8_t* row3 = src + far_cell(j, src_rows, dst_rows) * stride;
        for (int64_t pair = 0; pair < dst_row / 2; ++pair) {
            const int64_t left = near_cell(pair, src_row, dst_row);
            const int64_t right = far_cell(pair, src_row, dst_row);
            for (int64_t b = 0; b < 2; ++b) {
                dst[static_cast<size_t>(j * dst_row + 2 * pair + b)] =
                    static_cast<uint8_t>((row1[2 * left + b] >> 2) + (row1[2 * right + b] >> 2) +
                                         (row3[2 * left + b] >> 2) + (row3[2 * right + b] >> 2));
            }
        }
    }
    return dst;
}

// The scaled picture: luma at its own size, chroma on half of the grid.
struct Nv21Grids {
    std::vector<uint8_t> y, vu;
    int64_t width, height;         // luma
    int64_t chroma_row, chroma_h;  // chroma grid, bytes and rows

    Nv21Grids(const Nv21Source& src, int64_t w, int64_t h)
        : width(w), height(h), chroma_row(grid_length(w)), chroma_h(grid_length(h) / 2) {
        y = quarter_plane(src.y, src.stride, src.width, src.height, w, h);
        vu = quarter_pairs(src.vu, even_length(src.stride), even_length(src.width),
                           (src.height + 1) >> 1, chroma_row, chroma_h);
    }
};

inline std::vector<uint8_t> resize_nv21(const Nv21Source& src, int64_t w, int64_t h) {
    const Nv21Grids grids(src, w, h);
    std::vector<uint8_t> dst(static_cast<size_t>(nv21_size(w, h)));
    copy_block(grids.y, w, h, w, dst, 0, w);
    copy_block(grids.vu, grids.chroma_row, (h + 1) >> 1, even_length(w), dst, w * h,
               even_length(w));
    return dst;
}

inline void draw_nv21(const Nv21Source& src, const ovrin_resize_target& target,
                      std::vector<uint8_t>& canvas) {
    const Nv21Grids grids(src, target.dst_width, target.dst_height);
    const int64_t luma = int64_t{target.canvas_width} * target.canvas_height;
    const int64_t canvas_row = even_length(target.canvas_width);
    for (size_t i = 0; i < canvas.size(); ++i) canvas[i] = i < static_cast<size_t>(luma) ? 0 : 128;

    const int64_t w = visible_width(target);
    const int64_t h = visible_height(target);
    copy_block(grids.y, grids.width, h, w, canvas,
               int64_t{target.dst_y} * target.canvas_width + target.dst_x, target.canvas_width);
    const int64_t at = ((target.dst_y + 1) >> 1) * canvas_row + even_length(target.dst_x);
    copy_block(grids.vu, grids.chroma_row, (h + 1) >> 1, even_length(w), canvas, luma + at,
               canvas_row);
}

// Letterboxing. `src.stride` is ignored: the target gives the row length, taken as it stands by the
// single-threaded function, replaced by the width by the threaded one when it is below 1.
inline void keep_ratio_nv21_sg(Nv21Source src, const ovrin_resize_target& target,
                               std::vector<uint8_t>& canvas) {
    if (!single_accepts(target)) return;
    src.stride = target.src_stride;
    draw_nv21(src, target, canvas);
}
inline void keep_ratio_nv21_tps(Nv21Source src, const ovrin_resize_target& target,
                                std::vector<uint8_t>& canvas) {
    if (!threaded_accepts(target)) return;
    if (src.height < 1024 || band_count(src.height, target.dst_height) < 2) {
        keep_ratio_nv21_sg(src, target, canvas);
        return;
    }
    src.stride = target.src_stride > 0 ? target.src_stride : src.width;
    draw_nv21(src, target, canvas);
}

}  // namespace reference
