// SPDX-License-Identifier: Apache-2.0
#include "quarter/threaded.h"

namespace ovrin {

namespace {

struct Job {
    BandedPlanes picture;
    Turns turns;

    explicit Job(const BandedPlanes& p) : picture(p), turns{p.bands, 0, false} {}

    static void take_turns(void* argument) {
        auto& job = *static_cast<Job*>(argument);
        TurnTaker taker(job.turns);
        if (taker.is_late()) return;
        for (int32_t i = 0; i < job.picture.count; ++i) {
            sample_plane_in_turns(job.picture.planes[i], taker);
        }
    }
};

}  // namespace

bool sample_in_bands(const BandedPlanes& picture) {
    Job job(picture);
    return run_while_workers_start(Job::take_turns, &job);
}

void sample_in_bands(const BandedPlanes& picture, BandPool& pool) {
    Job job(picture);
    pool.run(Job::take_turns, &job);
}

}  // namespace ovrin
