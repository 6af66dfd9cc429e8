// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace ovrin_test {

// Compiled with a sanitizer, which takes memory and stack of its own.
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
constexpr bool kInstrumented = true;
#else
constexpr bool kInstrumented = false;
#endif

// Run by qemu-user.
#if defined(OVRIN_EMULATED)
constexpr bool kEmulated = true;
#else
constexpr bool kEmulated = false;
#endif

}  // namespace ovrin_test
