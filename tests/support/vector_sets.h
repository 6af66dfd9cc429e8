// SPDX-License-Identifier: Apache-2.0
// What the tests of single kernels share.
#pragma once

#include <gtest/gtest.h>

#include <vector>

#include "kernels/kernels.h"
#include "support/random.h"

namespace ovrin_test {

// The sets that this processor has besides the scalar one.
class VectorSets : public ::testing::Test {
protected:
    void SetUp() override {
        ovrin::NamedKernels sets[ovrin::kMaxSets];
        const int32_t count = ovrin::available_kernels(sets);
        vector_sets_.assign(sets + 1, sets + count);
        if (vector_sets_.empty()) GTEST_SKIP() << "this processor has no vector set";
    }

    std::vector<ovrin::NamedKernels> vector_sets_;
};

// What source rows hold.
enum class Content { kRandom, kBlack, kWhite, kExtremes };
constexpr Content kContents[] = {Content::kRandom, Content::kBlack, Content::kWhite,
                                 Content::kExtremes};

inline std::vector<uint8_t> content(Random& random, Content kind, size_t count) {
    if (kind == Content::kBlack) return std::vector<uint8_t>(count, 0);
    if (kind == Content::kWhite) return std::vector<uint8_t>(count, 255);
    std::vector<uint8_t> bytes = random.bytes(count);
    if (kind == Content::kExtremes) {
        for (uint8_t& byte : bytes) byte = byte & 1 ? 255 : 0;
    }
    return bytes;
}

}  // namespace ovrin_test
