// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>

#include "color.h"
#include "engine.h"
#include "orientation.h"
#include "picture.h"
#include "placement.h"

namespace tool {

// What happens to the pixels of every frame of a job.
struct Resizing {
    Engine engine;
    Placement placement;  // of the upright picture
    PixelFormat format;   // of the result, see engine.h
    Orientation orientation = Orientation::kUpright;
    std::optional<Color> background;  // behind what is transparent
    std::optional<Color> canvas;      // of the canvas; otherwise black, and transparent
    bool premultiply = true;          // colours count as much as they are opaque
    bool fills_alpha = false;         // alpha of a picture without any is 255
};

// Resizes one frame, which may be used up. *result is empty or holds the frame before.
void resize(const Resizing& resizing, Picture* frame, Picture* result);

}  // namespace tool
