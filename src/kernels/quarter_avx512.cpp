// SPDX-License-Identifier: Apache-2.0
// Quarter-point rows with AVX-512, on processors whose byte permutations cross lanes (VBMI): one
// permutation picks from two windows.
#include <immintrin.h>
#include <stddef.h>

#include "kernels/inline.h"
#include "kernels/quarter_windows_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kVector = 64;
constexpr int32_t kMaxWindows = 4;

__m512i quarter(__m512i samples) {
    return _mm512_and_si512(_mm512_srli_epi16(samples, 2), _mm512_set1_epi8(0x3F));
}

// The rows' quarters of one window.
template <bool kFetch, bool kPair>
OVRIN_ALWAYS_INLINE __m512i load_window(const QuarterRows& rows, ptrdiff_t offset) {
    if (kFetch) _mm_prefetch(rows.next_top + offset, _MM_HINT_T0);
    __m512i sums = quarter(_mm512_loadu_si512(rows.top + offset));
    if (kPair) {
        if (kFetch) _mm_prefetch(rows.next_bottom + offset, _MM_HINT_T0);
        sums = _mm512_add_epi8(sums, quarter(_mm512_loadu_si512(rows.bottom + offset)));
    }
    return sums;
}

// The form with a mask, because g++ warns about the plain one's own header.
__m512i permute(__m512i offsets, __m512i window) {
    return _mm512_maskz_permutexvar_epi8(~__mmask64{0}, offsets, window);
}

template <int kWindows, bool kPair>
OVRIN_ALWAYS_INLINE __m512i gather(const QuarterRows& rows, const QuarterPlan& plan,
                                   VectorEntry entry) {
    const auto& offsets = *reinterpret_cast<const Offsets<kVector>*>(plan.bytes + entry.masks);
    const __m512i left = _mm512_load_si512(offsets.left);
    const __m512i right = _mm512_load_si512(offsets.right);
    const auto window = [&](int32_t w) {
        return load_window<(kWindows > 1), kPair>(rows, ptrdiff_t{entry.base} + w * kVector);
    };
    const __m512i first = window(0);
    if (kWindows == 1) {
        return _mm512_add_epi8(permute(left, first), permute(right, first));
    }
    const __m512i second = window(1);
    __m512i left_taps = _mm512_permutex2var_epi8(first, left, second);
    __m512i right_taps = _mm512_permutex2var_epi8(first, right, second);
    if (kWindows > 2) {
        // A permutation looks at seven bits of an offset; the eighth says that it is meant for the
        // second pair of windows.
        const __m512i third = window(2);
        const __m512i fourth = kWindows > 3 ? window(3) : third;
        left_taps = _mm512_mask_mov_epi8(left_taps, _mm512_movepi8_mask(left),
                                         _mm512_permutex2var_epi8(third, left, fourth));
        right_taps = _mm512_mask_mov_epi8(right_taps, _mm512_movepi8_mask(right),
                                          _mm512_permutex2var_epi8(third, right, fourth));
    }
    return _mm512_add_epi8(left_taps, right_taps);
}

__mmask64 first_bytes(int32_t count) {
    return ~uint64_t{0} >> (kVector - count);
}

// Whole vectors are stored as long as they end inside the strip: what follows the samples of one
// is stored by the next.
template <int kWindows, bool kPair, bool kAdd>
void run_windows(uint8_t* dst, const QuarterRows& source, const QuarterPlan& plan) {
    const QuarterRows rows = source;
    const int32_t step = plan.vector_samples * plan.sample_bytes;
    const __mmask64 kept = first_bytes(step);
    const auto* entry = reinterpret_cast<const VectorEntry*>(plan.bytes);
    int32_t rest = plan.samples * plan.sample_bytes;
    for (; rest >= kVector; rest -= step, dst += step, ++entry) {
        __m512i samples = gather<kWindows, kPair>(rows, plan, *entry);
        if (kAdd) {
            samples =
                _mm512_add_epi8(_mm512_maskz_mov_epi8(kept, samples), _mm512_loadu_si512(dst));
        }
        _mm512_storeu_si512(dst, samples);
    }
    for (; rest > 0; rest -= step, dst += step, ++entry) {
        const __mmask64 part = first_bytes(rest < step ? rest : step);
        __m512i samples = gather<kWindows, kPair>(rows, plan, *entry);
        if (kAdd) samples = _mm512_add_epi8(samples, _mm512_maskz_loadu_epi8(part, dst));
        _mm512_mask_storeu_epi8(dst, part, samples);
    }
}

template <int kWindows>
constexpr QuarterKernels quarter_kernels() {
    return {run_windows<kWindows, true, false>, run_windows<kWindows, true, true>,
            run_windows<kWindows, false, true>};
}

constexpr QuarterKernels kQuarterKernels[kMaxWindows] = {
    quarter_kernels<1>(), quarter_kernels<2>(), quarter_kernels<3>(), quarter_kernels<4>()};

}  // namespace

const QuarterKernels& plan_quarters_avx512(QuarterPlan& plan, const QuarterRowShape& shape,
                                           QuarterColumns& columns, int32_t samples) {
    // At 3:2 and 2:3 of smaller samples, and for pixels of three bytes that are not enlarged,
    // permutations are as fast.
    const bool is_whole = shape.src_columns % shape.dst_columns == 0;
    const bool enlarges = shape.src_columns < shape.dst_columns;
    if (shape.sample_bytes == 4 || (enlarges && shape.sample_bytes == 3) ||
        (is_whole && shape.sample_bytes < 3)) {
        const QuarterKernels* simple = plan_simple_quarters_avx2(plan, shape, columns, samples);
        if (simple != nullptr) return *simple;
    }
    const WindowShape vector = window_shape(shape, kVector, kMaxWindows);
    // Rows too short for these windows may have room for shorter ones.
    if (vector.windows == 0) return plan_quarters_avx2(plan, shape, columns, samples);
    plan_offsets<kVector>(plan, shape, vector, columns, samples);
    return kQuarterKernels[vector.windows - 1];
}

}  // namespace ovrin
