// SPDX-License-Identifier: Apache-2.0
#include "dispatch/helping_run.h"

namespace ovrin {

namespace {

ovrin_threadpool_task* take_task(ovrin_threadpool* pool) {
    if (pthread_mutex_lock(&pool->pending_lock) != 0) return nullptr;
    void* task = ovrin_threadpool_queue_dequeue(&pool->pending);
    pthread_mutex_unlock(&pool->pending_lock);
    return static_cast<ovrin_threadpool_task*>(task);
}

}  // namespace

void run_bands_with_caller(ovrin_threadpool* pool, void (*task)(void*), void* bands, int32_t count,
                           size_t band_bytes) {
    auto* band = static_cast<uint8_t*>(bands);
    for (int32_t i = 0; i < count; ++i, band += band_bytes) {
        if (ovrin_threadpool_add_task(pool, task, band, 0) != 1) task(band);
    }
    while (ovrin_threadpool_task* queued = take_task(pool)) {
        queued->function(queued->argument);
        ovrin_threadpool_task_init(queued);
    }
    ovrin_threadpool_free(pool, 1);
}

}  // namespace ovrin
