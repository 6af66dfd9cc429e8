// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <ovrinresize.h>

namespace ovrin {

// A band on its way through the pool.
struct BandJob {
    void (*task)(void*);
    void* band;           // the task's argument, a band record
    const int32_t* done;  // the record's flag, set by the task
    bool shares_row;      // this band and the one before it add into one destination row
    bool skip;            // nothing is left for this band
    int32_t claimed;      // 1 once a thread has taken the band on
};

// Runs every band exactly once, so that no two bands that add into one destination row run at the
// same time. Only neighbours can share a row, and bands may be handed over in any other order: the
// even ones go first, an odd one follows when its neighbours are done. A band that the pool does
// not take, or has not started when the calling thread waits for it, runs on the calling thread.
// Returns when all bands are done.
void run_bands(ovrin_threadpool* pool, BandJob* jobs, int32_t count);

}  // namespace ovrin
