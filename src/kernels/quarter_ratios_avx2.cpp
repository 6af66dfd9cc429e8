// SPDX-License-Identifier: Apache-2.0
// The simple ratios with AVX2, 32 destination bytes at a time.
#include <immintrin.h>

#include "kernels/quarter_averages_x86_inl.h"
#include "kernels/quarter_ratios_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

OVRIN_ALWAYS_INLINE __m256i load_cleared(const uint8_t* bytes) {
    return clear_low_bits(_mm256_loadu_si256(reinterpret_cast<const __m256i*>(bytes)));
}

OVRIN_ALWAYS_INLINE __m256i load_cleared(const uint8_t* low, const uint8_t* high) {
    const __m256i lanes = _mm256_inserti128_si256(
        _mm256_castsi128_si256(_mm_loadu_si128(reinterpret_cast<const __m128i*>(low))),
        _mm_loadu_si128(reinterpret_cast<const __m128i*>(high)), 1);
    return clear_low_bits(lanes);
}

// Twice the quarters of both rows, or of the top one, from bytes `offset` on, or of two lanes.
template <bool kPair, class... Offsets>
OVRIN_ALWAYS_INLINE __m256i twice(const uint8_t* top, const uint8_t* bottom, Offsets... offset) {
    const __m256i cleared = load_cleared(top + offset...);
    return kPair ? _mm256_avg_epu8(cleared, load_cleared(bottom + offset...)) : halve(cleared);
}

// Sums of bytes and their right neighbours, halved, in 16 bits each.
OVRIN_ALWAYS_INLINE __m256i add_neighbours(__m256i bytes) {
    return _mm256_srli_epi16(_mm256_maddubs_epi16(bytes, _mm256_set1_epi8(1)), 1);
}

template <int kControl>
OVRIN_ALWAYS_INLINE __m256i shuffle_words(__m256i a, __m256i b) {
    return _mm256_castps_si256(
        _mm256_shuffle_ps(_mm256_castsi256_ps(a), _mm256_castsi256_ps(b), kControl));
}

OVRIN_ALWAYS_INLINE __m256i shuffle_bytes(__m256i bytes, __m128i order) {
    return _mm256_shuffle_epi8(bytes, _mm256_broadcastsi128_si256(order));
}

// After packing of two vectors, quarters of the first and of the second vector alternate.
OVRIN_ALWAYS_INLINE __m256i order_two(__m256i packed) {
    return _mm256_permute4x64_epi64(packed, 0xD8);
}

// The same after packing of four, by words.
OVRIN_ALWAYS_INLINE __m256i order_four(__m256i packed) {
    return _mm256_permutevar8x32_epi32(packed, _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7));
}

OVRIN_ALWAYS_INLINE void store_vector(uint8_t* dst, __m256i samples) {
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst), samples);
}

// Halves every two neighbouring pairs of bytes of each 16-byte lane to one: those of a, then of b.
OVRIN_ALWAYS_INLINE __m256i average_pairs(__m256i a, __m256i b) {
    const __m256i even = _mm256_blend_epi16(a, _mm256_slli_epi32(b, 16), 0xAA);
    const __m256i odd = _mm256_blend_epi16(_mm256_srli_epi32(a, 16), b, 0xAA);
    return shuffle_bytes(_mm256_avg_epu8(even, odd),
                         _mm_setr_epi8(0, 1, 4, 5, 8, 9, 12, 13, 2, 3, 6, 7, 10, 11, 14, 15));
}

template <int N>
struct TwoToOne {
    static constexpr SimpleRatio kRatio = kTwoToOne;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        const __m256i a = twice<kPair>(top, bottom, 0);
        const __m256i b = twice<kPair>(top, bottom, 32);
        store_vector(dst, order_two(reduce(a, b)));
    }

    static OVRIN_ALWAYS_INLINE __m256i reduce(__m256i a, __m256i b) {
        if (N == 1) return _mm256_packus_epi16(add_neighbours(a), add_neighbours(b));
        if (N == 2) return average_pairs(a, b);
        return _mm256_avg_epu8(shuffle_words<0x88>(a, b), shuffle_words<0xDD>(a, b));
    }
};

template <int N>
struct FourToOne {
    static constexpr SimpleRatio kRatio = kFourToOne;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        if (N == 4) return store_words<kPair>(dst, top, bottom);
        const __m256i a = odd_of_two<kPair>(top, bottom);
        const __m256i b = odd_of_two<kPair>(top + 64, bottom + 64);
        store_vector(dst, order_four(TwoToOne<N>::reduce(a, b)));
    }

    // The second of every two samples.
    template <bool kPair>
    static OVRIN_ALWAYS_INLINE __m256i odd_of_two(const uint8_t* top, const uint8_t* bottom) {
        const __m256i a = twice<kPair>(top, bottom, 0);
        const __m256i b = twice<kPair>(top, bottom, 32);
        if (N == 1) return _mm256_packus_epi16(_mm256_srli_epi16(a, 8), _mm256_srli_epi16(b, 8));
        return _mm256_packus_epi32(_mm256_srli_epi32(a, 16), _mm256_srli_epi32(b, 16));
    }

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store_words(uint8_t* dst, const uint8_t* top,
                                                const uint8_t* bottom) {
        const __m256i a = twice_odd_words<kPair>(top, bottom);
        const __m256i b = twice_odd_words<kPair>(top + 64, bottom + 64);
        store_vector(dst, order_four(_mm256_avg_epu8(_mm256_unpacklo_epi64(a, b),
                                                     _mm256_unpackhi_epi64(a, b))));
    }

    // Of words 0 to 15: 1, 9, 3, 11, 5, 13, 7, 15.
    template <bool kPair>
    static OVRIN_ALWAYS_INLINE __m256i twice_odd_words(const uint8_t* top, const uint8_t* bottom) {
        const __m256i cleared = odd_words(top);
        return kPair ? _mm256_avg_epu8(cleared, odd_words(bottom)) : halve(cleared);
    }

    static OVRIN_ALWAYS_INLINE __m256i odd_words(const uint8_t* row) {
        return _mm256_blend_epi32(load_cleared(row + 4), load_cleared(row + 32), 0xAA);
    }
};

// Every third sample from three vectors without a conflict: those of each lie where the others have
// none, so that blends bring them together, and one shuffle brings them in order.
template <int N>
struct ThreeToOne {
    static constexpr SimpleRatio kRatio = kThreeToOne;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        if (N == 4) {
            const __m256i a = twice<kPair>(top, bottom, 0);
            const __m256i b = twice<kPair>(top, bottom, 32);
            const __m256i c = twice<kPair>(top, bottom, 64);
            const __m256i left = _mm256_blend_epi32(_mm256_blend_epi32(a, b, 0x92), c, 0x24);
            const __m256i right = _mm256_blend_epi32(_mm256_blend_epi32(b, c, 0x92), a, 0x24);
            store_vector(
                dst,
                _mm256_avg_epu8(
                    _mm256_permutevar8x32_epi32(left, _mm256_setr_epi32(0, 3, 6, 1, 4, 7, 2, 5)),
                    _mm256_permutevar8x32_epi32(right, _mm256_setr_epi32(2, 5, 0, 3, 6, 1, 4, 7))));
            return;
        }
        // Each lane makes 16 bytes of its own.
        const __m256i a = twice<kPair>(top, bottom, 0, 48);
        const __m256i b = twice<kPair>(top, bottom, 16, 64);
        const __m256i c = twice<kPair>(top, bottom, 32, 80);
        store_vector(dst, N == 1 ? bytes(a, b, c) : pairs(a, b, c));
    }

    static OVRIN_ALWAYS_INLINE __m256i bytes(__m256i a, __m256i b, __m256i c) {
        const __m256i second = _mm256_broadcastsi128_si256(
            _mm_setr_epi8(0, -1, 0, 0, -1, 0, 0, -1, 0, 0, -1, 0, 0, -1, 0, 0));
        const __m256i third = _mm256_broadcastsi128_si256(
            _mm_setr_epi8(0, 0, -1, 0, 0, -1, 0, 0, -1, 0, 0, -1, 0, 0, -1, 0));
        const __m256i left = _mm256_blendv_epi8(_mm256_blendv_epi8(a, c, second), b, third);
        const __m256i right = _mm256_blendv_epi8(_mm256_blendv_epi8(c, b, second), a, third);
        return _mm256_avg_epu8(shuffle_bytes(left, _mm_setr_epi8(0, 3, 6, 9, 12, 15, 2, 5, 8, 11,
                                                                 14, 1, 4, 7, 10, 13)),
                               shuffle_bytes(right, _mm_setr_epi8(2, 5, 8, 11, 14, 1, 4, 7, 10, 13,
                                                                  0, 3, 6, 9, 12, 15)));
    }

    static OVRIN_ALWAYS_INLINE __m256i pairs(__m256i a, __m256i b, __m256i c) {
        const __m256i left = _mm256_blend_epi16(_mm256_blend_epi16(a, b, 0x92), c, 0x24);
        const __m256i right = _mm256_blend_epi16(_mm256_blend_epi16(b, c, 0x92), a, 0x24);
        return _mm256_avg_epu8(shuffle_bytes(left, _mm_setr_epi8(0, 1, 6, 7, 12, 13, 2, 3, 8, 9, 14,
                                                                 15, 4, 5, 10, 11)),
                               shuffle_bytes(right, _mm_setr_epi8(4, 5, 10, 11, 0, 1, 6, 7, 12, 13,
                                                                  2, 3, 8, 9, 14, 15)));
    }
};

template <int N>
struct ThreeToTwo {
    static constexpr SimpleRatio kRatio = kThreeToTwo;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        if (N == 4) {
            // Words 0 to 3 and 2 to 5 of either lane's six.
            const __m256i a = twice<kPair>(top, bottom, 0, 24);
            const __m256i b = twice<kPair>(top, bottom, 8, 32);
            store_vector(dst,
                         _mm256_avg_epu8(shuffle_words<0x94>(a, b), shuffle_words<0xE9>(a, b)));
            return;
        }
        const __m256i a = reduce(twice<kPair>(top, bottom, 0), 0);
        const __m256i b = reduce(twice<kPair>(top, bottom, 16), 2);
        store_vector(dst, order_two(_mm256_packus_epi16(a, b)));
    }

    // Each lane takes three of the six words from `first` on, and puts taps side by side.
    static OVRIN_ALWAYS_INLINE __m256i reduce(__m256i bytes, int32_t first) {
        const __m256i words =
            _mm256_add_epi32(_mm256_setr_epi32(0, 1, 2, 2, 3, 4, 5, 5), _mm256_set1_epi32(first));
        const __m128i taps = N == 1
                                 ? _mm_setr_epi8(0, 1, 1, 2, 3, 4, 4, 5, 6, 7, 7, 8, 9, 10, 10, 11)
                                 : _mm_setr_epi8(0, 2, 1, 3, 2, 4, 3, 5, 6, 8, 7, 9, 8, 10, 9, 11);
        return add_neighbours(shuffle_bytes(_mm256_permutevar8x32_epi32(bytes, words), taps));
    }
};

}  // namespace

const QuarterKernels* plan_simple_quarters_avx2(QuarterPlan& plan, const QuarterRowShape& shape,
                                                QuarterColumns& columns, int32_t samples) {
    return plan_patterns<TwoToOne<1>, TwoToOne<2>, TwoToOne<4>, ThreeToTwo<1>, ThreeToTwo<2>,
                         ThreeToTwo<4>, FourToOne<1>, FourToOne<2>, FourToOne<4>, ThreeToOne<1>,
                         ThreeToOne<2>, ThreeToOne<4>>(plan, shape, columns, samples);
}

}  // namespace ovrin
