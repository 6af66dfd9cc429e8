// SPDX-License-Identifier: Apache-2.0
// The command line.
#pragma once

#include <CLI/CLI.hpp>
#include <optional>
#include <string>

#include "color.h"
#include "engine.h"
#include "picture.h"
#include "placement.h"

namespace tool {

struct Options {
    std::string in;
    std::string out;
    Wish wish;
    std::optional<Engine> engine;  // without one, what suits the job
    int quality = 90;
    std::optional<PixelFormat> raw_format;
    std::optional<Size> raw_size;
    std::optional<Color> background;
    bool premultiply = true;
    bool rotate = true;
    bool strip = false;
    int64_t most_pixels = kMostPixels;
    bool quiet = false;
    bool verbose = false;
    bool json = false;
};

// Reads the command line into *options. Throws what CLI11 throws: errors, and requests for help.
void parse(int argc, char** argv, CLI::App* app, Options* options);

}  // namespace tool
