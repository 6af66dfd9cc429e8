// SPDX-License-Identifier: Apache-2.0
#include "orientation.h"

#include <algorithm>
#include <utility>
#include <vector>

namespace tool {

namespace {

// An orientation as two steps from the upright picture to the stored one: columns and rows swapped
// or not; then either counted from the other end or not.
struct Steps {
    bool swaps, flips_x, flips_y;
};

Steps steps_of(Orientation orientation) {
    switch (orientation) {
        case Orientation::kUpright:
            return {false, false, false};
        case Orientation::kMirrored:
            return {false, true, false};
        case Orientation::kTurned180:
            return {false, true, true};
        case Orientation::kMirroredTurned180:
            return {false, false, true};
        case Orientation::kMirroredTurned270:
            return {true, false, false};
        case Orientation::kTurned90:
            return {true, false, true};
        case Orientation::kMirroredTurned90:
            return {true, true, true};
        case Orientation::kTurned270:
            break;
    }
    return {true, true, false};
}

template <class Sample>
void turn(const Sample* stored, Size size, Steps steps, Sample* upright) {
    // From one upright sample to the one right of it or below, in the stored picture.
    const ptrdiff_t width = size.width;
    const ptrdiff_t height = size.height;
    const ptrdiff_t stored_right = steps.flips_x ? -1 : 1;
    const ptrdiff_t stored_down = steps.flips_y ? -width : width;
    const ptrdiff_t right = steps.swaps ? stored_down : stored_right;
    const ptrdiff_t down = steps.swaps ? stored_right : stored_down;
    const ptrdiff_t first =
        (steps.flips_x ? width - 1 : 0) + (steps.flips_y ? (height - 1) * width : 0);

    // In squares, whose stored rows stay in the cache while they are read as columns.
    constexpr ptrdiff_t kSquare = 32;
    const Sample* const from = stored + first;
    const ptrdiff_t columns = steps.swaps ? height : width;
    const ptrdiff_t rows = steps.swaps ? width : height;
    for (ptrdiff_t top = 0; top < rows; top += kSquare) {
        for (ptrdiff_t left = 0; left < columns; left += kSquare) {
            const ptrdiff_t bottom = std::min(top + kSquare, rows);
            const ptrdiff_t end = std::min(left + kSquare, columns);
            for (ptrdiff_t y = top; y < bottom; ++y) {
                for (ptrdiff_t x = left; x < end; ++x) {
                    upright[y * columns + x] = from[x * right + y * down];
                }
            }
        }
    }
}

}  // namespace

bool lies_on_its_side(Orientation orientation) {
    return steps_of(orientation).swaps;
}

Size turned(Size size, Orientation orientation) {
    if (lies_on_its_side(orientation)) std::swap(size.width, size.height);
    return size;
}

Picture turned(const Picture& stored, Orientation orientation) {
    Picture upright(turned(stored.size, orientation), stored.format);
    upright.has_alpha = stored.has_alpha;
    upright.is_gray = stored.is_gray;
    const Steps steps = steps_of(orientation);
    if (stored.format == PixelFormat::kRgba) {
        turn(stored.words.data(), stored.size, steps, upright.words.data());
        return upright;
    }
    const std::vector<Plane> from = planes_of(stored.format, stored.size);
    const std::vector<Plane> to = planes_of(upright.format, upright.size);
    for (size_t i = 0; i < from.size(); ++i) {
        turn(stored.bytes() + from[i].offset, from[i].size, steps, upright.bytes() + to[i].offset);
    }
    return upright;
}

Placement stored_placement(const Placement& upright, Orientation orientation) {
    const Steps steps = steps_of(orientation);
    Placement stored = upright;
    stored.result = turned(upright.result, orientation);
    stored.picture = turned(upright.picture, orientation);
    if (steps.swaps) std::swap(stored.x, stored.y);
    if (steps.flips_x) stored.x = stored.result.width - stored.picture.width - stored.x;
    if (steps.flips_y) stored.y = stored.result.height - stored.picture.height - stored.y;
    return stored;
}

}  // namespace tool
