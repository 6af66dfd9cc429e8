// SPDX-License-Identifier: Apache-2.0
// What transparency needs before and after resizing. Pictures are RGBA.
#pragma once

#include "color.h"
#include "picture.h"

namespace tool {

// Whether alpha is 255 everywhere.
bool is_opaque(const Picture& picture);

void make_opaque(Picture* picture);

// Puts the picture on a background; it has no alpha any more.
void flatten(Picture* picture, Color background);

// Multiplies colours by alpha, so that those of transparent pixels do not count.
void premultiply(Picture* picture);

// Undoes it after resizing. opaque: the alpha that resizing makes of 255, which becomes 255 again.
void unpremultiply(Picture* picture, int opaque);

}  // namespace tool
