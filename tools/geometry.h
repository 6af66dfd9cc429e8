// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "size.h"

namespace tool {

enum class Fit {
    kContain,  // the largest that fits into the size with the proportions kept
    kExact,    // stretched to the size
    kCover     // the smallest that covers the size with the proportions kept, and cropped to it
};

enum class Limit { kNone, kOnlyShrinks, kOnlyEnlarges };

// The size asked for, which may depend on that of the source.
struct Geometry {
    Geometry() = default;
    Geometry(Size size) : width(size.width), height(size.height) {}

    // Pixels. Where one side is missing, it follows from the other; both are where one of the next
    // two says it all.
    std::optional<int32_t> width, height;
    double factor = 0;  // of the source's sides
    double pixels = 0;  // in all
    Fit fit = Fit::kContain;
    Limit limit = Limit::kNone;
};

// Reads "640x480", "640x", "x480", "640", "50%" or "100000@", with "!" (exact) or "^" (cover)
// behind the first, and ">" (only shrinks) or "<" (only enlarges) behind any. Throws Error.
Geometry parse_geometry(const std::string& text);

}  // namespace tool
