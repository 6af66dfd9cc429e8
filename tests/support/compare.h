// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <gtest/gtest.h>

#include <cstddef>
#include <cstdint>

namespace ovrin_test {

// Compares two byte strings and names the first difference.
inline ::testing::AssertionResult same_bytes(const uint8_t* actual, const uint8_t* expected,
                                             size_t count) {
    for (size_t i = 0; i < count; ++i) {
        if (actual[i] != expected[i]) {
            return ::testing::AssertionFailure() << "byte " << i << " of " << count << " is "
                                                 << int{actual[i]} << ", not " << int{expected[i]};
        }
    }
    return ::testing::AssertionSuccess();
}

}  // namespace ovrin_test
