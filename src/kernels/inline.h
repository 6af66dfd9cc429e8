// SPDX-License-Identifier: Apache-2.0
#pragma once

// For the pieces of inner loops: compilers that judge by size alone call them, once for every
// vector. Also for what kernel files share with others: a copy of it, compiled for one instruction
// set, must not be the one that all use.
#define OVRIN_ALWAYS_INLINE inline __attribute__((always_inline))
