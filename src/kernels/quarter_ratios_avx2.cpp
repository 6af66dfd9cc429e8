// SPDX-License-Identifier: Apache-2.0
// The simple ratios with AVX2, 32 destination bytes at a time.
#include <immintrin.h>

#include <type_traits>
#include <utility>

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

template <int N>
struct ThreeToTwo {
    static constexpr SimpleRatio kRatio = kThreeToTwo;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
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

// Every third word from three vectors without a conflict: those of each lie where the others have
// none, so that blends bring them together, and one shuffle brings them in order.
struct ThreeToOneWords {
    static constexpr SimpleRatio kRatio = kThreeToOne;
    static constexpr int32_t kSampleBytes = 4;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
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
    }
};

// Likewise, of two vectors that share four words.
struct ThreeToTwoWords {
    static constexpr SimpleRatio kRatio = kThreeToTwo;
    static constexpr int32_t kSampleBytes = 4;
    static constexpr int32_t kDstBytes = 32;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        const __m256i a = twice<kPair>(top, bottom, 0);
        const __m256i b = twice<kPair>(top, bottom, 16);
        const __m256i left = _mm256_blend_epi32(a, b, 0x64);
        const __m256i right = _mm256_blend_epi32(a, b, 0xD9);
        store_vector(
            dst,
            _mm256_avg_epu8(
                _mm256_permutevar8x32_epi32(left, _mm256_setr_epi32(0, 1, 3, 4, 2, 7, 5, 6)),
                _mm256_permutevar8x32_epi32(right, _mm256_setr_epi32(1, 2, 0, 5, 3, 4, 6, 7))));
    }
};

// 24 words of 16.
struct TwoToThreeWords {
    static constexpr SimpleRatio kRatio = kTwoToThree;
    static constexpr int32_t kSampleBytes = 4;
    static constexpr int32_t kDstBytes = 96;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        const __m256i first = twice<kPair>(top, bottom, 0);
        const __m256i last = twice<kPair>(top, bottom, 32);
        const __m256i middle = _mm256_permute2x128_si256(first, last, 0x21);
        store_taps(dst, first, _mm256_setr_epi32(0, 0, 1, 2, 2, 3, 4, 4),
                   _mm256_setr_epi32(0, 1, 1, 2, 3, 3, 4, 5));
        store_taps(dst + 32, middle, _mm256_setr_epi32(1, 2, 2, 3, 4, 4, 5, 6),
                   _mm256_setr_epi32(1, 2, 3, 3, 4, 5, 5, 6));
        store_taps(dst + 64, last, _mm256_setr_epi32(2, 3, 4, 4, 5, 6, 6, 7),
                   _mm256_setr_epi32(3, 3, 4, 5, 5, 6, 7, 7));
    }

    static OVRIN_ALWAYS_INLINE void store_taps(uint8_t* dst, __m256i words, __m256i left,
                                               __m256i right) {
        store_vector(dst, _mm256_avg_epu8(_mm256_permutevar8x32_epi32(words, left),
                                          _mm256_permutevar8x32_epi32(words, right)));
    }
};

// 18 pixels of 12, in two vectors of nine. All constants stay in registers.
struct RgbTwoToThree {
    static constexpr SimpleRatio kRatio = kTwoToThree;
    static constexpr int32_t kSampleBytes = 3;
    static constexpr int32_t kHalfBytes = 27;
    static constexpr int32_t kDstBytes = 2 * kHalfBytes;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        const __m256i left = _mm256_setr_epi8(0, 1, 2, 0, 1, 2, 3, 4, 5, 6, 7, 8, 6, 7, 8, 9, 2, 3,
                                              4, 5, 6, 4, 5, 6, 7, 8, 9, 0, 0, 0, 0, 0);
        const __m256i right = _mm256_setr_epi8(0, 1, 2, 3, 4, 5, 3, 4, 5, 6, 7, 8, 9, 10, 11, 9, 2,
                                               3, 4, 5, 6, 7, 8, 9, 7, 8, 9, 0, 0, 0, 0, 0);
        const __m256i first = _mm256_permutevar8x32_epi32(
            sums<kPair>(top, bottom, 0), _mm256_setr_epi32(0, 1, 2, 3, 2, 3, 4, 5));
        store_taps(dst, first, left, right);
        // The pixels of the second half begin at byte 18, which is byte 14 of these.
        const __m256i second = _mm256_permutevar8x32_epi32(
            sums<kPair>(top, bottom, 4), _mm256_setr_epi32(3, 4, 5, 6, 4, 5, 6, 7));
        const __m256i moved = _mm256_inserti128_si256(_mm256_set1_epi8(2), _mm_set1_epi8(6), 1);
        store_taps(dst + kHalfBytes, second, _mm256_add_epi8(left, moved),
                   _mm256_add_epi8(right, moved));
    }

    // Enlarging, both rows are mostly the same one: its cleared bytes are twice their quarters.
    template <bool kPair>
    static OVRIN_ALWAYS_INLINE __m256i sums(const uint8_t* top, const uint8_t* bottom,
                                            ptrdiff_t offset) {
        if constexpr (kPair) {
            if (top == bottom) return load_cleared(top + offset);
        }
        return twice<kPair>(top, bottom, offset);
    }

    static OVRIN_ALWAYS_INLINE void store_taps(uint8_t* dst, __m256i lanes, __m256i left,
                                               __m256i right) {
        store_vector(dst, _mm256_avg_epu8(_mm256_shuffle_epi8(lanes, left),
                                          _mm256_shuffle_epi8(lanes, right)));
    }
};

template <>
constexpr int32_t kOverrun<RgbTwoToThree> = 32 - RgbTwoToThree::kHalfBytes;

// Enlarging, rows come again, and fetching them took a twentieth of the time.
template <>
constexpr bool kFetches<RgbTwoToThree> = false;

// The other patterns gather the taps of each lane from a few windows of 16 source bytes. Windows
// lie so that no two taps on the same side of their samples have the same place in different
// windows: blends bring those of a side together, and one shuffle brings them in order. The
// compiler works out which byte comes from which window.
//
// A shape says
//
//   kRatio, kSampleBytes
//   kLaneSamples             the samples of a lane
//   kBases[vector][lane][w]  where the windows begin that make so many vectors

// How one side's taps get into a vector.
template <int kWindows>
struct Gathering {
    alignas(32) uint8_t from[kWindows][32] = {};  // by place in a window: set where this one has it
    alignas(32) uint8_t order[32] = {};
    int32_t only = -1;  // the window that has all of them
    bool fits = true;
};

// Notes the taps of a lane, at most one at a place.
template <class Shape, int kWindows>
constexpr void gather_lane(Gathering<kWindows>& gathering, const int32_t (&bases)[kWindows],
                           int32_t first_byte, int32_t lane, bool right) {
    bool is_taken[16] = {};
    int32_t taken_by[16] = {};
    for (int32_t i = 0; i < 16; ++i) {
        const int32_t wanted =
            i < Shape::kLaneSamples * Shape::kSampleBytes ? first_byte + i : first_byte;
        const int32_t sample = wanted / Shape::kSampleBytes;
        const Tap tap = Shape::kRatio.taps[sample % Shape::kRatio.dst];
        const int32_t column =
            sample / Shape::kRatio.dst * Shape::kRatio.src + (right ? tap.right : tap.left);
        const int32_t byte = column * Shape::kSampleBytes + wanted % Shape::kSampleBytes;
        bool is_found = false;
        for (int32_t w = kWindows; !is_found && w-- > 0;) {
            const int32_t place = byte - bases[w];
            if (gathering.only >= 0 && w != gathering.only) continue;
            if (place < 0 || place >= 16) continue;
            if (is_taken[place] && taken_by[place] != byte) continue;
            is_taken[place] = is_found = true;
            taken_by[place] = byte;
            gathering.from[w][16 * lane + place] = 0xFF;
            gathering.order[16 * lane + i] = static_cast<uint8_t>(place);
        }
        if (!is_found) gathering.fits = false;
    }
}

template <class Shape, int kWindows>
constexpr Gathering<kWindows> gather_from(const int32_t (&bases)[2][kWindows], int32_t vector,
                                          bool right, int32_t only) {
    constexpr int32_t kLaneBytes = Shape::kLaneSamples * Shape::kSampleBytes;
    Gathering<kWindows> gathering;
    gathering.only = only;
    for (int32_t lane = 0; lane < 2; ++lane) {
        gather_lane<Shape>(gathering, bases[lane], (2 * vector + lane) * kLaneBytes, lane, right);
    }
    return gathering;
}

// By one window alone where one has all.
template <class Shape, int kWindows>
constexpr Gathering<kWindows> gathering_of(const int32_t (&bases)[2][kWindows], int32_t vector,
                                           bool right) {
    for (int32_t only = 0; only < kWindows; ++only) {
        const Gathering<kWindows> gathering = gather_from<Shape>(bases, vector, right, only);
        if (gathering.fits) return gathering;
    }
    return gather_from<Shape>(bases, vector, right, -1);
}

template <class Shape>
struct Gathered {
    static constexpr SimpleRatio kRatio = Shape::kRatio;
    static constexpr int32_t kSampleBytes = Shape::kSampleBytes;
    static constexpr int32_t kLaneBytes = Shape::kLaneSamples * kSampleBytes;
    static constexpr int32_t kVectors = std::extent_v<decltype(Shape::kBases), 0>;
    static constexpr int32_t kWindows = std::extent_v<decltype(Shape::kBases), 2>;
    static constexpr int32_t kDstBytes = kVectors * 2 * kLaneBytes;

    template <bool kPair>
    static OVRIN_ALWAYS_INLINE void store(uint8_t* dst, const uint8_t* top, const uint8_t* bottom) {
        store_vectors<kPair>(dst, top, bottom, std::make_integer_sequence<int32_t, kVectors>());
    }

    template <bool kPair, int32_t... kVector>
    static OVRIN_ALWAYS_INLINE void store_vectors(uint8_t* dst, const uint8_t* top,
                                                  const uint8_t* bottom,
                                                  std::integer_sequence<int32_t, kVector...>) {
        (store_one<kPair, kVector>(dst + kVector * 2 * kLaneBytes, top, bottom,
                                   std::make_integer_sequence<int32_t, kWindows>()),
         ...);
    }

    template <bool kPair, int32_t kVector, int32_t... kWindow>
    static OVRIN_ALWAYS_INLINE void store_one(uint8_t* dst, const uint8_t* top,
                                              const uint8_t* bottom,
                                              std::integer_sequence<int32_t, kWindow...>) {
        constexpr auto& kBases = Shape::kBases[kVector];
        const __m256i windows[] = {
            load_window<kPair, kBases[0][kWindow], kBases[1][kWindow]>(top, bottom)...};
        const __m256i samples =
            _mm256_avg_epu8(gather<kVector, false>(windows), gather<kVector, true>(windows));
        if constexpr (kLaneBytes == 16) return store_vector(dst, samples);
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst), _mm256_castsi256_si128(samples));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst + kLaneBytes),
                         _mm256_extracti128_si256(samples, 1));
    }

    // Two lanes that lie one behind the other are one load.
    template <bool kPair, int32_t kBase, int32_t kSecondBase>
    static OVRIN_ALWAYS_INLINE __m256i load_window(const uint8_t* top, const uint8_t* bottom) {
        if constexpr (kSecondBase == kBase + 16) return twice<kPair>(top, bottom, kBase);
        return twice<kPair>(top, bottom, kBase, kSecondBase);
    }

    template <int32_t kVector, bool kRight>
    static OVRIN_ALWAYS_INLINE __m256i gather(const __m256i (&windows)[kWindows]) {
        static constexpr Gathering<kWindows> kGathering =
            gathering_of<Shape>(Shape::kBases[kVector], kVector, kRight);
        static_assert(kGathering.fits);
        constexpr bool kBlends = kGathering.only < 0;
        __m256i taps = windows[kBlends ? 0 : kGathering.only];
        if constexpr (kBlends) {
            for (int32_t w = 1; w < kWindows; ++w) {
                taps = _mm256_blendv_epi8(taps, windows[w], load_mask(kGathering.from[w]));
            }
        }
        return _mm256_shuffle_epi8(taps, load_mask(kGathering.order));
    }

    static OVRIN_ALWAYS_INLINE __m256i load_mask(const uint8_t (&mask)[32]) {
        return _mm256_load_si256(reinterpret_cast<const __m256i*>(mask));
    }
};

template <class Shape>
constexpr int32_t kOverrun<Gathered<Shape>> = 16 - Gathered<Shape>::kLaneBytes;

template <int N>
struct ThreeToOne {
    static constexpr SimpleRatio kRatio = kThreeToOne;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kLaneSamples = 16 / N;
    static constexpr int32_t kBases[1][2][3] = {{{0, 16, 32}, {48, 64, 80}}};
};

template <int N>
struct TwoToThree {
    static constexpr SimpleRatio kRatio = kTwoToThree;
    static constexpr int32_t kSampleBytes = N;
    static constexpr int32_t kLaneSamples = 16 / N;
    static constexpr int32_t kBases[3][2][1] = {{{0}, {10}}, {{20}, {32}}, {{42}, {48}}};
};

struct RgbTwoToOne {
    static constexpr SimpleRatio kRatio = kTwoToOne;
    static constexpr int32_t kSampleBytes = 3;
    static constexpr int32_t kLaneSamples = 5;
    static constexpr int32_t kBases[1][2][2] = {{{0, 15}, {29, 44}}};
};

struct RgbThreeToOne {
    static constexpr SimpleRatio kRatio = kThreeToOne;
    static constexpr int32_t kSampleBytes = 3;
    static constexpr int32_t kLaneSamples = 5;
    static constexpr int32_t kBases[1][2][3] = {{{0, 15, 30}, {44, 59, 74}}};
};

struct RgbFourToOne {
    static constexpr SimpleRatio kRatio = kFourToOne;
    static constexpr int32_t kSampleBytes = 3;
    static constexpr int32_t kLaneSamples = 4;
    static constexpr int32_t kBases[1][2][3] = {{{3, 19, 35}, {50, 65, 80}}};
};

struct RgbThreeToTwo {
    static constexpr SimpleRatio kRatio = kThreeToTwo;
    static constexpr int32_t kSampleBytes = 3;
    static constexpr int32_t kLaneSamples = 4;
    static constexpr int32_t kBases[1][2][2] = {{{0, 4}, {16, 20}}};
};

}  // namespace

const QuarterKernels* plan_simple_quarters_avx2(QuarterPlan& plan, const QuarterRowShape& shape,
                                                QuarterColumns& columns, int32_t samples) {
    return plan_patterns<TwoToOne<1>, TwoToOne<2>, TwoToOne<4>, ThreeToTwo<1>, ThreeToTwo<2>,
                         ThreeToTwoWords, FourToOne<1>, FourToOne<2>, FourToOne<4>,
                         Gathered<ThreeToOne<1>>, Gathered<ThreeToOne<2>>, ThreeToOneWords,
                         Gathered<TwoToThree<1>>, Gathered<TwoToThree<2>>, TwoToThreeWords,
                         Gathered<RgbTwoToOne>, Gathered<RgbThreeToTwo>, Gathered<RgbFourToOne>,
                         Gathered<RgbThreeToOne>, RgbTwoToThree>(plan, shape, columns, samples);
}

}  // namespace ovrin
