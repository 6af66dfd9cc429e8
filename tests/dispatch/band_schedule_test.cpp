// SPDX-License-Identifier: Apache-2.0
// The order in which bands run, and the sizes that bands get.
#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <vector>

#include "dispatch/band_schedule.h"
#include "dispatch/band_size.h"
#include "support/random.h"

using namespace ovrin;
using ovrin_test::Random;
using ovrin_test::rounds;

namespace {

// A band that watches its neighbours while it runs.
struct Band {
    std::atomic<int> runs{0};
    std::atomic<bool> running{false};
    int32_t done = 0;
    Band* above = nullptr;  // the neighbours that it shares a row with
    Band* below = nullptr;
    std::atomic<bool>* overlap = nullptr;
    int32_t delay = 0;

    static void run(void* argument) {
        auto* self = static_cast<Band*>(argument);
        self->runs.fetch_add(1);
        self->running = true;
        if (self->delay > 0) ov_sleep(static_cast<uint32_t>(self->delay));
        for (const Band* neighbour : {self->above, self->below}) {
            if (neighbour != nullptr && neighbour->running) *self->overlap = true;
        }
        self->running = false;
        __atomic_store_n(&self->done, 1, __ATOMIC_RELEASE);
    }
};

struct Run {
    std::unique_ptr<Band[]> bands;
    std::vector<BandJob> jobs;
    std::atomic<bool> overlap{false};
};

std::unique_ptr<Run> make_run(int32_t count, Random& random, bool shares_all) {
    auto run = std::make_unique<Run>();
    run->bands = std::make_unique<Band[]>(static_cast<size_t>(count));
    for (int32_t k = 0; k < count; ++k) {
        Band& band = run->bands[static_cast<size_t>(k)];
        band.overlap = &run->overlap;
        band.delay = random.between(-40, 40);
        const bool shares = k > 0 && (shares_all || random.between(0, 1) == 1);
        if (shares) {
            band.above = &run->bands[static_cast<size_t>(k - 1)];
            run->bands[static_cast<size_t>(k - 1)].below = &band;
        }
        run->jobs.push_back({Band::run, &band, &band.done, shares, false, false, 0});
    }
    return run;
}

void expect_each_ran_once(const Run& run, int32_t count) {
    for (int32_t k = 0; k < count; ++k) {
        ASSERT_EQ(run.bands[static_cast<size_t>(k)].runs, 1) << "band " << k << " of " << count;
    }
    EXPECT_FALSE(run.overlap);
}

}  // namespace

TEST(BandSchedule, RunsEachBandOnceAndNeverTwoThatShareARow) {
    Random random(21);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(300); ++i) {
        const int32_t count = random.between(2, 24);
        auto run = make_run(count, random, i % 2 == 0);
        ovrin_threadpool* pool = ovrin_threadpool_init(4);
        run_bands(pool, run->jobs.data(), count);
        expect_each_ran_once(*run, count);
    }
}

TEST(BandSchedule, CallerRunsEverythingWhenNoWorkerDoes) {
    Random random(22);
    for (const int32_t count : {2, 3, 7, 4100}) {
        auto run = make_run(count, random, true);
        for (int32_t k = 0; k < count; ++k) run->bands[static_cast<size_t>(k)].delay = 0;
        ovrin_threadpool* pool = ovrin_threadpool_init(0);
        run_bands(pool, run->jobs.data(), count);
        expect_each_ran_once(*run, count);
    }
}

TEST(BandSchedule, BandsThatThePoolRefusesAreNotLost) {
    Random random(23);
    auto run = make_run(5, random, true);
    run_bands(nullptr, run->jobs.data(), 5);
    expect_each_ran_once(*run, 5);
}

TEST(BandSchedule, SkipsALastBandWithNothingLeft) {
    Random random(24);
    auto run = make_run(3, random, true);
    run->jobs[2].skip = true;
    ovrin_threadpool* pool = ovrin_threadpool_init(2);
    run_bands(pool, run->jobs.data(), 3);
    EXPECT_EQ(run->bands[1].runs, 1);
    EXPECT_EQ(run->bands[2].runs, 0);
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
