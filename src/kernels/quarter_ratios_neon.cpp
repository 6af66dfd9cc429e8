// SPDX-License-Identifier: Apache-2.0
// The simple ratios with NEON: loads that take every second or third sample, and stores that put
// them back in turn. Two groups of vectors at a time, before either is stored: in-order processors
// would otherwise wait for the end of one before they begin the other.
#include <arm_neon.h>

#include "kernels/quarter_ratios_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

// Every second sample, from the first and from the second on. None of these needs alignment.
template <int N>
OVRIN_ALWAYS_INLINE uint8x16x2_t load_by_two(const uint8_t* samples) {
    if constexpr (N == 1) {
        return vld2q_u8(samples);
    } else if constexpr (N == 2) {
        const uint16x8x2_t v = vld2q_u16(reinterpret_cast<const uint16_t*>(samples));
        return {{vreinterpretq_u8_u16(v.val[0]), vreinterpretq_u8_u16(v.val[1])}};
    } else {
        const uint32x4x2_t v = vld2q_u32(reinterpret_cast<const uint32_t*>(samples));
        return {{vreinterpretq_u8_u32(v.val[0]), vreinterpretq_u8_u32(v.val[1])}};
    }
}

template <int N>
OVRIN_ALWAYS_INLINE uint8x16x3_t load_by_three(const uint8_t* samples) {
    if constexpr (N == 1) {
        return vld3q_u8(samples);
    } else if constexpr (N == 2) {
        const uint16x8x3_t v = vld3q_u16(reinterpret_cast<const uint16_t*>(samples));
        return {{vreinterpretq_u8_u16(v.val[0]), vreinterpretq_u8_u16(v.val[1]),
                 vreinterpretq_u8_u16(v.val[2])}};
    } else {
        const uint32x4x3_t v = vld3q_u32(reinterpret_cast<const uint32_t*>(samples));
        return {{vreinterpretq_u8_u32(v.val[0]), vreinterpretq_u8_u32(v.val[1]),
                 vreinterpretq_u8_u32(v.val[2])}};
    }
}

template <int N>
OVRIN_ALWAYS_INLINE void store_by_two(uint8_t* dst, uint8x16x2_t samples) {
    if constexpr (N == 1) {
        vst2q_u8(dst, samples);
    } else if constexpr (N == 2) {
        const uint16x8x2_t v = {
            {vreinterpretq_u16_u8(samples.val[0]), vreinterpretq_u16_u8(samples.val[1])}};
        vst2q_u16(reinterpret_cast<uint16_t*>(dst), v);
    } else {
        const uint32x4x2_t v = {
            {vreinterpretq_u32_u8(samples.val[0]), vreinterpretq_u32_u8(samples.val[1])}};
        vst2q_u32(reinterpret_cast<uint32_t*>(dst), v);
    }
}

template <int N>
OVRIN_ALWAYS_INLINE void store_by_three(uint8_t* dst, uint8x16x3_t samples) {
    if constexpr (N == 1) {
        vst3q_u8(dst, samples);
    } else if constexpr (N == 2) {
        const uint16x8x3_t v = {{vreinterpretq_u16_u8(samples.val[0]),
                                 vreinterpretq_u16_u8(samples.val[1]),
                                 vreinterpretq_u16_u8(samples.val[2])}};
        vst3q_u16(reinterpret_cast<uint16_t*>(dst), v);
    } else {
        const uint32x4x3_t v = {{vreinterpretq_u32_u8(samples.val[0]),
                                 vreinterpretq_u32_u8(samples.val[1]),
                                 vreinterpretq_u32_u8(samples.val[2])}};
        vst3q_u32(reinterpret_cast<uint32_t*>(dst), v);
    }
}

// Of the samples of two vectors the first, or the second, of every two.
template <int N>
OVRIN_ALWAYS_INLINE uint8x16_t even_of_two(uint8x16_t a, uint8x16_t b) {
    if constexpr (N == 1) return vuzp1q_u8(a, b);
    if constexpr (N == 2) {
        return vreinterpretq_u8_u16(vuzp1q_u16(vreinterpretq_u16_u8(a), vreinterpretq_u16_u8(b)));
    }
    return vreinterpretq_u8_u32(vuzp1q_u32(vreinterpretq_u32_u8(a), vreinterpretq_u32_u8(b)));
}

template <int N>
OVRIN_ALWAYS_INLINE uint8x16_t odd_of_two(uint8x16_t a, uint8x16_t b) {
    if constexpr (N == 1) return vuzp2q_u8(a, b);
    if constexpr (N == 2) {
        return vreinterpretq_u8_u16(vuzp2q_u16(vreinterpretq_u16_u8(a), vreinterpretq_u16_u8(b)));
    }
    return vreinterpretq_u8_u32(vuzp2q_u32(vreinterpretq_u32_u8(a), vreinterpretq_u32_u8(b)));
}

OVRIN_ALWAYS_INLINE uint8x16_t quarters(uint8x16_t samples) {
    return vshrq_n_u8(samples, 2);
}

OVRIN_ALWAYS_INLINE uint8x16_t add_quarters(uint8x16_t sums, uint8x16_t samples) {
    return vsraq_n_u8(sums, samples, 2);
}

template <int N>
struct TwoToOne {
    static constexpr SimpleRatio kRatio = kTwoToOne;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        const uint8x16_t first = reduce<kPair>(top, bottom);
        const uint8x16_t second = reduce<kPair>(top + 32, bottom + 32);
        vst1q_u8(dst, first);
        vst1q_u8(dst + 16, second);
    }

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE uint8x16_t reduce(const uint8_t* top, const uint8_t* bottom) {
        if constexpr (N == 1) {
            uint8x16_t a = quarters(vld1q_u8(top));
            uint8x16_t b = quarters(vld1q_u8(top + 16));
            if constexpr (kPair) {
                a = add_quarters(a, vld1q_u8(bottom));
                b = add_quarters(b, vld1q_u8(bottom + 16));
            }
            return vpaddq_u8(a, b);
        } else {
            const uint8x16x2_t upper = load_by_two<N>(top);
            uint8x16_t sums = add_quarters(quarters(upper.val[0]), upper.val[1]);
            if constexpr (kPair) {
                const uint8x16x2_t lower = load_by_two<N>(bottom);
                sums = add_quarters(add_quarters(sums, lower.val[0]), lower.val[1]);
            }
            return sums;
        }
    }
};

// Only the second of every two samples counts; the others are left out before anything is shifted.
template <int N>
struct FourToOne {
    static constexpr SimpleRatio kRatio = kFourToOne;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        const uint8x16_t first = reduce<kPair>(top, bottom);
        const uint8x16_t second = reduce<kPair>(top + 64, bottom + 64);
        vst1q_u8(dst, first);
        vst1q_u8(dst + 16, second);
    }

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE uint8x16_t reduce(const uint8_t* top, const uint8_t* bottom) {
        uint8x16_t a = quarters(odd_samples(top));
        uint8x16_t b = quarters(odd_samples(top + 32));
        if constexpr (kPair) {
            a = add_quarters(a, odd_samples(bottom));
            b = add_quarters(b, odd_samples(bottom + 32));
        }
        if constexpr (N == 1) return vpaddq_u8(a, b);
        return vaddq_u8(even_of_two<N>(a, b), odd_of_two<N>(a, b));
    }

    static OVRIN_ALWAYS_INLINE uint8x16_t odd_samples(const uint8_t* samples) {
        return odd_of_two<N>(vld1q_u8(samples), vld1q_u8(samples + 16));
    }
};

template <int N>
struct ThreeToOne {
    static constexpr SimpleRatio kRatio = kThreeToOne;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        const uint8x16_t first = reduce<kPair>(top, bottom);
        const uint8x16_t second = reduce<kPair>(top + 48, bottom + 48);
        vst1q_u8(dst, first);
        vst1q_u8(dst + 16, second);
    }

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE uint8x16_t reduce(const uint8_t* top, const uint8_t* bottom) {
        const uint8x16x3_t upper = load_by_three<N>(top);
        uint8x16_t sums = add_quarters(quarters(upper.val[0]), upper.val[2]);
        if constexpr (kPair) {
            const uint8x16x3_t lower = load_by_three<N>(bottom);
            sums = add_quarters(add_quarters(sums, lower.val[0]), lower.val[2]);
        }
        return sums;
    }
};

template <int N>
struct ThreeToTwo {
    static constexpr SimpleRatio kRatio = kThreeToTwo;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 64;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        const uint8x16x2_t first = reduce<kPair>(top, bottom);
        const uint8x16x2_t second = reduce<kPair>(top + 48, bottom + 48);
        store_by_two<N>(dst, first);
        store_by_two<N>(dst + 32, second);
    }

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE uint8x16x2_t reduce(const uint8_t* top, const uint8_t* bottom) {
        const uint8x16x3_t upper = load_by_three<N>(top);
        uint8x16_t left = quarters(upper.val[0]);
        uint8x16_t middle = quarters(upper.val[1]);
        uint8x16_t right = quarters(upper.val[2]);
        if constexpr (kPair) {
            const uint8x16x3_t lower = load_by_three<N>(bottom);
            left = add_quarters(left, lower.val[0]);
            middle = add_quarters(middle, lower.val[1]);
            right = add_quarters(right, lower.val[2]);
        }
        return {{vaddq_u8(left, middle), vaddq_u8(middle, right)}};
    }
};

template <int N>
struct TwoToThree {
    static constexpr SimpleRatio kRatio = kTwoToThree;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 96;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        const uint8x16x3_t first = enlarge<kPair>(top, bottom);
        const uint8x16x3_t second = enlarge<kPair>(top + 32, bottom + 32);
        store_by_three<N>(dst, first);
        store_by_three<N>(dst + 48, second);
    }

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE uint8x16x3_t enlarge(const uint8_t* top, const uint8_t* bottom) {
        const uint8x16x2_t upper = load_by_two<N>(top);
        uint8x16_t left = quarters(upper.val[0]);
        uint8x16_t right = quarters(upper.val[1]);
        if constexpr (kPair) {
            const uint8x16x2_t lower = load_by_two<N>(bottom);
            left = add_quarters(left, lower.val[0]);
            right = add_quarters(right, lower.val[1]);
        }
        return {{vaddq_u8(left, left), vaddq_u8(left, right), vaddq_u8(right, right)}};
    }
};

}  // namespace

const QuarterKernels* plan_simple_quarters_neon(QuarterPlan& plan, const QuarterRowShape& shape,
                                                QuarterColumns& columns, int32_t samples) {
    return plan_patterns<TwoToOne<1>, TwoToOne<2>, TwoToOne<4>, ThreeToTwo<1>, ThreeToTwo<2>,
                         ThreeToTwo<4>, FourToOne<1>, FourToOne<2>, FourToOne<4>, ThreeToOne<1>,
                         ThreeToOne<2>, ThreeToOne<4>, TwoToThree<1>, TwoToThree<2>, TwoToThree<4>>(
        plan, shape, columns, samples);
}

}  // namespace ovrin
