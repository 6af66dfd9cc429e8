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
    bool released;        // may run now
    int32_t claimed;      // 1 once a thread has taken the band on
};

// Runs every band exactly once, so that no two bands that add into one destination row run at the
// same time, and ends the pool, which may be null. Only neighbours can share a row: the even bands,
// and all that share none, are released at once; an odd one, and the last, follow when the
// neighbours that they share a row with are done. Meanwhile, the calling thread runs released bands
// itself, those that the pool does not take among them. Returns when all bands are done.
void run_bands(ovrin_threadpool* pool, BandJob* jobs, int32_t count);

}  // namespace ovrin
