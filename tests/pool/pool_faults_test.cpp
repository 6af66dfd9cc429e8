// SPDX-License-Identifier: Apache-2.0
// What a pool asks the system for.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include "support/faults.h"

using faults::Kind;

TEST(PoolFaults, AllThingsThatCanBeRefusedAreAskedFor) {
    faults::reset();
    ovrin_threadpool* pool = ovrin_threadpool_init(4);
    ASSERT_NE(pool, nullptr);
    EXPECT_EQ(faults::calls(Kind::kMalloc) + faults::calls(Kind::kCalloc), 2);
    EXPECT_EQ(faults::calls(Kind::kThread), 4);
    EXPECT_EQ(faults::calls(Kind::kMutex), 2);
    EXPECT_EQ(faults::calls(Kind::kCondition), 2);
    ovrin_threadpool_free(pool, 1);
}

// Without a thread for it, a background teardown only raises the flag: idle workers stay, and so
// does the pool.
TEST(PoolFaults, BackgroundFreeWithoutAThreadOnlyRaisesTheFlag) {
    faults::reset();
    ovrin_threadpool* pool = ovrin_threadpool_init(0);
    ASSERT_NE(pool, nullptr);
    faults::fail(Kind::kThread, 1, true);
    ovrin_threadpool_free(pool, 0);
    EXPECT_TRUE(faults::has_failed());
    faults::reset();
    EXPECT_EQ(pool->stop, 1);
    EXPECT_EQ(faults::live_blocks(0), 2);
    ovrin_threadpool_free(pool, 1);
    EXPECT_EQ(faults::live_blocks(), 0);
}
