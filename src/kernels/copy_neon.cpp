// SPDX-License-Identifier: Apache-2.0
// Every step-th word with NEON: the loads that part interleaved elements do it.
#include <arm_neon.h>

#include "kernels/copy_words_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kWords = 4;

uint32x4_t load_every(const uint32_t* src, int32_t step) {
    if (step == 2) return vld2q_u32(src).val[0];
    if (step == 3) return vld3q_u32(src).val[0];
    return vld4q_u32(src).val[0];
}

}  // namespace

void copy_every_neon(uint32_t* dst, const uint32_t* src, int32_t step, int32_t count,
                     const uint32_t* next) {
    // Vectors read up to the word that follows; so one must follow.
    const int32_t vectors = step < 2 || step > 4 ? 0 : (count - 1) / kWords;
    for (int32_t i = 0; i < vectors; ++i) {
        __builtin_prefetch(next);
        vst1q_u32(dst, load_every(src, step));
        dst += kWords;
        src += kWords * step;
        next += kWords * step;
    }
    copy_words(dst, src, step, count - vectors * kWords, next);
}

}  // namespace ovrin
