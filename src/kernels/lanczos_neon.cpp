// SPDX-License-Identifier: Apache-2.0
// Lanczos rows with NEON; see lanczos_approximation.h for how the byte is decided.
#include <arm_neon.h>
#include <string.h>

#include "kernels/lanczos_approximation.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

// Sums of `floats` bytes from `first` on, weighted by row. floats is a multiple of 4.
void sum_columns(ColumnSums& sums, const LanczosRow& row, int64_t first, int32_t floats) {
    float weights[kTaps];
    for (int32_t r = 0; r < kTaps; ++r) weights[r] = static_cast<float>(row.row_weights[r]);
    int32_t i = 0;
    for (; i + 8 <= floats; i += 8) {
        float32x4_t low = vdupq_n_f32(0.0F);
        float32x4_t high = low;
        for (int32_t r = 0; r < kTaps; ++r) {
            const uint16x8_t words = vmovl_u8(vld1_u8(row.taps[r] + first + i));
            low = vfmaq_n_f32(low, vcvtq_f32_u32(vmovl_u16(vget_low_u16(words))), weights[r]);
            high = vfmaq_n_f32(high, vcvtq_f32_u32(vmovl_high_u16(words)), weights[r]);
        }
        vst1q_f32(sums.values + i, low);
        vst1q_f32(sums.values + i + 4, high);
    }
    sum_last_columns(sums, row, first, i, floats);
}

// One pixel in single precision, 0.5 added.
float32x4_t approximate_pixel(const float* sums, const double* weights) {
    const auto pair = [&](int32_t i) { return vcvt_f32_f64(vld1q_f64(weights + i)); };
    const float32x4_t low = vcombine_f32(pair(0), pair(2));   // taps 0 to 3
    const float32x4_t high = vcombine_f32(pair(3), pair(5));  // taps 3 to 6
    const auto pixel = [&](int32_t i) { return vld1q_f32(sums + i * kPixel); };
    float32x4_t even = vmulq_laneq_f32(pixel(0), low, 0);
    float32x4_t odd = vmulq_laneq_f32(pixel(1), low, 1);
    even = vfmaq_laneq_f32(even, pixel(2), low, 2);
    odd = vfmaq_laneq_f32(odd, pixel(3), low, 3);
    even = vfmaq_laneq_f32(even, pixel(4), high, 1);
    odd = vfmaq_laneq_f32(odd, pixel(5), high, 2);
    even = vfmaq_laneq_f32(even, pixel(6), high, 3);
    return vaddq_f32(vaddq_f32(even, odd), vdupq_n_f32(0.5F));
}

bool is_uncertain(float32x4_t value) {
    const float32x4_t whole = vrndnq_f32(value);
    const uint32x4_t near = vcltq_f32(vabdq_f32(value, whole), vdupq_n_f32(kUncertain));
    const uint32x4_t inside =
        vandq_u32(vcgeq_f32(whole, vdupq_n_f32(1.0F)), vcleq_f32(whole, vdupq_n_f32(255.0F)));
    return vmaxvq_u32(vandq_u32(near, inside)) != 0;
}

void store_pixel(uint8_t* dst, int16x4_t whole) {
    const uint8x8_t bytes = vqmovun_s16(vcombine_s16(whole, whole));
    const uint32_t word = vget_lane_u32(vreinterpret_u32_u8(bytes), 0);
    memcpy(dst, &word, sizeof word);
}

// The chain itself, one component per lane. `first`: byte of the first tap in each row.
void exact_pixel(uint8_t* dst, const LanczosRow& row, const double* weights, int64_t first) {
    float64x2_t low = vdupq_n_f64(0.0);
    float64x2_t high = low;
    for (int32_t r = 0; r < kTaps; ++r) {
        const uint8_t* taps = row.taps[r] + first;
        for (int32_t i = 0; i < kTaps; ++i, taps += kPixel) {
            const double weight = row.row_weights[r] * weights[i];
            const float64x2_t first_two = {static_cast<double>(taps[0]),
                                           static_cast<double>(taps[1])};
            const float64x2_t last_two = {static_cast<double>(taps[2]),
                                          static_cast<double>(taps[3])};
            low = vfmaq_n_f64(low, first_two, weight);
            high = vfmaq_n_f64(high, last_two, weight);
        }
    }
    const float64x2_t half = vdupq_n_f64(0.5);
    const int32x4_t whole = vcombine_s32(vqmovn_s64(vcvtq_s64_f64(vaddq_f64(low, half))),
                                         vqmovn_s64(vcvtq_s64_f64(vaddq_f64(high, half))));
    store_pixel(dst, vqmovn_s32(whole));
}

void filter_pixels(const LanczosRow& row) {
    ColumnSums sums;
    for (int32_t x = 0; x < row.count;) {
        const int32_t end = x + pixels_in_span(row, x);
        const int32_t first = row.index[x];
        sum_columns(sums, row, int64_t{first} * kPixel,
                    (row.index[end - 1] - first + kTaps) * kPixel);
        for (; x < end; ++x) {
            const double* weights = row.column_weights + int64_t{x} * kTaps;
            uint8_t* dst = row.dst + int64_t{x} * kPixel;
            const float32x4_t value =
                approximate_pixel(sums.values + (row.index[x] - first) * kPixel, weights);
            if (is_uncertain(value)) {
                exact_pixel(dst, row, weights, int64_t{row.index[x]} * kPixel);
            } else {
                store_pixel(dst, vqmovn_s32(vcvtq_s32_f32(value)));
            }
        }
    }
}

}  // namespace

void lanczos_row_neon(const LanczosRow& row) {
    if (row.has_small_weights && row.src_components == kPixel && row.dst_components == kPixel) {
        filter_pixels(row);
    } else {
        lanczos_row_scalar(row);
    }
}

}  // namespace ovrin
