// SPDX-License-Identifier: Apache-2.0
#include "canvas/margin.h"

#include <string.h>

namespace ovrin {

// What lies to the right of one row and to the left of the next is filled in one go.
void fill_margin(uint8_t* plane, ptrdiff_t row_bytes, ptrdiff_t rows, const PlaneArea& picture,
                 int value) {
    const ptrdiff_t first = picture.y * row_bytes + picture.x;
    memset(plane, value, static_cast<size_t>(first));
    uint8_t* behind = plane + first + picture.width;
    for (ptrdiff_t j = 1; j < picture.height; ++j, behind += row_bytes) {
        memset(behind, value, static_cast<size_t>(row_bytes - picture.width));
    }
    memset(behind, value, static_cast<size_t>(plane + row_bytes * rows - behind));
}

}  // namespace ovrin
