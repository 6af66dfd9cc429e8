// SPDX-License-Identifier: Apache-2.0
// Pools and threaded calls, over and over, while threads dawdle wherever they meet.
#include <gtest/gtest.h>
#include <ovrinresize.h>
#include <sched.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <iostream>

#include "soak/calls.h"
#include "soak/delays.h"
#include "support/entries.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

// Pools may end in the background. Valgrind and the sanitizers take a thread that outlives the
// program for a leak.
class Soak : public ::testing::Test {
protected:
    void TearDown() override { EXPECT_TRUE(only_this_thread()); }
};

// While it lives, this thread and those that it starts share one processor, so that each runs until
// it waits or its time slice ends.
class OneProcessor {
public:
    OneProcessor() {
        EXPECT_EQ(sched_getaffinity(0, sizeof all_, &all_), 0);
        int first = 0;
        while (!CPU_ISSET(first, &all_)) ++first;
        cpu_set_t one;
        CPU_ZERO(&one);
        CPU_SET(first, &one);
        EXPECT_EQ(sched_setaffinity(0, sizeof one, &one), 0);
    }
    ~OneProcessor() { sched_setaffinity(0, sizeof all_, &all_); }

    OneProcessor(const OneProcessor&) = delete;
    OneProcessor& operator=(const OneProcessor&) = delete;

private:
    cpu_set_t all_;
};

// All of it under the thread sanitizer; elsewhere a tenth, as little can be seen there.
int usually(int count) {
#if defined(__SANITIZE_THREAD__)
    return count;
#else
    return rounds(count / 10);
#endif
}

struct Counter {
    std::atomic<int> runs{0};
    static void run(void* self) { static_cast<Counter*>(self)->runs.fetch_add(1); }
};

ovrin_threadpool* make_pool(int32_t workers, Refuse refuse) {
    const Refusing refusing(refuse);
    return ovrin_threadpool_init(workers);
}

void make_and_end_pools(int count, Refuse refuse) {
    Random random(162);
    SCOPED_TRACE(random.trace());
    Counter in_background;
    int left_to_background = 0, made = 0;
    for (int i = 0; i < count; ++i) {
        ovrin_threadpool* pool = make_pool(random.between(1, 4), refuse);
        if (refuse != Refuse::kNothing && pool == nullptr) continue;
        ASSERT_NE(pool, nullptr);
        ++made;
        const bool waits = random.between(0, 7) != 0;
        const int tasks = random.between(0, 8);
        Counter here;
        Counter* counter = waits ? &here : &in_background;
        for (int n = 0; n < tasks; ++n) {
            ASSERT_EQ(ovrin_threadpool_add_task(pool, Counter::run, counter, n % 2), 1);
        }
        ovrin_threadpool_free(pool, waits ? 1 : 0);
        if (waits) {
            ASSERT_EQ(here.runs, tasks);
        } else {
            left_to_background += tasks;
        }
    }
    for (int i = 0; i < 60000 && in_background.runs < left_to_background; ++i) usleep(1000);
    EXPECT_EQ(in_background.runs, left_to_background);
    // About a third is refused; of a few pools that can be none, or all.
    if (refuse != Refuse::kNothing && count >= 50) {
        EXPECT_GT(made, 0);
        EXPECT_LT(made, count);
    }
    std::cout << made << " pools of " << count << ", " << delays() << " delays, " << refusals()
              << " refusals\n";
}

Bytes run(const Call& call, Refuse refuse, uint32_t pools = 0) {
    const Refusing refusing(refuse, pools);
    return call.run();
}

// With every combination of its pools; the first has them all.
std::vector<Bytes> outcomes(const Call& call) {
    std::vector<Bytes> result;
    for (uint32_t refused = 0; refused < 1U << call.pools; ++refused) {
        result.push_back(run(call, Refuse::kPools, refused));
    }
    return result;
}

void repeat_each_call(int times, Refuse refuse) {
    const std::vector<Call> calls = threaded_calls();
    for (const Call& call : calls) {
        SCOPED_TRACE(call.function);
        const std::vector<Bytes> known = outcomes(call);
        const Bytes alone = run(call, Refuse::kPools, ~0U);
        ASSERT_EQ(known.back(), alone);
        // Where threads are refused any of them will do, otherwise the first.
        const auto end = refuse == Refuse::kNothing ? known.begin() + 1 : known.end();
        for (int i = 0; i < times; ++i) {
            const Bytes again = run(call, refuse);
            ASSERT_NE(std::find(known.begin(), end, again), end) << "call " << i;
        }
    }
    std::cout << calls.size() << " functions, " << times << " calls of each, " << delays()
              << " delays, " << refusals() << " refusals\n";
}

}  // namespace

TEST_F(Soak, PoolsRunAllTheirTasksAndEnd) {
    make_and_end_pools(repetitions(usually(10000), 100000), Refuse::kNothing);
}

TEST_F(Soak, PoolsOnOneProcessorRunAllTheirTasksAndEnd) {
    const OneProcessor pinned;
    make_and_end_pools(repetitions(usually(1000), 100000), Refuse::kNothing);
}

TEST_F(Soak, PoolsThatGetTheirThreadsRunAllTheirTasksAndEnd) {
    make_and_end_pools(repetitions(usually(1000), 100000), Refuse::kAtRandom);
}

TEST_F(Soak, ThreadedCallsGiveTheSameBytesEachTime) {
    repeat_each_call(repetitions(usually(1000), 10000), Refuse::kNothing);
}

TEST_F(Soak, ThreadedCallsOnOneProcessorGiveTheSameBytesEachTime) {
    const OneProcessor pinned;
    repeat_each_call(repetitions(usually(100), 10000), Refuse::kNothing);
}

TEST_F(Soak, ThreadedCallsGiveTheSameBytesWhateverThreadsAreRefused) {
    repeat_each_call(repetitions(usually(100), 10000), Refuse::kAtRandom);
}
