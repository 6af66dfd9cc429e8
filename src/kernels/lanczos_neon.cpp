// SPDX-License-Identifier: Apache-2.0
// Lanczos rows with NEON; see lanczos_approximation.h for how the byte is decided.
#include <arm_neon.h>
#include <string.h>

#include "kernels/lanczos_approximation.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kVectorBytes = 16;

void convert_vector(float* floats, const uint8_t* bytes) {
    const uint8x16_t sixteen = vld1q_u8(bytes);
    const uint16x8_t low = vmovl_u8(vget_low_u8(sixteen));
    const uint16x8_t high = vmovl_high_u8(sixteen);
    vst1q_f32(floats, vcvtq_f32_u32(vmovl_u16(vget_low_u16(low))));
    vst1q_f32(floats + 4, vcvtq_f32_u32(vmovl_high_u16(low)));
    vst1q_f32(floats + 8, vcvtq_f32_u32(vmovl_u16(vget_low_u16(high))));
    vst1q_f32(floats + 12, vcvtq_f32_u32(vmovl_high_u16(high)));
}

// Seven taps of a pixel.
float32x4_t weigh_taps(const float* taps, const float* weights) {
    const float32x4_t low = vld1q_f32(weights);       // taps 0 to 3
    const float32x4_t high = vld1q_f32(weights + 4);  // taps 4 to 6
    const auto pixel = [&](int32_t i) { return vld1q_f32(taps + i * kPixel); };
    float32x4_t even = vmulq_laneq_f32(pixel(0), low, 0);
    float32x4_t odd = vmulq_laneq_f32(pixel(1), low, 1);
    even = vfmaq_laneq_f32(even, pixel(2), low, 2);
    odd = vfmaq_laneq_f32(odd, pixel(3), low, 3);
    even = vfmaq_laneq_f32(even, pixel(4), high, 0);
    odd = vfmaq_laneq_f32(odd, pixel(5), high, 1);
    even = vfmaq_laneq_f32(even, pixel(6), high, 2);
    return vaddq_f32(even, odd);
}

uint8x16_t narrow(uint32x4_t a, uint32x4_t b, uint32x4_t c, uint32x4_t d) {
    const uint16x8_t low = vuzp1q_u16(vreinterpretq_u16_u32(a), vreinterpretq_u16_u32(b));
    const uint16x8_t high = vuzp1q_u16(vreinterpretq_u16_u32(c), vreinterpretq_u16_u32(d));
    return vuzp1q_u8(vreinterpretq_u8_u16(low), vreinterpretq_u8_u16(high));
}

// Seven rows of sums, to be weighed and added.
class NeonSums {
public:
    NeonSums(const float* const* rows, const double* weights, float uncertain)
        : low_(vdupq_n_f32(0.0F)), high_(low_), uncertain_(vdupq_n_f32(uncertain)) {
        float floats[kTaps + 1] = {};
        for (int32_t r = 0; r < kTaps; ++r) {
            rows_[r] = rows[r];
            floats[r] = static_cast<float>(weights[r]);
        }
        low_ = vld1q_f32(floats);
        high_ = vld1q_f32(floats + 4);
    }

    uint64_t add_block(uint8_t* dst, int32_t x) const {
        uint32x4_t near[4];
        for (int32_t i = 0; i < 4; ++i) {
            near[i] = add_group(dst + i * kVectorBytes, x + i * kGroup);
        }
        // A byte for each pixel, then half of it.
        const uint8x16_t pixels = narrow(near[0], near[1], near[2], near[3]);
        const uint8x8_t halves = vshrn_n_u16(vreinterpretq_u16_u8(pixels), 4);
        return vget_lane_u64(vreinterpret_u64_u8(halves), 0);
    }

private:
    // Stores four pixels and tells which of them are uncertain.
    uint32x4_t add_group(uint8_t* dst, int32_t x) const {
        const float32x4_t values[] = {add_pixel(x), add_pixel(x + 1), add_pixel(x + 2),
                                      add_pixel(x + 3)};
        const auto whole = [&](int32_t i) { return vcvtq_u32_f32(values[i]); };
        vst1q_u8(dst, narrow(whole(0), whole(1), whole(2), whole(3)));
        const auto near = [&](int32_t i) {
            return vcltq_f32(vabdq_f32(values[i], vrndnq_f32(values[i])), uncertain_);
        };
        return vpmaxq_u32(vpmaxq_u32(near(0), near(1)), vpmaxq_u32(near(2), near(3)));
    }

    // One pixel, 0.5 added. Below and above, results are 0 and 255 anyway, and so are these: far
    // from others.
    float32x4_t add_pixel(int32_t x) const {
        const auto row = [&](int32_t r) { return vld1q_f32(rows_[r] + x * kPixel); };
        const float32x4_t half = vdupq_n_f32(0.5F);
        float32x4_t value = vfmaq_laneq_f32(half, row(0), low_, 0);
        value = vfmaq_laneq_f32(value, row(1), low_, 1);
        value = vfmaq_laneq_f32(value, row(2), low_, 2);
        value = vfmaq_laneq_f32(value, row(3), low_, 3);
        value = vfmaq_laneq_f32(value, row(4), high_, 0);
        value = vfmaq_laneq_f32(value, row(5), high_, 1);
        value = vfmaq_laneq_f32(value, row(6), high_, 2);
        return vminq_f32(vmaxq_f32(value, half), vdupq_n_f32(255.5F));
    }

    const float* rows_[kTaps];
    float32x4_t low_;
    float32x4_t high_;
    float32x4_t uncertain_;
};

// The chain of one pixel, two components per vector.
struct Chain {
    float64x2_t low = vdupq_n_f64(0.0);
    float64x2_t high = vdupq_n_f64(0.0);

    void add(const uint8_t* pixel, double weight) {
        uint32_t bytes;
        memcpy(&bytes, pixel, sizeof bytes);
        const uint8x8_t eight = vcreate_u8(bytes);
        const uint32x4_t words = vmovl_u16(vget_low_u16(vmovl_u8(eight)));
        low = vfmaq_n_f64(low, vcvtq_f64_u64(vmovl_u32(vget_low_u32(words))), weight);
        high = vfmaq_n_f64(high, vcvtq_f64_u64(vmovl_high_u32(words)), weight);
    }

    void store(uint8_t* dst) const {
        const float64x2_t half = vdupq_n_f64(0.5);
        const int32x4_t whole = vcombine_s32(vqmovn_s64(vcvtq_s64_f64(vaddq_f64(low, half))),
                                             vqmovn_s64(vcvtq_s64_f64(vaddq_f64(high, half))));
        const int16x4_t words = vqmovn_s32(whole);
        const uint8x8_t bytes = vqmovun_s16(vcombine_s16(words, words));
        const uint32_t pixel = vget_lane_u32(vreinterpret_u32_u8(bytes), 0);
        memcpy(dst, &pixel, sizeof pixel);
    }
};

// Two pixels side by side, to hide the latency.
void run_two_chains(const LanczosStrip& strip, const LanczosRow& row, int32_t a, int32_t b) {
    const double* weights_a = strip.column_weights + int64_t{a} * kTaps;
    const double* weights_b = strip.column_weights + int64_t{b} * kTaps;
    Chain chain_a;
    Chain chain_b;
    for (int32_t r = 0; r < kTaps; ++r) {
        const double weight = row.row_weights[r];
        const uint8_t* taps_a = row.taps[r] + int64_t{strip.index[a]} * kPixel;
        const uint8_t* taps_b = row.taps[r] + int64_t{strip.index[b]} * kPixel;
        for (int32_t i = 0; i < kTaps; ++i) {
            chain_a.add(taps_a + i * kPixel, weight * weights_a[i]);
            chain_b.add(taps_b + i * kPixel, weight * weights_b[i]);
        }
    }
    chain_a.store(row.dst + int64_t{a} * kPixel);
    chain_b.store(row.dst + int64_t{b} * kPixel);
}

struct Neon {
    using Sums = NeonSums;

    static void convert(float* floats, const uint8_t* bytes, int32_t count) {
        for (int32_t i = 0; i < count - kVectorBytes; i += kVectorBytes) {
            convert_vector(floats + i, bytes + i);
        }
        const int32_t last = count - kVectorBytes;
        convert_vector(floats + last, bytes + last);
    }

    static void sum_group(float* sums, const float* span, const LanczosStrip& strip, int32_t x,
                          int32_t first) {
        for (int32_t i = 0; i < kGroup; ++i) {
            const float* taps = span + (strip.index[x + i] - first) * kPixel;
            vst1q_f32(sums + i * kPixel, weigh_taps(taps, strip.weights[x + i]));
        }
    }

    // The last pixel may be computed twice.
    static void run_chains(const LanczosStrip& strip, const LanczosRow& row, const int32_t* columns,
                           int32_t count) {
        for (int32_t i = 0; i < count; i += 2) {
            run_two_chains(strip, row, columns[i], columns[i + 1 < count ? i + 1 : i]);
        }
    }
};

}  // namespace

const LanczosKernels lanczos_neon = {prepare, filter_row<Neon>};

}  // namespace ovrin
