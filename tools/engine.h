// SPDX-License-Identifier: Apache-2.0
// The library's resamplers by name. All calls of the library are here.
#pragma once

#include <string>

#include "picture.h"
#include "placement.h"

namespace tool {

enum class Engine { kQuarter, kBilinear, kLanczos, kNearest };

// Throws Error when the engine cannot resize pictures of this format.
void check_engine(Engine engine, PixelFormat format);

// Resizes into *result, which has the source's format. The engine has passed check_engine().
void resize(Engine engine, const Picture& source, Picture* result);

// The quarter engine, straight onto a black, transparent canvas.
void resize_onto_canvas(const Picture& source, const Placement& placement, Picture* canvas);

// What the engine makes of white and of full alpha, 255.
int white_of(Engine engine);

}  // namespace tool
