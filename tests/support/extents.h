// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>

namespace ovrin_test {

struct Sizes {
    int32_t src_w, src_h, dst_w, dst_h;
};

// The bytes that hold a plane's rows of `row_bytes` bytes, `stride` bytes apart, and no more: they
// end with the last row's own bytes, however wide the stride. A negative stride puts the first row
// last in memory. A plane without rows or columns has none.
struct PlaneExtent {
    size_t bytes = 0;
    size_t first = 0;  // where the first row starts

    PlaneExtent(int64_t row_bytes, int64_t rows, int64_t stride) {
        if (row_bytes <= 0 || rows <= 0) return;
        const int64_t distance = stride < 0 ? -stride : stride;
        bytes = static_cast<size_t>((rows - 1) * distance + row_bytes);
        if (stride < 0) first = static_cast<size_t>((rows - 1) * distance);
    }
};

}  // namespace ovrin_test
