// SPDX-License-Identifier: Apache-2.0
#include "canvas/placement.h"

#include <stddef.h>

namespace ovrin {

namespace {

int32_t scaled(int32_t size, int64_t new_extent, int32_t old_extent) {
    const double result = size * (static_cast<double>(new_extent) / old_extent);
    // Only a negative height can leave the range; what it means is not defined, a trap would be.
    if (!(result > INT32_MIN && result < INT32_MAX)) return 0;
    return static_cast<int32_t>(result);
}

// Cuts one axis; returns the source size to use.
int32_t cut(int32_t canvas_size, int32_t position, int32_t& dst_size, int32_t& target_src_size,
            int32_t src_size) {
    if (canvas_size >= int64_t{dst_size} + position) return src_size;
    const auto left =
        static_cast<int32_t>(static_cast<uint32_t>(canvas_size) - static_cast<uint32_t>(position));
    target_src_size = scaled(target_src_size, left, dst_size);
    dst_size = left;
    return target_src_size;
}

}  // namespace

bool rgba_lies_in_memory(const ovrin_resize_target& target) {
    const int64_t width = target.canvas_width;
    if (width < 1 || width < target.dst_width) return false;
    const int64_t first = width * target.dst_y + target.dst_x;
    const int64_t last_row = first + width * (int64_t{target.dst_height} - 1);
    return first >= 0 && last_row + target.dst_width <= width * target.canvas_height;
}

bool rgba_lies_inside(const ovrin_resize_target& target) {
    return target.dst_x >= 0 && target.dst_y >= 0 && target.dst_width > 0 &&
           target.dst_height > 0 &&
           int64_t{target.dst_x} + target.dst_width <= target.canvas_width &&
           int64_t{target.dst_y} + target.dst_height <= target.canvas_height;
}

bool planes_lie_inside(const Yuv420Layout& picture, const ovrin_resize_target& target) {
    return target.dst_x >= 0 && target.dst_y >= 0 && target.dst_x % 2 == 0 &&
           target.dst_y % 2 == 0 && int64_t{target.dst_x} + picture.width <= target.canvas_width &&
           int64_t{target.dst_y} + picture.height <= target.canvas_height;
}

SourceSize cut_rgba(ovrin_resize_target& target, SourceSize size) {
    const int32_t width =
        cut(target.canvas_width, target.dst_x, target.dst_width, target.src_width, size.width);
    const int32_t height =
        cut(target.canvas_height, target.dst_y, target.dst_height, target.src_height, size.height);
    return {width, height};
}

}  // namespace ovrin
