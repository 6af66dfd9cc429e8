// SPDX-License-Identifier: Apache-2.0
// What was done, for people and for programs.
#pragma once

#include <cstdint>
#include <string>

#include "engine.h"
#include "picture.h"
#include "placement.h"

namespace tool {

struct Report {
    std::string in, out;
    PixelFormat format;
    Size source;  // upright
    Placement placement;
    Engine engine;
    int64_t frames = 0;
    double resizing_ms = 0;
};

// Both end with a line feed.
std::string in_words(const Report& report);
std::string as_json(const Report& report);

}  // namespace tool
