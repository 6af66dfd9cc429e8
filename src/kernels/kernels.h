// SPDX-License-Identifier: Apache-2.0
// The inner loops of the library, one table of function pointers per instruction set. Nothing
// outside this folder knows which set is in use.
#pragma once

#include <stddef.h>
#include <stdint.h>

#include "quarter/points.h"

namespace ovrin {

// The rows that a plan is for.
struct QuarterRowShape {
    int32_t sample_bytes;    // 1 to 4
    int32_t source_samples;  // in a source row; taps are below this
    int32_t source_extent;   // source_extent / target_extent is the ratio of the two rows
    int32_t target_extent;
};

constexpr int32_t kPlanBytes = 32 * 1024;
constexpr int32_t kPlanTaps = kPlanBytes / static_cast<int32_t>(sizeof(Tap));

// Where a strip of a target row takes its samples: made once per call and strip, in fixed storage
// on the stack, and used for every row of the strip. Kernels encode the taps in their own ways.
struct QuarterPlan {
    int32_t sample_bytes;
    int32_t samples;         // in the strip
    int32_t vector_samples;  // vector kernels: in a target vector
    int64_t row_bytes;
    union {
        alignas(64) Tap taps[kPlanTaps];
        uint8_t bytes[kPlanBytes];
    };
};

// The source rows of a target row, and those that will be asked for next, to be fetched meanwhile.
// The next rows may be any.
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
// Reads only bytes of the source_samples of each row; writes only bytes of the strip. No alignment
// is needed; dst overlaps no source.
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

// Columns of a bilinear row, or of a strip of it: for every destination sample the source sample to
// its left and the weight of the one to its right, with 12 fractional bits, 1024 to 5119.
constexpr int32_t kBilinearColumns = 512;
constexpr int32_t kBilinearLanes = kBilinearColumns;
struct BilinearColumns {
    int32_t count;
    int32_t index[kBilinearColumns];
    int32_t weight[kBilinearColumns];
    // How vector kernels gather four bytes, a lane, at a time, or groups of bytes to be copied; set
    // by prepare.
    int32_t window_bytes;  // from which some lanes or a group take theirs; 0: no plan
    int32_t group_bytes;
    int32_t lane_base[kBilinearLanes];
    alignas(64) uint8_t lane_shuffle[kBilinearLanes][16];
    alignas(64) int32_t lane_weights[kBilinearLanes][4];
};

// A source row, blended horizontally for the columns of a strip: for every destination byte a sum
// with 12 fractional bits. What lies behind the last one up to a vector may be overwritten.
struct BilinearSums {
    alignas(64) uint32_t values[kBilinearColumns * 4];
};

// Bilinear rows of samples of N bytes. prepare is called once for columns whose index and weight
// are set; then, with wx and index those of column i, wy the weight of the lower row, and P(row, k)
// = row[N*(index + k) + c], for i in [0, count) and c in [0, N), all modulo 2^32:
//
//   across      sums = P(row, 0) * (4096 - wx) + P(row, 1) * wx
//   vertical    dst = (P(top, 0) * (4096 - wy) + P(bottom, 0) * wy) << 12 >> 24
//   copy        dst = P(row, 0)
//
// at sums or dst[N*i + c], and for i in [0, bytes):
//
//   down        dst[i] = (upper[i] * (4096 - wy) + lower[i] * wy) >> 24
//
// Of the rows only bytes from the first to the last of those named are read; of dst only the bytes
// named are written. No alignment is needed.
struct BilinearBlend {
    void (*prepare)(BilinearColumns& columns);
    void (*across)(BilinearSums& sums, const uint8_t* row, const BilinearColumns& columns);
    void (*down)(uint8_t* dst, const BilinearSums& upper, const BilinearSums& lower, int32_t wy,
                 int32_t bytes);
};
struct BilinearEdges {
    void (*vertical)(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, int32_t wy,
                     const BilinearColumns& columns);
};

// Here prepare plans columns whose index is set, which may come from a caller, in any order.
struct BilinearCopy {
    void (*prepare)(BilinearColumns& columns);
    void (*copy)(uint8_t* dst, const uint8_t* row, const BilinearColumns& columns);
};

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

// dst[i] = src[i * step], for i in [0, count) and a step of 0 or more. `next` is the row that will
// be asked for next. Reads nothing behind the last of these words.
using CopyEvery = void(uint32_t* dst, const uint32_t* src, int32_t step, int32_t count,
                       const uint32_t* next);

struct Kernels {
    PlanQuarters* plan_quarters;
    const BilinearBlend* bilinear_blend;  // these three for samples of 1, 2 and 4 bytes
    const BilinearEdges* bilinear_edges;
    const BilinearCopy* bilinear_copy;
    const LanczosKernels* lanczos;
    CopyEvery* copy_every;
};

// The plain C++ kernels, which define what every other set must compute.
extern const Kernels scalar_kernels;

// The set in use: the best that this processor has.
const Kernels& kernels();

// For tests and benchmarks of the library's objects: all sets that this processor can run, the
// scalar one first, and the choice of one of them for all calls from now on.
struct NamedKernels {
    const char* name;
    const Kernels* kernels;
};
constexpr int32_t kMostSets = 4;
int32_t available_kernels(NamedKernels sets[kMostSets]);
void force_kernels(const Kernels& set);

}  // namespace ovrin
