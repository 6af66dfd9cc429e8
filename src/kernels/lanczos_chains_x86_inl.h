// SPDX-License-Identifier: Apache-2.0
// The chains of whole Lanczos pixels with AVX2 and FMA: one component per lane, some pixels side by
// side to hide the latency. AVX-512 uses them too.
#pragma once

#include <immintrin.h>
#include <string.h>

#include "kernels/lanczos_approximation_inl.h"

namespace ovrin {

namespace {

constexpr int32_t kChains = 4;
constexpr int32_t kProducts = 8;  // per row; the last is not used

// The products of a column's weights with all row weights.
void multiply_weights(double* products, const double* rows, const double* columns) {
    const __m256d low = _mm256_loadu_pd(columns);
    const __m256d high = _mm256_loadu_pd(columns + 3);
    for (int32_t r = 0; r < kTaps; ++r, products += kProducts) {
        const __m256d weight = _mm256_set1_pd(rows[r]);
        _mm256_storeu_pd(products, _mm256_mul_pd(weight, low));
        _mm256_storeu_pd(products + 3, _mm256_mul_pd(weight, high));
    }
}

__m256d load_pixel(const uint8_t* pixel) {
    int32_t bytes;
    memcpy(&bytes, pixel, sizeof bytes);
    return _mm256_cvtepi32_pd(_mm_cvtepu8_epi32(_mm_cvtsi32_si128(bytes)));
}

// Adds 0.5, truncates and clamps.
void store_pixel(uint8_t* dst, __m256d sum) {
    const __m128i whole = _mm256_cvttpd_epi32(_mm256_add_pd(sum, _mm256_set1_pd(0.5)));
    const __m128i words = _mm_packs_epi32(whole, whole);
    const int32_t bytes = _mm_cvtsi128_si32(_mm_packus_epi16(words, words));
    memcpy(dst, &bytes, sizeof bytes);
}

void run_some_chains(const LanczosStrip& strip, const LanczosRow& row,
                     const int32_t (&columns)[kChains]) {
    double products[kChains][kTaps * kProducts];
    int64_t first[kChains];
    __m256d sums[kChains];
    for (int32_t k = 0; k < kChains; ++k) {
        multiply_weights(products[k], row.row_weights,
                         strip.column_weights + int64_t{columns[k]} * kTaps);
        first[k] = int64_t{strip.index[columns[k]]} * kPixel;
        sums[k] = _mm256_setzero_pd();
    }
    for (int32_t r = 0; r < kTaps; ++r) {
        const uint8_t* taps[kChains];
        for (int32_t k = 0; k < kChains; ++k) taps[k] = row.taps[r] + first[k];
        for (int32_t i = 0; i < kTaps; ++i) {
            for (int32_t k = 0; k < kChains; ++k) {
                const __m256d weight = _mm256_set1_pd(products[k][r * kProducts + i]);
                const __m256d samples = load_pixel(taps[k] + i * kPixel);
                sums[k] = _mm256_fmadd_pd(weight, samples, sums[k]);
            }
        }
    }
    for (int32_t k = 0; k < kChains; ++k) {
        store_pixel(row.dst + int64_t{columns[k]} * kPixel, sums[k]);
    }
}

// The last pixel may be computed several times.
void run_chains_of(const LanczosStrip& strip, const LanczosRow& row, const int32_t* columns,
                   int32_t count) {
    for (int32_t i = 0; i < count; i += kChains) {
        int32_t some[kChains];
        for (int32_t k = 0; k < kChains; ++k) {
            some[k] = columns[i + k < count ? i + k : count - 1];
        }
        run_some_chains(strip, row, some);
    }
}

}  // namespace

}  // namespace ovrin
