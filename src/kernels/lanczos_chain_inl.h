// SPDX-License-Identifier: Apache-2.0
// What a Lanczos row is: its definition, for the scalar kernel and for what vector kernels leave
// over. Where the instruction set has a fused multiply-add, the compiler uses it.
#pragma once

#include <math.h>

#include "kernels/lanczos.h"

#if defined(__wasm__)
#include "kernels/exact_fma.h"
#endif

namespace ovrin {

namespace {

uint8_t rounded(double value) {
    const double shifted = value + 0.5;
    if (shifted < 0.0) return 0;
    return shifted > 255.0 ? uint8_t{255} : static_cast<uint8_t>(shifted);
}

double add_tap(double acc, double weight, uint8_t byte) {
#if defined(__wasm__)
    return exact_fma(weight, byte, acc);
#else
    return fma(weight, byte, acc);
#endif
}

// Sum of all taps, which start at byte `first` of the source rows and lie `step` bytes apart.
double sum_of_taps(const LanczosRow& row, const double* column_weights, int64_t first,
                   int64_t step) {
    double acc = 0.0;
    for (int32_t r = 0; r < kLanczosTaps; ++r) {
        for (int32_t i = 0; i < kLanczosTaps; ++i) {
            const double weight = row.weights[r] * column_weights[i];
            acc = add_tap(acc, weight, row.taps[r][first + i * step]);
        }
    }
    return acc;
}

void filter_by_chains(const LanczosRow& row, const LanczosStripPlan& plan, LanczosSums& /*sums*/) {
    const LanczosColumns& columns = *plan.columns;
    const double* weights = columns.weights;
    uint8_t* dst = row.dst;
    for (int32_t x = 0; x < columns.count; ++x) {
        const int64_t first = int64_t{columns.index[x]} * columns.src_components;
        for (int32_t k = 0; k < columns.dst_components; ++k) {
            dst[k] = rounded(sum_of_taps(row, weights, first + k, columns.dst_components));
        }
        weights += kLanczosTaps;
        dst += columns.dst_components;
    }
}

}  // namespace

}  // namespace ovrin
