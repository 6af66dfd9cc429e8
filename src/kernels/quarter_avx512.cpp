// SPDX-License-Identifier: Apache-2.0
// Quarter-point rows with AVX-512, on processors whose byte permutations cross lanes (VBMI): one
// permutation picks from two windows.
#include <immintrin.h>

#include "kernels/quarter_windows.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kVector = 64;
constexpr int32_t kMostWindows = 4;

// Storage of a plan, for every target vector. A permutation looks at seven bits of an offset, so
// the eighth says which of two pairs of windows it is meant for.
struct VectorPlan {
    alignas(kVector) uint8_t left[kVector];
    uint8_t right[kVector];
    uint64_t left_in_second_pair;
    uint64_t right_in_second_pair;
    int32_t base;
};

constexpr int32_t kMostVectors = kPlanBytes / static_cast<int32_t>(sizeof(VectorPlan));

void append(QuarterPlan& plan, const Tap* taps, int32_t count) {
    const int32_t bytes = count * plan.sample_bytes;
    auto* vectors = reinterpret_cast<VectorPlan*>(plan.bytes);
    VectorPlan* vector = vectors + plan.samples * plan.sample_bytes / kVector;
    for (int32_t first = 0; first < bytes; first += kVector, ++vector) {
        const int32_t rest = bytes - first;
        WindowTaps window;
        locate_taps(window, taps, first, rest < kVector ? rest : kVector, plan,
                    plan.windows * kVector);
        const __m512i left = _mm512_load_si512(window.left);
        const __m512i right = _mm512_load_si512(window.right);
        _mm512_storeu_si512(vector->left, left);
        _mm512_storeu_si512(vector->right, right);
        vector->left_in_second_pair = _mm512_movepi8_mask(left);
        vector->right_in_second_pair = _mm512_movepi8_mask(right);
        vector->base = window.base;
    }
    plan.samples += count;
}

__m512i quarter(__m512i samples) {
    return _mm512_and_si512(_mm512_srli_epi16(samples, 2), _mm512_set1_epi8(0x3F));
}

// The rows' quarters of one window.
template <bool kPair>
__m512i load_window(const uint8_t* top, const uint8_t* bottom, int32_t offset) {
    __m512i sums = quarter(_mm512_loadu_si512(top + offset));
    if (kPair) sums = _mm512_add_epi8(sums, quarter(_mm512_loadu_si512(bottom + offset)));
    return sums;
}

// The form with a mask, because g++ warns about the plain one's own header.
__m512i permute(__m512i offsets, __m512i window) {
    return _mm512_maskz_permutexvar_epi8(~__mmask64{0}, offsets, window);
}

template <int kWindows, bool kPair>
__m512i gather(const uint8_t* top, const uint8_t* bottom, const VectorPlan& vector) {
    const __m512i left = _mm512_loadu_si512(vector.left);
    const __m512i right = _mm512_loadu_si512(vector.right);
    const auto window = [&](int32_t w) {
        return load_window<kPair>(top, bottom, vector.base + w * kVector);
    };
    const __m512i first = window(0);
    if (kWindows == 1) {
        return _mm512_add_epi8(permute(left, first), permute(right, first));
    }
    const __m512i second = window(1);
    __m512i left_taps = _mm512_permutex2var_epi8(first, left, second);
    __m512i right_taps = _mm512_permutex2var_epi8(first, right, second);
    if (kWindows > 2) {
        const __m512i third = window(2);
        const __m512i fourth = kWindows > 3 ? window(3) : third;
        left_taps = _mm512_mask_mov_epi8(left_taps, vector.left_in_second_pair,
                                         _mm512_permutex2var_epi8(third, left, fourth));
        right_taps = _mm512_mask_mov_epi8(right_taps, vector.right_in_second_pair,
                                          _mm512_permutex2var_epi8(third, right, fourth));
    }
    return _mm512_add_epi8(left_taps, right_taps);
}

template <int kWindows, bool kPair, bool kAdd>
void run_windows(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const QuarterPlan& plan) {
    const int32_t bytes = plan.samples * plan.sample_bytes;
    const auto* vector = reinterpret_cast<const VectorPlan*>(plan.bytes);
    for (int32_t done = kVector; done <= bytes; done += kVector, dst += kVector, ++vector) {
        __m512i samples = gather<kWindows, kPair>(top, bottom, *vector);
        if (kAdd) samples = _mm512_add_epi8(samples, _mm512_loadu_si512(dst));
        _mm512_storeu_si512(dst, samples);
    }
    if (bytes % kVector != 0) {
        const __mmask64 part = ~uint64_t{0} >> (kVector - bytes % kVector);
        __m512i samples = gather<kWindows, kPair>(top, bottom, *vector);
        if (kAdd) samples = _mm512_add_epi8(samples, _mm512_maskz_loadu_epi8(part, dst));
        _mm512_mask_storeu_epi8(dst, part, samples);
    }
}

template <int kWindows>
void store_pair(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const QuarterPlan& plan) {
    run_windows<kWindows, true, false>(dst, top, bottom, plan);
}

template <int kWindows>
void add_pair(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const QuarterPlan& plan) {
    run_windows<kWindows, true, true>(dst, top, bottom, plan);
}

template <int kWindows>
void add_row(uint8_t* dst, const uint8_t* row, const QuarterPlan& plan) {
    run_windows<kWindows, false, true>(dst, row, nullptr, plan);
}

template <int kWindows>
constexpr QuarterKernels quarter_kernels() {
    return {append, store_pair<kWindows>, add_pair<kWindows>, add_row<kWindows>};
}

constexpr QuarterKernels kQuarterKernels[kMostWindows] = {
    quarter_kernels<1>(), quarter_kernels<2>(), quarter_kernels<3>(), quarter_kernels<4>()};

}  // namespace

const QuarterKernels& begin_quarter_plan_avx512(QuarterPlan& plan, const QuarterRowShape& shape) {
    // Where four windows do not reach, the shorter ones of AVX2 do better than many long ones.
    const QuarterKernels& shorter = begin_quarter_plan_avx2(plan, shape);
    const int32_t windows = windows_needed(shape, kVector, kVector, kMostWindows);
    if (windows == 0) return shorter;
    plan.windows = windows;
    plan.capacity = kMostVectors * kVector / shape.sample_bytes;
    return kQuarterKernels[windows - 1];
}

}  // namespace ovrin
