// SPDX-License-Identifier: Apache-2.0
// Every instruction set's strided copy, the scalar one included, against what it is defined to do.
#include <gtest/gtest.h>

#include "support/guarded_buffer.h"
#include "support/vector_sets.h"

using namespace ovrin;
using namespace ovrin_test;

namespace {

using CopyKernelsTest = VectorSets;

std::vector<uint32_t> random_words(Random& random, int32_t count) {
    std::vector<uint32_t> words(static_cast<size_t>(count));
    const uint32_t same = random.pick({0U, 0U, 0xFFFFFFFFU});
    for (uint32_t& word : words) {
        word = same | (static_cast<uint32_t>(random.between(INT32_MIN, INT32_MAX)));
    }
    return words;
}

void check(const NamedKernels& set, int32_t step, int32_t count, Random& random) {
    const Flush flush = random.pick({Flush::kEnd, Flush::kStart});
    const int32_t reach = count < 1 ? 0 : (count - 1) * step + 1;
    const std::vector<uint32_t> words = random_words(random, reach);
    const GuardedBuffer<uint32_t> src(words, flush);
    GuardedBuffer<uint32_t> dst(static_cast<size_t>(count), flush, 0xEE);
    set.kernels->copy_every(dst.data(), src.data(), step, count, src.data());
    for (int32_t i = 0; i < count; ++i) {
        ASSERT_EQ(dst.data()[i], words[static_cast<size_t>(i) * static_cast<size_t>(step)])
            << set.name << ", copy_every: word " << i << " of " << count << ", step " << step;
    }
    ASSERT_TRUE(dst.intact()) << set.name << ", copy_every: " << count << ", step " << step;
}

void check_steps(const NamedKernels& set) {
    Random random(41);
    SCOPED_TRACE(random.trace());
    for (int32_t step = 0; step <= 20; ++step) {
        for (int32_t words = 0; words <= 70; ++words) {
            ASSERT_NO_FATAL_FAILURE(check(set, step, words, random));
        }
        ASSERT_NO_FATAL_FAILURE(check(set, step, random.between(1000, 5000), random));
    }
    for (const int32_t step : {64, 1000, 4096}) {
        ASSERT_NO_FATAL_FAILURE(check(set, step, random.between(1, 100), random));
    }
}

}  // namespace

TEST_F(CopyKernelsTest, TakeEveryStepthWordAndReadNoFurther) {
    for (const NamedKernels& set : vector_sets_) {
        EXPECT_NE(set.kernels->copy_every, scalar_kernels.copy_every) << set.name;
        check_steps(set);
    }
}

TEST(ScalarCopyKernel, TakesEveryStepthWordAndReadsNoFurther) {
    check_steps({"scalar", &scalar_kernels});
}
