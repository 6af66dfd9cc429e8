// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>

#include "geometry.h"
#include "picture.h"

namespace tool {

// Where on a canvas, or what of a picture that is cropped: in halves of the room, from the left and
// from the top.
struct Gravity {
    int32_t across = 1;
    int32_t down = 1;
};

// What is asked for; a size, a canvas or both.
struct Wish {
    std::optional<Geometry> size;
    std::optional<Size> canvas;
    std::optional<Fit> fit;  // instead of the size's own
    Gravity gravity = {};
};

// Where the scaled picture goes. Without a canvas, the result is the picture.
struct Placement {
    bool on_canvas;     // or cropped
    bool keeps_aspect;  // up to rounding
    Size result;        // of the canvas, or of the picture
    Size picture;       // of the scaled picture
    int32_t x, y;       // of its top left pixel; negative where it is cropped
};

// Throws Error when the picture does not fit on the canvas, or is too large.
Placement place(const Wish& wish, Size source, PixelFormat format);

}  // namespace tool
