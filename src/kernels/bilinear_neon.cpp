// SPDX-License-Identifier: Apache-2.0
// Blended bilinear rows with NEON, a lane at a time.
#include <arm_neon.h>
#include <string.h>

#include "kernels/bilinear_lanes.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kStepLanes = 4;
constexpr int32_t kStepSums = kStepLanes * kLaneBytes;
constexpr int32_t kStepBytes = 16;  // of a finished row

template <int N>
void prepare(BilinearColumns& columns) {
    prepare_lanes<N, 1, kStepLanes>(columns, 16);
}

// Left and right samples of a lane, blended.
uint32x4_t blend_lane(const uint8_t* row, const BilinearColumns& columns, int32_t lane) {
    const uint8x16_t window = vld1q_u8(row + columns.lane_base[lane]);
    const uint8x16_t shuffle = vld1q_u8(columns.lane_shuffle[lane]);
    // Lookups outside the table give 0: the high bytes of the 16-bit samples.
    const int16x8_t samples = vreinterpretq_s16_u8(vqtbl1q_u8(window, shuffle));
    const int16x8_t weights = vreinterpretq_s16_s32(vld1q_s32(columns.lane_weights[lane]));
    const int32x4_t low = vmull_s16(vget_low_s16(samples), vget_low_s16(weights));
    const int32x4_t high = vmull_high_s16(samples, weights);
    return vreinterpretq_u32_s32(vpaddq_s32(low, high));
}

template <int N>
void across(BilinearSums& sums, const uint8_t* row, const BilinearColumns& columns) {
    if (columns.window_bytes == 0) return bilinear_blend_scalar[N >> 1].across(sums, row, columns);
    const int32_t count = whole_steps(columns.count * N, kStepSums);
    for (int32_t i = 0; i < count; i += kStepSums) {
        for (int32_t k = 0; k < kStepLanes; ++k) {
            vst1q_u32(sums.values + i + k * kLaneBytes,
                      blend_lane(row, columns, i / kLaneBytes + k));
        }
    }
}

// Four target bytes, the top ones of 32-bit numbers. upper * (4096 - wy) + lower * wy with one
// multiplication.
uint32x4_t blend_four(const uint32_t* upper, const uint32_t* lower, uint32_t wy) {
    const uint32x4_t from = vld1q_u32(upper);
    return vmlaq_n_u32(vshlq_n_u32(from, 12), vsubq_u32(vld1q_u32(lower), from), wy);
}

uint8x16_t blend_bytes(const uint32_t* upper, const uint32_t* lower, uint32_t wy) {
    const auto four = [&](int32_t i) {
        return vreinterpretq_u16_u32(blend_four(upper + i, lower + i, wy));
    };
    // The odd 16-bit halves hold the top bytes; of those, the odd bytes are the results.
    const uint16x8_t low = vuzp2q_u16(four(0), four(4));
    const uint16x8_t high = vuzp2q_u16(four(8), four(12));
    return vuzp2q_u8(vreinterpretq_u8_u16(low), vreinterpretq_u8_u16(high));
}

void down(uint8_t* dst, const BilinearSums& upper, const BilinearSums& lower, int32_t wy,
          int32_t bytes) {
    const uint32_t weight = static_cast<uint32_t>(wy);
    int32_t i = 0;
    for (; i + kStepBytes <= bytes; i += kStepBytes) {
        vst1q_u8(dst + i, blend_bytes(upper.values + i, lower.values + i, weight));
    }
    if (i < bytes) {
        uint8_t copy[kStepBytes];
        vst1q_u8(copy, blend_bytes(upper.values + i, lower.values + i, weight));
        memcpy(dst + i, copy, static_cast<size_t>(bytes - i));
    }
}

template <int N>
void prepare_copy(BilinearColumns& columns) {
    for (int32_t window_bytes = 16; window_bytes <= 64; window_bytes *= 2) {
        if (prepare_groups<N>(columns, 16, window_bytes)) return;
    }
}

void copy_of_16(uint8_t* dst, const uint8_t* window, const uint8_t* shuffle) {
    vst1q_u8(dst, vqtbl1q_u8(vld1q_u8(window), vld1q_u8(shuffle)));
}

void copy_of_32(uint8_t* dst, const uint8_t* window, const uint8_t* shuffle) {
    vst1q_u8(dst, vqtbl2q_u8(vld1q_u8_x2(window), vld1q_u8(shuffle)));
}

void copy_of_64(uint8_t* dst, const uint8_t* window, const uint8_t* shuffle) {
    vst1q_u8(dst, vqtbl4q_u8(vld1q_u8_x4(window), vld1q_u8(shuffle)));
}

template <int N>
void copy(uint8_t* dst, const uint8_t* row, const BilinearColumns& columns) {
    if (columns.window_bytes == 0) {
        bilinear_copy_scalar[N >> 1].copy(dst, row, columns);
    } else if (columns.window_bytes == 16) {
        copy_groups<N, 16>(dst, row, columns, copy_of_16);
    } else if (columns.window_bytes == 32) {
        copy_groups<N, 16>(dst, row, columns, copy_of_32);
    } else {
        copy_groups<N, 16>(dst, row, columns, copy_of_64);
    }
}

}  // namespace

const BilinearBlend bilinear_blend_neon[3] = {
    {prepare<1>, across<1>, down}, {prepare<2>, across<2>, down}, {prepare<4>, across<4>, down}};

const BilinearCopy bilinear_copy_neon[3] = {
    {prepare_copy<1>, copy<1>}, {prepare_copy<2>, copy<2>}, {prepare_copy<4>, copy<4>}};

}  // namespace ovrin
