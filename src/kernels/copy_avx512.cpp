// SPDX-License-Identifier: Apache-2.0
// Every step-th word with AVX-512: of each source vector, its words go to their places in the
// target vector.
#include <immintrin.h>

#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kWords = 16;
constexpr int32_t kMostVectors = 8;  // beyond this step, word by word is as fast

// Which words of the target vector come from a source vector, and which words of it they are.
struct Part {
    __m512i index;
    __mmask16 mask;
};

void find_parts(Part parts[kMostVectors], int32_t step) {
    for (int32_t v = 0; v < step; ++v) {
        alignas(64) int32_t index[kWords];
        uint32_t mask = 0;
        for (int32_t i = 0; i < kWords; ++i) {
            index[i] = i * step - v * kWords;
            if (index[i] >= 0 && index[i] < kWords) mask |= 1U << i;
        }
        parts[v] = {_mm512_load_si512(index), static_cast<__mmask16>(mask)};
    }
}

template <int kStep>
void copy_vectors(uint32_t* dst, const uint32_t* src, int32_t vectors, const uint32_t* next) {
    Part parts[kMostVectors];
    find_parts(parts, kStep);
    for (int32_t i = 0; i < vectors; ++i, dst += kWords) {
        __m512i words = _mm512_setzero_si512();
        for (int v = 0; v < kStep; ++v, src += kWords, next += kWords) {
            _mm_prefetch(next, _MM_HINT_T0);
            words = _mm512_mask_permutexvar_epi32(words, parts[v].mask, parts[v].index,
                                                  _mm512_loadu_si512(src));
        }
        _mm512_storeu_si512(dst, words);
    }
}

using CopyVectors = void(uint32_t* dst, const uint32_t* src, int32_t vectors, const uint32_t* next);
constexpr CopyVectors* kCopyVectors[kMostVectors + 1] = {
    nullptr,         nullptr,         copy_vectors<2>, copy_vectors<3>, copy_vectors<4>,
    copy_vectors<5>, copy_vectors<6>, copy_vectors<7>, copy_vectors<8>};

}  // namespace

void copy_every_avx512(uint32_t* dst, const uint32_t* src, int32_t step, int32_t count,
                       const uint32_t* next) {
    if (step < 2 || step > kMostVectors) {
        copy_every_scalar(dst, src, step, count, next);
        return;
    }
    // Vectors read up to the word that follows; so one must follow.
    const int32_t vectors = (count - 1) / kWords;
    kCopyVectors[step](dst, src, vectors, next);
    const ptrdiff_t done = ptrdiff_t{vectors} * kWords;
    copy_every_scalar(dst + done, src + done * step, step, count - static_cast<int32_t>(done),
                      next + done * step);
}

}  // namespace ovrin
