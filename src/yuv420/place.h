// SPDX-License-Identifier: Apache-2.0
// From the grid to the canvas.
#pragma once

#include <ovrinresize.h>

#include "yuv420/planes.h"

namespace ovrin {

// Where the samples of a picture go whose planes lie inside the target's canvas.
Yuv420Destination picture_in_canvas(const Yuv420Format& format, const ovrin_resize_target& target);

// Paints the canvas black and copies the part of any other picture that it has room for.
void place_in_canvas(const uint8_t* grid_base, const Yuv420Layout& picture,
                     const ovrin_resize_target& target);

}  // namespace ovrin
