// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>

#include "color.h"
#include "picture.h"
#include "placement.h"

namespace tool {

// A canvas of one colour, without any black and transparent, with a picture on it, or as much of it
// as shows. In any format.
Picture on_canvas(const Picture& picture, const Placement& placement,
                  const std::optional<Color>& color);

}  // namespace tool
