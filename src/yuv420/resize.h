// SPDX-License-Identifier: Apache-2.0
// Resizing of 4:2:0 pictures on the calling thread.
#pragma once

#include <ovrinresize.h>

#include "yuv420/layout.h"

namespace ovrin {

// Into a contiguous picture of width x height.
void resize_yuv420(const Yuv420Source& source, uint8_t* dst, int32_t width, int32_t height);

// Into the target's canvas.
void resize_yuv420_into_canvas(const Yuv420Source& source, const ovrin_resize_target& target);

}  // namespace ovrin
