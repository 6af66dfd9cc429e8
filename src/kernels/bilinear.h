// SPDX-License-Identifier: Apache-2.0
// The contract of the bilinear kernels.
#pragma once

#include <stdint.h>

namespace ovrin {

// Fixed point: weights have 12 fractional bits, and what is blended in both directions has 24.
constexpr int32_t kBilinearWeightBits = 12;
constexpr int32_t kBilinearOne = 1 << kBilinearWeightBits;
constexpr int32_t kBilinearResultBits = 2 * kBilinearWeightBits;

// Columns of a bilinear row, or of a strip of it: for every destination sample the source sample to
// its left, and the weight of the one to its right, 1024 to 5119.
constexpr int32_t kBilinearColumns = 512;
struct BilinearColumns {
    int32_t sample_bytes;  // 1, 2 or 4
    int32_t count;
    int32_t to_right;  // from the left samples to the right ones: 1, or 0 where they are the same
    int32_t index[kBilinearColumns];
    int32_t weight[kBilinearColumns];
};

// How kernels find the samples of a strip: made once, used for every row of it. The columns that it
// was made for must stay as they are. Vector kernels gather four bytes, a quad, at a time, or
// groups of more.
constexpr int32_t kBilinearQuads = kBilinearColumns;
struct BilinearPlan {
    const BilinearColumns* columns;
    int32_t windows[kBilinearQuads];  // where in a row the bytes of a quad or a group lie
    alignas(64) uint8_t shuffles[kBilinearQuads][16];
    union {
        alignas(64) int32_t weight_pairs[kBilinearQuads][4];
        int16_t left_weights[kBilinearColumns * 4];
    };

    int32_t bytes() const { return columns->count * columns->sample_bytes; }
};

// A source row, blended horizontally for the columns of a strip: for every destination byte a sum
// with 12 fractional bits, shifted to where the kernels want it. What lies past the last one up to
// a vector may be overwritten.
struct BilinearSums {
    alignas(64) uint32_t values[kBilinearColumns * 4];
};

// Parts of two source rows that will be asked for next, to be fetched meanwhile.
struct BilinearNext {
    const uint8_t* rows[2];
    int64_t bytes;
};

// Row kernels for a plan. For every column i, with the weight wx, and every byte c of a sample of N
// bytes, modulo 2^32:
//
//   across  sums[N*i + c] = (left * (4096 - wx) + right * wx) << sum_shift
//   copy    dst[N*i + c] = left
//
//   left = row[N*index + c], right = row[N*(index + to_right) + c], index being column i's
//
// and for every byte i of the strip, with wy the weight of the lower row and upper and lower sums
// that `across` makes, before they are shifted:
//
//   down    dst[i] = (upper[i] * (4096 - wy) + lower[i] * wy) >> 24
//
// Of a row only bytes from the first to the last of those named are read; of dst only the bytes
// named are written. No alignment is needed.
using BilinearAcross = void(BilinearSums& sums, const uint8_t* row, const BilinearPlan& plan);
using BilinearDown = void(uint8_t* dst, const BilinearSums& upper, const BilinearSums& lower,
                          int32_t wy, const BilinearPlan& plan, const BilinearNext& next);
using BilinearCopy = void(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan);

struct BilinearKernels {
    BilinearAcross* across;
    BilinearDown* down;
    int32_t sum_shift = 0;
};

// Plans columns that are to be blended, whose indices never decrease, and returns the kernels to
// use with the plan: what is fastest depends on the ratio.
using PlanBilinear = BilinearKernels(BilinearPlan& plan, const BilinearColumns& columns);

// The same for columns that are to be copied, in whatever order; they need no weights.
using PlanBilinearCopy = BilinearCopy*(BilinearPlan& plan, const BilinearColumns& columns);

}  // namespace ovrin
