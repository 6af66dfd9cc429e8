// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <stdint.h>

#include "kernels/inline.h"

namespace ovrin {

constexpr int32_t kCacheLine = 64;

// Fetches bytes that are needed soon. A strip's part of the next row lies a whole row further on:
// the processor does not fetch it ahead by itself.
OVRIN_ALWAYS_INLINE void prefetch(const uint8_t* first, int64_t bytes) {
    for (int64_t i = 0; i < bytes; i += kCacheLine) __builtin_prefetch(first + i);
}

}  // namespace ovrin
