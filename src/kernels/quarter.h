// SPDX-License-Identifier: Apache-2.0
// The contract of the quarter-point kernels.
#pragma once

#include <stdint.h>

#include "kernels/quarter_points.h"

namespace ovrin {

// The rows that a plan is for.
struct QuarterRowShape {
    int32_t sample_bytes;  // 1 to 4
    int32_t src_columns;   // samples in a source row; taps are below this
    int32_t dst_columns;   // samples in a destination row
};

constexpr int32_t kPlanBytes = 32 * 1024;
constexpr int32_t kPlanTaps = kPlanBytes / static_cast<int32_t>(sizeof(Tap));

// Where a strip of a destination row takes its samples: made once per call and strip, in fixed
// storage on the stack, and used for every row of the strip. Kernels encode the taps in their own
// ways.
struct QuarterPlan {
    int32_t sample_bytes;
    int32_t samples;         // in the strip
    int32_t vector_samples;  // vector kernels: in a destination vector
    int32_t repeating;       // vector kernels: vectors, from the first on, that share shuffles
    int64_t row_bytes;
    int64_t first_byte;  // kernels of simple ratios: of the strip's first group, in a source row
    union {
        alignas(64) Tap taps[kPlanTaps];
        uint8_t bytes[kPlanBytes];
    };
};

// The source rows of a destination row, and those that the next call will ask for, which kernels
// may prefetch. They never read the next rows, whose pointers need not be valid.
struct QuarterRows {
    const uint8_t* top;
    const uint8_t* bottom;
    const uint8_t* next_top;
    const uint8_t* next_bottom;
};

// Row kernels that share a way of encoding a plan. For every sample i of the strip and every byte c
// of a sample of N bytes:
//
//   store_pair  dst[N*i + c]  = quarters(top, i, c) + quarters(bottom, i, c)
//   add_pair    dst[N*i + c] += quarters(top, i, c) + quarters(bottom, i, c)
//   add_row     dst[N*i + c] += quarters(top, i, c)
//
//   quarters(row, i, c) = (row[N*left + c] >> 2) + (row[N*right + c] >> 2), the taps of sample i
//
// Four quarters reach at most 252, so no byte carries into the next. Additions wrap per byte.
// Reads only bytes of the src_columns samples of each row; writes only bytes of the strip. No
// alignment is needed; dst overlaps no source.
using QuarterKernel = void(uint8_t* dst, const QuarterRows& rows, const QuarterPlan& plan);
struct QuarterKernels {
    QuarterKernel* store_pair;
    QuarterKernel* add_pair;
    QuarterKernel* add_row;
};

// Plans the samples whose columns come next: `samples` of them, or as many as the plan has room
// for, but at least one. Returns the kernels to use with the plan: what is fastest depends on the
// ratio.
using PlanQuarters = const QuarterKernels&(QuarterPlan& plan, const QuarterRowShape& shape,
                                           QuarterColumns& columns, int32_t samples);

// The same for rows with one of the ratios that a set has kernels for; null, and nothing is
// changed, for all others.
using PlanSimpleQuarters = const QuarterKernels*(QuarterPlan& plan, const QuarterRowShape& shape,
                                                 QuarterColumns& columns, int32_t samples);

}  // namespace ovrin
