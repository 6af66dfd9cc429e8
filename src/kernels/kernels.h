// SPDX-License-Identifier: Apache-2.0
// The inner loops of the library, one table of function pointers per instruction set. Nothing
// outside this folder knows which set is in use.
#pragma once

#include <stdint.h>

namespace ovrin {

// The source samples of one target sample within a row, as sample indices.
struct Tap {
    int32_t left;   // at the target's quarter point
    int32_t right;  // at its three-quarter point; never less than left
};

// The rows that a plan is for.
struct QuarterRowShape {
    int32_t sample_bytes;    // 1 to 4
    int32_t source_samples;  // in a source row; taps are below this
    int32_t source_extent;   // source_extent / target_extent is the ratio of the two rows
    int32_t target_extent;
    int32_t target_samples;  // still to be planned
};

constexpr int32_t kPlanBytes = 32 * 1024;
constexpr int32_t kPlanTaps = kPlanBytes / static_cast<int32_t>(sizeof(Tap));

// Where a strip of a target row takes its samples: made once per call and strip, in fixed storage
// on the stack, and used for every row of the strip. Each set encodes the taps in its own way.
struct QuarterPlan {
    int32_t sample_bytes;
    int32_t samples;   // in the strip
    int32_t capacity;  // most samples that the strip can take; at least 1
    int32_t windows;   // vector sets: source vectors that a target vector is gathered from; 0: taps
    union {
        alignas(64) Tap taps[kPlanTaps];
        uint8_t bytes[kPlanBytes];
    };
};

// The quarter-point row kernels. begin starts an empty plan; append takes the taps of the next
// `count` samples, in order, until capacity is reached. Then, for every sample i of the strip and
// every byte c of a sample of N bytes:
//
//   store_pair  dst[N*i + c]  = quarters(top, i, c) + quarters(bottom, i, c)
//   add_pair    dst[N*i + c] += quarters(top, i, c) + quarters(bottom, i, c)
//   add_row     dst[N*i + c] += quarters(row, i, c)
//
//   quarters(row, i, c) = (row[N*left + c] >> 2) + (row[N*right + c] >> 2), the taps of sample i
//
// Four quarters reach at most 252, so no byte carries into the next. Additions wrap per byte.
// Reads only bytes of the source_samples of each row; writes only bytes of the strip. No alignment
// is needed; dst overlaps no source.
struct QuarterKernels {
    void (*begin)(QuarterPlan& plan, const QuarterRowShape& shape);
    void (*append)(QuarterPlan& plan, const Tap* taps, int32_t count);
    void (*store_pair)(uint8_t* dst, const uint8_t* top, const uint8_t* bottom,
                       const QuarterPlan& plan);
    void (*add_pair)(uint8_t* dst, const uint8_t* top, const uint8_t* bottom,
                     const QuarterPlan& plan);
    void (*add_row)(uint8_t* dst, const uint8_t* row, const QuarterPlan& plan);
};

// dst[i] = row[taps[i]] for i in [0, count). Reads and writes nothing else.
using CopyTaps4 = void(uint32_t* dst, const uint32_t* row, const int32_t* taps, int32_t count);
constexpr int32_t kCopyTaps = 1024;

struct Kernels {
    QuarterKernels quarter[4];  // for samples of 1, 2, 3 and 4 bytes
    CopyTaps4* copy_taps4;
};

// The plain C++ kernels, which define what every other set must compute.
extern const Kernels scalar_kernels;

// The set in use on this processor.
const Kernels& kernels();

}  // namespace ovrin
