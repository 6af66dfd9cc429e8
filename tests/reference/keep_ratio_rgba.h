// SPDX-License-Identifier: Apache-2.0
// RGBA8888 letterboxing, written down as plainly as possible.
#pragma once

#include <ovrinresize.h>

#include <cstddef>
#include <cstdint>
#include <vector>

#include "reference/bands.h"
#include "reference/quarter.h"

namespace reference {

// Source length that is left when a picture of `old_length` is cut to `new_length`.
inline int32_t cut_source(int32_t source, int32_t new_length, int32_t old_length) {
    const double kept = static_cast<double>(new_length) / static_cast<double>(old_length);
    return static_cast<int32_t>(static_cast<double>(source) * kept);
}

// Cuts the picture at the right and the bottom edge of the canvas, rewriting the target. False
// when the placement is rejected; then nothing has been changed.
inline bool clip_rgba(ovrin_resize_target& target, int32_t& src_w, int32_t& src_h) {
    if (target.canvas_width < target.dst_x) return false;
    if (target.canvas_height < target.dst_height) return false;
    if (target.dst_height == 0) return false;
    if (target.canvas_width < target.dst_width + target.dst_x) {
        const int32_t width = target.canvas_width - target.dst_x;
        src_w = cut_source(target.src_width, width, target.dst_width);
        target.dst_width = width;
        target.src_width = src_w;
    }
    if (target.canvas_height < target.dst_height + target.dst_y) {
        const int32_t height = target.canvas_height - target.dst_y;
        src_h = cut_source(target.src_height, height, target.dst_height);
        target.dst_height = height;
        target.src_height = src_h;
    }
    return true;
}

// Fills `canvas` as the clipped target says; source rows lie `stride` pixels apart.
inline void draw_rgba(const uint8_t* src, int64_t stride, int64_t src_w, int64_t src_h,
                      const ovrin_resize_target& target, std::vector<uint32_t>& canvas) {
    for (uint32_t& word : canvas) word = 0;
    if (src_w < 1 || src_h < 1) return;
    for (int64_t j = 0; j < target.dst_height; ++j) {
        for (int64_t k = 0; k < target.dst_width; ++k) {
            const int64_t rows[2] = {near_cell(j, src_h, target.dst_height),
                                     far_cell(j, src_h, target.dst_height)};
            const int64_t columns[2] = {near_cell(k, src_w, target.dst_width),
                                        far_cell(k, src_w, target.dst_width)};
            uint32_t word = 0;
            for (int c = 0; c < 4; ++c) {
                uint32_t sum = 0;
                for (int64_t row : rows) {
                    for (int64_t column : columns) {
                        sum += src[(row * stride + column) * 4 + c] >> 2;
                    }
                }
                word |= sum << (8 * c);
            }
            const int64_t at = (target.dst_y + j) * target.canvas_width + target.dst_x + k;
            canvas.at(static_cast<size_t>(at)) = word;
        }
    }
}

// The single-threaded function. The source row length is taken as it stands.
inline void keep_ratio_rgba_sg(const uint8_t* src, int32_t src_w, int32_t src_h,
                               ovrin_resize_target& target, std::vector<uint32_t>& canvas) {
    if (!clip_rgba(target, src_w, src_h)) return;
    draw_rgba(src, target.src_stride, src_w, src_h, target, canvas);
}

// The threaded function. A row length below 1 stands for the source width; a picture of fewer than
// two bands is left to the single-threaded function, which judges the clipped target again.
inline void keep_ratio_rgba_tps(const uint8_t* src, int32_t src_w, int32_t src_h,
                                ovrin_resize_target& target, std::vector<uint32_t>& canvas) {
    if (!clip_rgba(target, src_w, src_h)) return;
    if (band_count(src_h, target.dst_height) < 2) {
        keep_ratio_rgba_sg(src, src_w, src_h, target, canvas);
        return;
    }
    const int32_t stride = target.src_stride > 0 ? target.src_stride : src_w;
    draw_rgba(src, stride, src_w, src_h, target, canvas);
}

}  // namespace reference
