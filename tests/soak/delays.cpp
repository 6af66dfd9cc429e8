// SPDX-License-Identifier: Apache-2.0
#include "soak/delays.h"

#include <ovrinresize.h>
#include <sched.h>
#include <unistd.h>

#include <atomic>

using namespace ovrin_test;

namespace {

std::atomic<uint32_t> threads_seen{0};
std::atomic<int64_t> delay_count{0};
std::atomic<int64_t> refusal_count{0};
thread_local Refuse refused_here = Refuse::kNothing;
thread_local uint32_t refused_pools = 0;
thread_local bool last_thread_refused = false, is_second_mutex = false;

// Each thread draws numbers of its own.
uint32_t draw() {
    thread_local uint32_t state = 0x9E3779B9U * (2 * threads_seen++ + 1);
    state ^= state << 13;
    state ^= state >> 17;
    state ^= state << 5;
    return state;
}

// Mostly nothing, sometimes the rest of the time slice, now and then a sleep in which others get
// far ahead.
void dawdle() {
    const uint32_t number = draw();
    if (number % 4 != 0) return;
    delay_count.fetch_add(1, std::memory_order_relaxed);
    if (number % 64 == 0) {
        usleep(number / 64 % 60);
    } else {
        sched_yield();
    }
}

bool refuses(bool is_refused) {
    if (is_refused) refusal_count.fetch_add(1, std::memory_order_relaxed);
    return is_refused;
}

// One request in `odds`.
bool refuses_at_random(uint32_t odds) {
    return refuses(refused_here == Refuse::kAtRandom && draw() % odds == 0);
}

bool refuses_thread() {
    last_thread_refused = !last_thread_refused && refuses_at_random(8);
    return last_thread_refused;
}

// A pool has two mutexes, and does not ask for the second when the first is refused.
bool refuses_mutex() {
    if (refused_here == Refuse::kAtRandom) return refuses_at_random(64);
    is_second_mutex = !is_second_mutex;
    if (!is_second_mutex) return false;
    const bool is_refused = (refused_pools & 1) != 0;
    refused_pools >>= 1;
    is_second_mutex = !is_refused;
    return refuses(is_refused);
}

// A task that its worker takes up late, so that it can meet any other.
struct LateTask {
    void (*function)(void*);
    void* argument;

    static void run(void* self) {
        const LateTask task = *static_cast<LateTask*>(self);
        delete static_cast<LateTask*>(self);
        static std::atomic<uint32_t> turn{0};
        const uint32_t number = turn++ * 0x9E3779B9U >> 20;
        if (number % 16 == 0) usleep(number / 16);
        dawdle();
        task.function(task.argument);
    }
};

}  // namespace

namespace ovrin_test {

int64_t delays() {
    return delay_count;
}

int64_t refusals() {
    return refusal_count;
}

Refusing::Refusing(Refuse what, uint32_t pools) {
    refused_here = what;
    refused_pools = pools;
    last_thread_refused = is_second_mutex = false;
}

Refusing::~Refusing() {
    refused_here = Refuse::kNothing;
    refused_pools = 0;
}

}  // namespace ovrin_test

extern "C" {
int __real_pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                          void* (*start)(void*), void* argument);
int __real_pthread_join(pthread_t thread, void** result);
int __real_pthread_mutex_init(pthread_mutex_t* mutex, const pthread_mutexattr_t* attributes);
int __real_pthread_mutex_lock(pthread_mutex_t* mutex);
int __real_pthread_mutex_unlock(pthread_mutex_t* mutex);
int __real_pthread_cond_init(pthread_cond_t* condition, const pthread_condattr_t* attributes);
int __real_pthread_cond_wait(pthread_cond_t* condition, pthread_mutex_t* mutex);
int __real_pthread_cond_broadcast(pthread_cond_t* condition);
int32_t __real_ovrin_threadpool_add_task(ovrin_threadpool* pool, void (*function)(void*),
                                         void* argument, int32_t wait);
void __real_ovrin_threadpool_free(ovrin_threadpool* pool, int32_t sync);

int __wrap_pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                          void* (*start)(void*), void* argument) {
    dawdle();
    if (refuses_thread()) return 11;
    return __real_pthread_create(thread, attributes, start, argument);
}

int __wrap_pthread_join(pthread_t thread, void** result) {
    dawdle();
    return __real_pthread_join(thread, result);
}

int __wrap_pthread_mutex_init(pthread_mutex_t* mutex, const pthread_mutexattr_t* attributes) {
    return refuses_mutex() ? 12 : __real_pthread_mutex_init(mutex, attributes);
}

int __wrap_pthread_mutex_lock(pthread_mutex_t* mutex) {
    dawdle();
    return __real_pthread_mutex_lock(mutex);
}

int __wrap_pthread_mutex_unlock(pthread_mutex_t* mutex) {
    dawdle();
    return __real_pthread_mutex_unlock(mutex);
}

int __wrap_pthread_cond_init(pthread_cond_t* condition, const pthread_condattr_t* attributes) {
    return refuses_at_random(64) ? 12 : __real_pthread_cond_init(condition, attributes);
}

int __wrap_pthread_cond_wait(pthread_cond_t* condition, pthread_mutex_t* mutex) {
    dawdle();
    return __real_pthread_cond_wait(condition, mutex);
}

int __wrap_pthread_cond_broadcast(pthread_cond_t* condition) {
    dawdle();
    return __real_pthread_cond_broadcast(condition);
}

int32_t __wrap_ovrin_threadpool_add_task(ovrin_threadpool* pool, void (*function)(void*),
                                         void* argument, int32_t wait) {
    dawdle();
    auto* task = new LateTask{function, argument};
    const int32_t result = __real_ovrin_threadpool_add_task(pool, LateTask::run, task, wait);
    if (result != 1) delete task;
    return result;
}

// A pool for which no thread could be had runs none of its tasks.
void __wrap_ovrin_threadpool_free(ovrin_threadpool* pool, int32_t sync) {
    if (pool->thread_count == 0) {
        while (void* slot = ovrin_threadpool_queue_dequeue(&pool->pending)) {
            delete static_cast<LateTask*>(static_cast<ovrin_threadpool_task*>(slot)->argument);
        }
    }
    __real_ovrin_threadpool_free(pool, sync);
}
}
