// SPDX-License-Identifier: Apache-2.0
// Nearest neighbour by whole-number steps, written down as plainly as possible.
#pragma once

#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

namespace reference {

// One axis: the ratio rounded to a whole number, and samples half a step in.
struct NearestAxis {
    int32_t step;
    float offset;

    NearestAxis(int32_t src, int32_t dst)
        : step(static_cast<int32_t>(static_cast<double>(src) / static_cast<double>(dst) + 0.5)),
          offset(std::ceil(static_cast<float>(step) * 0.5F)) {
        if (offset < 0) offset = 0;
    }

    int32_t sample(int32_t k) const {
        const float scaled = static_cast<float>(static_cast<double>(step) * k);
        const float moved = scaled + offset;
        return static_cast<int32_t>(moved);
    }
};

// Sizes must not be 0. `dst` is changed only where a sample is written.
inline void nearest(const uint32_t* src, std::vector<uint32_t>& dst, int32_t src_w, int32_t src_h,
                    int32_t dst_w, int32_t dst_h) {
    const NearestAxis columns(src_w, dst_w);
    const NearestAxis rows(src_h, dst_h);
    for (int32_t j = 0; j < dst_h; ++j) {
        int64_t cursor = int64_t{j} * dst_w;
        for (int32_t k = 0; k < dst_w; ++k) {
            const int32_t x = columns.sample(k);
            const int32_t y = rows.sample(j);
            if (x < 0 || x >= src_w || y < 0 || y >= src_h) continue;
            dst[static_cast<size_t>(cursor++)] = src[int64_t{y} * src_w + x];
        }
    }
}

}  // namespace reference
