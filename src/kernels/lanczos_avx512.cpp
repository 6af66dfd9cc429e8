// SPDX-License-Identifier: Apache-2.0
// Lanczos rows with AVX-512; see lanczos_approximation_inl.h for how the byte is decided.
#include "kernels/intrinsics_avx512_inl.h"
#include "kernels/lanczos_approximation_inl.h"
#include "kernels/lanczos_x86_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kVectorFloats = 16;

// The taps of a pixel, added up to four partial sums per component.
__m512 weigh_taps(const float* taps, const float* weights) {
    const __m512i low = _mm512_setr_epi32(0, 0, 0, 0, 1, 1, 1, 1, 2, 2, 2, 2, 3, 3, 3, 3);
    const __m512i high = _mm512_setr_epi32(4, 4, 4, 4, 5, 5, 5, 5, 6, 6, 6, 6, 7, 7, 7, 7);
    const __m512 eight = _mm512_castps256_ps512(_mm256_load_ps(weights));
    const __m512 sum = _mm512_mul_ps(_mm512_permutexvar_ps(low, eight), _mm512_loadu_ps(taps));
    return _mm512_fmadd_ps(_mm512_permutexvar_ps(high, eight),
                           _mm512_loadu_ps(taps + kVectorFloats), sum);
}

// Quarters 0 and 2, and 1 and 3, of each vector added: two quarters of a, then two of b.
__m512 add_halves(__m512 a, __m512 b) {
    return _mm512_add_ps(_mm512_shuffle_f32x4(a, b, 0x44), _mm512_shuffle_f32x4(a, b, 0xEE));
}

// Neighbouring quarters added.
__m512 add_quarters(__m512 a, __m512 b) {
    return _mm512_add_ps(_mm512_shuffle_f32x4(a, b, 0x88), _mm512_shuffle_f32x4(a, b, 0xDD));
}

struct Avx512 {
    using Vector = __m512;
    using WeightedRows = WeightedRowsX86<Avx512>;
    static constexpr bool kMirrors = false;

    static constexpr int32_t kConverted = kVectorFloats;
    static void convert(float* floats, const uint8_t* bytes) {
        const __m128i sixteen = _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes));
        _mm512_storeu_ps(floats, _mm512_cvtepi32_ps(_mm512_cvtepu8_epi32(sixteen)));
    }

    static void sum_group(float* sums, const float* span, const LanczosStripPlan& plan, int32_t x,
                          int32_t first) {
        const auto pixel = [&](int32_t i) {
            return weigh_taps(span + (plan.index[x + i] - first) * kPixel, plan.weights[x + i]);
        };
        const __m512 low = add_halves(pixel(0), pixel(1));
        const __m512 high = add_halves(pixel(2), pixel(3));
        _mm512_store_ps(sums, add_quarters(low, high));
    }

    static Vector broadcast(float value) { return _mm512_set1_ps(value); }

    static Vector multiply_add(Vector weight, const float* sums, Vector value) {
        return _mm512_fmadd_ps(weight, _mm512_load_ps(sums), value);
    }

    template <class Floats>
    static uint32_t store_group(uint8_t* dst, const Floats& floats, Vector uncertain) {
        const Vector value = floats(0);
        const __m512i whole = _mm512_max_epi32(_mm512_cvttps_epi32(value), _mm512_setzero_si512());
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst), _mm512_cvtusepi32_epi8(whole));
        const __m512 off = _mm512_abs_ps(_mm512_reduce_ps(value, 0));
        return _mm512_cmp_ps_mask(off, uncertain, _CMP_LT_OQ);
    }

    static void run_chains(const LanczosColumns& columns, const LanczosRow& row,
                           const uint16_t* bytes, int32_t count) {
        run_chains_of_four<ChainsOfFour>(columns, row, bytes, count);
    }
};

}  // namespace

FilterLanczos* plan_lanczos_avx512(LanczosStripPlan& plan, const LanczosColumns& columns) {
    return plan_filter<Avx512>(plan, columns);
}

}  // namespace ovrin
