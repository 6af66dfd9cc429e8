// SPDX-License-Identifier: Apache-2.0
// YUV 4:2:0, planar (I420) and semi-planar (NV21), written down as plainly as possible.
#pragma once

#include <ovrinresize.h>

#include <cstddef>
#include <cstdint>
#include <vector>

#include "reference/bands.h"
#include "reference/canvas.h"
#include "reference/quarter.h"

namespace reference {

// How chroma lies: U and V in planes of their own, or pairs of V and U in one plane.
struct ChromaLayout {
    int64_t planes;
    int64_t sample_bytes;
};
constexpr ChromaLayout kI420 = {2, 1};
constexpr ChromaLayout kNv21 = {1, 2};

inline int64_t half(int64_t length) {
    return (length + 1) >> 1;
}

// Bytes of the chroma beside `columns` luma samples.
inline int64_t chroma_row(const ChromaLayout& layout, int64_t columns) {
    return half(columns) * layout.sample_bytes;
}

inline int64_t yuv420_size(const ChromaLayout& layout, int64_t w, int64_t h) {
    return w * h + layout.planes * chroma_row(layout, w) * half(h);
}
inline int64_t i420_size(int64_t w, int64_t h) {
    return yuv420_size(kI420, w, h);
}
inline int64_t nv21_size(int64_t w, int64_t h) {
    return yuv420_size(kNv21, w, h);
}

// `stride` is the luma row length; chroma rows lie as far apart as a chroma row beside it is long.
struct Yuv420Source {
    ChromaLayout layout;
    const uint8_t* y;
    const uint8_t* chroma[2];  // U and V, or VU
    int64_t width, height, stride;
};

// A picture in one piece.
inline Yuv420Source contiguous(const ChromaLayout& layout, const uint8_t* src, int64_t width,
                               int64_t height) {
    const uint8_t* first = src + width * height;
    const uint8_t* second =
        layout.planes > 1 ? first + chroma_row(layout, width) * half(height) : nullptr;
    return {layout, src, {first, second}, width, height, width};
}

// One plane of samples of `bytes` bytes, src_row bytes x src_rows scaled to dst_row bytes x
// dst_rows. Positions come from the lengths in bytes and count samples. An empty source gives
// zeros.
inline std::vector<uint8_t> quarter_plane(const uint8_t* src, int64_t stride, int64_t src_row,
                                          int64_t src_rows, int64_t dst_row, int64_t dst_rows,
                                          int64_t bytes) {
    std::vector<uint8_t> dst(static_cast<size_t>(dst_row * dst_rows));
    if (src_row <= 0 || src_rows <= 0) return dst;
    for (int64_t j = 0; j < dst_rows; ++j) {
        const uint8_t* row1 = src + near_cell(j, src_rows, dst_rows) * stride;
        const uint8_t* row3 = src + far_cell(j, src_rows, dst_rows) * stride;
        for (int64_t k = 0; k < dst_row / bytes; ++k) {
            for (int64_t b = 0; b < bytes; ++b) {
                const int64_t c1 = near_cell(k, src_row, dst_row) * bytes + b;
                const int64_t c3 = far_cell(k, src_row, dst_row) * bytes + b;
                dst[static_cast<size_t>(j * dst_row + k * bytes + b)] = static_cast<uint8_t>(
                    (row1[c1] >> 2) + (row1[c3] >> 2) + (row3[c1] >> 2) + (row3[c3] >> 2));
            }
        }
    }
    return dst;
}

// The scaled picture: luma at its own size, chroma on half of the grid.
struct Yuv420Grids {
    std::vector<uint8_t> y, chroma[2];
    int64_t row;  // bytes of a chroma row

    Yuv420Grids(const Yuv420Source& src, int64_t w, int64_t h)
        : y(quarter_plane(src.y, src.stride, src.width, src.height, w, h, 1)),
          row(chroma_row(src.layout, grid_length(w))) {
        for (int64_t plane = 0; plane < src.layout.planes; ++plane) {
            chroma[plane] = quarter_plane(src.chroma[plane], chroma_row(src.layout, src.stride),
                                          chroma_row(src.layout, src.width), half(src.height), row,
                                          grid_length(h) / 2, src.layout.sample_bytes);
        }
    }
};

// The picture in one piece: luma, then the first columns and rows of each chroma grid.
inline std::vector<uint8_t> resize_yuv420(const Yuv420Source& src, int64_t w, int64_t h) {
    const Yuv420Grids grids(src, w, h);
    const int64_t row = chroma_row(src.layout, w);
    std::vector<uint8_t> dst(static_cast<size_t>(yuv420_size(src.layout, w, h)));
    copy_block(grids.y, w, h, w, dst, 0, w);
    for (int64_t plane = 0; plane < src.layout.planes; ++plane) {
        copy_block(grids.chroma[plane], grids.row, half(h), row, dst, w * h + plane * row * half(h),
                   row);
    }
    return dst;
}

inline void draw_yuv420(const Yuv420Source& src, const ovrin_resize_target& target,
                        std::vector<uint8_t>& canvas) {
    const Yuv420Grids grids(src, target.dst_width, target.dst_height);
    const int64_t luma = int64_t{target.canvas_width} * target.canvas_height;
    for (size_t i = 0; i < canvas.size(); ++i) canvas[i] = i < static_cast<size_t>(luma) ? 0 : 128;

    const int64_t w = visible_width(target);
    const int64_t h = visible_height(target);
    copy_block(grids.y, target.dst_width, h, w, canvas,
               int64_t{target.dst_y} * target.canvas_width + target.dst_x, target.canvas_width);
    const int64_t row = chroma_row(src.layout, target.canvas_width);
    const int64_t at = half(target.dst_y) * row + chroma_row(src.layout, target.dst_x);
    for (int64_t plane = 0; plane < src.layout.planes; ++plane) {
        copy_block(grids.chroma[plane], grids.row, half(h), chroma_row(src.layout, w), canvas,
                   luma + plane * row * half(target.canvas_height) + at, row);
    }
}

// Letterboxing. `src.stride` is ignored: the target gives the row length, taken as it stands by the
// single-threaded function, replaced by the width by the threaded one when it is below 1.
inline void keep_ratio_yuv420_sg(Yuv420Source src, const ovrin_resize_target& target,
                                 std::vector<uint8_t>& canvas) {
    if (!single_accepts(target)) return;
    src.stride = target.src_stride;
    draw_yuv420(src, target, canvas);
}
inline void keep_ratio_yuv420_tps(Yuv420Source src, const ovrin_resize_target& target,
                                  std::vector<uint8_t>& canvas) {
    if (!threaded_accepts(target)) return;
    if (src.height < 1024 || band_count(src.height, target.dst_height) < 2) {
        keep_ratio_yuv420_sg(src, target, canvas);
        return;
    }
    src.stride = target.src_stride > 0 ? target.src_stride : src.width;
    draw_yuv420(src, target, canvas);
}

}  // namespace reference
