// SPDX-License-Identifier: Apache-2.0
// Sizes as people write them, and where a picture of any size goes with them. Colours, too.
#include "color.h"
#include "placement.h"
#include "tool_support.h"

using namespace fuzz;

namespace {

constexpr tool::PixelFormat kFormats[] = {tool::PixelFormat::kRgba, tool::PixelFormat::kI420};

bool is_picture(tool::Size size) {
    return size.width > 0 && size.height > 0 && size.width <= 65535 && size.height <= 65535 &&
           int64_t(size.pixels()) <= tool::kMostPixels;
}

// The first eight bytes say how large the source is and how it lies, the rest is the text.
struct Case {
    tool::Size source;
    tool::PixelFormat format;
    tool::Gravity gravity;
    std::optional<tool::Size> canvas;
    std::string text;
};

Case read_case(const uint8_t* data, size_t size) {
    const auto number = [&](size_t at) { return data[at] | data[at + 1] << 8; };
    Case read = {{1 + number(0) % 65535, 1 + number(2) % 4096},
                 kFormats[data[4] % 2],
                 {data[4] / 2 % 3, data[4] / 6 % 3},
                 {},
                 text(data + 8, size - 8)};
    if (data[5] % 2 != 0) read.canvas = tool::Size{1 + data[6] * 16, 1 + data[7] * 16};
    return read;
}

// One side of the picture lies inside that of the canvas, or covers it.
bool lies_right(int32_t at, int32_t picture, int32_t canvas) {
    const int32_t end = at + picture;
    return (at >= 0 && end <= canvas) || (at <= 0 && end >= canvas);
}

void check_placement(const tool::Placement& placement) {
    require(is_picture(placement.result) && is_picture(placement.picture), "an impossible size");
    require(lies_right(placement.x, placement.picture.width, placement.result.width) &&
                lies_right(placement.y, placement.picture.height, placement.result.height),
            "a picture beside its canvas");
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size < 8) return 0;
    const Case given = read_case(data, size);
    succeeds([&] { tool::parse_color(given.text); });
    succeeds([&] {
        tool::Wish wish;
        wish.size = tool::parse_geometry(given.text);
        wish.canvas = given.canvas;
        wish.gravity = given.gravity;
        check_placement(place(wish, given.source, given.format));
    });
    return 0;
}
