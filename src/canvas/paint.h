// SPDX-License-Identifier: Apache-2.0
// Black: 0 in RGBA8888 and luma, 128 in chroma.
#pragma once

#include <ovrinresize.h>

#include "canvas/yuv420_layout.h"

namespace ovrin {

// A whole canvas; nothing when it is empty.
void paint_rgba_black(void* canvas, int32_t width, int32_t height);
void paint_planes_black(uint8_t* canvas, const Yuv420Layout& layout);

// What an RGBA8888 picture that stores every pixel of its own leaves free of its target's canvas;
// all of it when rows of the picture run on from one canvas row into the next.
void paint_around_rgba(const ovrin_resize_target& target);

// What planes that lie inside the target's canvas leave free of it.
void paint_around_planes(const Yuv420Layout& picture, const ovrin_resize_target& target);

}  // namespace ovrin
