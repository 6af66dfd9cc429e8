// SPDX-License-Identifier: Apache-2.0
// Blended bilinear rows with AVX2: two lanes at a time.
#include <immintrin.h>
#include <string.h>

#include "kernels/bilinear_lanes.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kStepLanes = 8;  // lanes whose bytes fill a vector
constexpr int32_t kStepBytes = kStepLanes * kLaneBytes;

// Left and right samples of two lanes, blended: eight sums with 12 fractional bits.
__m256i blend_right(const uint8_t* row, const BilinearColumns& columns, int32_t lane) {
    const auto* low = reinterpret_cast<const __m128i*>(row + columns.lane_base[lane]);
    const auto* high = reinterpret_cast<const __m128i*>(row + columns.lane_base[lane + 1]);
    const __m256i window = _mm256_inserti128_si256(_mm256_castsi128_si256(_mm_loadu_si128(low)),
                                                   _mm_loadu_si128(high), 1);
    const auto* shuffle = reinterpret_cast<const __m256i*>(columns.lane_shuffle[lane]);
    const auto* weights = reinterpret_cast<const __m256i*>(columns.lane_weights[lane]);
    return _mm256_madd_epi16(_mm256_shuffle_epi8(window, _mm256_load_si256(shuffle)),
                             _mm256_load_si256(weights));
}

// Eight target bytes as 32-bit numbers.
__m256i blend(const uint8_t* top, const uint8_t* bottom, __m256i upper_weight, __m256i lower_weight,
              const BilinearColumns& columns, int32_t lane) {
    const __m256i upper = _mm256_mullo_epi32(blend_right(top, columns, lane), upper_weight);
    const __m256i lower = _mm256_mullo_epi32(blend_right(bottom, columns, lane), lower_weight);
    return _mm256_srli_epi32(_mm256_add_epi32(upper, lower), 24);
}

// 32 target bytes.
__m256i blend_step(const uint8_t* top, const uint8_t* bottom, __m256i upper_weight,
                   __m256i lower_weight, const BilinearColumns& columns, int32_t lane) {
    const auto eight = [&](int32_t i) {
        return blend(top, bottom, upper_weight, lower_weight, columns, lane + 2 * i);
    };
    // Packing works within the halves of a vector; the permutation brings the lanes back in order.
    const __m256i words_low = _mm256_packus_epi32(eight(0), eight(1));
    const __m256i words_high = _mm256_packus_epi32(eight(2), eight(3));
    return _mm256_permutevar8x32_epi32(_mm256_packus_epi16(words_low, words_high),
                                       _mm256_setr_epi32(0, 4, 1, 5, 2, 6, 3, 7));
}

template <int N>
void prepare(BilinearColumns& columns) {
    prepare_lanes<N>(columns, kStepLanes);
}

template <int N>
void both(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, int32_t wy,
          const BilinearColumns& columns) {
    if (columns.lanes == 0)
        return bilinear_blend_scalar[N >> 1].both(dst, top, bottom, wy, columns);
    const __m256i upper_weight = _mm256_set1_epi32(4096 - wy);
    const __m256i lower_weight = _mm256_set1_epi32(wy);
    const int32_t bytes = columns.count * N;
    int32_t lane = 0;
    for (int32_t done = kStepBytes; done <= bytes; done += kStepBytes, lane += kStepLanes) {
        const __m256i samples = blend_step(top, bottom, upper_weight, lower_weight, columns, lane);
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst), samples);
        dst += kStepBytes;
    }
    if (bytes % kStepBytes != 0) {
        alignas(32) uint8_t copy[kStepBytes];
        const __m256i samples = blend_step(top, bottom, upper_weight, lower_weight, columns, lane);
        _mm256_store_si256(reinterpret_cast<__m256i*>(copy), samples);
        memcpy(dst, copy, static_cast<size_t>(bytes % kStepBytes));
    }
}

}  // namespace

const BilinearBlend bilinear_blend_avx2[3] = {
    {prepare<1>, both<1>}, {prepare<2>, both<2>}, {prepare<4>, both<4>}};

}  // namespace ovrin
