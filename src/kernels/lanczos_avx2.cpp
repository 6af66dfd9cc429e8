// SPDX-License-Identifier: Apache-2.0
// Lanczos rows with AVX2 and FMA; see lanczos_approximation.h for how the byte is decided.
#include <immintrin.h>

#include "kernels/lanczos_approximation.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kVectorFloats = 8;

__m256 load_bytes(const uint8_t* bytes) {
    const __m128i eight = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(bytes));
    return _mm256_cvtepi32_ps(_mm256_cvtepu8_epi32(eight));
}

// Sums of `floats` bytes from `first` on, weighted by row.
void sum_columns(ColumnSums& sums, const LanczosRow& row, int64_t first, int32_t floats) {
    __m256 weights[kTaps];
    for (int32_t r = 0; r < kTaps; ++r) {
        weights[r] = _mm256_set1_ps(static_cast<float>(row.row_weights[r]));
    }
    int32_t i = 0;
    for (; i + kVectorFloats <= floats; i += kVectorFloats) {
        __m256 sum = _mm256_mul_ps(weights[0], load_bytes(row.taps[0] + first + i));
        for (int32_t r = 1; r < kTaps; ++r) {
            sum = _mm256_fmadd_ps(weights[r], load_bytes(row.taps[r] + first + i), sum);
        }
        _mm256_store_ps(sums.values + i, sum);
    }
    sum_last_columns(sums, row, first, i, floats);
}

// Two neighbouring pixels' column sums, weighted by two neighbouring taps.
__m256 two_taps(const float* sums, __m256 weights, int first, int second) {
    const __m256i lanes =
        _mm256_setr_epi32(first, first, first, first, second, second, second, second);
    return _mm256_mul_ps(_mm256_loadu_ps(sums), _mm256_permutevar8x32_ps(weights, lanes));
}

__m256 add_two_taps(__m256 sum, const float* sums, __m256 weights, int first, int second) {
    const __m256i lanes =
        _mm256_setr_epi32(first, first, first, first, second, second, second, second);
    return _mm256_fmadd_ps(_mm256_loadu_ps(sums), _mm256_permutevar8x32_ps(weights, lanes), sum);
}

// One pixel in single precision, 0.5 added. weights: seven doubles.
__m128 approximate_pixel(const float* sums, const double* weights) {
    const __m128 low = _mm256_cvtpd_ps(_mm256_loadu_pd(weights));       // taps 0 to 3
    const __m128 high = _mm256_cvtpd_ps(_mm256_loadu_pd(weights + 3));  // taps 3 to 6
    const __m256 taps = _mm256_insertf128_ps(_mm256_castps128_ps256(low), high, 1);
    __m256 sum = two_taps(sums, taps, 0, 1);
    sum = add_two_taps(sum, sums + 2 * kPixel, taps, 2, 3);
    sum = add_two_taps(sum, sums + 4 * kPixel, taps, 5, 6);
    const __m128 last = _mm_mul_ps(_mm_loadu_ps(sums + 6 * kPixel), _mm_permute_ps(high, 0xFF));
    const __m128 halves = _mm_add_ps(_mm256_castps256_ps128(sum), _mm256_extractf128_ps(sum, 1));
    return _mm_add_ps(_mm_add_ps(halves, last), _mm_set1_ps(0.5F));
}

// Whether the byte could be another one: a component lies next to a whole number from 1 to 255.
// Below and above, results are clamped anyway.
bool is_uncertain(__m128 value) {
    const __m128 whole = _mm_round_ps(value, _MM_FROUND_TO_NEAREST_INT | _MM_FROUND_NO_EXC);
    const __m128 distance = _mm_andnot_ps(_mm_set1_ps(-0.0F), _mm_sub_ps(value, whole));
    const __m128 near = _mm_cmplt_ps(distance, _mm_set1_ps(kUncertain));
    const __m128 inside = _mm_and_ps(_mm_cmpge_ps(whole, _mm_set1_ps(1.0F)),
                                     _mm_cmple_ps(whole, _mm_set1_ps(255.0F)));
    return _mm_movemask_ps(_mm_and_ps(near, inside)) != 0;
}

// Truncates and clamps.
void store_pixel(uint8_t* dst, __m128i whole) {
    const __m128i words = _mm_packs_epi32(whole, whole);
    const int32_t bytes = _mm_cvtsi128_si32(_mm_packus_epi16(words, words));
    __builtin_memcpy(dst, &bytes, sizeof bytes);
}

// The chain itself, one component per lane. `first`: byte of the first tap in each row.
void exact_pixel(uint8_t* dst, const LanczosRow& row, const double* weights, int64_t first) {
    __m256d sum = _mm256_setzero_pd();
    for (int32_t r = 0; r < kTaps; ++r) {
        const uint8_t* taps = row.taps[r] + first;
        for (int32_t i = 0; i < kTaps; ++i) {
            int32_t bytes;
            __builtin_memcpy(&bytes, taps + i * kPixel, sizeof bytes);
            const __m256d samples = _mm256_cvtepi32_pd(_mm_cvtepu8_epi32(_mm_cvtsi32_si128(bytes)));
            sum = _mm256_fmadd_pd(_mm256_set1_pd(row.row_weights[r] * weights[i]), samples, sum);
        }
    }
    store_pixel(dst, _mm256_cvttpd_epi32(_mm256_add_pd(sum, _mm256_set1_pd(0.5))));
}

void filter_pixels(const LanczosRow& row) {
    ColumnSums sums;
    for (int32_t x = 0; x < row.count;) {
        const int32_t end = x + pixels_in_span(row, x);
        const int32_t first = row.index[x];
        sum_columns(sums, row, int64_t{first} * kPixel,
                    (row.index[end - 1] - first + kTaps) * kPixel);
        for (; x < end; ++x) {
            const double* weights = row.column_weights + int64_t{x} * kTaps;
            uint8_t* dst = row.dst + int64_t{x} * kPixel;
            const __m128 value =
                approximate_pixel(sums.values + (row.index[x] - first) * kPixel, weights);
            if (is_uncertain(value)) {
                exact_pixel(dst, row, weights, int64_t{row.index[x]} * kPixel);
            } else {
                store_pixel(dst, _mm_cvttps_epi32(value));
            }
        }
    }
}

}  // namespace

void lanczos_row_avx2(const LanczosRow& row) {
    if (row.has_small_weights && row.src_components == kPixel && row.dst_components == kPixel) {
        filter_pixels(row);
    } else {
        lanczos_row_scalar(row);
    }
}

}  // namespace ovrin
