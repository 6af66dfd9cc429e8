// SPDX-License-Identifier: Apache-2.0
// Blended bilinear rows with AVX2: two lanes at a time.
#include <immintrin.h>
#include <string.h>

#include "kernels/bilinear_lanes_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kStepLanes = 2;
constexpr int32_t kStepSums = kStepLanes * kLaneBytes;
constexpr int32_t kStepBytes = 32;  // of a finished row

template <int N>
void prepare(BilinearColumns& columns) {
    prepare_lanes<N, 1, kStepLanes>(columns, 16);
}

__m256i load_sums(const uint32_t* sums) {
    return _mm256_load_si256(reinterpret_cast<const __m256i*>(sums));
}

// Left and right samples of two lanes, blended.
__m256i blend_lanes(const uint8_t* row, const BilinearColumns& columns, int32_t lane) {
    const auto* low = reinterpret_cast<const __m128i*>(row + columns.lane_base[lane]);
    const auto* high = reinterpret_cast<const __m128i*>(row + columns.lane_base[lane + 1]);
    const __m256i windows = _mm256_inserti128_si256(_mm256_castsi128_si256(_mm_loadu_si128(low)),
                                                    _mm_loadu_si128(high), 1);
    const auto* shuffle = reinterpret_cast<const __m256i*>(columns.lane_shuffle[lane]);
    const auto* weights = reinterpret_cast<const __m256i*>(columns.lane_weights[lane]);
    return _mm256_madd_epi16(_mm256_shuffle_epi8(windows, _mm256_load_si256(shuffle)),
                             _mm256_load_si256(weights));
}

template <int N>
void across(BilinearSums& sums, const uint8_t* row, const BilinearColumns& columns) {
    if (columns.window_bytes == 0) return bilinear_blend_scalar[N >> 1].across(sums, row, columns);
    const int32_t count = whole_steps(columns.count * N, kStepSums);
    for (int32_t i = 0; i < count; i += kStepSums) {
        _mm256_store_si256(reinterpret_cast<__m256i*>(sums.values + i),
                           blend_lanes(row, columns, i / kLaneBytes));
    }
}

// Eight target bytes as 32-bit numbers. upper * (4096 - wy) + lower * wy with one multiplication.
__m256i blend_eight(const uint32_t* upper, const uint32_t* lower, __m256i wy) {
    const __m256i from = load_sums(upper);
    const __m256i step = _mm256_mullo_epi32(_mm256_sub_epi32(load_sums(lower), from), wy);
    return _mm256_srli_epi32(_mm256_add_epi32(_mm256_slli_epi32(from, 12), step), 24);
}

__m256i blend_bytes(const uint32_t* upper, const uint32_t* lower, __m256i wy) {
    const auto eight = [&](int32_t i) { return blend_eight(upper + i, lower + i, wy); };
    // Packing works within the halves of a vector; the permutation brings the bytes back in order.
    const __m256i words_low = _mm256_packus_epi32(eight(0), eight(8));
    const __m256i words_high = _mm256_packus_epi32(eight(16), eight(24));
    return _mm256_permutevar8x32_epi32(_mm256_packus_epi16(words_low, words_high),
                                       _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7));
}

void down(uint8_t* dst, const BilinearSums& upper, const BilinearSums& lower, int32_t wy,
          int32_t bytes) {
    const __m256i weight = _mm256_set1_epi32(wy);
    int32_t i = 0;
    for (; i + kStepBytes <= bytes; i += kStepBytes) {
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst + i),
                            blend_bytes(upper.values + i, lower.values + i, weight));
    }
    if (i < bytes) {
        alignas(32) uint8_t copy[kStepBytes];
        _mm256_store_si256(reinterpret_cast<__m256i*>(copy),
                           blend_bytes(upper.values + i, lower.values + i, weight));
        memcpy(dst + i, copy, static_cast<size_t>(bytes - i));
    }
}

template <int N>
void prepare_copy(BilinearColumns& columns) {
    if (!prepare_groups<N>(columns, 16, 32)) prepare_groups<N>(columns, 8, 32);
}

// 16 bytes of a window of 32. Shuffles give 0 where the top bit of an index is set.
__m128i shuffle_window(const uint8_t* window, __m128i indices) {
    const auto* halves = reinterpret_cast<const __m128i*>(window);
    const __m128i in_low = _mm_adds_epu8(indices, _mm_set1_epi8(0x70));
    const __m128i in_high = _mm_sub_epi8(indices, _mm_set1_epi8(16));
    return _mm_or_si128(_mm_shuffle_epi8(_mm_loadu_si128(halves), in_low),
                        _mm_shuffle_epi8(_mm_loadu_si128(halves + 1), in_high));
}

template <int N>
void copy(uint8_t* dst, const uint8_t* row, const BilinearColumns& columns) {
    if (columns.window_bytes == 0) return bilinear_copy_scalar[N >> 1].copy(dst, row, columns);
    if (columns.group_bytes == 16) {
        copy_groups<N, 16>(dst, row, columns,
                           [](uint8_t* to, const uint8_t* window, const uint8_t* shuffle) {
                               const auto* indices = reinterpret_cast<const __m128i*>(shuffle);
                               _mm_storeu_si128(reinterpret_cast<__m128i*>(to),
                                                shuffle_window(window, _mm_loadu_si128(indices)));
                           });
    } else {
        copy_groups<N, 8>(dst, row, columns,
                          [](uint8_t* to, const uint8_t* window, const uint8_t* shuffle) {
                              const auto* indices = reinterpret_cast<const __m128i*>(shuffle);
                              _mm_storel_epi64(reinterpret_cast<__m128i*>(to),
                                               shuffle_window(window, _mm_loadl_epi64(indices)));
                          });
    }
}

}  // namespace

const BilinearBlend bilinear_blend_avx2[3] = {
    {prepare<1>, across<1>, down}, {prepare<2>, across<2>, down}, {prepare<4>, across<4>, down}};

const BilinearCopy bilinear_copy_avx2[3] = {
    {prepare_copy<1>, copy<1>}, {prepare_copy<2>, copy<2>}, {prepare_copy<4>, copy<4>}};

}  // namespace ovrin
