// SPDX-License-Identifier: Apache-2.0
// The inner loops of the library, one table of function pointers per instruction set. Nothing
// outside this folder knows which set is in use.
#pragma once

#include <stdint.h>

namespace ovrin {

// Columns are sampled in strips, so that their plan fits into this fixed storage on the stack.
constexpr int32_t kStripColumns = 1024;

// Where a strip of target samples takes its source samples within a row.
struct ColumnPlan {
    int32_t count;                 // target samples in the strip, at most kStripColumns
    int32_t left[kStripColumns];   // source sample index at each target's quarter point
    int32_t right[kStripColumns];  // ... at its three-quarter point; never less than left
};

// For samples of N bytes (N = 1 to 4), for every target sample i in [0, count) and byte c in [0,
// N):
//
//   store_pair  dst[N*i + c]  = quarters(top, i, c) + quarters(bottom, i, c)
//   add_pair    dst[N*i + c] += quarters(top, i, c) + quarters(bottom, i, c)
//   add_taps    dst[N*i + c] += row[N*taps[i] + c] >> 2
//
//   quarters(row, i, c) = (row[N*left[i] + c] >> 2) + (row[N*right[i] + c] >> 2)
//
// Four quarters reach at most 252, so no byte carries into the next. Additions wrap per byte.
// Only the bytes named here are read or written. No alignment is needed; dst overlaps no source.
struct QuarterKernels {
    void (*store_pair)(uint8_t* dst, const uint8_t* top, const uint8_t* bottom,
                       const ColumnPlan& columns);
    void (*add_pair)(uint8_t* dst, const uint8_t* top, const uint8_t* bottom,
                     const ColumnPlan& columns);
    void (*add_taps)(uint8_t* dst, const uint8_t* row, const int32_t* taps, int32_t count);
};

struct Kernels {
    QuarterKernels quarter[4];  // for samples of 1, 2, 3 and 4 bytes
};

// The plain C++ kernels, which define what every other set must compute.
extern const Kernels scalar_kernels;

// The set in use on this processor.
const Kernels& kernels();

}  // namespace ovrin
