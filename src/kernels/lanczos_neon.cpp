// SPDX-License-Identifier: Apache-2.0
// Lanczos rows with NEON; see lanczos_approximation_inl.h for how the byte is decided.
#include <arm_neon.h>
#include <string.h>

#include "kernels/inline.h"
#include "kernels/lanczos_approximation_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kVectorBytes = 16;

// From 2^23 to 2^24 floats are the whole numbers: in the lowest byte of 2^23, whose topmost byte is
// the only other one that is not 0, a byte makes 2^23 more than itself. Lookups and subtractions
// use all vector units of a processor, conversions often one.
constexpr float kWholes = 8388608.0F;
constexpr float kSignedWholes = 12582912.0F;  // in the middle of them: 0 has 16 low bits of 0
constexpr uint8_t kTopOfWholes = 0x4B;
constexpr uint8_t kTop = 16;  // where the lookup finds it
constexpr uint8_t k0 = 0xFF;
constexpr uint8_t kAsWholes[4][kVectorBytes] = {
    {0, k0, k0, kTop, 1, k0, k0, kTop, 2, k0, k0, kTop, 3, k0, k0, kTop},
    {4, k0, k0, kTop, 5, k0, k0, kTop, 6, k0, k0, kTop, 7, k0, k0, kTop},
    {8, k0, k0, kTop, 9, k0, k0, kTop, 10, k0, k0, kTop, 11, k0, k0, kTop},
    {12, k0, k0, kTop, 13, k0, k0, kTop, 14, k0, k0, kTop, 15, k0, k0, kTop},
};

// Three pixels, the last one first, and a fourth one of zeros.
constexpr uint8_t kMirror[kVectorBytes] = {12, 13, 14, 15, 8,  9,  10, 11,
                                           4,  5,  6,  7,  k0, k0, k0, k0};

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

    uint64_t add_block(uint8_t* dst, int32_t first) const {
        // A byte of ones for each uncertain one. Unrolled, compilers mix the groups up and run out
        // of registers.
        uint8_t marks[kBlock * kPixel];
#pragma GCC unroll 1
        for (int32_t i = 0; i < kBlock * kPixel; i += kVectorBytes) {
            vst1q_u8(marks + i, add_group(dst + i, first + i));
        }
        const uint8x16_t bit = vreinterpretq_u8_u64(vdupq_n_u64(0x8040201008040201));
        const auto bits = [&](int32_t i) {
            return vandq_u8(vld1q_u8(marks + i * kVectorBytes), bit);
        };
        const uint8x16_t low = vpaddq_u8(bits(0), bits(1));
        const uint8x16_t high = vpaddq_u8(bits(2), bits(3));
        const uint8x16_t pairs = vpaddq_u8(low, high);
        return vgetq_lane_u64(vreinterpretq_u64_u8(vpaddq_u8(pairs, pairs)), 0);
    }

private:
    // Stores four pixels, and tells which of their bytes are uncertain.
    uint8x16_t add_group(uint8_t* dst, int32_t first) const {
        float32x4_t values[kGroup];
        for (int32_t k = 0; k < kGroup; ++k) {
            values[k] = vmulq_laneq_f32(vld1q_f32(rows_[0] + first + k * kPixel), low_, 0);
        }
        add_row<1>(values, rows_[1] + first, low_);
        add_row<2>(values, rows_[2] + first, low_);
        add_row<3>(values, rows_[3] + first, low_);
        add_row<4>(values, rows_[4] + first, high_);
        add_row<5>(values, rows_[5] + first, high_);
        add_row<6>(values, rows_[6] + first, high_);
        // Rounded to whole numbers, which lie in the low bits.
        const float32x4_t base = vdupq_n_f32(kSignedWholes);
        const float32x4_t wholes[kGroup] = {vaddq_f32(values[0], base), vaddq_f32(values[1], base),
                                            vaddq_f32(values[2], base), vaddq_f32(values[3], base)};
        const auto bits = [&](int32_t i) { return vreinterpretq_u16_f32(wholes[i]); };
        const uint16x8_t low = vuzp1q_u16(bits(0), bits(1));
        const uint16x8_t high = vuzp1q_u16(bits(2), bits(3));
        vst1q_u8(dst, vqmovun_high_s16(vqmovun_s16(vreinterpretq_s16_u16(low)),
                                       vreinterpretq_s16_u16(high)));
        const auto near = [&](int32_t i) {
            return vcgtq_f32(vabdq_f32(values[i], vsubq_f32(wholes[i], base)), certain_);
        };
        return narrow(near(0), near(1), near(2), near(3));
    }

    const float* rows_[kLanczosTaps];
    float32x4_t low_;
    float32x4_t high_;
    float32x4_t certain_;  // the largest distance from a whole number that decides
};

// Chains of bytes from anywhere in a row, two in each of two vectors.
class ChainsOfFour {
public:
    ChainsOfFour(const LanczosColumns& columns, const uint16_t* bytes) {
        for (int32_t k = 0; k < kLanes; ++k) {
            const int32_t x = bytes[k] / kPixel;
            const double* weights = columns.weights + int64_t{x} * kLanczosTaps;
            for (int32_t i = 0; i < kLanczosTaps; ++i) weights_[i][k] = weights[i];
            first_[k] = int64_t{columns.index[x]} * kPixel;
            moves_[k] = moves(k, bytes[k] % kPixel);
        }
    }

    // Adds a source row.
    void add(const uint8_t* taps, double row_weight) {
        uint8x16_t low = vdupq_n_u8(0);
        uint8x16_t high = low;
        for (int32_t k = 0; k < kLanes; ++k) {
            const uint8_t* first = taps + first_[k];
            low = vorrq_u8(low, vqtbl1q_u8(vld1q_u8(first), moves_[k]));
            high = vorrq_u8(high, vqtbl1q_u8(vld1q_u8(first + kHigh * kPixel), moves_[k]));
        }
        const uint16x8_t words[] = {vmovl_u8(vget_low_u8(low)), vmovl_high_u8(low),
                                    vmovl_u8(vget_low_u8(high)), vmovl_high_u8(high)};
        add_tap(0, vmovl_u16(vget_low_u16(words[0])), row_weight);
        add_tap(1, vmovl_high_u16(words[0]), row_weight);
        add_tap(2, vmovl_u16(vget_low_u16(words[1])), row_weight);
        add_tap(3, vmovl_high_u16(words[1]), row_weight);
        add_tap(4, vmovl_high_u16(words[2]), row_weight);
        add_tap(5, vmovl_u16(vget_low_u16(words[3])), row_weight);
        add_tap(6, vmovl_high_u16(words[3]), row_weight);
    }

    // Adds 0.5, truncates and clamps.
    void store(uint8_t* row, const uint16_t* bytes) const {
        const float64x2_t half = vdupq_n_f64(0.5);
        const int32x4_t whole = vcombine_s32(vqmovn_s64(vcvtq_s64_f64(vaddq_f64(low_, half))),
                                             vqmovn_s64(vcvtq_s64_f64(vaddq_f64(high_, half))));
        const int16x4_t words = vqmovn_s32(whole);
        uint8_t results[2 * kLanes];
        vst1_u8(results, vqmovun_s16(vcombine_s16(words, words)));
        for (int32_t k = 0; k < kLanes; ++k) row[bytes[k]] = results[k];
    }

private:
    // Taps come in halves of four: the first ones, and those from this one on.
    static constexpr int32_t kHigh = kLanczosTaps - kLanes;

    // Moves byte `component` of each pixel to its byte `lane`, and zeros to the others.
    static uint8x16_t moves(int32_t lane, int32_t component) {
        static constexpr uint32_t kPixels[] = {0, 4, 8, 12};
        const int32x4_t lane_bits = vdupq_n_s32(8 * lane);
        const uint32x4_t byte =
            vaddq_u32(vld1q_u32(kPixels), vdupq_n_u32(static_cast<uint32_t>(component)));
        const uint32x4_t own = vshlq_u32(vdupq_n_u32(0xFF), lane_bits);
        return vreinterpretq_u8_u32(vornq_u32(vshlq_u32(byte, lane_bits), own));
    }

    void add_tap(int32_t i, uint32x4_t samples, double row_weight) {
        const float64x2_t low = vcvtq_f64_u64(vmovl_u32(vget_low_u32(samples)));
        const float64x2_t high = vcvtq_f64_u64(vmovl_high_u32(samples));
        low_ = vfmaq_f64(low_, vmulq_n_f64(vld1q_f64(weights_[i]), row_weight), low);
        high_ = vfmaq_f64(high_, vmulq_n_f64(vld1q_f64(weights_[i] + 2), row_weight), high);
    }

    float64x2_t low_ = vdupq_n_f64(0.0);
    float64x2_t high_ = vdupq_n_f64(0.0);
    int64_t first_[kLanes];
    uint8x16_t moves_[kLanes];
    double weights_[kLanczosTaps][kLanes];
};

// Whether the weights of every column are the same from either end: those of whole ratios are,
// whose taps lie around a source pixel.
bool is_mirrored(const LanczosStripPlan& plan) {
    for (int32_t x = 0; x < plan.columns->count; ++x) {
        const float* weights = plan.weights[x];
        for (int32_t i = 0; i < kLanczosTaps / 2; ++i) {
            if (weights[i] != weights[kLanczosTaps - 1 - i]) return false;
        }
    }
    return true;
}

// In such a plan the weights of the second half make room for what a whole number's base adds to
// the first product, below 0: a fused operation takes it off for nothing, and rounds once, as a
// product is rounded.
constexpr int32_t kBase = 4;
void plan_bases(LanczosStripPlan& plan) {
    for (int32_t x = 0; x < padded_count(plan); ++x) {
        float* weights = plan.weights[x];
        for (int32_t i = 0; i < kPixel; ++i) weights[kBase + i] = -kWholes * weights[0];
    }
}

// The sums of taps that have the same weight, of two pairs each: what is left to be converted and
// weighed is half as much.
struct TapPairs {
    uint16x8_t outer;  // the first and the last tap, then the second and the last but one
    uint16x8_t inner;  // the third and the last but two, then the middle one alone
};

OVRIN_ALWAYS_INLINE TapPairs add_mirrored_taps(const uint8_t* taps) {
    const uint8x16_t left = vld1q_u8(taps);
    const uint8x16_t right = vqtbl1q_u8(vld1q_u8(taps + 3 * kPixel), vld1q_u8(kMirror));
    return {vaddl_u8(vget_low_u8(left), vget_low_u8(right)), vaddl_high_u8(left, right)};
}

// Numbers as floats, kWholes more than they are.
float32x4_t low_wholes(uint16x8_t numbers) {
    return vreinterpretq_f32_u16(vzip1q_u16(numbers, vdupq_n_u16(kTopOfWholes << 8)));
}

float32x4_t high_wholes(uint16x8_t numbers) {
    return vreinterpretq_f32_u16(vzip2q_u16(numbers, vdupq_n_u16(kTopOfWholes << 8)));
}

struct Neon {
    using WeightedRows = NeonRows;
    static constexpr bool kMirrors = true;

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
        // As pixels, which loads can count in: compilers would multiply four indices in a vector
        // and move them back one by one.
        const auto* pixels = reinterpret_cast<const float(*)[kPixel]>(span);
        const auto tap = [&](int32_t k) { return pixels[plan.index[x + k] - first]; };
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

    static void sum_mirrored_row(float* sums, const LanczosStripPlan& plan, const uint8_t* src) {
        const auto* pixels = reinterpret_cast<const uint8_t(*)[kPixel]>(src);
        const float32x4_t base = vdupq_n_f32(kWholes);
        const int32_t padded = padded_count(plan);
        for (int32_t x = 0; x < padded; x += kGroup) {
            const auto add_taps = [&](int32_t k) {
                return add_mirrored_taps(pixels[plan.index[x + k]]);
            };
            const auto floats = [&](int32_t k, int32_t i) {
                return vld1q_f32(plan.weights[x + k] + i);
            };
            const TapPairs pairs[kGroup] = {add_taps(0), add_taps(1), add_taps(2), add_taps(3)};
            const float32x4_t weights[kGroup] = {floats(0, 0), floats(1, 0), floats(2, 0),
                                                 floats(3, 0)};
            float32x4_t values[kGroup] = {floats(0, kBase), floats(1, kBase), floats(2, kBase),
                                          floats(3, kBase)};
            for (int32_t k = 0; k < kGroup; ++k) {
                values[k] = vfmaq_laneq_f32(values[k], low_wholes(pairs[k].outer), weights[k], 0);
            }
            for (int32_t k = 0; k < kGroup; ++k) {
                const float32x4_t pair = vsubq_f32(high_wholes(pairs[k].outer), base);
                values[k] = vfmaq_laneq_f32(values[k], pair, weights[k], 1);
            }
            for (int32_t k = 0; k < kGroup; ++k) {
                const float32x4_t pair = vsubq_f32(low_wholes(pairs[k].inner), base);
                values[k] = vfmaq_laneq_f32(values[k], pair, weights[k], 2);
            }
            for (int32_t k = 0; k < kGroup; ++k) {
                const float32x4_t middle = vsubq_f32(high_wholes(pairs[k].inner), base);
                vst1q_f32(sums + (x + k) * kPixel,
                          vfmaq_laneq_f32(values[k], middle, weights[k], 3));
            }
        }
    }

    static void run_chains(const LanczosColumns& columns, const LanczosRow& row,
                           const uint16_t* bytes, int32_t count) {
        // One after the other takes less time than eight side by side.
        constexpr int32_t kFew = 2;
        if (count > kFew) return run_chains_of_four<ChainsOfFour>(columns, row, bytes, count);
        for (int32_t i = 0; i < count; ++i) run_chain(columns, row, bytes[i]);
    }
};

}  // namespace

FilterLanczos* plan_lanczos_neon(LanczosStripPlan& plan, const LanczosColumns& columns) {
    FilterLanczos* filter = plan_filter<Neon>(plan, columns);
    plan.mirrored =
        filter == filter_row<Neon> && columns.src_components == kPixel && is_mirrored(plan);
    if (plan.mirrored) plan_bases(plan);
    return filter;
}

}  // namespace ovrin
