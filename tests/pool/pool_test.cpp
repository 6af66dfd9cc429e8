// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <atomic>
#include <cstring>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

#include "support/entries.h"
#include "support/random.h"

using ovrin_test::rounds;

namespace {

constexpr int kCapacity = OVRIN_THREADPOOL_CAPACITY;

void count_up(void* counter) {
    static_cast<std::atomic<int>*>(counter)->fetch_add(1);
}

// A task that holds its worker until it is let go.
struct Gate {
    std::atomic<int> entered{0};
    std::atomic<bool> open{false};

    static void pass(void* gate) {
        auto* self = static_cast<Gate*>(gate);
        self->entered.fetch_add(1);
        while (!self->open) std::this_thread::yield();
    }
    void wait_for(int workers) {
        while (entered < workers) std::this_thread::yield();
    }
};

std::unique_ptr<ovrin_threadpool_queue> empty_queue() {
    auto queue = std::make_unique<ovrin_threadpool_queue>();
    memset(queue.get(), 0, sizeof *queue);
    return queue;
}

int entries[kCapacity + 1];

}  // namespace

TEST(Queue, IsFirstInFirstOut) {
    auto queue = empty_queue();
    for (int i = 0; i < 5; ++i)
        EXPECT_EQ(ovrin_threadpool_queue_enqueue(queue.get(), &entries[i]), 0);
    EXPECT_EQ(ovrin_threadpool_queue_getsize(queue.get()), 5U);
    EXPECT_EQ(ovrin_threadpool_queue_is_empty(queue.get()), 0);
    for (int i = 0; i < 5; ++i) EXPECT_EQ(ovrin_threadpool_queue_dequeue(queue.get()), &entries[i]);
    EXPECT_EQ(ovrin_threadpool_queue_is_empty(queue.get()), 1);
}

TEST(Queue, NullOrEmptyQueueHasNoEntry) {
    auto queue = empty_queue();
    EXPECT_EQ(ovrin_threadpool_queue_dequeue(nullptr), nullptr);
    EXPECT_EQ(ovrin_threadpool_queue_dequeue(queue.get()), nullptr);
}

TEST(Queue, RefusesMoreThanItsCapacity) {
    auto queue = empty_queue();
    for (int i = 0; i < kCapacity; ++i) {
        ASSERT_EQ(ovrin_threadpool_queue_enqueue(queue.get(), &entries[i]), 0);
    }
    EXPECT_EQ(queue->tail, 0U);
    EXPECT_EQ(ovrin_threadpool_queue_enqueue(queue.get(), &entries[kCapacity]), -1);
    EXPECT_EQ(ovrin_threadpool_queue_getsize(queue.get()), 2000U);
}

TEST(Queue, RefusesAPositionThatIsStillOccupied) {
    auto queue = empty_queue();
    queue->entries[0] = &entries[7];
    EXPECT_EQ(ovrin_threadpool_queue_enqueue(queue.get(), &entries[1]), -1);
    EXPECT_EQ(queue->entries[0], &entries[7]);
    EXPECT_EQ(queue->count, 0U);
    EXPECT_EQ(queue->tail, 0U);
}

TEST(Queue, RestartsAtZeroWhenEmptied) {
    auto queue = empty_queue();
    for (int i = 0; i < 3; ++i) ovrin_threadpool_queue_enqueue(queue.get(), &entries[i]);
    for (int i = 0; i < 2; ++i) ovrin_threadpool_queue_dequeue(queue.get());
    EXPECT_EQ(queue->head, 2U);
    EXPECT_EQ(queue->tail, 3U);
    ovrin_threadpool_queue_dequeue(queue.get());
    EXPECT_EQ(queue->head, 0U);
    EXPECT_EQ(queue->tail, 0U);
    EXPECT_EQ(queue->entries[2], nullptr);
}

TEST(Queue, WrapsAround) {
    auto queue = empty_queue();
    for (int i = 0; i < kCapacity; ++i) ovrin_threadpool_queue_enqueue(queue.get(), &entries[i]);
    for (int i = 0; i < kCapacity - 1; ++i) ovrin_threadpool_queue_dequeue(queue.get());
    EXPECT_EQ(queue->head, 1999U);
    EXPECT_EQ(ovrin_threadpool_queue_enqueue(queue.get(), &entries[5]), 0);
    EXPECT_EQ(queue->tail, 1U);
    EXPECT_EQ(ovrin_threadpool_queue_dequeue(queue.get()), &entries[kCapacity - 1]);
    EXPECT_EQ(queue->head, 0U);
    EXPECT_EQ(ovrin_threadpool_queue_dequeue(queue.get()), &entries[5]);
}

TEST(Pool, IsLaidOutReadyToRun) {
    ovrin_threadpool* pool = ovrin_threadpool_init(3);
    ASSERT_NE(pool, nullptr);
    EXPECT_EQ(pool->thread_count, 3);
    EXPECT_EQ(pool->stop, 0);
    EXPECT_EQ(ovrin_threadpool_queue_getsize(&pool->free_slots), 2000U);
    EXPECT_EQ(pool->free_slots.entries[0], &pool->tasks[0]);
    EXPECT_EQ(pool->free_slots.entries[kCapacity - 1], &pool->tasks[kCapacity - 1]);
    ovrin_threadpool_free(pool, 1);
}

TEST(Pool, WithoutWorkersKeepsTasksAndIsReleased) {
    for (const int32_t n : {0, -1, INT32_MIN}) {
        ovrin_threadpool* pool = ovrin_threadpool_init(n);
        if (pool == nullptr && n < 0) continue;
        ASSERT_NE(pool, nullptr);
        EXPECT_EQ(pool->thread_count, 0);
        std::atomic<int> counter{0};
        EXPECT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), 1);
        EXPECT_EQ(ovrin_threadpool_queue_getsize(&pool->pending), 1U);
        ovrin_threadpool_free(pool, 1);
        EXPECT_EQ(counter, 0);
    }
}

TEST(Pool, MoreWorkersThanItCanCountAreRefused) {
    EXPECT_EQ(ovrin_threadpool_init(65536), nullptr);
    EXPECT_EQ(ovrin_threadpool_init(INT32_MAX), nullptr);
}

TEST(Pool, NullPoolIsAnError) {
    EXPECT_EQ(ovrin_threadpool_add_task(nullptr, count_up, nullptr, 0), -1);
    EXPECT_EQ(ovrin_threadpool_add_task(nullptr, count_up, nullptr, 1), -1);
}

TEST(Pool, GivesOutTasksInOrder) {
    ovrin_threadpool* pool = ovrin_threadpool_init(0);
    std::atomic<int> counters[3];
    for (auto& counter : counters) ovrin_threadpool_add_task(pool, count_up, &counter, 0);
    for (auto& counter : counters) {
        ovrin_threadpool_task* task = ovrin_threadpool_task_get_task(pool);
        ASSERT_NE(task, nullptr);
        EXPECT_EQ(task->function, count_up);
        EXPECT_EQ(task->argument, &counter);
        ovrin_threadpool_task_init(task);
        EXPECT_EQ(task->function, nullptr);
        EXPECT_EQ(task->argument, nullptr);
    }
    pool->stop = 1;
    EXPECT_EQ(ovrin_threadpool_task_get_task(pool), nullptr);
    ovrin_threadpool_free(pool, 1);
}

TEST(Pool, FreeReturnsOnlyAfterEveryQueuedTaskHasRun) {
    for (int i = 0; i < rounds(200); ++i) {
        ovrin_threadpool* pool = ovrin_threadpool_init(i % 5 + 1);
        ASSERT_NE(pool, nullptr);
        std::atomic<int> counter{0};
        for (int t = 0; t < 50; ++t) {
            ASSERT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), 1);
        }
        ovrin_threadpool_free(pool, 1);
        ASSERT_EQ(counter, 50);
    }
}

TEST(Pool, RefusesWithoutWaitingWhenAllSlotsAreInUse) {
    ovrin_threadpool* pool = ovrin_threadpool_init(0);
    std::atomic<int> counter{0};
    for (int i = 0; i < kCapacity; ++i) {
        ASSERT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), 1);
    }
    EXPECT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), -2);
    ovrin_threadpool_free(pool, 1);
}

TEST(Pool, WaitsForASlotWhenAsked) {
    ovrin_threadpool* pool = ovrin_threadpool_init(1);
    Gate gate;
    std::atomic<int> counter{0};
    ASSERT_EQ(ovrin_threadpool_add_task(pool, Gate::pass, &gate, 0), 1);
    for (int i = 1; i < kCapacity; ++i) ovrin_threadpool_add_task(pool, count_up, &counter, 0);
    ASSERT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), -2);
    std::atomic<bool> returned{false};
    std::thread submitter([&] {
        EXPECT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 1), 1);
        returned = true;
    });
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    EXPECT_FALSE(returned);
    gate.open = true;
    submitter.join();
    ovrin_threadpool_free(pool, 1);
    EXPECT_EQ(counter, kCapacity);
}

TEST(Pool, SkipsATaskWithoutFunctionAndLosesItsSlot) {
    ovrin_threadpool* pool = ovrin_threadpool_init(1);
    std::atomic<int> counter{0};
    ASSERT_EQ(ovrin_threadpool_add_task(pool, nullptr, &counter, 0), 1);
    ASSERT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), 1);
    // All slots but the lost one come back.
    uint32_t slots = 0;
    while (slots < kCapacity - 1U) {
        std::this_thread::yield();
        pthread_mutex_lock(&pool->free_lock);
        slots = ovrin_threadpool_queue_getsize(&pool->free_slots);
        pthread_mutex_unlock(&pool->free_lock);
    }
    std::this_thread::sleep_for(std::chrono::milliseconds(5));
    pthread_mutex_lock(&pool->free_lock);
    EXPECT_EQ(ovrin_threadpool_queue_getsize(&pool->free_slots), kCapacity - 1U);
    pthread_mutex_unlock(&pool->free_lock);
    EXPECT_EQ(counter, 1);
    ovrin_threadpool_free(pool, 1);
}

TEST(Pool, RunsTasksOfOneWorkerInOrder) {
    ovrin_threadpool* pool = ovrin_threadpool_init(1);
    struct Step {
        std::vector<int>* log;
        int number;
        static void run(void* step) {
            auto* self = static_cast<Step*>(step);
            self->log->push_back(self->number);
        }
    };
    std::vector<int> log;
    std::vector<Step> steps;
    for (int i = 0; i < 500; ++i) steps.push_back({&log, i});
    for (Step& step : steps) ASSERT_EQ(ovrin_threadpool_add_task(pool, Step::run, &step, 0), 1);
    ovrin_threadpool_free(pool, 1);
    ASSERT_EQ(log.size(), steps.size());
    for (int i = 0; i < 500; ++i) EXPECT_EQ(log[static_cast<size_t>(i)], i);
}

TEST(Pool, WorkersRunSideBySide) {
    ovrin_threadpool* pool = ovrin_threadpool_init(4);
    Gate gate;
    for (int i = 0; i < 4; ++i) ovrin_threadpool_add_task(pool, Gate::pass, &gate, 0);
    gate.wait_for(4);
    gate.open = true;
    ovrin_threadpool_free(pool, 1);
}

TEST(Pool, BackgroundFreeReturnsAtOnceAndStillRunsEverything) {
    static Gate gate;
    static std::atomic<int> counter{0};
    ovrin_threadpool* pool = ovrin_threadpool_init(2);
    ovrin_threadpool_add_task(pool, Gate::pass, &gate, 0);
    ovrin_threadpool_add_task(pool, Gate::pass, &gate, 0);
    for (int i = 0; i < 100; ++i) ovrin_threadpool_add_task(pool, count_up, &counter, 0);
    gate.wait_for(2);
    ovrin_threadpool_free(pool, 0);
    EXPECT_EQ(counter, 0);
    gate.open = true;
    while (counter < 100) std::this_thread::yield();
    // Or the program might end before they do.
    EXPECT_TRUE(ovrin_test::only_this_thread());
}

TEST(Pool, EightSubmittersAtOnceLoseNothing) {
    constexpr int kSubmitters = 8;
    const int tasks = rounds(20000);
    ovrin_threadpool* pool = ovrin_threadpool_init(4);
    std::atomic<int> counter{0};
    std::vector<std::thread> submitters;
    for (int s = 0; s < kSubmitters; ++s) {
        submitters.emplace_back([&, s] {
            for (int i = 0; i < tasks; ++i) {
                // Half of them wait in the pool, half try again.
                while (ovrin_threadpool_add_task(pool, count_up, &counter, s % 2) != 1) {
                    std::this_thread::yield();
                }
            }
        });
    }
    for (std::thread& submitter : submitters) submitter.join();
    ovrin_threadpool_free(pool, 1);
    EXPECT_EQ(counter, kSubmitters * tasks);
}

TEST(Sleep, ReturnsZeroAfterTheTime) {
    const auto before = std::chrono::steady_clock::now();
    EXPECT_EQ(ov_sleep(2000), 0);
    EXPECT_GE(std::chrono::steady_clock::now() - before, std::chrono::microseconds(2000));
}
