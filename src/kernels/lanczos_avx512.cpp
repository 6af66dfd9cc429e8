// SPDX-License-Identifier: Apache-2.0
// Lanczos rows with AVX-512; see lanczos_approximation_inl.h for how the byte is decided.
#include "kernels/intrinsics_avx512.h"
#include "kernels/lanczos_approximation_inl.h"
#include "kernels/lanczos_chains_x86_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kVectorFloats = 16;

void convert_vector(float* floats, const uint8_t* bytes) {
    const __m128i sixteen = _mm_loadu_si128(reinterpret_cast<const __m128i*>(bytes));
    _mm512_storeu_ps(floats, _mm512_cvtepi32_ps(_mm512_cvtepu8_epi32(sixteen)));
}

// Seven taps of a pixel, added up to four partial sums per component.
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

// Seven rows of sums, to be weighed and added.
class Avx512Sums {
public:
    Avx512Sums(const float* const* rows, const double* weights, float uncertain)
        : uncertain_(_mm512_set1_ps(uncertain)) {
        for (int32_t r = 0; r < kTaps; ++r) {
            rows_[r] = rows[r];
            weights_[r] = _mm512_set1_ps(static_cast<float>(weights[r]));
        }
    }

    uint64_t add_block(uint8_t* dst, int32_t x) const {
        uint64_t near = 0;
        for (int32_t i = 0; i < kBlock; i += kGroup) {
            near |= uint64_t{add_group(dst + i * kPixel, x + i)} << (i * kPixel);
        }
        return near;
    }

private:
    uint32_t add_group(uint8_t* dst, int32_t x) const {
        __m512 value = _mm512_set1_ps(0.5F);
        for (int32_t r = 0; r < kTaps; ++r) {
            value = _mm512_fmadd_ps(weights_[r], _mm512_load_ps(rows_[r] + x * kPixel), value);
        }
        // Below and above, results are 0 and 255 anyway, and so are these: far from others.
        value = _mm512_max_ps(value, _mm512_set1_ps(0.5F));
        value = _mm512_min_ps(value, _mm512_set1_ps(255.5F));
        const __m128i bytes = _mm512_cvtepi32_epi8(_mm512_cvttps_epi32(value));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(dst), bytes);
        const __m512 off = _mm512_abs_ps(_mm512_reduce_ps(value, 0));
        return _mm512_cmp_ps_mask(off, uncertain_, _CMP_LT_OQ);
    }

    const float* rows_[kTaps];
    __m512 weights_[kTaps];
    __m512 uncertain_;
};

struct Avx512 {
    using Sums = Avx512Sums;

    static void convert(float* floats, const uint8_t* bytes, int32_t count) {
        for (int32_t i = 0; i < count - kVectorFloats; i += kVectorFloats) {
            convert_vector(floats + i, bytes + i);
        }
        const int32_t last = count - kVectorFloats;
        convert_vector(floats + last, bytes + last);
    }

    static void sum_group(float* sums, const float* span, const LanczosStrip& strip, int32_t x,
                          int32_t first) {
        const auto pixel = [&](int32_t i) {
            return weigh_taps(span + (strip.index[x + i] - first) * kPixel, strip.weights[x + i]);
        };
        const __m512 low = add_halves(pixel(0), pixel(1));
        const __m512 high = add_halves(pixel(2), pixel(3));
        _mm512_store_ps(sums, add_quarters(low, high));
    }

    static void run_chains(const LanczosStrip& strip, const LanczosRow& row, const int32_t* columns,
                           int32_t count) {
        run_chains_of(strip, row, columns, count);
    }
};

}  // namespace

const LanczosKernels lanczos_avx512 = {prepare, filter_row<Avx512>};

}  // namespace ovrin
