// SPDX-License-Identifier: Apache-2.0
#include <string.h>

#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr uint32_t kOne = 4096;  // a weight of 1

uint32_t blend(uint32_t first, uint32_t second, int32_t weight) {
    const uint32_t w = static_cast<uint32_t>(weight);
    return first * (kOne - w) + second * w;
}

void prepare(BilinearColumns& columns) {
    columns.window_bytes = 0;
}

template <int N>
void across(BilinearSums& sums, const uint8_t* row, const BilinearColumns& columns) {
    for (int32_t i = 0; i < columns.count; ++i) {
        for (int c = 0; c < N; ++c) {
            const uint8_t* sample = row + int64_t{N} * columns.index[i] + c;
            sums.values[N * i + c] = blend(sample[0], sample[N], columns.weight[i]);
        }
    }
}

void down(uint8_t* dst, const BilinearSums& upper, const BilinearSums& lower, int32_t wy,
          int32_t bytes) {
    for (int32_t i = 0; i < bytes; ++i) {
        dst[i] = static_cast<uint8_t>(blend(upper.values[i], lower.values[i], wy) >> 24);
    }
}

template <int N>
void vertical(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, int32_t wy,
              const BilinearColumns& columns) {
    for (int32_t i = 0; i < columns.count; ++i, dst += N) {
        for (int c = 0; c < N; ++c) {
            const int64_t sample = int64_t{N} * columns.index[i] + c;
            dst[c] = static_cast<uint8_t>(blend(top[sample], bottom[sample], wy) << 12 >> 24);
        }
    }
}

template <int N>
void copy(uint8_t* dst, const uint8_t* row, const BilinearColumns& columns) {
    for (int32_t i = 0; i < columns.count; ++i, dst += N) {
        memcpy(dst, row + int64_t{N} * columns.index[i], N);
    }
}

}  // namespace

const BilinearBlend bilinear_blend_scalar[3] = {
    {prepare, across<1>, down}, {prepare, across<2>, down}, {prepare, across<4>, down}};

const BilinearEdges bilinear_edges_scalar[3] = {{vertical<1>}, {vertical<2>}, {vertical<4>}};

const BilinearCopy bilinear_copy_scalar[3] = {
    {prepare, copy<1>}, {prepare, copy<2>}, {prepare, copy<4>}};

}  // namespace ovrin
