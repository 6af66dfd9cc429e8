// SPDX-License-Identifier: Apache-2.0
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr uint32_t kOne = 4096;  // a weight of 1

uint32_t blend(uint32_t first, uint32_t second, int32_t weight) {
    const uint32_t w = static_cast<uint32_t>(weight);
    return first * (kOne - w) + second * w;
}

template <int N>
uint32_t blend_right(const uint8_t* row, int32_t index, int32_t weight, int c) {
    const uint8_t* sample = row + int64_t{N} * index + c;
    return blend(sample[0], sample[N], weight);
}

template <int N>
void both(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const int32_t* index,
          const int32_t* wx, int32_t wy, int32_t count) {
    for (int32_t i = 0; i < count; ++i, dst += N) {
        for (int c = 0; c < N; ++c) {
            const uint32_t upper = blend_right<N>(top, index[i], wx[i], c);
            const uint32_t lower = blend_right<N>(bottom, index[i], wx[i], c);
            dst[c] = static_cast<uint8_t>(blend(upper, lower, wy) >> 24);
        }
    }
}

template <int N>
void vertical(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const int32_t* index,
              int32_t wy, int32_t count) {
    for (int32_t i = 0; i < count; ++i, dst += N) {
        for (int c = 0; c < N; ++c) {
            const int64_t sample = int64_t{N} * index[i] + c;
            dst[c] = static_cast<uint8_t>(blend(top[sample], bottom[sample], wy) << 12 >> 24);
        }
    }
}

template <int N>
void horizontal(uint8_t* dst, const uint8_t* row, const int32_t* index, const int32_t* wx,
                int32_t count) {
    for (int32_t i = 0; i < count; ++i, dst += N) {
        for (int c = 0; c < N; ++c) {
            dst[c] = static_cast<uint8_t>(blend_right<N>(row, index[i], wx[i], c) << 12 >> 24);
        }
    }
}

template <int N>
void copy(uint8_t* dst, const uint8_t* row, const int32_t* index, int32_t count) {
    for (int32_t i = 0; i < count; ++i, dst += N) {
        for (int c = 0; c < N; ++c) dst[c] = row[int64_t{N} * index[i] + c];
    }
}

template <int N>
constexpr BilinearKernels kernels_of() {
    return {both<N>, vertical<N>, horizontal<N>, copy<N>};
}

}  // namespace

const BilinearKernels bilinear_scalar[3] = {kernels_of<1>(), kernels_of<2>(), kernels_of<4>()};

}  // namespace ovrin
