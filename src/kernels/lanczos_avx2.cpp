// SPDX-License-Identifier: Apache-2.0
// Lanczos rows with AVX2 and FMA; see lanczos_approximation_inl.h for how the byte is decided.
#include <immintrin.h>
#include <string.h>

#include "kernels/lanczos_approximation_inl.h"
#include "kernels/lanczos_x86_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kVectorFloats = 8;

// Taps `first` and `first + 1` of a pixel.
__m256 two_weights(__m256 weights, int first) {
    const __m256i lanes = _mm256_setr_epi32(0, 0, 0, 0, 1, 1, 1, 1);
    return _mm256_permutevar8x32_ps(weights, _mm256_add_epi32(lanes, _mm256_set1_epi32(first)));
}

// The taps of a pixel, added up to two partial sums per component.
__m256 weigh_taps(const float* taps, const float* weights) {
    const __m256 eight = _mm256_load_ps(weights);
    __m256 sum = _mm256_mul_ps(two_weights(eight, 0), _mm256_loadu_ps(taps));
    for (int32_t i = 2; i < kLanczosTaps; i += 2) {
        sum = _mm256_fmadd_ps(two_weights(eight, i), _mm256_loadu_ps(taps + i * kPixel), sum);
    }
    return sum;
}

__m256 add_halves(__m256 a, __m256 b) {
    return _mm256_add_ps(_mm256_permute2f128_ps(a, b, 0x20), _mm256_permute2f128_ps(a, b, 0x31));
}

// A bit for every component that lies within `distance` of another byte.
uint32_t find_uncertain(__m256 value, __m256 distance) {
    const __m256 whole = _mm256_round_ps(value, _MM_FROUND_TO_NEAREST_INT | _MM_FROUND_NO_EXC);
    const __m256 off = _mm256_andnot_ps(_mm256_set1_ps(-0.0F), _mm256_sub_ps(value, whole));
    return static_cast<uint32_t>(_mm256_movemask_ps(_mm256_cmp_ps(off, distance, _CMP_LT_OQ)));
}

// A group's bytes, clamped.
__m128i pack(__m256 low, __m256 high) {
    const __m256i words = _mm256_packus_epi32(_mm256_cvttps_epi32(low), _mm256_cvttps_epi32(high));
    // Packing works within the halves of a vector; the permutation brings the pixels back in order.
    const __m256i bytes = _mm256_packus_epi16(words, words);
    return _mm256_castsi256_si128(
        _mm256_permutevar8x32_epi32(bytes, _mm256_setr_epi32(0, 4, 1, 5, 0, 0, 0, 0)));
}

struct Avx2 {
    using Vector = __m256;
    using WeightedRows = WeightedRowsX86<Avx2>;
    static constexpr bool kMirrors = false;

    static constexpr int32_t kConverted = kVectorFloats;
    static void convert(float* floats, const uint8_t* bytes) {
        const __m128i eight = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(bytes));
        _mm256_storeu_ps(floats, _mm256_cvtepi32_ps(_mm256_cvtepu8_epi32(eight)));
    }

    static void sum_group(float* sums, const float* span, const LanczosStripPlan& plan, int32_t x,
                          int32_t first) {
        const auto pixel = [&](int32_t i) {
            return weigh_taps(span + (plan.index[x + i] - first) * kPixel, plan.weights[x + i]);
        };
        _mm256_store_ps(sums, add_halves(pixel(0), pixel(1)));
        _mm256_store_ps(sums + kVectorFloats, add_halves(pixel(2), pixel(3)));
    }

    static Vector broadcast(float value) { return _mm256_set1_ps(value); }

    static Vector multiply_add(Vector weight, const float* sums, Vector value) {
        return _mm256_fmadd_ps(weight, _mm256_load_ps(sums), value);
    }

    template <class Floats>
    static uint32_t store_group(uint8_t* dst, const Floats& floats, Vector uncertain) {
        const Vector low = floats(0);
        const Vector high = floats(kVectorFloats);
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst), pack(low, high));
        return find_uncertain(low, uncertain) | find_uncertain(high, uncertain) << kVectorFloats;
    }

    static void run_chains(const LanczosColumns& columns, const LanczosRow& row,
                           const uint16_t* bytes, int32_t count) {
        run_chains_of_four<ChainsOfFour>(columns, row, bytes, count);
    }
};

}  // namespace

FilterLanczos* plan_lanczos_avx2(LanczosStripPlan& plan, const LanczosColumns& columns) {
    return plan_filter<Avx2>(plan, columns);
}

}  // namespace ovrin
