// SPDX-License-Identifier: Apache-2.0
// Band records that any thread may run in any order, as the engines have them.
#pragma once

#include <stdlib.h>

#include "bands/pool.h"
#include "bands/turns.h"

namespace ovrin {

template <class Band>
class BandRecords {
public:
    explicit BandRecords(int32_t count)
        : count_(count),
          data_(static_cast<Band*>(calloc(static_cast<size_t>(count), sizeof(Band)))) {}
    ~BandRecords() { free(data_); }

    BandRecords(const BandRecords&) = delete;
    BandRecords& operator=(const BandRecords&) = delete;

    Band* data() const { return data_; }  // null when there was no memory
    int32_t count() const { return count_; }

private:
    int32_t count_;
    Band* data_;
};

// Calls task(&band) once for each record, on the pool's threads and the calling one.
template <class Band>
void run_records(BandPool& pool, void (*task)(void*), const BandRecords<Band>& bands) {
    struct Job {
        void (*task)(void*);
        Band* bands;
        Turns turns;

        static void work(void* argument) {
            auto& job = *static_cast<Job*>(argument);
            TurnTaker(job.turns).take_pass([&](Turn turn) {
                for (int32_t i = turn.first; i < turn.end; ++i) job.task(&job.bands[i]);
            });
        }
    };
    Job job = {task, bands.data(), {bands.count(), 0, false}};
    pool.run(Job::work, &job);
}

}  // namespace ovrin
