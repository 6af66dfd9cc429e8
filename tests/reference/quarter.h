// SPDX-License-Identifier: Apache-2.0
// The quarter-point rule, written down as plainly as possible. Shares nothing with the library.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace reference {

// Source cell of target k's one-quarter and three-quarter points, S cells scaled to D.
inline int64_t near_cell(int64_t k, int64_t S, int64_t D) {
    return (k * S + (S >> 2)) / D;
}
inline int64_t far_cell(int64_t k, int64_t S, int64_t D) {
    return (k * S + ((3 * S) >> 2)) / D;
}

// A packed picture of `bytes` bytes per pixel.
inline std::vector<uint8_t> quarter_packed(const uint8_t* src, int64_t src_w, int64_t src_h,
                                           int64_t dst_w, int64_t dst_h, int64_t bytes) {
    std::vector<uint8_t> dst(static_cast<size_t>(dst_w * dst_h * bytes));
    for (int64_t j = 0; j < dst_h; ++j) {
        for (int64_t k = 0; k < dst_w; ++k) {
            for (int64_t c = 0; c < bytes; ++c) {
                const int64_t rows[2] = {near_cell(j, src_h, dst_h), far_cell(j, src_h, dst_h)};
                const int64_t columns[2] = {near_cell(k, src_w, dst_w), far_cell(k, src_w, dst_w)};
                int sum = 0;
                for (int64_t row : rows) {
                    for (int64_t column : columns) {
                        sum += src[(row * src_w + column) * bytes + c] >> 2;
                    }
                }
                dst[static_cast<size_t>((j * dst_w + k) * bytes + c)] = static_cast<uint8_t>(sum);
            }
        }
    }
    return dst;
}

}  // namespace reference
