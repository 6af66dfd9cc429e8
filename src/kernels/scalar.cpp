// SPDX-License-Identifier: Apache-2.0
#include "kernels/kernels.h"

namespace ovrin {

namespace {

uint8_t quarter(uint8_t sample) {
    return static_cast<uint8_t>(sample >> 2);
}

uint8_t sum(int a, int b) {
    return static_cast<uint8_t>(a + b);
}

// Byte i of the pair's target row, i counted over samples of N bytes.
template <int N>
uint8_t pair_sum(const uint8_t* top, const uint8_t* bottom, int64_t left, int64_t right, int c) {
    return sum(quarter(top[N * left + c]) + quarter(top[N * right + c]),
               quarter(bottom[N * left + c]) + quarter(bottom[N * right + c]));
}

template <int N>
void store_pair(uint8_t* dst, const uint8_t* top, const uint8_t* bottom,
                const ColumnPlan& columns) {
    for (int32_t i = 0; i < columns.count; ++i, dst += N) {
        for (int c = 0; c < N; ++c) {
            dst[c] = pair_sum<N>(top, bottom, columns.left[i], columns.right[i], c);
        }
    }
}

template <int N>
void add_pair(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const ColumnPlan& columns) {
    for (int32_t i = 0; i < columns.count; ++i, dst += N) {
        for (int c = 0; c < N; ++c) {
            dst[c] = sum(dst[c], pair_sum<N>(top, bottom, columns.left[i], columns.right[i], c));
        }
    }
}

template <int N>
void add_taps(uint8_t* dst, const uint8_t* row, const int32_t* taps, int32_t count) {
    for (int32_t i = 0; i < count; ++i, dst += N) {
        for (int c = 0; c < N; ++c) dst[c] = sum(dst[c], quarter(row[N * int64_t{taps[i]} + c]));
    }
}

template <int N>
constexpr QuarterKernels quarter_kernels() {
    return {store_pair<N>, add_pair<N>, add_taps<N>};
}

void copy_taps4(uint32_t* dst, const uint32_t* row, const int32_t* taps, int32_t count) {
    for (int32_t i = 0; i < count; ++i) dst[i] = row[taps[i]];
}

}  // namespace

constexpr Kernels scalar_kernels = {
    {quarter_kernels<1>(), quarter_kernels<2>(), quarter_kernels<3>(), quarter_kernels<4>()},
    copy_taps4,
};

}  // namespace ovrin
