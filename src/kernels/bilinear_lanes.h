// SPDX-License-Identifier: Apache-2.0
// How the vector sets plan a bilinear strip. Four target bytes, a lane, take their eight source
// bytes from one 16-byte window of each row by a byte shuffle that also widens them: left and right
// sample of each byte lie side by side as 16-bit numbers, ready to be multiplied by a pair of
// weights.
//
// For inclusion by kernel files only: everything has internal linkage, because each of them is
// compiled for another instruction set.
#pragma once

#include "kernels/kernels.h"

namespace ovrin {

namespace {

constexpr int32_t kWindowBytes = 16;
constexpr int32_t kLaneBytes = 4;
constexpr uint8_t kZeroByte = 0x80;  // a shuffle gives 0 for it

// Two 16-bit weights of a target byte: the left sample's in the low half.
int32_t weight_pair(int32_t weight) {
    return static_cast<int32_t>(static_cast<uint32_t>(weight) << 16 |
                                (static_cast<uint32_t>(4096 - weight) & 0xFFFF));
}

// Plans whole lanes, up to a multiple of `step`; those behind the last byte repeat it. Windows stay
// between the first and the last byte that the columns name; where they do not fit there are no
// lanes.
template <int N>
void prepare_lanes(BilinearColumns& columns, int32_t step) {
    columns.lanes = 0;
    if (columns.count < 1) return;
    const int32_t bytes = columns.count * N;
    const int64_t begin = int64_t{N} * columns.index[0];
    const int64_t last_base = int64_t{N} * (columns.index[columns.count - 1] + 2) - kWindowBytes;
    if (last_base < begin || last_base > INT32_MAX) return;
    const int32_t steps = (bytes + step * kLaneBytes - 1) / (step * kLaneBytes);
    const int32_t lanes = steps * step;
    if (lanes > kBilinearLanes) return;
    for (int32_t lane = 0; lane < lanes; ++lane) {
        const auto byte_at = [&](int32_t byte) { return byte < bytes ? byte : bytes - 1; };
        const int64_t first = int64_t{N} * columns.index[byte_at(lane * kLaneBytes) / N];
        const int64_t base = first < last_base ? first : last_base;
        columns.lane_base[lane] = static_cast<int32_t>(base);
        for (int32_t i = 0; i < kLaneBytes; ++i) {
            const int32_t byte = byte_at(lane * kLaneBytes + i);
            const int64_t left = int64_t{N} * columns.index[byte / N] + byte % N - base;
            if (left + N >= kWindowBytes) return;
            uint8_t* shuffle = columns.lane_shuffle[lane] + i * 4;
            shuffle[0] = static_cast<uint8_t>(left);
            shuffle[1] = kZeroByte;
            shuffle[2] = static_cast<uint8_t>(left + N);
            shuffle[3] = kZeroByte;
            columns.lane_weights[lane][i] = weight_pair(columns.weight[byte / N]);
        }
    }
    columns.lanes = lanes;
}

}  // namespace

}  // namespace ovrin
