// SPDX-License-Identifier: Apache-2.0
// Every step-th word, one by one, for the steps and the ends of rows that vectors leave over. The
// next row is fetched meanwhile.
#pragma once

#include <string.h>

#include "kernels/copy.h"
#include "kernels/prefetch.h"

namespace ovrin {

namespace {

constexpr int32_t kLineWords = kCacheLine / static_cast<int32_t>(sizeof(uint32_t));

void copy_words(uint32_t* dst, const uint32_t* src, int32_t step, int32_t count,
                const uint32_t* next) {
    if (step == 1) {
        memcpy(dst, src, static_cast<size_t>(count) * sizeof *dst);
        return;
    }
    const int32_t line = step < kLineWords ? kLineWords : step;
    int64_t fetched = 0;
    for (int32_t i = 0; i < count; ++i, src += step) {
        dst[i] = *src;
        if (int64_t{i} * step >= fetched) {
            __builtin_prefetch(next + fetched);
            fetched += line;
        }
    }
}

}  // namespace

}  // namespace ovrin
