// SPDX-License-Identifier: Apache-2.0
#include "dispatch/band_schedule.h"

namespace ovrin {

namespace {

constexpr uint32_t kPollMicroseconds = 5;

// Several threads may come across one job. Adding a band twice would spoil the picture, so whoever
// claims it first runs it.
bool run_if_unclaimed(BandJob& job) {
    if (__atomic_exchange_n(&job.claimed, 1, __ATOMIC_ACQ_REL) != 0) return false;
    job.task(job.band);
    return true;
}

void run_job(void* argument) {
    run_if_unclaimed(*static_cast<BandJob*>(argument));
}

bool is_done(const BandJob& job) {
    return __atomic_load_n(job.done, __ATOMIC_ACQUIRE) != 0;
}

// The bands of one call, as the calling thread sees them.
struct Bands {
    ovrin_threadpool* pool;
    BandJob* jobs;
    int32_t count;

    int32_t last() const { return count - 1; }
    bool share_row(int32_t k) const { return k > 0 && k < count && jobs[k].shares_row; }
    bool may_run_at_once(int32_t k) const {
        return (k % 2 == 0 && k != last()) || (!share_row(k) && !share_row(k + 1));
    }
};

// A band that the pool does not take is left to the calling thread.
void release(const Bands& bands, int32_t k) {
    BandJob& job = bands.jobs[k];
    if (job.skip) return;
    job.released = true;
    ovrin_threadpool_add_task(bands.pool, run_job, &job, 0);
}

// Runs a band that no thread has taken on; false when there is none.
bool help(const Bands& bands) {
    for (int32_t k = 0; k < bands.count; ++k) {
        if (bands.jobs[k].released && run_if_unclaimed(bands.jobs[k])) return true;
    }
    return false;
}

void wait_for(const Bands& bands, int32_t k) {
    const BandJob& job = bands.jobs[k];
    while (job.released && !is_done(job)) {
        if (!help(bands)) ov_sleep(kPollMicroseconds);
    }
}

}  // namespace

void run_bands(ovrin_threadpool* pool, BandJob* jobs, int32_t count) {
    const Bands bands = {pool, jobs, count};
    for (int32_t k = 0; k < count; ++k) {
        if (bands.may_run_at_once(k)) release(bands, k);
    }
    for (int32_t k = 1; k < count; ++k) {
        if (bands.may_run_at_once(k)) continue;
        if (bands.share_row(k)) wait_for(bands, k - 1);
        if (bands.share_row(k + 1)) wait_for(bands, k + 1);
        release(bands, k);
    }
    while (help(bands)) {
    }
    // Waits for the bands that workers are running, better than by polling.
    if (pool != nullptr) ovrin_threadpool_free(pool, 1);
    for (int32_t k = 0; k < count; ++k) wait_for(bands, k);
}

}  // namespace ovrin
