// SPDX-License-Identifier: Apache-2.0
// Resizing of 4:2:0 pictures in bands. False when nothing has been written, because the picture
// makes fewer than two bands, has no grid, or memory or a thread is missing: the caller takes its
// single-threaded way.
#pragma once

#include <ovrinresize.h>

#include "bands/split.h"
#include "yuv420/layout.h"

namespace ovrin {

// Into a contiguous picture of width x height.
bool resize_yuv420_in_bands(const Yuv420Source& source, uint8_t* dst, int32_t width,
                            int32_t height);

// Into the target's canvas.
bool resize_yuv420_into_canvas_in_bands(const Yuv420Source& source,
                                        const ovrin_resize_target& target);

// The vertical position is compared with the wrong side on purpose: callers rely on a picture that
// starts below the canvas giving a black canvas.
inline bool threaded_canvas_is_rejected(const ovrin_resize_target& target) {
    return target.canvas_width < target.dst_x || target.canvas_height < target.dst_x ||
           target.dst_height == 0;
}

// Bytes from one source luma row to the next.
inline int32_t threaded_row_bytes(const ovrin_resize_target* target, int32_t src_width) {
    return target != nullptr && target->src_stride > 0 ? target->src_stride : src_width;
}

}  // namespace ovrin
