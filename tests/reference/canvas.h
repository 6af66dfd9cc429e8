// SPDX-License-Identifier: Apache-2.0
// What letterboxed planar and semi-planar pictures have in common.
#pragma once

#include <ovrinresize.h>

#include <cstddef>
#include <cstdint>
#include <vector>

namespace reference {

// Target sizes are rounded up to multiples of 4.
inline int64_t grid_length(int64_t length) {
    return length % 4 != 0 ? length - length % 4 + 4 : length;
}

// Whether a letterboxed picture of planes is drawn at all. The threaded functions compare the
// canvas height with dst_x.
inline bool single_accepts(const ovrin_resize_target& target) {
    return target.canvas_width >= target.dst_x && target.canvas_height >= target.dst_y &&
           target.dst_height != 0;
}
inline bool threaded_accepts(const ovrin_resize_target& target) {
    return target.canvas_width >= target.dst_x && target.canvas_height >= target.dst_x &&
           target.dst_height != 0;
}

// The part of the picture that lies on the canvas.
inline int64_t visible_width(const ovrin_resize_target& target) {
    const bool cut = target.dst_width + target.dst_x > target.canvas_width;
    return cut ? target.canvas_width - target.dst_x : target.dst_width;
}
inline int64_t visible_height(const ovrin_resize_target& target) {
    const bool cut = target.dst_height + target.dst_y > target.canvas_height;
    return cut ? target.canvas_height - target.dst_y : target.dst_height;
}

// Copies rows x bytes of `block` to byte `start` of the canvas, canvas rows `canvas_row` bytes
// apart. Rows may run into the next row or the next plane; bytes past the canvas are dropped.
inline void copy_block(const std::vector<uint8_t>& block, int64_t block_row, int64_t rows,
                       int64_t bytes, std::vector<uint8_t>& canvas, int64_t start,
                       int64_t canvas_row) {
    for (int64_t r = 0; r < rows; ++r) {
        for (int64_t b = 0; b < bytes; ++b) {
            const int64_t to = start + r * canvas_row + b;
            if (to >= static_cast<int64_t>(canvas.size())) continue;
            canvas.at(static_cast<size_t>(to)) = block.at(static_cast<size_t>(r * block_row + b));
        }
    }
}

}  // namespace reference
