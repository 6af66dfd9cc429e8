// SPDX-License-Identifier: Apache-2.0
// When a picture is cut into bands, and how high they are.
#pragma once

#include <stdint.h>

namespace ovrin {

// Pictures of this many rows or more are cut into bands.
constexpr int32_t kThreadedRows = 1024;

// Workers of the pool that a threaded call makes, whatever the machine has.
constexpr int32_t kBandThreads = 4;

// Rows in a band: at least 32, and a multiple of the whole-number ratio of source to destination
// rows, so that with an exact ratio every band ends where a destination row ends.
inline int32_t band_height(int32_t src_rows, int32_t dst_rows) {
    const int64_t ratio = dst_rows == 0 ? 0 : int64_t{src_rows} / dst_rows;
    if (ratio <= 0 || ratio > INT32_MAX) return 32;
    int32_t height = static_cast<int32_t>(ratio);
    while (height <= 31) height *= 2;
    return height;
}

// Bands in `rows` rows, to the nearest whole band; the last one takes what is left.
inline int32_t band_count(int32_t rows, int32_t height) {
    return static_cast<int32_t>((int64_t{rows} + (height >> 1)) / height);
}

// Bands of a picture that is cut by its source rows; fewer than two are not worth any thread.
inline int32_t picture_bands(int32_t src_rows, int32_t dst_rows) {
    return band_count(src_rows, band_height(src_rows, dst_rows));
}

}  // namespace ovrin
