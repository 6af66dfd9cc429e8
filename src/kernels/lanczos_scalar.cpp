// SPDX-License-Identifier: Apache-2.0
#include <math.h>

#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kTaps = 7;

uint8_t rounded(double value) {
    const double shifted = value + 0.5;
    if (shifted < 0.0) return 0;
    return shifted > 255.0 ? uint8_t{255} : static_cast<uint8_t>(shifted);
}

// Sum of the 49 taps that start at byte `first` of the source rows.
double sum_of_taps(const LanczosRow& row, const double* column_weights, int64_t first) {
    double acc = 0.0;
    for (int32_t r = 0; r < kTaps; ++r) {
        for (int32_t i = 0; i < kTaps; ++i) {
            const double weight = row.row_weights[r] * column_weights[i];
            acc = fma(weight, row.taps[r][first + int64_t{i} * row.dst_components], acc);
        }
    }
    return acc;
}

}  // namespace

void lanczos_row_scalar(const LanczosRow& row) {
    const double* weights = row.column_weights;
    uint8_t* dst = row.dst;
    for (int32_t x = 0; x < row.count; ++x, weights += kTaps, dst += row.dst_components) {
        const int64_t first = int64_t{row.index[x]} * row.src_components;
        for (int32_t k = 0; k < row.dst_components; ++k) {
            dst[k] = rounded(sum_of_taps(row, weights, first + k));
        }
    }
}

}  // namespace ovrin
