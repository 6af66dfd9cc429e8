// SPDX-License-Identifier: Apache-2.0
#include "bands/pool.h"

#include "bands/split.h"
#include "pool/threadpool.h"

namespace ovrin {

namespace {

// A task that the pool refuses is no loss: the calling thread goes on until nothing is left to do.
void add_task_for_each_worker(ovrin_threadpool* pool, void (*work)(void*), void* argument) {
    for (int32_t i = 0; i < kBandThreads; ++i) ovrin_threadpool_add_task(pool, work, argument, 0);
}

}  // namespace

// Unlike ovrin_threadpool_init, which needs one more thread to end a pool that lacks a worker, and
// leaves its idle workers for good when that is refused, too.
BandPool::BandPool() : pool_(make_pool(kBandThreads)) {
    if (pool_ == nullptr || start_workers(pool_, kBandThreads)) return;
    ovrin_threadpool_free(pool_, 1);
    pool_ = nullptr;
}

BandPool::~BandPool() {
    if (pool_ != nullptr) ovrin_threadpool_free(pool_, 1);
}

void BandPool::run(void (*work)(void*), void* argument) {
    add_task_for_each_worker(pool_, work, argument);
    work(argument);
    ovrin_threadpool_free(pool_, 1);
    pool_ = nullptr;
}

bool run_while_workers_start(void (*work)(void*), void* argument) {
    ovrin_threadpool* pool = make_pool(kBandThreads);
    if (pool == nullptr) return false;
    add_task_for_each_worker(pool, work, argument);
    start_workers(pool, kBandThreads);
    work(argument);
    ovrin_threadpool_free(pool, 1);
    return true;
}

}  // namespace ovrin
