// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <vector>

#include "size.h"

namespace tool {

// An RGBA picture: bytes R, G, B, A per pixel, rows packed. Words because the library writes words.
struct Picture {
    explicit Picture(Size the_size) : size(the_size), pixels(the_size.pixels()) {}

    uint8_t* bytes() { return reinterpret_cast<uint8_t*>(pixels.data()); }
    const uint8_t* bytes() const { return reinterpret_cast<const uint8_t*>(pixels.data()); }

    Size size;
    std::vector<uint32_t> pixels;
    bool has_alpha = false;  // false: A means nothing and is not written to files
};

// The picture without A, three bytes per pixel.
std::vector<uint8_t> rgb_bytes(const Picture& picture);

}  // namespace tool
