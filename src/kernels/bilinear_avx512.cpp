// SPDX-License-Identifier: Apache-2.0
// Blended bilinear rows with AVX-512: one window and one shuffle for four quads.
#include "kernels/bilinear_quads_inl.h"
#include "kernels/intrinsics_avx512_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kQuads = 4;
constexpr int32_t kStepSums = kQuads * kQuadBytes;
constexpr int32_t kStepBytes = 64;  // of a finished row

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

template <int kWindowBytes>
void across(BilinearSums& sums, const uint8_t* row, const BilinearPlan& plan) {
    const __mmask64 low_bytes = 0x5555555555555555;
    const int32_t count = plan.bytes();
    for (int32_t i = 0; i < count; i += kStepSums) {
        const int32_t quad = i / kQuadBytes;
        const __m512i window = load_window<kWindowBytes>(row + plan.windows[quad]);
        const __m512i shuffle = _mm512_load_si512(plan.shuffles[quad]);
        const __m512i weights = _mm512_load_si512(plan.weight_pairs[quad]);
        const __m512i samples = _mm512_maskz_permutexvar_epi8(low_bytes, shuffle, window);
        _mm512_store_si512(sums.values + i, _mm512_madd_epi16(samples, weights));
    }
}

// Sixteen destination bytes, the top ones of 32-bit numbers: upper * (4096 - wy) + lower * wy with
// one multiplication.
__m512i blend_sixteen(const uint32_t* upper, const uint32_t* lower, __m512i wy) {
    const __m512i from = _mm512_load_si512(upper);
    const __m512i step = _mm512_mullo_epi32(_mm512_sub_epi32(_mm512_load_si512(lower), from), wy);
    return _mm512_add_epi32(_mm512_slli_epi32(from, kBilinearWeightBits), step);
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
          const BilinearPlan& plan, const BilinearNext& next) {
    const int32_t bytes = plan.bytes();
    SteadyFetch fetch(next, bytes / kStepBytes);
    const __m512i weight = _mm512_set1_epi32(wy);
    int32_t i = 0;
    for (; i + kStepBytes <= bytes; i += kStepBytes) {
        fetch.step();
        _mm512_storeu_si512(dst + i, blend_bytes(upper.values + i, lower.values + i, weight));
    }
    if (i < bytes) {
        const __mmask64 rest = ~uint64_t{0} >> (kStepBytes - (bytes - i));
        _mm512_mask_storeu_epi8(dst + i, rest,
                                blend_bytes(upper.values + i, lower.values + i, weight));
    }
}

// The bytes of a window of 128.
__m512i shuffle_window(const uint8_t* window, __m512i indices) {
    return _mm512_permutex2var_epi8(_mm512_loadu_si512(window), indices,
                                    _mm512_loadu_si512(window + 64));
}

void copy_64_of_64(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan) {
    copy_groups<64>(dst, row, plan, [](uint8_t* to, const uint8_t* window, const uint8_t* shuffle) {
        const __m512i indices = _mm512_loadu_si512(shuffle);
        _mm512_storeu_si512(to, _mm512_permutexvar_epi8(indices, _mm512_loadu_si512(window)));
    });
}

void copy_64_of_128(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan) {
    copy_groups<64>(dst, row, plan, [](uint8_t* to, const uint8_t* window, const uint8_t* shuffle) {
        _mm512_storeu_si512(to, shuffle_window(window, _mm512_loadu_si512(shuffle)));
    });
}

void copy_32_of_128(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan) {
    copy_groups<32>(dst, row, plan, [](uint8_t* to, const uint8_t* window, const uint8_t* shuffle) {
        const __m256i indices = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(shuffle));
        const __m512i bytes = shuffle_window(window, _mm512_castsi256_si512(indices));
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(to), _mm512_castsi512_si256(bytes));
    });
}

void copy_16_of_128(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan) {
    copy_groups<16>(dst, row, plan, [](uint8_t* to, const uint8_t* window, const uint8_t* shuffle) {
        const __m128i indices = _mm_loadu_si128(reinterpret_cast<const __m128i*>(shuffle));
        const __m512i bytes = shuffle_window(window, _mm512_castsi128_si512(indices));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(to), _mm512_castsi512_si128(bytes));
    });
}

}  // namespace

// The smallest window that will do: it crosses fewer cache lines. Reductions to less than a third
// or so take more than the largest; of those, windows as AVX2 takes them serve a quad each.
BilinearKernels plan_bilinear_avx512(BilinearPlan& plan, const BilinearColumns& columns) {
    if (plan_quads(plan, columns, {16, kQuads, kQuads})) return {across<16>, down};
    if (plan_quads(plan, columns, {32, kQuads, kQuads})) return {across<32>, down};
    if (plan_quads(plan, columns, {64, kQuads, kQuads})) return {across<64>, down};
    return {plan_bilinear_avx2(plan, columns).across, down};
}

// Windows of one vector, or of two for smaller and smaller groups.
BilinearCopy* plan_bilinear_copy_avx512(BilinearPlan& plan, const BilinearColumns& columns) {
    if (plan_groups(plan, columns, 64, 64)) return copy_64_of_64;
    if (plan_groups(plan, columns, 64, 128)) return copy_64_of_128;
    if (plan_groups(plan, columns, 32, 128)) return copy_32_of_128;
    if (plan_groups(plan, columns, 16, 128)) return copy_16_of_128;
    return plan_bilinear_copy_scalar(plan, columns);
}

}  // namespace ovrin
