// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

namespace tool {

// Width and height, pixels.
struct Size {
    int32_t width;
    int32_t height;

    size_t pixels() const { return static_cast<size_t>(width) * static_cast<size_t>(height); }
};

// Reads "WxH". Throws Error unless it is a size that the tool handles.
Size parse_size(const std::string& text);

// Throws Error unless a picture of this size can be handled. Sides come from files, so they may be
// anything at all.
Size checked_size(int64_t width, int64_t height);

std::string to_string(const Size& size);

}  // namespace tool
