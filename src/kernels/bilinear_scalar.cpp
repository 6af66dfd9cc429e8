// SPDX-License-Identifier: Apache-2.0
#include <string.h>

#include "kernels/sets.h"

namespace ovrin {

namespace {

uint32_t blend(uint32_t first, uint32_t second, int32_t weight) {
    return first * static_cast<uint32_t>(kBilinearOne - weight) +
           second * static_cast<uint32_t>(weight);
}

template <int N>
void across(BilinearSums& sums, const uint8_t* row, const BilinearPlan& plan) {
    const BilinearColumns& columns = *plan.columns;
    const int32_t right = N * columns.to_right;
    for (int32_t i = 0; i < columns.count; ++i) {
        for (int c = 0; c < N; ++c) {
            const uint8_t* sample = row + int64_t{N} * columns.index[i] + c;
            sums.values[N * i + c] = blend(sample[0], sample[right], columns.weight[i]);
        }
    }
}

void down(uint8_t* dst, const BilinearSums& upper, const BilinearSums& lower, int32_t wy,
          const BilinearPlan& plan, const BilinearNext& /*next*/) {
    const int32_t bytes = plan.bytes();
    for (int32_t i = 0; i < bytes; ++i) {
        const uint32_t result = blend(upper.values[i], lower.values[i], wy);
        dst[i] = static_cast<uint8_t>(result >> kBilinearResultBits);
    }
}

template <int N>
void copy(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan) {
    const BilinearColumns& columns = *plan.columns;
    for (int32_t i = 0; i < columns.count; ++i, dst += N) {
        memcpy(dst, row + int64_t{N} * columns.index[i], N);
    }
}

}  // namespace

BilinearKernels plan_bilinear_scalar(BilinearPlan& plan, const BilinearColumns& columns) {
    plan.columns = &columns;
    if (columns.sample_bytes == 1) return {across<1>, down};
    if (columns.sample_bytes == 2) return {across<2>, down};
    return {across<4>, down};
}

BilinearCopy* plan_bilinear_copy_scalar(BilinearPlan& plan, const BilinearColumns& columns) {
    plan.columns = &columns;
    if (columns.sample_bytes == 1) return copy<1>;
    if (columns.sample_bytes == 2) return copy<2>;
    return copy<4>;
}

}  // namespace ovrin
