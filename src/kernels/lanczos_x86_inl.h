// SPDX-License-Identifier: Apache-2.0
// What the Lanczos rows of AVX2 and AVX-512 share: all but the vectors.
#pragma once

#include <immintrin.h>
#include <string.h>

#include "kernels/lanczos_approximation_inl.h"

namespace ovrin {

namespace {

// The sums of all source rows, to be weighed and added by vectors of a set.
template <class Set>
class WeightedRowsX86 {
public:
    WeightedRowsX86(const float* const* rows, const double* weights, float uncertain)
        : uncertain_(Set::broadcast(uncertain)) {
        for (int32_t r = 0; r < kLanczosTaps; ++r) {
            rows_[r] = rows[r];
            weights_[r] = Set::broadcast(static_cast<float>(weights[r]));
        }
    }

    uint64_t add_block(uint8_t* dst, int32_t x) const {
        uint64_t near = 0;
        for (int32_t i = 0; i < kBlock; i += kGroup) {
            const auto pixels = [&](int32_t k) { return add(x + i + k); };
            const uint32_t some = Set::store_group(dst + i * kPixel, pixels, uncertain_);
            near |= uint64_t{some} << (i * kPixel);
        }
        return near;
    }

private:
    using Vector = typename Set::Vector;

    // A vector of pixels, 0.5 added. Below and above, results are 0 and 255 anyway, and so are
    // these: far from others.
    Vector add(int32_t x) const {
        Vector value = Set::broadcast(0.5F);
        for (int32_t r = 0; r < kLanczosTaps; ++r) {
            value = Set::multiply_add(weights_[r], rows_[r] + x * kPixel, value);
        }
        return Set::clamp(value, Set::broadcast(0.5F), Set::broadcast(255.5F));
    }

    const float* rows_[kLanczosTaps];
    Vector weights_[kLanczosTaps];
    Vector uncertain_;
};

// The chains of whole pixels: one component in each double of a vector, some pixels side by side to
// hide the latency.
constexpr int32_t kChains = 4;
constexpr int32_t kProducts = 8;  // per row; the last is not used

// The products of a column's weights with all row weights.
void multiply_weights(double* products, const double* rows, const double* columns) {
    const __m256d low = _mm256_loadu_pd(columns);
    const __m256d high = _mm256_loadu_pd(columns + 3);
    for (int32_t r = 0; r < kLanczosTaps; ++r, products += kProducts) {
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

void run_some_chains(const LanczosColumns& columns, const LanczosRow& row,
                     const int32_t (&pixels)[kChains]) {
    double products[kChains][kLanczosTaps * kProducts];
    int64_t first[kChains];
    __m256d sums[kChains];
    for (int32_t k = 0; k < kChains; ++k) {
        multiply_weights(products[k], row.weights,
                         columns.weights + int64_t{pixels[k]} * kLanczosTaps);
        first[k] = int64_t{columns.index[pixels[k]]} * kPixel;
        sums[k] = _mm256_setzero_pd();
    }
    for (int32_t r = 0; r < kLanczosTaps; ++r) {
        const uint8_t* taps[kChains];
        for (int32_t k = 0; k < kChains; ++k) taps[k] = row.taps[r] + first[k];
        for (int32_t i = 0; i < kLanczosTaps; ++i) {
            for (int32_t k = 0; k < kChains; ++k) {
                const __m256d weight = _mm256_set1_pd(products[k][r * kProducts + i]);
                const __m256d samples = load_pixel(taps[k] + i * kPixel);
                sums[k] = _mm256_fmadd_pd(weight, samples, sums[k]);
            }
        }
    }
    for (int32_t k = 0; k < kChains; ++k) {
        store_pixel(row.dst + int64_t{pixels[k]} * kPixel, sums[k]);
    }
}

// The last pixel may be computed several times.
void run_chains_x86(const LanczosColumns& columns, const LanczosRow& row, const uint8_t* pixels,
                    int32_t count) {
    for (int32_t i = 0; i < count; i += kChains) {
        int32_t some[kChains];
        for (int32_t k = 0; k < kChains; ++k) some[k] = pixels[i + k < count ? i + k : count - 1];
        run_some_chains(columns, row, some);
    }
}

}  // namespace

}  // namespace ovrin
