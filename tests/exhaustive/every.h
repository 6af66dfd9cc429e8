// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>

namespace ovrin_test {

// 1: everything. N: one in N, where OVRIN_TEST_DIVISOR says so because an emulator or a sanitizer
// makes each case slow; the test's output says so too.
inline int32_t one_in() {
    const char* text = getenv("OVRIN_TEST_DIVISOR");
    const int64_t divisor = text == nullptr ? 1 : strtoll(text, nullptr, 10);
    if (divisor <= 1) return 1;
    printf("OVRIN_TEST_DIVISOR: only one case in %d\n", static_cast<int>(divisor));
    return static_cast<int32_t>(divisor);
}

}  // namespace ovrin_test
