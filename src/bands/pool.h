// SPDX-License-Identifier: Apache-2.0
// The thread pool of one call, with the calling thread as one more worker.
#pragma once

#include <ovrinresize.h>

namespace ovrin {

// All four workers, or none: for calls whose single-threaded way may give other bytes, so that it
// must be known before anything is written which way is taken.
class BandPool {
public:
    BandPool();
    ~BandPool();

    BandPool(const BandPool&) = delete;
    BandPool& operator=(const BandPool&) = delete;

    // False when memory or a thread is missing.
    bool ready() const { return pool_ != nullptr; }

    // Calls work(argument) on the calling thread and on every worker, side by side, and returns
    // when all of these calls have returned. Once at most.
    void run(void (*work)(void*), void* argument);

private:
    ovrin_threadpool* pool_;
};

// The same without waiting for all workers to exist: each begins as soon as it has been started,
// and one that cannot be started is left out. False when there is no memory for a pool; work has
// not been called then.
bool run_while_workers_start(void (*work)(void*), void* argument);

}  // namespace ovrin
