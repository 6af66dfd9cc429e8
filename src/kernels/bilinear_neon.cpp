// SPDX-License-Identifier: Apache-2.0
// Blended bilinear rows with NEON, a lane at a time.
#include <arm_neon.h>
#include <string.h>

#include "kernels/bilinear_lanes.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kStepLanes = 4;  // lanes whose bytes fill a vector
constexpr int32_t kStepBytes = kStepLanes * kLaneBytes;

// Left and right samples of a lane, blended: four sums with 12 fractional bits.
uint32x4_t blend_right(const uint8_t* row, const BilinearColumns& columns, int32_t lane) {
    const uint8x16_t window = vld1q_u8(row + columns.lane_base[lane]);
    const uint8x16_t shuffle = vld1q_u8(columns.lane_shuffle[lane]);
    // Lookups outside the table give 0: the high bytes of the 16-bit samples.
    const int16x8_t samples = vreinterpretq_s16_u8(vqtbl1q_u8(window, shuffle));
    const int16x8_t weights = vreinterpretq_s16_s32(vld1q_s32(columns.lane_weights[lane]));
    const int32x4_t low = vmull_s16(vget_low_s16(samples), vget_low_s16(weights));
    const int32x4_t high = vmull_high_s16(samples, weights);
    return vreinterpretq_u32_s32(vpaddq_s32(low, high));
}

// Four target bytes as 32-bit numbers, in their top bytes.
uint32x4_t blend(const uint8_t* top, const uint8_t* bottom, uint32_t wy,
                 const BilinearColumns& columns, int32_t lane) {
    const uint32x4_t upper = vmulq_n_u32(blend_right(top, columns, lane), 4096 - wy);
    return vmlaq_n_u32(upper, blend_right(bottom, columns, lane), wy);
}

// 16 target bytes.
uint8x16_t blend_step(const uint8_t* top, const uint8_t* bottom, uint32_t wy,
                      const BilinearColumns& columns, int32_t lane) {
    const auto four = [&](int32_t i) {
        return vreinterpretq_u16_u32(blend(top, bottom, wy, columns, lane + i));
    };
    // The odd 16-bit halves hold the top bytes; of those, the odd bytes are the results.
    const uint16x8_t low = vuzp2q_u16(four(0), four(1));
    const uint16x8_t high = vuzp2q_u16(four(2), four(3));
    return vuzp2q_u8(vreinterpretq_u8_u16(low), vreinterpretq_u8_u16(high));
}

template <int N>
void prepare(BilinearColumns& columns) {
    prepare_lanes<N>(columns, kStepLanes);
}

template <int N>
void both(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, int32_t wy,
          const BilinearColumns& columns) {
    if (columns.lanes == 0)
        return bilinear_blend_scalar[N >> 1].both(dst, top, bottom, wy, columns);
    const uint32_t weight = static_cast<uint32_t>(wy);
    const int32_t bytes = columns.count * N;
    int32_t lane = 0;
    for (int32_t done = kStepBytes; done <= bytes; done += kStepBytes, lane += kStepLanes) {
        vst1q_u8(dst, blend_step(top, bottom, weight, columns, lane));
        dst += kStepBytes;
    }
    if (bytes % kStepBytes != 0) {
        uint8_t copy[kStepBytes];
        vst1q_u8(copy, blend_step(top, bottom, weight, columns, lane));
        memcpy(dst, copy, static_cast<size_t>(bytes % kStepBytes));
    }
}

}  // namespace

const BilinearBlend bilinear_blend_neon[3] = {
    {prepare<1>, both<1>}, {prepare<2>, both<2>}, {prepare<4>, both<4>}};

}  // namespace ovrin
