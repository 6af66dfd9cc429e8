// SPDX-License-Identifier: Apache-2.0
#include "dispatch/band_schedule.h"

namespace ovrin {

namespace {

constexpr uint32_t kPollMicroseconds = 5;

// Several threads may come across one job, for instance when the pool queued a task and reported
// an error all the same. Adding a band twice would spoil the picture, so whoever claims it first
// runs it.
void run_once(void* argument) {
    auto* job = static_cast<BandJob*>(argument);
    if (__atomic_exchange_n(&job->claimed, 1, __ATOMIC_ACQ_REL) == 0) job->task(job->band);
}

bool is_done(const BandJob& job) {
    return __atomic_load_n(job.done, __ATOMIC_ACQUIRE) != 0;
}

void submit(ovrin_threadpool* pool, BandJob& job) {
    if (ovrin_threadpool_add_task(pool, run_once, &job, 0) != 1) run_once(&job);
}

// Only for bands that have been submitted: running one here must be allowed.
void finish(BandJob& job) {
    run_once(&job);
    while (!is_done(job)) ov_sleep(kPollMicroseconds);
}

}  // namespace

void run_bands(ovrin_threadpool* pool, BandJob* jobs, int32_t count) {
    const int32_t last = count - 1;
    for (int32_t k = 0; k < last; k += 2) submit(pool, jobs[k]);
    for (int32_t k = 1; k < last; k += 2) {
        finish(jobs[k - 1]);
        // The last band is not on its way yet; it waits for this one.
        if (k + 1 < last && jobs[k + 1].shares_row) finish(jobs[k + 1]);
        submit(pool, jobs[k]);
    }
    finish(jobs[last - 1]);
    if (!jobs[last].skip) submit(pool, jobs[last]);
    for (int32_t k = 0; k < count; ++k) {
        if (!jobs[k].skip) finish(jobs[k]);
    }
}

}  // namespace ovrin
