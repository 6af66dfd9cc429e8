// SPDX-License-Identifier: Apache-2.0
// Every step-th word with AVX2: of each source vector, its words go to their places in the
// destination vector. Longer vectors are no faster: the rows are waited for.
#include <immintrin.h>

#include "kernels/copy_words_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kWords = 8;
constexpr int32_t kMaxVectors = 8;  // beyond this step, word by word is as fast

// Which words of the destination vector come from a source vector, and which words of it they are.
struct Part {
    __m256i index;
    __m256i mask;
};

Part part_of(int32_t step, int32_t vector) {
    alignas(32) int32_t index[kWords];
    alignas(32) int32_t mask[kWords];
    for (int32_t i = 0; i < kWords; ++i) {
        index[i] = i * step - vector * kWords;
        mask[i] = index[i] >= 0 && index[i] < kWords ? -1 : 0;
    }
    return {_mm256_load_si256(reinterpret_cast<const __m256i*>(index)),
            _mm256_load_si256(reinterpret_cast<const __m256i*>(mask))};
}

template <int kStep>
void copy_vectors(uint32_t* dst, const uint32_t* src, int32_t vectors, const uint32_t* next) {
    Part parts[kStep];
    for (int32_t v = 0; v < kStep; ++v) parts[v] = part_of(kStep, v);
    for (int32_t i = 0; i < vectors; ++i, dst += kWords) {
        __m256i words = _mm256_setzero_si256();
        for (int v = 0; v < kStep; ++v, src += kWords, next += kWords) {
            // A cache line holds two vectors.
            if (v % 2 == 0) _mm_prefetch(next, _MM_HINT_T0);
            const __m256i source = _mm256_loadu_si256(reinterpret_cast<const __m256i*>(src));
            const __m256i placed = _mm256_permutevar8x32_epi32(source, parts[v].index);
            words = _mm256_blendv_epi8(words, placed, parts[v].mask);
        }
        _mm256_storeu_si256(reinterpret_cast<__m256i*>(dst), words);
    }
}

using CopyVectors = void(uint32_t* dst, const uint32_t* src, int32_t vectors, const uint32_t* next);
constexpr CopyVectors* kCopyVectors[kMaxVectors + 1] = {
    nullptr,         nullptr,         copy_vectors<2>, copy_vectors<3>, copy_vectors<4>,
    copy_vectors<5>, copy_vectors<6>, copy_vectors<7>, copy_vectors<8>};

}  // namespace

void copy_every_avx2(uint32_t* dst, const uint32_t* src, int32_t step, int32_t count,
                     const uint32_t* next) {
    if (step < 2 || step > kMaxVectors) {
        copy_words(dst, src, step, count, next);
        return;
    }
    // Vectors read up to the word that follows; so one must follow.
    const int32_t vectors = (count - 1) / kWords;
    kCopyVectors[step](dst, src, vectors, next);
    const int64_t done = int64_t{vectors} * kWords;
    copy_words(dst + done, src + done * step, step, count - static_cast<int32_t>(done),
               next + done * step);
}

}  // namespace ovrin
