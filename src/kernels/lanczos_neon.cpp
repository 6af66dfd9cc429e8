// SPDX-License-Identifier: Apache-2.0
// Lanczos rows with NEON; see lanczos_approximation_inl.h for how the byte is decided.
#include <arm_neon.h>
#include <string.h>

#include "kernels/lanczos_approximation_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kVectorBytes = 16;

// From 2^23 to 2^24 floats are the whole numbers: in the lowest byte of 2^23, whose topmost byte is
// the only other one that is not 0, a byte makes 2^23 more than itself. Lookups and subtractions
// use all vector units of a processor, conversions often one.
constexpr float kWholes = 8388608.0F;
constexpr uint8_t kTopOfWholes = 0x4B;
constexpr uint8_t kTop = 16;  // where the lookup finds it
constexpr uint8_t k0 = 0xFF;
constexpr uint8_t kAsWholes[4][kVectorBytes] = {
    {0, k0, k0, kTop, 1, k0, k0, kTop, 2, k0, k0, kTop, 3, k0, k0, kTop},
    {4, k0, k0, kTop, 5, k0, k0, kTop, 6, k0, k0, kTop, 7, k0, k0, kTop},
    {8, k0, k0, kTop, 9, k0, k0, kTop, 10, k0, k0, kTop, 11, k0, k0, kTop},
    {12, k0, k0, kTop, 13, k0, k0, kTop, 14, k0, k0, kTop, 15, k0, k0, kTop},
};

// What follows goes through four pixels in step: processors that work in order would wait for each
// sum to be ready before they add to it.

// Adds tap `kTap` of each pixel.
template <int kTap>
void add_tap(float32x4_t (&sums)[kGroup], const float* const (&taps)[kGroup],
             const float32x4_t (&weights)[kGroup]) {
    for (int32_t k = 0; k < kGroup; ++k) {
        const float32x4_t pixel = vld1q_f32(taps[k] + kTap * kPixel);
        sums[k] = vfmaq_laneq_f32(sums[k], pixel, weights[k], kTap % 4);
    }
}

// Begins the sums with tap `kTap` of each pixel.
template <int kTap>
void weigh_tap(float32x4_t (&sums)[kGroup], const float* const (&taps)[kGroup],
               const float32x4_t (&weights)[kGroup]) {
    for (int32_t k = 0; k < kGroup; ++k) {
        const float32x4_t pixel = vld1q_f32(taps[k] + kTap * kPixel);
        sums[k] = vmulq_laneq_f32(pixel, weights[k], kTap % 4);
    }
}

// Adds row `kRow`, whose taps are weighed already, to each pixel.
template <int kRow>
void add_row(float32x4_t (&values)[kGroup], const float* sums, float32x4_t weights) {
    for (int32_t k = 0; k < kGroup; ++k) {
        const float32x4_t pixel = vld1q_f32(sums + k * kPixel);
        values[k] = vfmaq_laneq_f32(values[k], pixel, weights, kRow % 4);
    }
}

uint8x16_t narrow(uint32x4_t a, uint32x4_t b, uint32x4_t c, uint32x4_t d) {
    const uint16x8_t low = vuzp1q_u16(vreinterpretq_u16_u32(a), vreinterpretq_u16_u32(b));
    const uint16x8_t high = vuzp1q_u16(vreinterpretq_u16_u32(c), vreinterpretq_u16_u32(d));
    return vuzp1q_u8(vreinterpretq_u8_u16(low), vreinterpretq_u8_u16(high));
}

// The sums of all source rows, to be weighed and added.
class NeonRows {
public:
    NeonRows(const float* const* rows, const double* weights, float uncertain)
        : low_(vdupq_n_f32(0.0F)), high_(low_), certain_(vdupq_n_f32(0.5F - uncertain)) {
        float floats[kLanczosTaps + 1] = {};
        for (int32_t r = 0; r < kLanczosTaps; ++r) {
            rows_[r] = rows[r];
            floats[r] = static_cast<float>(weights[r]);
        }
        low_ = vld1q_f32(floats);
        high_ = vld1q_f32(floats + 4);
    }

    uint64_t add_block(uint8_t* dst, int32_t x) const {
        const uint32x4_t first = add_group(dst, x);
        const uint32x4_t second = add_group(dst + kVectorBytes, x + kGroup);
        const uint32x4_t third = add_group(dst + 2 * kVectorBytes, x + 2 * kGroup);
        const uint32x4_t fourth = add_group(dst + 3 * kVectorBytes, x + 3 * kGroup);
        // A byte for each pixel, then half of it.
        const uint8x16_t pixels = narrow(first, second, third, fourth);
        const uint8x8_t halves = vshrn_n_u16(vreinterpretq_u16_u8(pixels), 4);
        return vget_lane_u64(vreinterpret_u64_u8(halves), 0);
    }

private:
    // Stores four pixels and tells which of them are uncertain.
    uint32x4_t add_group(uint8_t* dst, int32_t x) const {
        float32x4_t values[kGroup];
        for (int32_t k = 0; k < kGroup; ++k) {
            values[k] = vmulq_laneq_f32(vld1q_f32(rows_[0] + (x + k) * kPixel), low_, 0);
        }
        add_row<1>(values, rows_[1] + x * kPixel, low_);
        add_row<2>(values, rows_[2] + x * kPixel, low_);
        add_row<3>(values, rows_[3] + x * kPixel, low_);
        add_row<4>(values, rows_[4] + x * kPixel, high_);
        add_row<5>(values, rows_[5] + x * kPixel, high_);
        add_row<6>(values, rows_[6] + x * kPixel, high_);
        // Below and above, results are 0 and 255 anyway, and so are these: far from others.
        for (float32x4_t& value : values) value = vmaxq_f32(value, vdupq_n_f32(0.0F));
        for (float32x4_t& value : values) value = vminq_f32(value, vdupq_n_f32(255.0F));
        // Rounded to whole numbers, which lie in the low bits.
        const float32x4_t base = vdupq_n_f32(kWholes);
        const float32x4_t wholes[kGroup] = {vaddq_f32(values[0], base), vaddq_f32(values[1], base),
                                            vaddq_f32(values[2], base), vaddq_f32(values[3], base)};
        const auto bits = [&](int32_t i) { return vreinterpretq_u32_f32(wholes[i]); };
        vst1q_u8(dst, narrow(bits(0), bits(1), bits(2), bits(3)));
        const auto near = [&](int32_t i) {
            return vcgtq_f32(vabdq_f32(values[i], vsubq_f32(wholes[i], base)), certain_);
        };
        return vpmaxq_u32(vpmaxq_u32(near(0), near(1)), vpmaxq_u32(near(2), near(3)));
    }

    const float* rows_[kLanczosTaps];
    float32x4_t low_;
    float32x4_t high_;
    float32x4_t certain_;  // the largest distance from a whole number that decides
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
void run_two_chains(const LanczosColumns& columns, const LanczosRow& row, int32_t a, int32_t b) {
    const double* weights_a = columns.weights + int64_t{a} * kLanczosTaps;
    const double* weights_b = columns.weights + int64_t{b} * kLanczosTaps;
    Chain chain_a;
    Chain chain_b;
    for (int32_t r = 0; r < kLanczosTaps; ++r) {
        const double weight = row.weights[r];
        const uint8_t* taps_a = row.taps[r] + int64_t{columns.index[a]} * kPixel;
        const uint8_t* taps_b = row.taps[r] + int64_t{columns.index[b]} * kPixel;
        for (int32_t i = 0; i < kLanczosTaps; ++i) {
            chain_a.add(taps_a + i * kPixel, weight * weights_a[i]);
            chain_b.add(taps_b + i * kPixel, weight * weights_b[i]);
        }
    }
    chain_a.store(row.dst + int64_t{a} * kPixel);
    chain_b.store(row.dst + int64_t{b} * kPixel);
}

struct Neon {
    using WeightedRows = NeonRows;

    static constexpr int32_t kConverted = kVectorBytes;
    static void convert(float* floats, const uint8_t* bytes) {
        const uint8x16x2_t table = {{vld1q_u8(bytes), vdupq_n_u8(kTopOfWholes)}};
        const float32x4_t base = vdupq_n_f32(kWholes);
        for (int32_t k = 0; k < 4; ++k) {
            const uint8x16_t whole = vqtbl2q_u8(table, vld1q_u8(kAsWholes[k]));
            vst1q_f32(floats + 4 * k, vsubq_f32(vreinterpretq_f32_u8(whole), base));
        }
    }

    static void sum_group(float* sums, const float* span, const LanczosStripPlan& plan, int32_t x,
                          int32_t first) {
        const auto tap = [&](int32_t k) { return span + (plan.index[x + k] - first) * kPixel; };
        const auto weights = [&](int32_t k, int32_t i) {
            return vld1q_f32(plan.weights[x + k] + i);
        };
        const float* const taps[kGroup] = {tap(0), tap(1), tap(2), tap(3)};
        const float32x4_t low[kGroup] = {weights(0, 0), weights(1, 0), weights(2, 0),
                                         weights(3, 0)};
        const float32x4_t high[kGroup] = {weights(0, 4), weights(1, 4), weights(2, 4),
                                          weights(3, 4)};
        float32x4_t even[kGroup];
        float32x4_t odd[kGroup];
        weigh_tap<0>(even, taps, low);
        weigh_tap<1>(odd, taps, low);
        add_tap<2>(even, taps, low);
        add_tap<3>(odd, taps, low);
        add_tap<4>(even, taps, high);
        add_tap<5>(odd, taps, high);
        add_tap<6>(even, taps, high);
        for (int32_t k = 0; k < kGroup; ++k) {
            vst1q_f32(sums + k * kPixel, vaddq_f32(even[k], odd[k]));
        }
    }

    // The last pixel may be computed twice.
    static void run_chains(const LanczosColumns& columns, const LanczosRow& row,
                           const uint8_t* pixels, int32_t count) {
        for (int32_t i = 0; i < count; i += 2) {
            run_two_chains(columns, row, pixels[i], pixels[i + 1 < count ? i + 1 : i]);
        }
    }
};

}  // namespace

FilterLanczos* plan_lanczos_neon(LanczosStripPlan& plan, const LanczosColumns& columns) {
    return plan_filter<Neon>(plan, columns);
}

}  // namespace ovrin
