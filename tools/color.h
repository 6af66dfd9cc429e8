// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

namespace tool {

struct Color {
    uint8_t red, green, blue;

    bool is_gray() const { return red == green && green == blue; }
};

constexpr Color kBlack = {0, 0, 0};
constexpr Color kWhite = {255, 255, 255};

// Reads "#rrggbb", "#rgb" or one of a few names. Throws Error.
Color parse_color(const std::string& text);

}  // namespace tool
