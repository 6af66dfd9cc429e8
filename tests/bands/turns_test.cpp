// SPDX-License-Identifier: Apache-2.0
// How bands are counted, and how threads share them.
#include "bands/turns.h"

#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <vector>

#include "bands/records.h"
#include "bands/split.h"
#include "support/random.h"

using namespace ovrin;
using ovrin_test::Random;
using ovrin_test::rounds;

namespace {

// Several passes over the same bands, as a picture with several planes has them.
struct Shared {
    Turns turns;
    int32_t passes;
    std::unique_ptr<std::atomic<int>[]> runs;  // of each band in each pass
    std::atomic<int> threads{0};

    Shared(int32_t bands, int32_t pass_count)
        : turns{bands, 0, false},
          passes(pass_count),
          runs(new std::atomic<int>[static_cast<size_t>(bands) * static_cast<size_t>(pass_count)]) {
        for (int32_t i = 0; i < bands * pass_count; ++i) run(i) = 0;
    }

    std::atomic<int>& run(int32_t i) { return runs[static_cast<size_t>(i)]; }

    static void work(void* argument) {
        auto& self = *static_cast<Shared*>(argument);
        ++self.threads;
        TurnTaker taker(self.turns);
        for (int32_t pass = 0; pass < self.passes; ++pass) {
            taker.take_pass([&](Turn turn) {
                for (int32_t i = turn.first; i < turn.end; ++i) {
                    ++self.run(pass * taker.bands() + i);
                    if (i % 7 == 0) ov_sleep(1);
                }
            });
        }
    }

    void expect_each_band_ran_once() {
        for (int32_t i = 0; i < passes * turns.bands; ++i) {
            ASSERT_EQ(run(i), 1) << "band " << i % turns.bands << " of pass " << i / turns.bands;
        }
    }
};

}  // namespace

TEST(Turns, EachBandOfEachPassRunsOnce) {
    Random random(21);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(200) && !HasFatalFailure(); ++i) {
        Shared shared(random.between(1, 100), random.between(1, 5));
        if (i % 2 == 0) {
            BandPool pool;
            ASSERT_TRUE(pool.ready());
            pool.run(Shared::work, &shared);
        } else {
            ASSERT_TRUE(run_while_workers_start(Shared::work, &shared));
        }
        EXPECT_EQ(shared.threads, kBandThreads + 1);
        shared.expect_each_band_ran_once();
    }
}

TEST(Turns, OneThreadTakesEverythingInShrinkingTurns) {
    Turns turns = {94, 0, false};
    std::vector<int32_t> lengths;
    int32_t next = 0;
    {
        TurnTaker taker(turns);
        taker.take_pass([&](Turn turn) {
            EXPECT_EQ(turn.first, next);
            next = turn.end;
            lengths.push_back(turn.end - turn.first);
        });
        EXPECT_FALSE(taker.is_late());
    }
    EXPECT_EQ(next, 94);
    EXPECT_EQ(lengths.front(), 12);
    EXPECT_EQ(lengths.back(), 1);
    for (size_t i = 1; i < lengths.size(); ++i) EXPECT_LE(lengths[i], lengths[i - 1]);
}

TEST(Turns, AThreadThatComesLateIsToldSo) {
    Turns turns = {3, 0, false};
    EXPECT_FALSE(TurnTaker(turns).is_late());  // its way ends here
    TurnTaker late(turns);
    EXPECT_TRUE(late.is_late());
}

TEST(Turns, AThreadThatMissesAPassGoesOnWithTheNext) {
    Turns turns = {5, 0, false};
    TurnTaker first(turns);
    first.take_pass([](Turn) {});
    TurnTaker second(turns);
    second.take_pass([](Turn) { FAIL() << "the first pass has been taken"; });
    int32_t taken = 0;
    second.take_pass([&](Turn turn) { taken += turn.end - turn.first; });
    EXPECT_EQ(taken, 5);
}

TEST(Records, EachRunsOnce) {
    for (const int32_t count : {1, 2, 7, 4100}) {
        const BandRecords<std::atomic<int>> records(count);
        BandPool pool;
        run_records(
            pool, [](void* record) { ++*static_cast<std::atomic<int>*>(record); }, records);
        for (int32_t i = 0; i < count; ++i) ASSERT_EQ(records.data()[i], 1) << i << " of " << count;
    }
}

TEST(BandSize, IsAtLeast32AndAMultipleOfTheRatio) {
    const int32_t expected[][3] = {
        {1024, 512, 32}, {1100, 100, 44}, {3000, 50, 60},     {40, 1, 40}, {1024, 1024, 32},
        {3, 1, 48},      {5, 1, 40},      {31, 1, 62},        {32, 1, 32}, {100, 200, 32},
        {100, 0, 32},    {100, -3, 32},   {INT32_MIN, -1, 32}};
    for (const auto& e : expected) {
        EXPECT_EQ(band_height(e[0], e[1]), e[2]) << e[0] << " to " << e[1];
    }
}

TEST(BandSize, CountIsRoundedToTheNearestBand) {
    EXPECT_EQ(band_count(1024, 32), 32);
    EXPECT_EQ(band_count(1100, 44), 25);
    EXPECT_EQ(band_count(3000, 60), 50);
    EXPECT_EQ(band_count(40, 40), 1);
    EXPECT_EQ(band_count(47, 32), 1);
    EXPECT_EQ(band_count(48, 32), 2);
    EXPECT_EQ(band_count(INT32_MAX, 32), 67108864);
    EXPECT_LT(band_count(INT32_MIN, 32), 1);
}
