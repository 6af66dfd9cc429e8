// SPDX-License-Identifier: Apache-2.0
// Blended bilinear rows with AVX-512: one window and one shuffle for four lanes.
#include "kernels/bilinear_lanes_inl.h"
#include "kernels/intrinsics_avx512.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kLanes = 4;
constexpr int32_t kStepSums = kLanes * kLaneBytes;
constexpr int32_t kStepBytes = 64;     // of a finished row
constexpr int32_t kNarrowWindows = 1;  // instead of a size: windows as AVX2 plans them

// The smallest window that will do: it crosses fewer cache lines. Reductions to less than a third
// or so take more than the largest.
template <int N>
void prepare(BilinearColumns& columns) {
    for (int32_t window_bytes = 16; window_bytes <= 64; window_bytes *= 2) {
        prepare_lanes<N, kLanes, kLanes>(columns, window_bytes);
        if (columns.window_bytes != 0) return;
    }
    bilinear_blend_avx2[N >> 1].prepare(columns);
    if (columns.window_bytes != 0) columns.window_bytes = kNarrowWindows;
}

template <int kBytes>
__m512i load_window(const uint8_t* bytes) {
    if (kBytes == 16) {
        return _mm512_castsi128_si512(_mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes)));
    }
    if (kBytes == 32) {
        return _mm512_castsi256_si512(_mm256_loadu_si256(reinterpret_cast<const __m256i*>(bytes)));
    }
    return _mm512_loadu_si512(bytes);
}

template <int kBytes>
void across_windows(uint32_t* sums, const uint8_t* row, const BilinearColumns& columns,
                    int32_t count) {
    const __mmask64 low_bytes = 0x5555555555555555;
    for (int32_t i = 0; i < count; i += kStepSums) {
        const int32_t lane = i / kLaneBytes;
        const __m512i window = load_window<kBytes>(row + columns.lane_base[lane]);
        const __m512i shuffle = _mm512_load_si512(columns.lane_shuffle[lane]);
        const __m512i weights = _mm512_load_si512(columns.lane_weights[lane]);
        const __m512i samples = _mm512_maskz_permutexvar_epi8(low_bytes, shuffle, window);
        _mm512_store_si512(sums + i, _mm512_madd_epi16(samples, weights));
    }
}

template <int N>
void across(BilinearSums& sums, const uint8_t* row, const BilinearColumns& columns) {
    const int32_t count = whole_steps(columns.count * N, kStepSums);
    switch (columns.window_bytes) {
        case 16:
            return across_windows<16>(sums.values, row, columns, count);
        case 32:
            return across_windows<32>(sums.values, row, columns, count);
        case 64:
            return across_windows<64>(sums.values, row, columns, count);
        default:
            return bilinear_blend_avx2[N >> 1].across(sums, row, columns);
    }
}

// Sixteen target bytes, the top ones of 32-bit numbers. upper * (4096 - wy) + lower * wy with one
// multiplication.
__m512i blend_sixteen(const uint32_t* upper, const uint32_t* lower, __m512i wy) {
    const __m512i from = _mm512_load_si512(upper);
    const __m512i step = _mm512_mullo_epi32(_mm512_sub_epi32(_mm512_load_si512(lower), from), wy);
    return _mm512_add_epi32(_mm512_slli_epi32(from, 12), step);
}

// The top bytes of two vectors of 32-bit numbers.
alignas(64) constexpr uint8_t kTopBytes[64] = {3,  7,  11, 15,  19,  23,  27,  31,  35,  39, 43,
                                               47, 51, 55, 59,  63,  67,  71,  75,  79,  83, 87,
                                               91, 95, 99, 103, 107, 111, 115, 119, 123, 127};

__m512i blend_bytes(const uint32_t* upper, const uint32_t* lower, __m512i wy) {
    const __m512i top_bytes = _mm512_load_si512(kTopBytes);
    const auto thirty_two = [&](int32_t i) {
        return _mm512_castsi512_si256(
            _mm512_permutex2var_epi8(blend_sixteen(upper + i, lower + i, wy), top_bytes,
                                     blend_sixteen(upper + i + 16, lower + i + 16, wy)));
    };
    return _mm512_inserti64x4(_mm512_castsi256_si512(thirty_two(0)), thirty_two(32), 1);
}

void down(uint8_t* dst, const BilinearSums& upper, const BilinearSums& lower, int32_t wy,
          int32_t bytes) {
    const __m512i weight = _mm512_set1_epi32(wy);
    int32_t i = 0;
    for (; i + kStepBytes <= bytes; i += kStepBytes) {
        _mm512_storeu_si512(dst + i, blend_bytes(upper.values + i, lower.values + i, weight));
    }
    if (i < bytes) {
        const __mmask64 rest = ~uint64_t{0} >> (kStepBytes - (bytes - i));
        _mm512_mask_storeu_epi8(dst + i, rest,
                                blend_bytes(upper.values + i, lower.values + i, weight));
    }
}

// Windows of one vector, or of two for groups of less and less.
template <int N>
void prepare_copy(BilinearColumns& columns) {
    if (prepare_groups<N>(columns, 64, 64)) return;
    for (int32_t group_bytes = 64; group_bytes >= 16; group_bytes /= 2) {
        if (prepare_groups<N>(columns, group_bytes, 128)) return;
    }
}

// The bytes of a window of 128.
__m512i shuffle_window(const uint8_t* window, __m512i indices) {
    return _mm512_permutex2var_epi8(_mm512_loadu_si512(window), indices,
                                    _mm512_loadu_si512(window + 64));
}

void copy_64_of_64(uint8_t* dst, const uint8_t* window, const uint8_t* shuffle) {
    _mm512_storeu_si512(
        dst, _mm512_permutexvar_epi8(_mm512_loadu_si512(shuffle), _mm512_loadu_si512(window)));
}

void copy_64_of_128(uint8_t* dst, const uint8_t* window, const uint8_t* shuffle) {
    _mm512_storeu_si512(dst, shuffle_window(window, _mm512_loadu_si512(shuffle)));
}

void copy_32_of_128(uint8_t* dst, const uint8_t* window, const uint8_t* shuffle) {
    const __m256i indices = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(shuffle));
    const __m512i bytes = shuffle_window(window, _mm512_castsi256_si512(indices));
    _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst), _mm512_castsi512_si256(bytes));
}

void copy_16_of_128(uint8_t* dst, const uint8_t* window, const uint8_t* shuffle) {
    const __m128i indices = _mm_loadu_si128(reinterpret_cast<const __m128i*>(shuffle));
    const __m512i bytes = shuffle_window(window, _mm512_castsi128_si512(indices));
    _mm_storeu_si128(reinterpret_cast<__m128i*>(dst), _mm512_castsi512_si128(bytes));
}

template <int N>
void copy(uint8_t* dst, const uint8_t* row, const BilinearColumns& columns) {
    if (columns.window_bytes == 0) {
        bilinear_copy_scalar[N >> 1].copy(dst, row, columns);
    } else if (columns.window_bytes == 64) {
        copy_groups<N, 64>(dst, row, columns, copy_64_of_64);
    } else if (columns.group_bytes == 64) {
        copy_groups<N, 64>(dst, row, columns, copy_64_of_128);
    } else if (columns.group_bytes == 32) {
        copy_groups<N, 32>(dst, row, columns, copy_32_of_128);
    } else {
        copy_groups<N, 16>(dst, row, columns, copy_16_of_128);
    }
}

}  // namespace

const BilinearBlend bilinear_blend_avx512[3] = {
    {prepare<1>, across<1>, down}, {prepare<2>, across<2>, down}, {prepare<4>, across<4>, down}};

const BilinearCopy bilinear_copy_avx512[3] = {
    {prepare_copy<1>, copy<1>}, {prepare_copy<2>, copy<2>}, {prepare_copy<4>, copy<4>}};

}  // namespace ovrin
