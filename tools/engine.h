// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "picture.h"

namespace tool {

// Names of the library's resamplers; the first is the default.
std::vector<std::string> engine_names();

// engine: one of engine_names().
Picture resize(const Picture& source, Size size, const std::string& engine);

}  // namespace tool
