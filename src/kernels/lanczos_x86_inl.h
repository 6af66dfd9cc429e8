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

    uint64_t add_block(uint8_t* dst, int32_t first) const {
        constexpr int32_t kGroupBytes = kGroup * kPixel;
        uint64_t near = 0;
        for (int32_t i = 0; i < kBlock * kPixel; i += kGroupBytes) {
            const auto floats = [&](int32_t k) { return add(first + i + k); };
            near |= uint64_t{Set::store_group(dst + i, floats, uncertain_)} << i;
        }
        return near;
    }

private:
    using Vector = typename Set::Vector;

    // A vector of bytes, 0.5 added, to be clamped yet.
    Vector add(int32_t i) const {
        Vector value = Set::broadcast(0.5F);
        for (int32_t r = 0; r < kLanczosTaps; ++r) {
            value = Set::multiply_add(weights_[r], rows_[r] + i, value);
        }
        return value;
    }

    const float* rows_[kLanczosTaps];
    Vector weights_[kLanczosTaps];
    Vector uncertain_;
};

// Chains of bytes from anywhere in a row, one in each double of a vector.
class ChainsOfFour {
public:
    ChainsOfFour(const LanczosColumns& columns, const uint16_t* bytes) {
        __m256d low[kLanes];
        __m256d high[kLanes];
        for (int32_t k = 0; k < kLanes; ++k) {
            const int32_t x = bytes[k] / kPixel;
            const double* weights = columns.weights + int64_t{x} * kLanczosTaps;
            low[k] = _mm256_loadu_pd(weights);
            high[k] = _mm256_loadu_pd(weights + kHigh);
            first_[k] = int64_t{columns.index[x]} * kPixel;
            moves_[k] = moves(k, bytes[k] % kPixel);
        }
        transpose(weights_, low);
        transpose(weights_ + kHigh, high);
    }

    // Adds a source row.
    void add(const uint8_t* taps, double row_weight) {
        __m256i samples = _mm256_setzero_si256();
        for (int32_t k = 0; k < kLanes; ++k) {
            const uint8_t* low = taps + first_[k];
            const __m256i pixels =
                _mm256_loadu2_m128i(as_vector(low + kHigh * kPixel), as_vector(low));
            samples = _mm256_or_si256(samples, _mm256_shuffle_epi8(pixels, moves_[k]));
        }
        alignas(32) uint8_t bytes[2 * kLanes * kLanes];
        _mm256_store_si256(reinterpret_cast<__m256i*>(bytes), samples);
        const __m256d weight = _mm256_set1_pd(row_weight);
        for (int32_t i = 0; i < kLanczosTaps; ++i) {
            const int32_t at = i < kLanes ? i : i - kHigh + kLanes;
            const __m256d product = _mm256_mul_pd(weight, weights_[i]);
            sum_ = _mm256_fmadd_pd(product, as_doubles(bytes + at * kLanes), sum_);
        }
    }

    // Adds 0.5, truncates and clamps.
    void store(uint8_t* row, const uint16_t* bytes) const {
        const __m128i whole = _mm256_cvttpd_epi32(_mm256_add_pd(sum_, _mm256_set1_pd(0.5)));
        const __m128i words = _mm_packs_epi32(whole, whole);
        const int32_t four = _mm_cvtsi128_si32(_mm_packus_epi16(words, words));
        uint8_t results[kLanes];
        memcpy(results, &four, sizeof results);
        for (int32_t k = 0; k < kLanes; ++k) row[bytes[k]] = results[k];
    }

private:
    // Taps come in halves of four: the first ones, and those from this one on.
    static constexpr int32_t kHigh = kLanczosTaps - kLanes;

    static const __m128i* as_vector(const uint8_t* bytes) {
        return reinterpret_cast<const __m128i*>(bytes);
    }

    // Moves byte `component` of each pixel to its byte `lane`, and zeros to the others.
    static __m256i moves(int32_t lane, int32_t component) {
        const __m128i lane_bits = _mm_cvtsi32_si128(8 * lane);
        const __m128i pixels = _mm_setr_epi32(0, 4, 8, 12);
        const __m128i byte = _mm_add_epi32(pixels, _mm_set1_epi32(component));
        const __m128i others =
            _mm_andnot_si128(_mm_sll_epi32(_mm_set1_epi32(0xFF), lane_bits), _mm_set1_epi8(-1));
        return _mm256_broadcastsi128_si256(_mm_or_si128(_mm_sll_epi32(byte, lane_bits), others));
    }

    static void transpose(__m256d* columns, const __m256d (&rows)[kLanes]) {
        const __m256d a = _mm256_unpacklo_pd(rows[0], rows[1]);
        const __m256d b = _mm256_unpackhi_pd(rows[0], rows[1]);
        const __m256d c = _mm256_unpacklo_pd(rows[2], rows[3]);
        const __m256d d = _mm256_unpackhi_pd(rows[2], rows[3]);
        columns[0] = _mm256_permute2f128_pd(a, c, 0x20);
        columns[1] = _mm256_permute2f128_pd(b, d, 0x20);
        columns[2] = _mm256_permute2f128_pd(a, c, 0x31);
        columns[3] = _mm256_permute2f128_pd(b, d, 0x31);
    }

    static __m256d as_doubles(const uint8_t* bytes) {
        int32_t four;
        memcpy(&four, bytes, sizeof four);
        return _mm256_cvtepi32_pd(_mm_cvtepu8_epi32(_mm_cvtsi32_si128(four)));
    }

    __m256d sum_ = _mm256_setzero_pd();
    int64_t first_[kLanes];
    __m256i moves_[kLanes];
    __m256d weights_[kLanczosTaps];
};

}  // namespace

}  // namespace ovrin
