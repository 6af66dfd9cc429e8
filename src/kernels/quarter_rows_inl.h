// SPDX-License-Identifier: Apache-2.0
// Where the kernels of a strip begin in its source rows.
#pragma once

#include <stddef.h>

#include "kernels/inline.h"
#include "kernels/quarter.h"

namespace ovrin {

namespace {

// Compilers that know what was added would add it in every round of a loop.
OVRIN_ALWAYS_INLINE const uint8_t* from_byte(const uint8_t* row, ptrdiff_t first) {
    const uint8_t* byte = row + first;
    __asm__("" : "+r"(byte));
    return byte;
}

// A single row stands for both.
template <bool kPair>
OVRIN_ALWAYS_INLINE QuarterRows from_byte(const QuarterRows& rows, ptrdiff_t first) {
    const uint8_t* const top = from_byte(rows.top, first);
    const uint8_t* const next_top = from_byte(rows.next_top, first);
    if (!kPair) return {top, top, next_top, next_top};
    return {top, from_byte(rows.bottom, first), next_top, from_byte(rows.next_bottom, first)};
}

}  // namespace

}  // namespace ovrin
