// SPDX-License-Identifier: Apache-2.0
// The intrinsics without warnings about their own definitions: g++ 12 initialises vectors whose
// contents do not matter with themselves.
#pragma once

#if defined(__GNUC__) && !defined(__clang__)
#pragma GCC diagnostic ignored "-Wmaybe-uninitialized"
#endif
#include <immintrin.h>
