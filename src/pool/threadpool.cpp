// SPDX-License-Identifier: Apache-2.0
#include "pool/threadpool.h"

#include <stdlib.h>
#include <string.h>

namespace {

constexpr uint32_t kCapacity = OVRIN_THREADPOOL_CAPACITY;

// Only the first waiter's queue going from empty to one entry matters: a thread waits only while
// the queue that it needs is empty.
bool wake_if_first(const ovrin_threadpool_queue& queue, pthread_cond_t* condition) {
    return queue.count != 1 || pthread_cond_broadcast(condition) == 0;
}

// Gives a slot that has been run back to the submitters.
bool return_slot(ovrin_threadpool* pool, ovrin_threadpool_task* slot) {
    if (pthread_mutex_lock(&pool->free_lock) != 0) return false;
    const bool stored = ovrin_threadpool_queue_enqueue(&pool->free_slots, slot) == 0 &&
                        wake_if_first(pool->free_slots, &pool->slot_freed);
    return pthread_mutex_unlock(&pool->free_lock) == 0 && stored;
}

void* worker_loop(void* argument) {
    auto* pool = static_cast<ovrin_threadpool*>(argument);
    while (ovrin_threadpool_task* slot = ovrin_threadpool_task_get_task(pool)) {
        if (slot->function == nullptr) continue;
        slot->function(slot->argument);
        ovrin_threadpool_task_init(slot);
        if (!return_slot(pool, slot)) break;
    }
    return nullptr;
}

bool wake_workers_to_stop(ovrin_threadpool* pool) {
    __atomic_store_n(&pool->stop, uint16_t{1}, __ATOMIC_RELEASE);
    return pthread_mutex_lock(&pool->pending_lock) == 0 &&
           pthread_cond_broadcast(&pool->task_ready) == 0 &&
           pthread_mutex_unlock(&pool->pending_lock) == 0;
}

// Mutexes and conditions are left as they are: destroying them is a no-op on every supported
// platform.
void stop_join_and_release(ovrin_threadpool* pool) {
    if (!wake_workers_to_stop(pool)) return;
    for (uint16_t i = 0; i < pool->thread_count; ++i) pthread_join(pool->threads[i], nullptr);
    free(pool->threads);
    free(pool);
}

// Nobody joins the joiner, so it detaches itself; otherwise its stack would never be released.
void* background_joiner(void* argument) {
    pthread_detach(pthread_self());
    stop_join_and_release(static_cast<ovrin_threadpool*>(argument));
    return nullptr;
}

bool init_synchronisation(ovrin_threadpool* pool) {
    return pthread_mutex_init(&pool->free_lock, nullptr) == 0 &&
           pthread_mutex_init(&pool->pending_lock, nullptr) == 0 &&
           pthread_cond_init(&pool->slot_freed, nullptr) == 0 &&
           pthread_cond_init(&pool->task_ready, nullptr) == 0;
}

void init_slots(ovrin_threadpool* pool) {
    memset(&pool->pending, 0, sizeof pool->pending);
    memset(&pool->free_slots, 0, sizeof pool->free_slots);
    for (ovrin_threadpool_task& slot : pool->tasks) {
        ovrin_threadpool_task_init(&slot);
        // A queue has a place for each.
        static_cast<void>(ovrin_threadpool_queue_enqueue(&pool->free_slots, &slot));
    }
}

bool init_fields(ovrin_threadpool* pool, int32_t n) {
    pool->stop = 0;
    pool->thread_count = 0;
    if (!init_synchronisation(pool)) return false;
    init_slots(pool);
    // At least one handle, because malloc(0) may return null.
    const size_t handles = n < 1 ? 1 : static_cast<size_t>(n);
    pool->threads = static_cast<pthread_t*>(malloc(handles * sizeof(pthread_t)));
    return pool->threads != nullptr;
}

// A slot that the submitter owns: it is in neither queue.
struct Acquired {
    ovrin_threadpool_task* slot;
    int32_t error;
};

Acquired acquire_slot(ovrin_threadpool* pool, bool wait) {
    if (pthread_mutex_lock(&pool->free_lock) != 0) return {nullptr, -1};
    int32_t error = -1;
    while (wait && pool->free_slots.count == 0) {
        if (pthread_cond_wait(&pool->slot_freed, &pool->free_lock) != 0) {
            pthread_mutex_unlock(&pool->free_lock);
            return {nullptr, -1};
        }
    }
    if (pool->free_slots.count == 0) error = -2;
    void* slot = ovrin_threadpool_queue_dequeue(&pool->free_slots);
    if (pthread_mutex_unlock(&pool->free_lock) != 0) return {nullptr, -1};
    return {static_cast<ovrin_threadpool_task*>(slot), error};
}

bool submit_slot(ovrin_threadpool* pool, ovrin_threadpool_task* slot) {
    if (pthread_mutex_lock(&pool->pending_lock) != 0) return false;
    const bool queued = ovrin_threadpool_queue_enqueue(&pool->pending, slot) == 0 &&
                        wake_if_first(pool->pending, &pool->task_ready);
    return pthread_mutex_unlock(&pool->pending_lock) == 0 && queued;
}

}  // namespace

namespace ovrin {

ovrin_threadpool* make_pool(int32_t n) {
    if (n > UINT16_MAX) return nullptr;
    auto* pool = static_cast<ovrin_threadpool*>(malloc(sizeof(ovrin_threadpool)));
    if (pool == nullptr) return nullptr;
    if (!init_fields(pool, n)) {
        free(pool);
        return nullptr;
    }
    return pool;
}

bool start_workers(ovrin_threadpool* pool, int32_t n) {
    while (pool->thread_count < n) {
        if (pthread_create(&pool->threads[pool->thread_count], nullptr, worker_loop, pool) != 0) {
            return false;
        }
        ++pool->thread_count;
    }
    return true;
}

}  // namespace ovrin

int32_t ovrin_threadpool_queue_enqueue(ovrin_threadpool_queue* queue, void* entry) {
    if (queue->count == kCapacity) return -1;
    if (queue->entries[queue->tail] != nullptr) return -1;
    queue->entries[queue->tail] = entry;
    ++queue->count;
    if (++queue->tail == kCapacity) queue->tail = 0;
    return 0;
}

void* ovrin_threadpool_queue_dequeue(ovrin_threadpool_queue* queue) {
    if (queue == nullptr || queue->count == 0) return nullptr;
    void* entry = queue->entries[queue->head];
    queue->entries[queue->head] = nullptr;
    if (--queue->count == 0) {
        queue->head = queue->tail = 0;
    } else if (++queue->head == kCapacity) {
        queue->head = 0;
    }
    return entry;
}

int32_t ovrin_threadpool_queue_is_empty(const ovrin_threadpool_queue* queue) {
    return queue->count == 0 ? 1 : 0;
}

uint32_t ovrin_threadpool_queue_getsize(const ovrin_threadpool_queue* queue) {
    return queue->count;
}

void ovrin_threadpool_task_init(ovrin_threadpool_task* task) {
    task->function = nullptr;
    task->argument = nullptr;
}

ovrin_threadpool_task* ovrin_threadpool_task_get_task(ovrin_threadpool* pool) {
    if (pthread_mutex_lock(&pool->pending_lock) != 0) return nullptr;
    // `stop` only matters while nothing is pending: ending a pool drains its queue.
    while (pool->pending.count == 0 && __atomic_load_n(&pool->stop, __ATOMIC_ACQUIRE) == 0) {
        if (pthread_cond_wait(&pool->task_ready, &pool->pending_lock) != 0) {
            pthread_mutex_unlock(&pool->pending_lock);
            return nullptr;
        }
    }
    void* slot = ovrin_threadpool_queue_dequeue(&pool->pending);
    if (pthread_mutex_unlock(&pool->pending_lock) != 0) return nullptr;
    return static_cast<ovrin_threadpool_task*>(slot);
}

ovrin_threadpool* ovrin_threadpool_init(int32_t n) {
    ovrin_threadpool* pool = ovrin::make_pool(n);
    if (pool == nullptr) return nullptr;
    if (!ovrin::start_workers(pool, n)) {
        ovrin_threadpool_free(pool, 0);
        return nullptr;
    }
    return pool;
}

int32_t ovrin_threadpool_add_task(ovrin_threadpool* pool, void (*function)(void*), void* argument,
                                  int32_t wait) {
    if (pool == nullptr) return -1;
    const Acquired acquired = acquire_slot(pool, wait != 0);
    if (acquired.slot == nullptr) return acquired.error;
    acquired.slot->argument = argument;
    acquired.slot->function = function;
    return submit_slot(pool, acquired.slot) ? 1 : -1;
}

void ovrin_threadpool_free(ovrin_threadpool* pool, int32_t sync) {
    if (sync != 0) {
        stop_join_and_release(pool);
        return;
    }
    pthread_t joiner;
    if (pthread_create(&joiner, nullptr, background_joiner, pool) != 0) {
        // Idle workers cannot be joined from here without blocking the caller, so they stay.
        __atomic_store_n(&pool->stop, uint16_t{1}, __ATOMIC_RELEASE);
    }
}
