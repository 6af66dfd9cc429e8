// SPDX-License-Identifier: Apache-2.0
// How the vector sets plan a bilinear strip. Four target bytes, a lane, take their eight source
// bytes from one window of each row by a byte shuffle that also widens them: left and right sample
// of each byte lie side by side as 16-bit numbers, ready to be multiplied by a pair of weights.
// Sets with wide shuffles serve several lanes from one window.
#pragma once

#include <string.h>

#include "kernels/bilinear.h"

namespace ovrin {

namespace {

constexpr int32_t kLaneBytes = 4;
constexpr uint8_t kZeroByte = 0x80;  // a shuffle gives 0 for it

// Two 16-bit weights of a target byte: the left sample's in the low half.
int32_t weight_pair(int32_t weight) {
    return static_cast<int32_t>(static_cast<uint32_t>(weight) << 16 |
                                (static_cast<uint32_t>(4096 - weight) & 0xFFFF));
}

// A multiple of `step` that is not below `bytes`.
int32_t whole_steps(int32_t bytes, int32_t step) {
    return (bytes + step - 1) / step * step;
}

// Plans a lane whose window begins `base` bytes into a row. False: the window does not reach.
template <int N>
bool plan_lane(BilinearColumns& columns, int32_t lane, int64_t base, int32_t window_bytes) {
    const int32_t bytes = columns.count * N;
    for (int32_t i = 0; i < kLaneBytes; ++i) {
        const int32_t wanted = lane * kLaneBytes + i;
        const int32_t byte = wanted < bytes ? wanted : bytes - 1;
        const int64_t left = int64_t{N} * columns.index[byte / N] + byte % N - base;
        if (left < 0 || left + N >= window_bytes) return false;
        uint8_t* shuffle = columns.lane_shuffle[lane] + i * 4;
        shuffle[0] = static_cast<uint8_t>(left);
        shuffle[1] = kZeroByte;
        shuffle[2] = static_cast<uint8_t>(left + N);
        shuffle[3] = kZeroByte;
        columns.lane_weights[lane][i] = weight_pair(columns.weight[byte / N]);
    }
    columns.lane_base[lane] = static_cast<int32_t>(base);
    return true;
}

// Plans windows of kLanes lanes each, up to a multiple of kStepLanes lanes; lanes behind the last
// byte repeat it. Windows stay between the first and the last byte that the columns name; where
// they do not fit, or lanes not into them, there is no plan.
template <int N, int kLanes, int kStepLanes>
void prepare_lanes(BilinearColumns& columns, int32_t window_bytes) {
    columns.window_bytes = 0;
    if (columns.count < 1) return;
    const int64_t begin = int64_t{N} * columns.index[0];
    const int64_t last_base = int64_t{N} * (columns.index[columns.count - 1] + 2) - window_bytes;
    if (last_base < begin || last_base > INT32_MAX) return;
    const int32_t lanes = whole_steps(columns.count * N, kStepLanes * kLaneBytes) / kLaneBytes;
    for (int32_t lane = 0; lane < lanes; ++lane) {
        const int32_t column = lane / kLanes * kLanes * kLaneBytes / N;
        const int64_t first =
            column < columns.count ? int64_t{N} * columns.index[column] : last_base;
        const int64_t base = first < last_base ? first : last_base;
        if (!plan_lane<N>(columns, lane, base, window_bytes)) return;
    }
    columns.window_bytes = window_bytes;
}

// Plans copies of groups of bytes by a byte shuffle of a window each, the shuffles one behind the
// other; bytes behind the last one repeat it. Windows stay between the first and the last byte that
// the columns name. False: they do not fit, or groups not into them, and there is no plan.
template <int N>
bool prepare_groups(BilinearColumns& columns, int32_t group_bytes, int32_t window_bytes) {
    columns.window_bytes = 0;
    if (columns.count < 1) return false;
    const int64_t begin = int64_t{N} * columns.index[0];
    const int64_t last_base = int64_t{N} * (columns.index[columns.count - 1] + 1) - window_bytes;
    if (last_base < begin || last_base > INT32_MAX) return false;
    const int32_t bytes = columns.count * N;
    uint8_t* shuffle = columns.lane_shuffle[0];
    for (int32_t i = 0; i < bytes; i += group_bytes) {
        const int64_t first = int64_t{N} * columns.index[i / N];
        const int64_t base = first < last_base ? first : last_base;
        columns.lane_base[i / group_bytes] = static_cast<int32_t>(base);
        for (int32_t k = i; k < i + group_bytes; ++k) {
            const int32_t byte = k < bytes ? k : bytes - 1;
            const int64_t from = int64_t{N} * columns.index[byte / N] + byte % N - base;
            if (from < 0 || from >= window_bytes) return false;
            shuffle[k] = static_cast<uint8_t>(from);
        }
    }
    columns.window_bytes = window_bytes;
    columns.group_bytes = group_bytes;
    return true;
}

// Calls copy_group(dst, window, shuffle) for every group, the last of them into a copy if it is not
// whole.
template <int N, int kGroupBytes, class CopyGroup>
void copy_groups(uint8_t* dst, const uint8_t* row, const BilinearColumns& columns,
                 const CopyGroup& copy_group) {
    const int32_t bytes = columns.count * N;
    const uint8_t* shuffle = columns.lane_shuffle[0];
    const int32_t* base = columns.lane_base;
    int32_t i = 0;
    for (; i + kGroupBytes <= bytes; i += kGroupBytes) {
        copy_group(dst + i, row + *base++, shuffle + i);
    }
    if (i < bytes) {
        uint8_t copy[kGroupBytes];
        copy_group(copy, row + *base, shuffle + i);
        memcpy(dst + i, copy, static_cast<size_t>(bytes - i));
    }
}

}  // namespace

}  // namespace ovrin
