// SPDX-License-Identifier: Apache-2.0
// What files of pictures say beside their pixels, and what of that holds for a resized picture.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "orientation.h"
#include "size.h"

namespace tool {

using Bytes = std::vector<uint8_t>;

// Pixels per metre or, where is_absolute is false, only the shape of a pixel.
struct Density {
    bool is_absolute;
    double x, y;
};

// How a PNG describes its colours where it has neither a profile nor sRGB. Samples are converted to
// the gamma of sRGB when they are read.
struct PngColors {
    bool has_gamma = false;
    // White, red, green, blue: x and y, times 100000.
    std::optional<std::array<int32_t, 8>> chromaticities;
};

struct Metadata {
    Bytes exif;                      // a TIFF structure; empty: none
    Bytes icc;                       // a colour profile; empty: none
    std::optional<int> srgb_intent;  // the file claims sRGB
    std::optional<Density> density;
    PngColors png_colors;
    std::string damage;  // what the file lacks, though there is a picture; empty: nothing
};

// Of a picture that was resized to `size`, as it is stored, and turned upright if is_turned.
Metadata resized_metadata(const Metadata& source, Size size, bool is_turned);

// Of the picture as it is stored; kUpright where nothing or nonsense is said.
Orientation orientation_of(const Metadata& metadata);

// Whether a file of greys can say this. Profiles for colours fit no grey file.
bool fits_gray(const Metadata& metadata);

// Whether a picture is to be written as a grey one.
bool is_gray_file(const Picture& picture, const Metadata& metadata);

// Whether there is a profile that fits the picture: one for greys does not fit colours.
bool has_fitting_profile(const Picture& picture, const Metadata& metadata);

}  // namespace tool
