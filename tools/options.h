// SPDX-License-Identifier: Apache-2.0
// The command line.
#pragma once

#include <CLI/CLI.hpp>
#include <optional>
#include <string>
#include <vector>

#include "color.h"
#include "engine.h"
#include "file_kind.h"
#include "picture.h"
#include "placement.h"
#include "source.h"
#include "yuv.h"

namespace tool {

enum class Command { kResize, kInfo, kCompare, kSelftest };

// Counted from 1, the last included.
struct FrameRange {
    int64_t first = 1;
    int64_t last = INT64_MAX;
};

struct Options {
    Command command = Command::kResize;
    std::vector<std::string> files;     // as given: inputs, and OUT where there is no template
    std::optional<std::string> output;  // the template for names of many results
    std::string in;                     // of one job
    std::string out;
    std::optional<FileKind> output_type;
    FrameRange frames;
    bool recursive = false;
    int64_t jobs = 1;
    std::optional<int64_t> threads;  // the most at a time; without a number as many as do good
    bool shows_progress = true;
    Wish wish;
    std::optional<Engine> engine;  // without one, what suits the job
    int quality = 90;
    std::optional<PixelFormat> raw_format;
    std::optional<Size> raw_size;
    YuvMeaning yuv;
    std::optional<Color> background;
    bool premultiply = true;
    bool rotate = true;
    bool strip = false;
    bool strict = false;
    int64_t most_pixels = kMostPixels;
    bool quiet = false;
    bool verbose = false;
    bool json = false;
    int largest_difference = 0;  // that counts as equal; of kCompare
    std::string library;         // whose results are looked at; empty: the tool's own; of kSelftest
};

// How --format and --input-size say that inputs are to be read.
std::optional<RawLayout> raw_layout(const Options& options);

// Reads the command line into *options; its first word may be a command. Throws what CLI11 throws:
// errors, and requests for help.
void parse(int argc, char** argv, CLI::App* app, Options* options);

}  // namespace tool
