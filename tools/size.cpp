// SPDX-License-Identifier: Apache-2.0
#include "size.h"

#include <charconv>

#include "error.h"

namespace tool {

namespace {

constexpr int64_t kMaxSide = 65535;
int64_t most_pixels = kMostPixels;

// Reads a number and returns the place behind it; null where there is none. A number with more
// digits than an int64_t holds is as good as the largest one: too big.
const char* parse_side(const char* begin, const char* end, int64_t* side) {
    const auto [stop, status] = std::from_chars(begin, end, *side);
    if (status == std::errc::invalid_argument) return nullptr;
    if (status == std::errc::result_out_of_range) *side = *begin == '-' ? INT64_MIN : INT64_MAX;
    return stop;
}

}  // namespace

std::optional<Size> parse_size(const std::string& text) {
    const char* const end = text.data() + text.size();
    int64_t width = 0;
    int64_t height = 0;
    const char* at = parse_side(text.data(), end, &width);
    if (at == nullptr || at == end || (*at != 'x' && *at != 'X')) return std::nullopt;
    at = parse_side(at + 1, end, &height);
    if (at != end) return std::nullopt;
    return checked_size(width, height);
}

Size checked_size(int64_t width, int64_t height) {
    if (width < 1 || height < 1) throw Error("width and height must be at least 1");
    if (width > kMaxSide || height > kMaxSide) {
        throw Error("too large: a side is at most " + std::to_string(kMaxSide) + " pixels");
    }
    if (width * height > most_pixels) {
        throw Error("too large: a picture has at most " + std::to_string(most_pixels) + " pixels");
    }
    return {static_cast<int32_t>(width), static_cast<int32_t>(height)};
}

void set_most_pixels(int64_t pixels) {
    most_pixels = pixels;
}

std::string to_string(const Size& size) {
    return std::to_string(size.width) + "x" + std::to_string(size.height);
}

}  // namespace tool
