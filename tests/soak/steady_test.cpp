// SPDX-License-Identifier: Apache-2.0
// Threaded calls, over and over: memory, descriptors and threads stay as they are after the first.
#include <gtest/gtest.h>
#include <malloc.h>
#include <sys/prctl.h>

#include <fstream>
#include <iostream>
#include <string>

#include "soak/calls.h"
#include "support/entries.h"
#include "support/faults.h"
#include "support/instrumented.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

// A line of /proc/self/status that gives KB.
int64_t kilobytes(const std::string& name) {
    std::ifstream status("/proc/self/status");
    for (std::string word; status >> word;) {
        int64_t value = 0;
        if (word == name + ":" && status >> value) return value;
    }
    ADD_FAILURE() << "no " << name;
    return 0;
}

struct State {
    int blocks;  // of the library's
    int descriptors;
    bool alone;  // no thread but this one
    int64_t resident, mapped;
};

State state_now() {
    const bool alone = only_this_thread();
    return {faults::live_blocks(), count_entries("/proc/self/fd"), alone, kilobytes("VmRSS"),
            kilobytes("VmSize")};
}

void print(int64_t calls, const State& state) {
    std::cout << calls << " calls: " << state.blocks << " blocks, " << state.descriptors
              << " descriptors, " << state.resident << " KB resident, " << state.mapped
              << " KB mapped\n";
}

}  // namespace

TEST(Steady, CallsLeaveNothingBehind) {
    if (kEmulated) GTEST_SKIP() << "qemu-user keeps 256 KB for every thread that there has been";
#if defined(__GLIBC__)
    // Or a thread would get a heap of its own, of 64 MB, when it happens to need one.
    mallopt(M_ARENA_MAX, 1);
#endif
    // Or a stack might get a page of 2 MB when it happens to lie well.
    ASSERT_EQ(prctl(PR_SET_THP_DISABLE, 1, 0, 0, 0), 0);
    constexpr int kIntervals = 10;
    const std::vector<Call> calls = threaded_calls();
    std::vector<Bytes> pictures;
    for (const Call& call : calls) pictures.push_back(call.run());
    const int turns =
        repetitions(rounds(20000), 1000000) / kIntervals / static_cast<int>(calls.size()) + 1;

    State first{};
    for (int interval = 0; interval <= kIntervals; ++interval) {
        for (int turn = 0; turn < turns; ++turn) {
            for (size_t i = 0; i < calls.size(); ++i) {
                ASSERT_EQ(calls[i].run(), pictures[i]) << calls[i].function;
            }
        }
        const State state = state_now();
        print(int64_t{interval + 1} * turns * static_cast<int64_t>(calls.size()), state);
        if (interval == 0) first = state;
        EXPECT_EQ(state.blocks, 0);
        EXPECT_EQ(state.descriptors, first.descriptors);
        EXPECT_TRUE(state.alone);
        if (kInstrumented) continue;
        EXPECT_LE(state.resident, first.resident + 4096);
        EXPECT_LE(state.mapped, first.mapped + 4096);
    }
}
