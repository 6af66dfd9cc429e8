// SPDX-License-Identifier: Apache-2.0
// The pool and the bands, compiled from src/ as they are, under the memory model of C11: every
// atomic operation, lock, wait and join is Relacy's, which lets loads return any value that the
// model allows, and reports data that is read without being handed over.
//
// Plain fields of the pool are not looked at here; the thread sanitizer does that.
//
// BROKEN names a fault that must be found.
#include <relacy/pthread.h>
#include <stdio.h>
#include <unistd.h>

#include <map>
#include <memory>
#include <vector>
// Before the names below mean something else.
#include <pthread.h>
#include <stdint.h>
#include <stdlib.h>
#include <string.h>

#undef malloc
#undef calloc
#undef free
#undef new
#undef delete

namespace model {

struct Mutex {
    rl::rl_pthread_mutex_t* lock;
};
struct Condition {
    rl::rl_pthread_cond_t* condition;
};
using Thread = rl::rl_pthread_t;
using Atomic = rl::atomic<int64_t>;

// What stands for the memory of one execution.
struct World {
    std::vector<std::unique_ptr<rl::rl_pthread_mutex_t>> mutexes;
    std::vector<std::unique_ptr<rl::rl_pthread_cond_t>> conditions;
    std::map<const volatile void*, std::unique_ptr<Atomic>> atomics;
};
World* world = nullptr;

// From here on the object at `address` is atomic. To be called before other threads see it.
void make_atomic(const volatile void* address, int64_t value) {
    auto& atomic = world->atomics[address];
    if (atomic == nullptr) {
        atomic = std::make_unique<Atomic>();
        atomic->store(value, rl::mo_relaxed, $);
    }
}

Atomic& atomic_at(const volatile void* address) {
    return *world->atomics.at(address);
}

rl::memory_order order_of(int order) {
    if (order == __ATOMIC_RELAXED) return rl::mo_relaxed;
    return order == __ATOMIC_ACQUIRE ? rl::mo_acquire : rl::mo_release;
}

template <class T>
T load(const T* address, int order) {
    return static_cast<T>(atomic_at(address).load(order_of(order), $));
}

template <class T>
void store(T* address, T value, int order) {
    atomic_at(address).store(static_cast<int64_t>(value), order_of(order), $);
}

template <class T>
bool compare_exchange(T* address, T* expected, T wanted, int order) {
    int64_t seen = *expected;
#if defined(BROKEN_EXCHANGE)
    seen = atomic_at(address).load(rl::mo_relaxed, $);
    const bool same = seen == *expected;
    if (same) atomic_at(address).store(wanted, rl::mo_relaxed, $);
#else
    const bool same = atomic_at(address).compare_exchange_strong(seen, wanted, order_of(order), $);
#endif
    *expected = static_cast<T>(seen);
    return same;
}

int init(Mutex* mutex) {
    world->mutexes.push_back(std::make_unique<rl::rl_pthread_mutex_t>());
    mutex->lock = world->mutexes.back().get();
    return rl::rl_pthread_mutex_init(mutex->lock, nullptr, $);
}

int init(Condition* condition) {
    world->conditions.push_back(std::make_unique<rl::rl_pthread_cond_t>());
    condition->condition = world->conditions.back().get();
    return rl::rl_pthread_cond_init(condition->condition, nullptr, $);
}

// Waits may end for no reason, which callers must bear.
int wait(Condition* condition, Mutex* mutex) {
    rl::rl_pthread_cond_wait(condition->condition, mutex->lock, $);
    return 0;
}

int join(Thread thread) {
#if defined(BROKEN_JOIN)
    return 0;
#else
    void* result;
    return rl::rl_pthread_join(thread, &result, $);
#endif
}

int create(Thread* thread, void* (*function)(void*), void* argument);

}  // namespace model

#define pthread_mutex_t model::Mutex
#define pthread_cond_t model::Condition
#define pthread_t model::Thread
#define pthread_mutex_init(mutex, attributes) model::init(mutex)
#define pthread_cond_init(condition, attributes) model::init(condition)
#define pthread_mutex_lock(mutex) rl::rl_pthread_mutex_lock((mutex)->lock, $)
#define pthread_mutex_unlock(mutex) rl::rl_pthread_mutex_unlock((mutex)->lock, $)
#define pthread_cond_wait(condition, mutex) model::wait(condition, mutex)
#define pthread_cond_broadcast(c) rl::rl_pthread_cond_broadcast((c)->condition, $)
#define pthread_create(thread, attributes, function, argument) \
    model::create(thread, function, argument)
#define pthread_join(thread, result) model::join(thread)
#define pthread_self() model::Thread()
#define pthread_detach(thread) ((void)(thread))
#define __atomic_load_n(address, order) model::load(address, order)
#define __atomic_store_n(address, value, order) model::store(address, value, order)
#define __atomic_compare_exchange_n(address, expected, wanted, weak, order, failure) \
    model::compare_exchange(address, expected, wanted, order)

#include "bands/pool.cpp"
#include "bands/turns.h"
#include "pool/threadpool.cpp"

// The first thread that is created takes the pool along, and with it its only atomic.
int model::create(Thread* thread, void* (*function)(void*), void* argument) {
    auto* pool = static_cast<ovrin_threadpool*>(argument);
    make_atomic(&pool->stop, pool->stop);
    return rl::rl_pthread_create(thread, nullptr, function, argument, $);
}

namespace {

constexpr int32_t kPasses = 2;
constexpr int32_t kMaxBands = 3;

// A picture of a few bands, each of which a thread reads and writes.
struct Picture {
    ovrin::Turns turns;
    rl::var<int> source[kMaxBands];
    rl::var<int> result[kPasses][kMaxBands];

    static void work(void* argument) {
        auto& picture = *static_cast<Picture*>(argument);
        ovrin::TurnTaker taker(picture.turns);
        if (taker.is_late()) return;
        for (auto& pass : picture.result) {
            taker.take_pass([&](ovrin::Turn turn) {
                for (int32_t i = turn.first; i < turn.end; ++i) {
                    pass[i]($) = pass[i]($) + picture.source[i]($);
                }
            });
        }
    }
};

// kOwnThreads: a pool that is ready; otherwise workers start while the caller works.
template <int32_t kBands, bool kOwnThreads>
struct Call : rl::test_suite<Call<kBands, kOwnThreads>, 1> {
    static constexpr size_t dynamic_thread_count = ovrin::kBandThreads;

    void before() { model::world = new model::World; }

    void thread(unsigned /*number*/) {
        Picture picture;
        picture.turns = {kBands, 0, false};
        model::make_atomic(&picture.turns.next, 0);
        model::make_atomic(&picture.turns.all_taken, 0);
        for (int32_t i = 0; i < kBands; ++i) {
            picture.source[i]($) = i + 1;
            for (auto& pass : picture.result) pass[i]($) = 0;
        }
        if (kOwnThreads) {
            ovrin::BandPool pool;
            RL_ASSERT(pool.ready());
            pool.run(Picture::work, &picture);
        } else {
            RL_ASSERT(ovrin::run_while_workers_start(Picture::work, &picture));
        }
        // Every band of every pass ran once, and what it wrote is here.
        for (auto& pass : picture.result) {
            for (int32_t i = 0; i < kBands; ++i) RL_ASSERT(pass[i]($) == i + 1);
        }
        for (auto& mutex : model::world->mutexes) rl::rl_pthread_mutex_destroy(mutex.get(), $);
        for (auto& condition : model::world->conditions) {
            rl::rl_pthread_cond_destroy(condition.get(), $);
        }
        model::world->atomics.clear();
    }

    void after() { delete model::world; }
};

}  // namespace

int main(int argc, char** argv) {
    rl::test_params parameters;
    parameters.iteration_count = argc > 1 ? static_cast<unsigned>(atoi(argv[1])) : 10000;
    const bool holds =
        rl::simulate<Call<2, true>>(parameters) && rl::simulate<Call<3, true>>(parameters) &&
        rl::simulate<Call<2, false>>(parameters) && rl::simulate<Call<3, false>>(parameters);
    return holds ? 0 : 1;
}
