// SPDX-License-Identifier: Apache-2.0
#include "placement.h"

#include <algorithm>
#include <cmath>

#include "error.h"

namespace tool {

namespace {

// The library's 4:2:0 functions lay chroma exactly under the luma only where sizes are multiples of
// 4; two pixels of distortion are less visible than colours beside their shapes. Planes that are
// resized one by one need as much as whole samples of chroma.
int64_t unit_of(PixelFormat format) {
    if (is_420(format)) return 4;
    return format == PixelFormat::kI422 ? 2 : 1;
}

// round(side * numerator / denominator) to a multiple of `unit`, at least one unit, at most
// `limit`.
int32_t scaled_side(int64_t side, int64_t numerator, int64_t denominator, int64_t unit,
                    int32_t limit = INT32_MAX) {
    const int64_t divisor = denominator * unit;
    const int64_t units = std::max<int64_t>(1, (side * numerator + divisor / 2) / divisor);
    return static_cast<int32_t>(std::min<int64_t>(units * unit, limit));
}

bool is_wider(Size a, Size b) {
    return int64_t{a.width} * b.height >= int64_t{a.height} * b.width;
}

Size of_width(int32_t width, Size source, int64_t unit, int32_t limit = INT32_MAX) {
    return {width, scaled_side(source.height, width, source.width, unit, limit)};
}

Size of_height(int32_t height, Size source, int64_t unit, int32_t limit = INT32_MAX) {
    return {scaled_side(source.width, height, source.height, unit, limit), height};
}

Size contained(Size source, Size box, int64_t unit) {
    if (is_wider(source, box)) return of_width(box.width, source, unit, box.height);
    return of_height(box.height, source, unit, box.width);
}

Size covering(Size source, Size box, int64_t unit) {
    Size size = is_wider(source, box) ? of_height(box.height, source, unit)
                                      : of_width(box.width, source, unit);
    return {std::max(size.width, box.width), std::max(size.height, box.height)};
}

// Both sides times the same factor, which need not be a ratio of whole numbers.
Size times(Size source, double factor, int64_t unit) {
    const auto side = [&](int32_t from) {
        const double units = std::round(from * factor / static_cast<double>(unit));
        return static_cast<int64_t>(std::clamp(units, 1.0, 1e9)) * unit;
    };
    return checked_size(side(source.width), side(source.height));
}

Size asked_for(const Geometry& geometry, Fit fit, Size source, int64_t unit) {
    if (geometry.factor > 0) return times(source, geometry.factor, unit);
    if (geometry.pixels > 0) {
        return times(source, std::sqrt(geometry.pixels / static_cast<double>(source.pixels())),
                     unit);
    }
    if (!geometry.height) return of_width(*geometry.width, source, unit);
    if (!geometry.width) return of_height(*geometry.height, source, unit);
    const Size box = {*geometry.width, *geometry.height};
    if (fit == Fit::kExact) return box;
    return fit == Fit::kCover ? covering(source, box, unit) : contained(source, box, unit);
}

// Nothing is changed where that would be against the limit.
Size limited(Size asked, Size source, Limit limit) {
    const bool grows = asked.width > source.width || asked.height > source.height;
    const bool shrinks = asked.width < source.width || asked.height < source.height;
    const bool is_refused =
        (limit == Limit::kOnlyShrinks && grows) || (limit == Limit::kOnlyEnlarges && shrinks);
    return is_refused ? source : asked;
}

Placement placed(Size picture, Size frame, bool keeps_aspect, Gravity gravity, PixelFormat format) {
    int32_t x = (frame.width - picture.width) * gravity.across / 2;
    int32_t y = (frame.height - picture.height) * gravity.down / 2;
    if (unit_of(format) > 1) {
        // A chroma sample covers two pixels each way.
        x -= x % 2;
        y -= y % 2;
    }
    return {true, keeps_aspect, frame, picture, x, y};
}

}  // namespace

Placement place(const Wish& wish, Size source, PixelFormat format) {
    const Geometry geometry = wish.size ? *wish.size : Geometry(wish.canvas.value());
    const Fit fit = wish.fit.value_or(geometry.fit);
    const bool keeps_aspect = fit != Fit::kExact;
    const Size asked = asked_for(geometry, fit, source, unit_of(format));
    const Size size = limited(asked, source, geometry.limit);
    const Size picture = checked_size(size.width, size.height);

    if (wish.canvas) {
        const Size canvas = *wish.canvas;
        if (fit != Fit::kCover &&
            (picture.width > canvas.width || picture.height > canvas.height)) {
            throw Error("a picture of " + to_string(picture) + " does not fit on a canvas of " +
                        to_string(canvas));
        }
        return placed(picture, canvas, keeps_aspect, wish.gravity, format);
    }
    if (fit == Fit::kCover && geometry.width && geometry.height) {
        const Size frame = {std::min(*geometry.width, picture.width),
                            std::min(*geometry.height, picture.height)};
        return placed(picture, frame, keeps_aspect, wish.gravity, format);
    }
    return {false, keeps_aspect, picture, picture, 0, 0};
}

}  // namespace tool
