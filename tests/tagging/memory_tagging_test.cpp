// SPDX-License-Identifier: Apache-2.0
// On Armv8.5 the C library can tag memory, so that a program which leaves its block dies. Where the
// tests are run that way, this one proves that they are.
#include <gtest/gtest.h>

#include <csignal>
#include <cstdint>
#include <cstdlib>

namespace {

constexpr size_t kBlock = 64;

// Writes one byte, `offset` bytes into a block.
void write_at(size_t offset) {
    auto* block = static_cast<uint8_t*>(malloc(kBlock));
    volatile uint8_t* byte = block + offset;
    *byte = 1;
    free(block);
}

}  // namespace

TEST(MemoryTaggingDeathTest, AnOverrunDies) {
    if (getenv("OVRIN_EXPECT_TAGGING") == nullptr) GTEST_SKIP() << "this run tags no memory";
    write_at(kBlock - 1);
    for (const size_t beyond : {kBlock, kBlock + 15}) {
        EXPECT_EXIT(write_at(beyond), ::testing::KilledBySignal(SIGSEGV), "") << beyond;
    }
}
