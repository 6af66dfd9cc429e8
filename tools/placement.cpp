// SPDX-License-Identifier: Apache-2.0
#include "placement.h"

#include <algorithm>

#include "error.h"

namespace tool {

namespace {

// round(side * numerator / denominator) to a multiple of `unit`, at least one unit, at most
// `limit`.
int32_t scaled_side(int64_t side, int64_t numerator, int64_t denominator, int64_t unit,
                    int32_t limit) {
    const int64_t divisor = denominator * unit;
    const int64_t units = std::max<int64_t>(1, (side * numerator + divisor / 2) / divisor);
    return static_cast<int32_t>(std::min<int64_t>(units * unit, limit));
}

Size contained(Size source, Size box, PixelFormat format) {
    // The library's 4:2:0 functions lay chroma exactly under the luma only where sizes are
    // multiples of 4; two pixels of distortion are less visible than colours beside their shapes.
    const int64_t unit = has_chroma_planes(format) ? 4 : 1;
    const bool is_wider = int64_t{source.width} * box.height >= int64_t{source.height} * box.width;
    if (is_wider) {
        return {box.width, scaled_side(source.height, box.width, source.width, unit, box.height)};
    }
    return {scaled_side(source.width, box.height, source.height, unit, box.width), box.height};
}

}  // namespace

Placement place(const Wish& wish, Size source, PixelFormat format) {
    const Size box = wish.size ? *wish.size : wish.canvas.value();
    const Fit fit = wish.fit.value_or(wish.canvas ? Fit::kContain : Fit::kExact);
    const bool keeps_aspect = fit == Fit::kContain;
    const Size picture = keeps_aspect ? contained(source, box, format) : box;
    if (!wish.canvas) return {false, keeps_aspect, picture, picture, 0, 0};

    const Size canvas = *wish.canvas;
    if (picture.width > canvas.width || picture.height > canvas.height) {
        throw Error("a picture of " + to_string(picture) + " does not fit on a canvas of " +
                    to_string(canvas));
    }
    int32_t x = (canvas.width - picture.width) / 2;
    int32_t y = (canvas.height - picture.height) / 2;
    if (has_chroma_planes(format)) {
        // A chroma sample covers two pixels each way.
        x -= x % 2;
        y -= y % 2;
    }
    return {true, keeps_aspect, canvas, picture, x, y};
}

}  // namespace tool
