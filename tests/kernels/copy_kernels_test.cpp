// SPDX-License-Identifier: Apache-2.0
// Every instruction set's strided copy against what it is defined to do.
#include <gtest/gtest.h>

#include "kernels/kernels.h"
#include "support/guarded_buffer.h"
#include "support/random.h"

using namespace ovrin;
using namespace ovrin_test;

namespace {

std::vector<uint32_t> random_words(Random& random, int32_t count) {
    std::vector<uint32_t> words(static_cast<size_t>(count));
    for (uint32_t& word : words) word = static_cast<uint32_t>(random.between(0, INT32_MAX));
    return words;
}

void check(const NamedKernels& set, int32_t step, int32_t count, Random& random) {
    const Flush flush = random.pick({Flush::kEnd, Flush::kStart});
    const int32_t reach = count < 1 ? 1 : (count - 1) * step + 1;
    const std::vector<uint32_t> words = random_words(random, reach);
    const GuardedBuffer<uint32_t> src(words, flush);
    GuardedBuffer<uint32_t> dst(static_cast<size_t>(count), flush, 0xEE);
    set.kernels->copy_every(dst.data(), src.data(), step, count, src.data());
    for (int32_t i = 0; i < count; ++i) {
        ASSERT_EQ(dst.data()[i], words[static_cast<size_t>(i) * static_cast<size_t>(step)])
            << set.name << ": word " << i << " of " << count << ", step " << step;
    }
    ASSERT_TRUE(dst.intact());
}

}  // namespace

TEST(CopyKernels, TakeEveryStepthWordAndReadNoFurther) {
    NamedKernels sets[kMaxSets];
    const int32_t count = available_kernels(sets);
    Random random(41);
    SCOPED_TRACE(random.trace());
    for (int32_t i = 0; i < count; ++i) {
        for (int32_t step = 0; step <= 20 && !HasFatalFailure(); ++step) {
            for (int32_t words = 1; words <= 70 && !HasFatalFailure(); ++words) {
                check(sets[i], step, words, random);
            }
            check(sets[i], step, random.between(1000, 5000), random);
        }
    }
}
