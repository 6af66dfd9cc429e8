// SPDX-License-Identifier: Apache-2.0
// The library's resamplers by name. All calls of the library are here.
#pragma once

#include <string>

#include "picture.h"
#include "placement.h"

namespace tool {

enum class Engine { kQuarter, kBilinear, kLanczos, kNearest };

// Throws Error when the engine cannot do that with pictures of this format.
void check_engine(Engine engine, PixelFormat format, const Placement& placement);

// Resizes into *result, which has the source's format and the placement's size. The engine has
// passed check_engine().
void resize(Engine engine, const Picture& source, const Placement& placement, Picture* result);

}  // namespace tool
