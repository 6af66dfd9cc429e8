// SPDX-License-Identifier: Apache-2.0
// Blended bilinear rows with AVX2: two quads in a vector.
#include <immintrin.h>
#include <stddef.h>
#include <string.h>

#include "kernels/bilinear_quads_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kStepQuads = 4;
constexpr int32_t kStepBytes = 32;  // of a finished row

__m256i load_sums(const uint32_t* sums) {
    return _mm256_load_si256(reinterpret_cast<const __m256i*>(sums));
}

// The windows of two quads, which may be one.
template <int kWindowQuads>
__m256i load_windows(const uint8_t* row, const BilinearPlan& plan, ptrdiff_t quad) {
    const auto* low = reinterpret_cast<const __m128i*>(row + plan.windows[quad]);
    if (kWindowQuads == 2) return _mm256_broadcastsi128_si256(_mm_loadu_si128(low));
    const auto* high = reinterpret_cast<const __m128i*>(row + plan.windows[quad + 1]);
    return _mm256_inserti128_si256(_mm256_castsi128_si256(_mm_loadu_si128(low)),
                                   _mm_loadu_si128(high), 1);
}

// Left and right samples of two quads, blended.
template <int kWindowQuads>
void blend_quads(uint32_t* sums, const uint8_t* row, const BilinearPlan& plan, ptrdiff_t quad) {
    const auto* shuffle = reinterpret_cast<const __m256i*>(plan.shuffles[quad]);
    const auto* weights = reinterpret_cast<const __m256i*>(plan.weight_pairs[quad]);
    const __m256i samples = _mm256_shuffle_epi8(load_windows<kWindowQuads>(row, plan, quad),
                                                _mm256_load_si256(shuffle));
    _mm256_store_si256(reinterpret_cast<__m256i*>(sums + quad * kQuadBytes),
                       _mm256_madd_epi16(samples, _mm256_load_si256(weights)));
}

template <int kWindowQuads>
void across(BilinearSums& sums, const uint8_t* row, const BilinearPlan& plan) {
    const ptrdiff_t quads = (plan.bytes() + kQuadBytes - 1) / kQuadBytes;
    for (ptrdiff_t quad = 0; quad < quads; quad += kStepQuads) {
        blend_quads<kWindowQuads>(sums.values, row, plan, quad);
        blend_quads<kWindowQuads>(sums.values, row, plan, quad + 2);
    }
}

// Pixels of four bytes that lie within eight source pixels: one permutation brings left and right
// ones side by side, so that fixed shuffles do for the rest. Half the loads of windows for two.
constexpr int32_t kGroupPixels = 4;
constexpr int32_t kWindowPixels = 8;

// The places of left and right pixels in a group's window, as a permutation wants them: those of
// pixels 0 and 2 in the low lane, of 1 and 3 in the high one. False: the window does not reach.
bool plan_group(BilinearPlan& plan, int32_t group, int64_t base) {
    constexpr int32_t kFirst[kGroupPixels] = {0, 4, 2, 6};
    const BilinearColumns& columns = *plan.columns;
    int32_t places[kWindowPixels];
    for (int32_t i = 0; i < kGroupPixels; ++i) {
        const int32_t wanted = group * kGroupPixels + i;
        const int32_t column = wanted < columns.count ? wanted : columns.count - 1;
        const int64_t left = columns.index[column] - base;
        if (left < 0 || left + columns.to_right >= kWindowPixels) return false;
        places[kFirst[i]] = static_cast<int32_t>(left);
        places[kFirst[i] + 1] = static_cast<int32_t>(left) + columns.to_right;
        for (int32_t& pair : plan.weight_pairs[group * kGroupPixels + i]) {
            pair = weight_pair(columns.weight[column]);
        }
    }
    memcpy(plan.shuffles[group * 2], places, sizeof places);
    plan.windows[group] = static_cast<int32_t>(base * 4);
    return true;
}

bool plan_pixels(BilinearPlan& plan, const BilinearColumns& columns) {
    plan.columns = &columns;
    const WindowBases<4> windows(columns, columns.to_right, kWindowPixels * 4);
    if (columns.sample_bytes != 4 || !windows.fit()) return false;
    for (int32_t group = 0; group * kGroupPixels < columns.count; ++group) {
        if (!plan_group(plan, group, windows.base(group * kGroupPixels) / 4)) return false;
    }
    return true;
}

// Left and right pixels as bytes side by side, widened, of the lanes' first or second one.
OVRIN_ALWAYS_INLINE __m256i widen_pairs(__m256i pixels, int32_t first) {
    const __m128i order = _mm_setr_epi8(0, -1, 4, -1, 1, -1, 5, -1, 2, -1, 6, -1, 3, -1, 7, -1);
    const __m128i mine = _mm_adds_epu8(order, _mm_set1_epi8(static_cast<char>(first)));
    return _mm256_shuffle_epi8(pixels, _mm256_broadcastsi128_si256(mine));
}

void across_pixels(BilinearSums& sums, const uint8_t* row, const BilinearPlan& plan) {
    const int32_t count = plan.columns->count;
    for (ptrdiff_t group = 0; group * kGroupPixels < count; ++group) {
        const auto* window = reinterpret_cast<const __m256i*>(row + plan.windows[group]);
        const auto* places = reinterpret_cast<const __m256i*>(plan.shuffles[group * 2]);
        const auto* weights =
            reinterpret_cast<const __m256i*>(plan.weight_pairs[group * kGroupPixels]);
        auto* sum = reinterpret_cast<__m256i*>(sums.values + group * kGroupPixels * 4);
        const __m256i pixels =
            _mm256_permutevar8x32_epi32(_mm256_loadu_si256(window), _mm256_load_si256(places));
        _mm256_store_si256(sum,
                           _mm256_madd_epi16(widen_pairs(pixels, 0), _mm256_load_si256(weights)));
        _mm256_store_si256(
            sum + 1, _mm256_madd_epi16(widen_pairs(pixels, 8), _mm256_load_si256(weights + 1)));
    }
}

// Eight destination bytes as 32-bit numbers: upper * (4096 - wy) + lower * wy with one
// multiplication.
__m256i blend_eight(const uint32_t* upper, const uint32_t* lower, __m256i wy) {
    const __m256i from = load_sums(upper);
    const __m256i step = _mm256_mullo_epi32(_mm256_sub_epi32(load_sums(lower), from), wy);
    return _mm256_srli_epi32(_mm256_add_epi32(_mm256_slli_epi32(from, kBilinearWeightBits), step),
                             kBilinearResultBits);
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
          const BilinearPlan& plan, const BilinearNext& next) {
    const int32_t bytes = plan.bytes();
    SteadyFetch fetch(next, bytes / kStepBytes);
    const __m256i weight = _mm256_set1_epi32(wy);
    int32_t i = 0;
    for (; i + kStepBytes <= bytes; i += kStepBytes) {
        fetch.step();
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst + i),
                            blend_bytes(upper.values + i, lower.values + i, weight));
    }
    if (i < bytes) {
        alignas(32) uint8_t last[kStepBytes];
        _mm256_store_si256(reinterpret_cast<__m256i*>(last),
                           blend_bytes(upper.values + i, lower.values + i, weight));
        memcpy(dst + i, last, static_cast<size_t>(bytes - i));
    }
}

// 16 bytes of a window of 32. Shuffles give 0 where the top bit of an index is set.
__m128i shuffle_window(const uint8_t* window, __m128i indices) {
    const auto* halves = reinterpret_cast<const __m128i*>(window);
    const __m128i in_low = _mm_adds_epu8(indices, _mm_set1_epi8(0x70));
    const __m128i in_high = _mm_sub_epi8(indices, _mm_set1_epi8(16));
    return _mm_or_si128(_mm_shuffle_epi8(_mm_loadu_si128(halves), in_low),
                        _mm_shuffle_epi8(_mm_loadu_si128(halves + 1), in_high));
}

void copy_groups_of_16(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan) {
    copy_groups<16>(dst, row, plan, [](uint8_t* to, const uint8_t* window, const uint8_t* shuffle) {
        const auto* indices = reinterpret_cast<const __m128i*>(shuffle);
        _mm_storeu_si128(reinterpret_cast<__m128i*>(to),
                         shuffle_window(window, _mm_loadu_si128(indices)));
    });
}

void copy_groups_of_8(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan) {
    copy_groups<8>(dst, row, plan, [](uint8_t* to, const uint8_t* window, const uint8_t* shuffle) {
        const auto* indices = reinterpret_cast<const __m128i*>(shuffle);
        _mm_storel_epi64(reinterpret_cast<__m128i*>(to),
                         shuffle_window(window, _mm_loadl_epi64(indices)));
    });
}

}  // namespace

BilinearKernels plan_bilinear_avx2(BilinearPlan& plan, const BilinearColumns& columns) {
    if (plan_pixels(plan, columns)) return {across_pixels, down};
    if (plan_quads(plan, columns, {16, 2, kStepQuads})) return {across<2>, down};
    if (plan_quads(plan, columns, {16, 1, kStepQuads})) return {across<1>, down};
    return {plan_bilinear_scalar(plan, columns).across, down};
}

BilinearCopy* plan_bilinear_copy_avx2(BilinearPlan& plan, const BilinearColumns& columns) {
    if (plan_groups(plan, columns, 16, 32)) return copy_groups_of_16;
    if (plan_groups(plan, columns, 8, 32)) return copy_groups_of_8;
    return plan_bilinear_copy_scalar(plan, columns);
}

}  // namespace ovrin
