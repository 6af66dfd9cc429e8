// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <stddef.h>
#include <stdint.h>

namespace ovrin {

// Where a picture lies in a plane of its canvas, in bytes and rows; all of it within the plane.
struct PlaneArea {
    ptrdiff_t x;
    ptrdiff_t y;
    ptrdiff_t width;
    ptrdiff_t height;
};

// Fills what the picture leaves free of a contiguous plane.
void fill_margin(uint8_t* plane, ptrdiff_t row_bytes, ptrdiff_t rows, const PlaneArea& picture,
                 int value);

}  // namespace ovrin
