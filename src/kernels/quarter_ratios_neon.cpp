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
OVRIN_ALWAYS_INLINE uint8x16x4_t load_by_four(const uint8_t* samples) {
    if constexpr (N == 1) {
        return vld4q_u8(samples);
    } else if constexpr (N == 2) {
        const uint16x8x4_t v = vld4q_u16(reinterpret_cast<const uint16_t*>(samples));
        return {{vreinterpretq_u8_u16(v.val[0]), vreinterpretq_u8_u16(v.val[1]),
                 vreinterpretq_u8_u16(v.val[2]), vreinterpretq_u8_u16(v.val[3])}};
    } else {
        const uint32x4x4_t v = vld4q_u32(reinterpret_cast<const uint32_t*>(samples));
        return {{vreinterpretq_u8_u32(v.val[0]), vreinterpretq_u8_u32(v.val[1]),
                 vreinterpretq_u8_u32(v.val[2]), vreinterpretq_u8_u32(v.val[3])}};
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

// Of the samples of two vectors the second of every two.
template <int N>
OVRIN_ALWAYS_INLINE uint8x16_t odd_of_two(uint8x16_t a, uint8x16_t b) {
    if constexpr (N == 1) return vuzp2q_u8(a, b);
    if constexpr (N == 2) {
        return vreinterpretq_u8_u16(vuzp2q_u16(vreinterpretq_u16_u8(a), vreinterpretq_u16_u8(b)));
    }
    return vreinterpretq_u8_u32(vuzp2q_u32(vreinterpretq_u32_u8(a), vreinterpretq_u32_u8(b)));
}

// The sums of every two samples of two vectors. Quarters do not carry: bytes are added, however
// wide the samples are.
template <int N>
OVRIN_ALWAYS_INLINE uint8x16_t add_neighbours(uint8x16_t a, uint8x16_t b) {
    if constexpr (N == 1) return vpaddq_u8(a, b);
    if constexpr (N == 2) {
        return vreinterpretq_u8_u16(vpaddq_u16(vreinterpretq_u16_u8(a), vreinterpretq_u16_u8(b)));
    }
    return vreinterpretq_u8_u32(vpaddq_u32(vreinterpretq_u32_u8(a), vreinterpretq_u32_u8(b)));
}

OVRIN_ALWAYS_INLINE uint8x16_t quarters(uint8x16_t samples) {
    return vshrq_n_u8(samples, 2);
}

OVRIN_ALWAYS_INLINE uint8x16_t add_quarters(uint8x16_t sums, uint8x16_t samples) {
    return vsraq_n_u8(sums, samples, 2);
}

// The quarters of both rows, or of the top one, vector by vector.
template <bool kPair, class Vectors>
OVRIN_ALWAYS_INLINE Vectors add_rows(Vectors top, const Vectors& bottom) {
    constexpr size_t kVectors = sizeof(Vectors) / sizeof(uint8x16_t);
    for (size_t i = 0; i < kVectors; ++i) {
        top.val[i] = quarters(top.val[i]);
        if (kPair) top.val[i] = add_quarters(top.val[i], bottom.val[i]);
    }
    return top;
}

// The same of 16 bytes in memory.
template <bool kPair>
OVRIN_ALWAYS_INLINE uint8x16_t load_quarters(const uint8_t* top, const uint8_t* bottom) {
    const uint8x16_t sums = quarters(vld1q_u8(top));
    return kPair ? add_quarters(sums, vld1q_u8(bottom)) : sums;
}

// The same for both rows without adding shifts: large processors shift in only one of their vector
// units, so what makes one vector of four this way takes less time.
OVRIN_ALWAYS_INLINE uint8x16_t load_halved(const uint8_t* top, const uint8_t* bottom) {
    const uint8x16_t high_bits = vdupq_n_u8(0xFC);
    const uint8x16_t twice =
        vhaddq_u8(vandq_u8(vld1q_u8(top), high_bits), vandq_u8(vld1q_u8(bottom), high_bits));
    return vshrq_n_u8(twice, 1);
}

// Makes two groups of vectors before it stores either.
template <class Pattern>
struct TwoInStep {
    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        constexpr ptrdiff_t kHalf = Pattern::kDstBytes / 2;
        constexpr ptrdiff_t kHalfSrc = src_bytes<Pattern>(kHalf);
        const auto first = Pattern::template make<kPair>(top, bottom);
        const auto second = Pattern::template make<kPair>(top + kHalfSrc, bottom + kHalfSrc);
        Pattern::put(dst, first);
        Pattern::put(dst + kHalf, second);
    }

    static OVRIN_ALWAYS_INLINE void put(uint8_t* dst, uint8x16_t samples) {
        vst1q_u8(dst, samples);
    }
};

// Neighbouring samples are added after the rows are.
template <int N>
struct TwoToOne : TwoInStep<TwoToOne<N>> {
    static constexpr SimpleRatio kRatio = kTwoToOne;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 64;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE uint8x16x2_t make(const uint8_t* top, const uint8_t* bottom) {
        const auto load = [&](int32_t i) { return load_quarters<kPair>(top + i, bottom + i); };
        const uint8x16_t last = kPair && N < 4 ? load_halved(top + 48, bottom + 48) : load(48);
        return {{add_neighbours<N>(load(0), load(16)), add_neighbours<N>(load(32), last)}};
    }

    static OVRIN_ALWAYS_INLINE void put(uint8_t* dst, uint8x16x2_t samples) {
        vst1q_u8(dst, samples.val[0]);
        vst1q_u8(dst + 16, samples.val[1]);
    }
};

// Only the second of every two samples counts; the others are left out before anything is shifted.
template <int N>
struct FourToOne : TwoInStep<FourToOne<N>> {
    static constexpr SimpleRatio kRatio = kFourToOne;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE uint8x16_t make(const uint8_t* top, const uint8_t* bottom) {
        uint8x16_t a = quarters(odd_samples(top));
        uint8x16_t b = quarters(odd_samples(top + 32));
        if constexpr (kPair) {
            a = add_quarters(a, odd_samples(bottom));
            b = add_quarters(b, odd_samples(bottom + 32));
        }
        return add_neighbours<N>(a, b);
    }

    static OVRIN_ALWAYS_INLINE uint8x16_t odd_samples(const uint8_t* samples) {
        return odd_of_two<N>(vld1q_u8(samples), vld1q_u8(samples + 16));
    }
};

template <int N>
struct ThreeToOne : TwoInStep<ThreeToOne<N>> {
    static constexpr SimpleRatio kRatio = kThreeToOne;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE uint8x16_t make(const uint8_t* top, const uint8_t* bottom) {
        const uint8x16x3_t upper = load_by_three<N>(top);
        const uint8x16_t sums = add_quarters(quarters(upper.val[0]), upper.val[2]);
        if (!kPair) return sums;
        const uint8x16x3_t lower = load_by_three<N>(bottom);
        return add_quarters(add_quarters(sums, lower.val[0]), lower.val[2]);
    }
};

template <int N>
struct ThreeToTwo : TwoInStep<ThreeToTwo<N>> {
    static constexpr SimpleRatio kRatio = kThreeToTwo;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 64;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE uint8x16x2_t make(const uint8_t* top, const uint8_t* bottom) {
        const uint8x16x3_t sums = add_rows<kPair>(load_by_three<N>(top), load_by_three<N>(bottom));
        return {{vaddq_u8(sums.val[0], sums.val[1]), vaddq_u8(sums.val[1], sums.val[2])}};
    }

    static OVRIN_ALWAYS_INLINE void put(uint8_t* dst, uint8x16x2_t samples) {
        store_by_two<N>(dst, samples);
    }
};

template <int N>
struct FourToThree : TwoInStep<FourToThree<N>> {
    static constexpr SimpleRatio kRatio = kFourToThree;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 96;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE uint8x16x3_t make(const uint8_t* top, const uint8_t* bottom) {
        const uint8x16x4_t sums = add_rows<kPair>(load_by_four<N>(top), load_by_four<N>(bottom));
        return {{vaddq_u8(sums.val[0], sums.val[1]), vaddq_u8(sums.val[1], sums.val[2]),
                 vaddq_u8(sums.val[3], sums.val[3])}};
    }

    static OVRIN_ALWAYS_INLINE void put(uint8_t* dst, uint8x16x3_t samples) {
        store_by_three<N>(dst, samples);
    }
};

template <int N>
struct TwoToThree : TwoInStep<TwoToThree<N>> {
    static constexpr SimpleRatio kRatio = kTwoToThree;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 96;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE uint8x16x3_t make(const uint8_t* top, const uint8_t* bottom) {
        const uint8x16x2_t sums = add_rows<kPair>(load_by_two<N>(top), load_by_two<N>(bottom));
        return {{vaddq_u8(sums.val[0], sums.val[0]), vaddq_u8(sums.val[0], sums.val[1]),
                 vaddq_u8(sums.val[1], sums.val[1])}};
    }

    static OVRIN_ALWAYS_INLINE void put(uint8_t* dst, uint8x16x3_t samples) {
        store_by_three<N>(dst, samples);
    }
};

}  // namespace

const QuarterKernels* plan_simple_quarters_neon(QuarterPlan& plan, const QuarterRowShape& shape,
                                                QuarterColumns& columns, int32_t samples) {
    return plan_patterns<TwoToOne<1>, TwoToOne<2>, TwoToOne<4>, ThreeToTwo<1>, ThreeToTwo<2>,
                         ThreeToTwo<4>, FourToOne<1>, FourToOne<2>, FourToOne<4>, ThreeToOne<1>,
                         ThreeToOne<2>, ThreeToOne<4>, TwoToThree<1>, TwoToThree<2>, TwoToThree<4>,
                         FourToThree<1>, FourToThree<2>, FourToThree<4>>(plan, shape, columns,
                                                                         samples);
}

}  // namespace ovrin
