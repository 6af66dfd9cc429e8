// SPDX-License-Identifier: Apache-2.0
// How vector kernels decide the bytes of a Lanczos row without computing every one exactly.
//
// The result is defined by a chain of 49 double-precision operations per component. For four
// components a pixel is first computed in single precision, columns before rows, which takes 14
// operations instead of 49. Where its distance from the exact sum cannot matter, that decides the
// byte; elsewhere the chain does, four components side by side.
//
// How far the two lie apart, with u = 2^-24, and V and H the sums of the absolute row and column
// weights. A weight rounded to single precision is off by 1 u of its size, and seven fused steps
// add 7 u: a column sum lies within 8 u * 255 V of the exact one. A pixel sums seven of those, none
// larger than 255 V (1 + 8 u), with weights off by 1 u, and in as many steps: together 17 u * 255 V
// H, and a little for products of errors. Adding 0.5 costs at most 2^-17, half a unit of values up
// to 512. V and H are at most kSmallWeights, 1.9, so the bound is 17 * 255 * 1.9^2 / 2^24 + 2^-17,
// below 0.000941. The rounding of the chain itself, some 1e-12, is lost in what is left to
// kUncertain.
//
// For inclusion by kernel files only: everything has internal linkage, because each of them is
// compiled for another instruction set.
#pragma once

#include <math.h>

#include "kernels/kernels.h"

namespace ovrin {

namespace {

constexpr int32_t kTaps = 7;
constexpr int32_t kPixel = 4;           // components
constexpr float kUncertain = 0.00097F;  // distance from a boundary within which the chain decides
constexpr int32_t kSpanPixels = 1024;   // source pixels whose column sums are held at once

// Column sums of a span of source pixels. One pixel more than the last tap's is read, with weight
// 0.
struct ColumnSums {
    alignas(32) float values[(kSpanPixels + 4) * kPixel];
};

// The sums from float `done` on, one by one, and zeros for the pixel behind them.
void sum_last_columns(ColumnSums& sums, const LanczosRow& row, int64_t first, int32_t done,
                      int32_t floats) {
    for (int32_t i = done; i < floats; ++i) {
        float sum = 0.0F;
        for (int32_t r = 0; r < kTaps; ++r) {
            sum = fmaf(static_cast<float>(row.row_weights[r]), row.taps[r][first + i], sum);
        }
        sums.values[i] = sum;
    }
    for (int32_t i = 0; i < kPixel; ++i) sums.values[floats + i] = 0.0F;
}

// Pixels of the row from `x` on whose taps lie within one span.
int32_t pixels_in_span(const LanczosRow& row, int32_t x) {
    const int32_t end = row.index[x] + kSpanPixels - kTaps;
    int32_t count = 1;
    while (x + count < row.count && row.index[x + count] <= end) ++count;
    return count;
}

}  // namespace

}  // namespace ovrin
