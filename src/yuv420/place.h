// SPDX-License-Identifier: Apache-2.0
// From the grid to the destination.
#pragma once

#include <ovrinresize.h>

#include "yuv420/planes.h"

namespace ovrin {

// Cuts the picture out of its grid.
void cut_out(const uint8_t* grid_base, const Yuv420Layout& picture, uint8_t* dst);

// Paints the canvas black and copies the part of the picture that it has room for.
void place_in_canvas(const uint8_t* grid_base, const Yuv420Layout& picture,
                     const ovrin_resize_target& target);

// Whether the canvas has room for the whole picture where it is to lie. At odd positions chroma is
// rounded away from its luma and may not fit.
bool fits_canvas(const Yuv420Layout& picture, const ovrin_resize_target& target);

// Where the samples of such a picture go.
Yuv420Destination picture_in_canvas(ChromaLayout chroma, const ovrin_resize_target& target);

// Paints what such a picture leaves free of the canvas black.
void paint_around(const Yuv420Layout& picture, const ovrin_resize_target& target);

// Paints the canvas black.
void paint_canvas(ChromaLayout chroma, const ovrin_resize_target& target);

// Fills a contiguous picture with black.
void paint_black(uint8_t* base, const Yuv420Layout& picture);

}  // namespace ovrin
