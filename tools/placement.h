// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>

#include "picture.h"

namespace tool {

enum class Fit {
    kExact,   // stretched to the size asked for
    kContain  // the largest that fits into it with the proportions kept
};

// What is asked for; a size, a canvas or both.
struct Wish {
    std::optional<Size> size;
    std::optional<Size> canvas;
    std::optional<Fit> fit;  // without one: kContain on a canvas, kExact otherwise
};

// Where the scaled picture goes. Without a canvas, the result is the picture.
struct Placement {
    bool on_canvas;
    bool keeps_aspect;  // up to rounding
    Size result;        // of the canvas, or of the picture
    Size picture;       // of the scaled picture
    int32_t x, y;       // of its top left pixel
};

// Throws Error when the picture does not fit on the canvas.
Placement place(const Wish& wish, Size source, PixelFormat format);

}  // namespace tool
