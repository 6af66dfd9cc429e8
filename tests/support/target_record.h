// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <ovrinresize.h>

#include <cstdint>
#include <cstring>

namespace ovrin_test {

// A picture of dst_w x dst_h at (x, y) on a canvas. All other fields hold garbage, so that using
// one shows.
inline ovrin_resize_target letterbox(int32_t canvas_w, int32_t canvas_h, int32_t dst_w,
                                     int32_t dst_h, int32_t x, int32_t y) {
    ovrin_resize_target target;
    memset(static_cast<void*>(&target), 0x5A, sizeof target);
    target.canvas_width = canvas_w;
    target.canvas_height = canvas_h;
    target.dst_width = dst_w;
    target.dst_height = dst_h;
    target.dst_x = x;
    target.dst_y = y;
    return target;
}

}  // namespace ovrin_test
