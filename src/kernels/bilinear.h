// SPDX-License-Identifier: Apache-2.0
// The contract of the bilinear kernels.
#pragma once

#include <stdint.h>

namespace ovrin {

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

}  // namespace ovrin
