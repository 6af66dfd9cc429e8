// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

namespace tool {

// Width and height, pixels.
struct Size {
    int32_t width;
    int32_t height;

    size_t pixels() const { return static_cast<size_t>(width) * static_cast<size_t>(height); }
};

// Reads "WxH"; nothing where the text is not of that form. Throws Error when the tool cannot handle
// such a size.
std::optional<Size> parse_size(const std::string& text);

// Throws Error unless a picture of this size can be handled. Sides come from files, so they may be
// anything at all.
Size checked_size(int64_t width, int64_t height);

// 1 GiB of RGBA. Byte counts fit 31 bits, which is all that the library promises to handle.
constexpr int64_t kMostPixels = int64_t{1} << 28;

// Lets checked_size() refuse more pixels than that; before any threads start.
void set_most_pixels(int64_t pixels);

std::string to_string(const Size& size);

}  // namespace tool
