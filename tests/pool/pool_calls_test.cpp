// SPDX-License-Identifier: Apache-2.0
// A pool whose locks, waits and broadcasts fail. Linked with --wrap for each of them.
#include <gtest/gtest.h>
#include <ovrinresize.h>
#include <unistd.h>

#include <atomic>

namespace {

enum Call { kLock, kUnlock, kWait, kBroadcast, kCalls };

// The calls that still succeed before one fails; below 0: all succeed.
std::atomic<int> left_to_succeed[kCalls] = {{-1}, {-1}, {-1}, {-1}};

bool fails(Call call) {
    return left_to_succeed[call] >= 0 && left_to_succeed[call]-- == 0;
}

void fail_after(Call call, int successes) {
    left_to_succeed[call] = successes;
}

// The failure has happened.
bool has_failed(Call call) {
    return left_to_succeed[call] < 0;
}

}  // namespace

extern "C" {
int __real_pthread_mutex_lock(pthread_mutex_t* mutex);
int __real_pthread_mutex_unlock(pthread_mutex_t* mutex);
int __real_pthread_cond_wait(pthread_cond_t* condition, pthread_mutex_t* mutex);
int __real_pthread_cond_broadcast(pthread_cond_t* condition);

int __wrap_pthread_mutex_lock(pthread_mutex_t* mutex) {
    return fails(kLock) ? 22 : __real_pthread_mutex_lock(mutex);
}

// The mutex is free all the same, so that others need not wait for ever.
int __wrap_pthread_mutex_unlock(pthread_mutex_t* mutex) {
    const int result = __real_pthread_mutex_unlock(mutex);
    return fails(kUnlock) ? 1 : result;
}

int __wrap_pthread_cond_wait(pthread_cond_t* condition, pthread_mutex_t* mutex) {
    return fails(kWait) ? 22 : __real_pthread_cond_wait(condition, mutex);
}

int __wrap_pthread_cond_broadcast(pthread_cond_t* condition) {
    return fails(kBroadcast) ? 22 : __real_pthread_cond_broadcast(condition);
}
}

namespace {

void count_up(void* counter) {
    static_cast<std::atomic<int>*>(counter)->fetch_add(1);
}

void use_all_slots(ovrin_threadpool* pool, std::atomic<int>* counter) {
    for (int i = 0; i < OVRIN_THREADPOOL_CAPACITY; ++i) {
        ASSERT_EQ(ovrin_threadpool_add_task(pool, count_up, counter, 0), 1);
    }
}

}  // namespace

TEST(PoolCalls, AddingATaskReportsEveryFailure) {
    const struct {
        Call call;
        int successes;
        int wait;
    } failures[] = {{kLock, 0, 0},   {kLock, 1, 0},      {kUnlock, 0, 0},
                    {kUnlock, 1, 0}, {kBroadcast, 0, 0}, {kLock, 0, 1}};
    for (const auto& failure : failures) {
        SCOPED_TRACE(failure.call);
        std::atomic<int> counter{0};
        ovrin_threadpool* pool = ovrin_threadpool_init(0);
        fail_after(failure.call, failure.successes);
        EXPECT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, failure.wait), -1);
        EXPECT_TRUE(has_failed(failure.call));
        EXPECT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), 1);
        ovrin_threadpool_free(pool, 1);
        EXPECT_EQ(counter, 0);
    }
}

TEST(PoolCalls, AWaitForASlotThatFailsIsReportedAndLeavesTheLockFree) {
    std::atomic<int> counter{0};
    ovrin_threadpool* pool = ovrin_threadpool_init(0);
    use_all_slots(pool, &counter);
    fail_after(kWait, 0);
    EXPECT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 1), -1);
    fail_after(kUnlock, 0);
    EXPECT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), -1);
    EXPECT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), -2);
    ovrin_threadpool_free(pool, 1);
}

// A position in the ring that was never emptied.
TEST(PoolCalls, AQueueWithAnOccupiedPositionTakesNoTask) {
    std::atomic<int> counter{0};
    ovrin_threadpool* pool = ovrin_threadpool_init(0);
    int entry = 0;
    pool->pending.entries[0] = &entry;
    EXPECT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), -1);
    EXPECT_EQ(ovrin_threadpool_queue_is_empty(&pool->pending), 1);
    ovrin_threadpool_free(pool, 1);
}

TEST(PoolCalls, GettingATaskGivesNoneWhenACallFails) {
    std::atomic<int> counter{0};
    ovrin_threadpool* pool = ovrin_threadpool_init(0);
    fail_after(kWait, 0);
    EXPECT_EQ(ovrin_threadpool_task_get_task(pool), nullptr);
    ASSERT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), 1);
    fail_after(kLock, 0);
    EXPECT_EQ(ovrin_threadpool_task_get_task(pool), nullptr);
    EXPECT_EQ(ovrin_threadpool_queue_getsize(&pool->pending), 1U);
    fail_after(kUnlock, 0);
    EXPECT_EQ(ovrin_threadpool_task_get_task(pool), nullptr);
    EXPECT_EQ(ovrin_threadpool_queue_getsize(&pool->pending), 0U);
    ovrin_threadpool_free(pool, 1);
}

// Workers that nobody can wake cannot be joined: the pool stays, and can be ended later.
TEST(PoolCalls, EndingAPoolStopsAtTheFirstFailure) {
    for (const Call call : {kLock, kBroadcast, kUnlock}) {
        SCOPED_TRACE(call);
        ovrin_threadpool* pool = ovrin_threadpool_init(0);
        fail_after(call, 0);
        ovrin_threadpool_free(pool, 1);
        EXPECT_TRUE(has_failed(call));
        EXPECT_EQ(pool->stop, 1);
        // A failed broadcast leaves the lock taken.
        if (call == kBroadcast) pthread_mutex_unlock(&pool->pending_lock);
        ovrin_threadpool_free(pool, 1);
    }
}

// A task that waits until all slots are in use and then spoils what its worker does next.
struct Spoiler {
    ovrin_threadpool* pool;
    Call call;  // kCalls: the slot's place is taken
    std::atomic<bool> may_go{false};
    int occupant = 0;

    static void run(void* argument) {
        auto* self = static_cast<Spoiler*>(argument);
        while (!self->may_go) usleep(100);
        if (self->call == kCalls) {
            self->pool->free_slots.entries[self->pool->free_slots.tail] = &self->occupant;
        } else {
            fail_after(self->call, 0);
        }
    }
};

TEST(PoolCalls, AWorkerThatCannotReturnItsSlotEndsAndLeavesTheRest) {
    for (const Call call : {kLock, kUnlock, kBroadcast, kCalls}) {
        SCOPED_TRACE(call);
        std::atomic<int> counter{0};
        ovrin_threadpool* pool = ovrin_threadpool_init(1);
        Spoiler spoiler{pool, call};
        ASSERT_EQ(ovrin_threadpool_add_task(pool, Spoiler::run, &spoiler, 0), 1);
        for (int i = 1; i < OVRIN_THREADPOOL_CAPACITY; ++i) {
            ASSERT_EQ(ovrin_threadpool_add_task(pool, count_up, &counter, 0), 1);
        }
        spoiler.may_go = true;
        ASSERT_EQ(pthread_join(pool->threads[0], nullptr), 0);
        if (call != kCalls) {
            EXPECT_TRUE(has_failed(call));
        }
        EXPECT_EQ(counter, 0);
        pool->thread_count = 0;
        ovrin_threadpool_free(pool, 1);
    }
}
