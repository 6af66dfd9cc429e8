// SPDX-License-Identifier: Apache-2.0
// How a picture is cut into bands.
#pragma once

#include <cstdint>

namespace reference {

// Source rows in a band: the height ratio, doubled until it passes 31, so that a whole ratio puts
// every cut on a destination row.
inline int64_t band_height(int64_t src_h, int64_t dst_h) {
    const int64_t ratio = dst_h == 0 ? 0 : src_h / dst_h;
    if (ratio <= 0) return 32;
    int64_t rows = ratio;
    while (rows <= 31) rows *= 2;
    return rows;
}

// The number of whole bands nearest to src_h.
inline int64_t band_count(int64_t src_h, int64_t dst_h) {
    const int64_t rows = band_height(src_h, dst_h);
    return (src_h + (rows >> 1)) / rows;
}

// The same where destination rows are cut, as the engines do.
inline int64_t destination_band_count(int64_t src_h, int64_t dst_h) {
    const int64_t rows = band_height(src_h, dst_h);
    return (dst_h + (rows >> 1)) / rows;
}

}  // namespace reference
