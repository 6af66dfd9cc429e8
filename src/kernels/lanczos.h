// SPDX-License-Identifier: Apache-2.0
// The contract of the Lanczos kernels.
#pragma once

#include <stdint.h>

namespace ovrin {

constexpr int32_t kLanczosTaps = 7;

// Neighbouring columns of a picture that is filtered by so many taps in each direction. Its pixels
// are interleaved components.
constexpr int32_t kLanczosColumns = 256;
struct LanczosColumns {
    const double* weights;  // of every column, one for each tap
    int32_t src_components;
    int32_t dst_components;
    int32_t count;
    int32_t index[kLanczosColumns];  // of every column, the pixel of its first tap
};

// How kernels filter a strip of columns: made once, used for every row of the strip. The columns
// that it was made for must stay as they are. The rest is the vector kernels' own.
struct LanczosStripPlan {
    const LanczosColumns* columns;
    double max_weights;  // of any column, the sum of its absolute weights
    bool mirrored;       // every column's weights are the same from either end
    int32_t index[kLanczosColumns];
    alignas(64) float weights[kLanczosColumns][kLanczosTaps + 1];
};

// Source rows filtered across, which kernels keep from one destination row of a strip to the next.
struct LanczosSums {
    int32_t rows[kLanczosTaps];  // the source row of each of the sums; negative: none
    alignas(64) float values[kLanczosTaps][kLanczosColumns * 4];

    // Before the first row of a strip.
    void clear() {
        for (int32_t& row : rows) row = -1;
    }
};

// One destination row of a strip. Rows may come in any order; a source row has the same bytes in
// all of them.
struct LanczosRow {
    uint8_t* dst;
    const uint8_t* taps[kLanczosTaps];  // source rows; pixel 0 of each lies three left of column 0
    int32_t source_rows[kLanczosTaps];  // their numbers: consecutive, or the same at a border
    const double* weights;
};

// For column x of the strip and component k of a destination pixel, with v the row weights and h
// the column's:
//
//   acc = 0; for each tap r of the rows, for each tap i of the columns, in this order:
//       acc = fma(v[r] * h[i], taps[r][index[x] * src_components + i * dst_components + k], acc)
//   dst[x * dst_components + k] = acc + 0.5, truncated, clamped to 0 ... 255
//
// in double precision, each operation rounded once: the order and the fusing are part of the
// result. Of the source rows only bytes from the first to the last of those named are read.
using FilterLanczos = void(const LanczosRow& row, const LanczosStripPlan& plan, LanczosSums& sums);

// Plans columns whose indices never decrease, and returns the kernel to use with the plan.
using PlanLanczos = FilterLanczos*(LanczosStripPlan& plan, const LanczosColumns& columns);

}  // namespace ovrin
