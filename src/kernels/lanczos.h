// SPDX-License-Identifier: Apache-2.0
// The contract of the Lanczos kernels.
#pragma once

#include <stdint.h>

namespace ovrin {

// Neighbouring columns of a picture that a seven-tap filter makes out of interleaved components,
// and what vector kernels keep of them from row to row.
constexpr int32_t kLanczosColumns = 256;
struct LanczosStrip {
    const double* column_weights;  // per column: seven
    double largest_weights;        // of any column, the sum of its absolute weights; for kernels
    int32_t src_components;
    int32_t dst_components;
    int32_t count;
    int32_t index[kLanczosColumns];  // per column: the first of its seven taps in a source row
    // The rest is the kernels' own.
    int32_t held_rows[7];    // the source row of each of the sums; negative: none
    bool has_small_weights;  // see kSmallWeights
    alignas(64) float sums[7][kLanczosColumns * 4];
    alignas(64) float weights[kLanczosColumns][8];  // with a zero behind the seven
};

// One destination row of a strip. Rows may come in any order; a source row has the same bytes in
// all of them.
struct LanczosRow {
    uint8_t* dst;
    const uint8_t* taps[7];     // source rows; pixel 0 of each lies three left of column 0
    int32_t source_rows[7];     // their numbers: consecutive, or the same at a border
    const double* row_weights;  // seven
};

// Weights of which no seven add up to more than this in absolute value leave room for shortcuts
// that do not change a byte. Those of the kernel add up to 1.55 at most, others may come from a
// caller.
constexpr double kSmallWeights = 1.9;

// prepare is called once for a strip that says where its columns are. Then row computes, for column
// x in [0, count), component k in [0, dst_components), with v the row weights and h the column's:
//
//   acc = 0; for r in [0, 7), for i in [0, 7), in this order:
//       acc = fma(v[r] * h[i], taps[r][index[x] * src_components + i * dst_components + k], acc)
//   dst = acc + 0.5, truncated, clamped to 0 ... 255
//
// in double precision, each operation rounded once: the order and the fusing are part of the
// result. Of the source rows only bytes from the first to the last of those named are read.
struct LanczosKernels {
    void (*prepare)(LanczosStrip& strip);
    void (*row)(LanczosStrip& strip, const LanczosRow& row);
};

}  // namespace ovrin
