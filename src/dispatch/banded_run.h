// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <stdlib.h>

#include "dispatch/band_schedule.h"
#include "dispatch/band_size.h"

namespace ovrin {

// The band driver of the quarter-point formats: the pool and the band records of one call.
//
// Format is a struct that says what a format's bands are:
//     using Band                                      the band record, with an int32_t `done`
//     static void task(void* band)                    the band task
//     static void advance(Band& next, Band& previous) next, a copy of previous, becomes the band
//                                                     after it; previous learns where it ends
//     static bool take_rest(Band& last, const Band& previous)
//                                                     gives the last band all rows that are left;
//                                                     false when there are none
//     static bool shares_row(const Band& band)        a destination row is open where it starts
//     static void clear_shared_row(const Band& band)  clears that row
//
// Tasks store the destination rows of which they have all samples; only rows that two bands share
// are added to, and cleared before.
template <class Format>
class BandedRun {
public:
    using Band = typename Format::Band;

    // Obtains the pool and chains the records, starting from `first`, for at least 2 bands. Nothing
    // is run or written yet.
    BandedRun(const Band& first, const BandSplit& split) : count_(split.count) {
        pool_ = ovrin_threadpool_init(kBandThreads);
        if (pool_ == nullptr) return;
        const size_t n = static_cast<size_t>(count_);
        bands_ = static_cast<Band*>(calloc(n, sizeof(Band)));
        jobs_ = static_cast<BandJob*>(calloc(n, sizeof(BandJob)));
        if (bands_ != nullptr && jobs_ != nullptr) chain(first, split.rows);
    }

    ~BandedRun() {
        if (pool_ != nullptr) ovrin_threadpool_free(pool_, 1);
        free(bands_);
        free(jobs_);
    }

    BandedRun(const BandedRun&) = delete;
    BandedRun& operator=(const BandedRun&) = delete;

    // False when memory or threads are missing: the caller takes its single-threaded way instead.
    bool ready() const { return pool_ != nullptr && bands_ != nullptr && jobs_ != nullptr; }

    // Runs all bands; returns when they are done.
    void run() {
        for (int32_t i = 1; i < count_; ++i) {
            if (jobs_[i].shares_row) Format::clear_shared_row(bands_[i]);
        }
        run_bands(pool_, jobs_, count_);
        pool_ = nullptr;
    }

private:
    void chain(const Band& first, int32_t rows) {
        bands_[0] = first;
        bands_[0].band_rows = rows;
        for (int32_t i = 1; i < count_; ++i) {
            bands_[i] = bands_[i - 1];
            Format::advance(bands_[i], bands_[i - 1]);
        }
        const int32_t last = count_ - 1;
        const bool rest = Format::take_rest(bands_[last], bands_[last - 1]);
        for (int32_t i = 0; i < count_; ++i) {
            jobs_[i] = {Format::task,
                        &bands_[i],
                        &bands_[i].done,
                        i > 0 && Format::shares_row(bands_[i]),
                        i == last && !rest,
                        false,
                        0};
        }
    }

    int32_t count_;
    ovrin_threadpool* pool_ = nullptr;
    Band* bands_ = nullptr;
    BandJob* jobs_ = nullptr;
};

}  // namespace ovrin
