// SPDX-License-Identifier: Apache-2.0
// Chroma is sampled on a grid: the destination size rounded up to multiples of 4. A destination
// that is such a grid takes the samples itself; of any other, only the part that it has room for is
// kept.
#pragma once

#include "canvas/yuv420_layout.h"

namespace ovrin {

constexpr int32_t kGridStep = 4;
constexpr int32_t kLargestGridSize = INT32_MAX / kGridStep * kGridStep;

inline bool is_grid_size(int32_t size) {
    return size % kGridStep == 0;
}

inline int32_t rounded_up_to_grid(int32_t size) {
    return static_cast<int32_t>((int64_t{size} + (kGridStep - 1)) / kGridStep * kGridStep);
}

inline bool is_own_grid(const Yuv420Layout& picture) {
    return is_grid_size(picture.width) && is_grid_size(picture.height);
}

// Empty pictures, and the three largest sizes that 32 bits can name, have none.
inline bool has_grid(const Yuv420Layout& picture) {
    return !picture.is_empty() && picture.width <= kLargestGridSize &&
           picture.height <= kLargestGridSize;
}

// Only for pictures that have one.
inline Yuv420Layout grid_of(const Yuv420Layout& picture) {
    return {picture.format, rounded_up_to_grid(picture.width), rounded_up_to_grid(picture.height)};
}

}  // namespace ovrin
