// SPDX-License-Identifier: Apache-2.0
#pragma once

// For the pieces of inner loops: compilers that judge by size alone call them, once for every
// vector.
#define OVRIN_ALWAYS_INLINE inline __attribute__((always_inline))
