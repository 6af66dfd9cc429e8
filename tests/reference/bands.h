// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace reference {

// Rows in a band: the ratio of the source's rows to the destination's, doubled until it passes 31.
inline int32_t band_height(int32_t src_h, int32_t dst_h) {
    int32_t ratio = src_h / dst_h;
    if (ratio <= 0) return 32;
    while (ratio <= 31) ratio *= 2;
    return ratio;
}

// Bands that `rows` rows make, halves counting as one.
inline int32_t band_count(int32_t rows, int32_t height) {
    return (rows + (height >> 1)) / height;
}

}  // namespace reference
