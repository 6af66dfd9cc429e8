// SPDX-License-Identifier: Apache-2.0
// The thread pool and its queue, beside plain models.
#include <cstring>
#include <deque>
#include <memory>

#include "support.h"

using namespace fuzz;

namespace {

// ---- A queue alone ----

void check_queue(const ovrin_threadpool_queue& queue, const std::deque<void*>& model) {
    require(ovrin_threadpool_queue_getsize(&queue) == model.size(), "wrong size", "any");
    require(ovrin_threadpool_queue_is_empty(&queue) == (model.empty() ? 1 : 0), "wrong emptiness",
            "any");
}

void put(ovrin_threadpool_queue& queue, std::deque<void*>& model, int32_t count) {
    for (int32_t i = 0; i < count; ++i) {
        void* entry = &model + i;
        const bool full = model.size() == OVRIN_THREADPOOL_CAPACITY;
        require(ovrin_threadpool_queue_enqueue(&queue, entry) == (full ? -1 : 0),
                "wrong answer of enqueue", "any");
        if (!full) model.push_back(entry);
    }
}

void take(ovrin_threadpool_queue& queue, std::deque<void*>& model, int32_t count) {
    for (int32_t i = 0; i < count; ++i) {
        void* expected = model.empty() ? nullptr : model.front();
        if (!model.empty()) model.pop_front();
        require(ovrin_threadpool_queue_dequeue(&queue) == expected, "wrong entry", "any");
        if (model.empty()) require(queue.head == 0 && queue.tail == 0, "not restarted", "any");
    }
}

void queue_alone(Input& in) {
    static ovrin_threadpool_queue queue;  // 16 KB
    memset(&queue, 0, sizeof queue);
    std::deque<void*> model;
    for (int32_t step = in.between(1, 12); step > 0; --step) {
        const int32_t count = in.flag() ? in.byte() : in.between(0, 2100);
        in.flag() ? put(queue, model, count) : take(queue, model, count);
        check_queue(queue, model);
    }
}

// ---- A pool ----

struct Counters {
    int32_t started[256];
};

void count(void* counter) {
    __atomic_fetch_add(static_cast<int32_t*>(counter), 1, __ATOMIC_RELAXED);
}

// Every task that was accepted runs once, before a synchronous end.
void pool_with_workers(Input& in) {
    const int32_t workers = in.between(1, 4);
    ovrin_threadpool* pool = ovrin_threadpool_init(workers);
    require(pool != nullptr, "no pool", "any");
    require(pool->thread_count == workers, "wrong number of workers", "any");
    Counters ran = {};
    Counters accepted = {};
    for (int32_t task = in.between(0, 60); task > 0; --task) {
        const uint8_t which = in.byte();
        const bool dropped = which == 255;  // a task without a function
        const int32_t answer = ovrin_threadpool_add_task(pool, dropped ? nullptr : count,
                                                         &ran.started[which], in.flag() ? 1 : 0);
        require(answer == 1, "a task was refused", "any");
        if (!dropped) ++accepted.started[which];
    }
    ovrin_threadpool_free(pool, 1);
    require(memcmp(&ran, &accepted, sizeof ran) == 0, "tasks were lost or run twice", "any");
}

// Nothing runs; the caller takes the tasks.
void pool_without_workers(Input& in) {
    ovrin_threadpool* pool = ovrin_threadpool_init(in.pick({0, -1, INT32_MIN}));
    require(pool != nullptr && pool->thread_count == 0, "no pool", "any");
    const int32_t tasks = in.between(0, 2100);
    const int32_t queued = tasks < OVRIN_THREADPOOL_CAPACITY ? tasks : OVRIN_THREADPOOL_CAPACITY;
    int32_t ran = 0;
    for (int32_t task = 0; task < tasks; ++task) {
        require(ovrin_threadpool_add_task(pool, count, &ran, 0) == (task < queued ? 1 : -2),
                "wrong answer of add_task", "any");
    }
    const int32_t taken = in.between(0, queued);
    for (int32_t task = 0; task < taken; ++task) {
        ovrin_threadpool_task* slot = ovrin_threadpool_task_get_task(pool);
        require(slot != nullptr && slot->function == count && slot->argument == &ran,
                "not the task that was queued", "any");
        ovrin_threadpool_task_init(slot);
        require(slot->function == nullptr && slot->argument == nullptr, "not cleared", "any");
    }
    require(ovrin_threadpool_queue_getsize(&pool->pending) == static_cast<uint32_t>(queued - taken),
            "wrong number of tasks left", "any");
    ovrin_threadpool_free(pool, 1);
    require(ran == 0, "a task ran without a worker", "any");
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    Input in(data, size);
    const uint8_t what = in.byte() % 4;
    if (what < 2) queue_alone(in);
    if (what == 2) pool_with_workers(in);
    if (what == 3) pool_without_workers(in);
    return 0;
}
