// SPDX-License-Identifier: Apache-2.0
// How the threads of one call share its bands without waiting for each other.
#pragma once

#include <stdint.h>

namespace ovrin {

// The bands that no thread has taken yet. A call may run through its bands several times, once for
// each plane, say: these passes follow one another in one count, which every thread reads alike.
struct Turns {
    int32_t bands;  // in each pass; at least 1
    int64_t next;   // of all passes together
    bool all_taken;
};

// Consecutive bands of a pass, for one thread to do.
struct Turn {
    int32_t first;
    int32_t end;
};

// One thread's way through the passes, to the end of the last one.
class TurnTaker {
public:
    explicit TurnTaker(Turns& turns) : turns_(turns) {}
    ~TurnTaker() { __atomic_store_n(&turns_.all_taken, true, __ATOMIC_RELAXED); }

    TurnTaker(const TurnTaker&) = delete;
    TurnTaker& operator=(const TurnTaker&) = delete;

    // A thread that comes late need not look at pass after pass.
    bool is_late() const { return __atomic_load_n(&turns_.all_taken, __ATOMIC_RELAXED); }

    int32_t bands() const { return turns_.bands; }

    // Calls work(turn) as long as this pass has bands left, then goes on to the next pass. The
    // turns shrink: long ones first, which cost least, then shorter ones, so that no thread is left
    // with much to do when the others have finished.
    template <class Work>
    void take_pass(const Work& work) {
        const int64_t begin = pass_ * turns_.bands;
        const int64_t end = begin + turns_.bands;
        int64_t first = __atomic_load_n(&turns_.next, __ATOMIC_RELAXED);
        while (first < end) {
            const int64_t after = first + turn_length(end - first);
            // Says who does what, and hands no data over: the pool's locks and joins do that. When
            // another thread was faster, `first` is where it left off.
            if (__atomic_compare_exchange_n(&turns_.next, &first, after, false, __ATOMIC_RELAXED,
                                            __ATOMIC_RELAXED)) {
                work(
                    Turn{static_cast<int32_t>(first - begin), static_cast<int32_t>(after - begin)});
                first = __atomic_load_n(&turns_.next, __ATOMIC_RELAXED);
            }
        }
        ++pass_;
    }

private:
    // A share for each thread of a pool and its caller, and some to spare.
    static int64_t turn_length(int64_t left) {
        constexpr int64_t kShares = 8;
        return (left + kShares - 1) / kShares;
    }

    Turns& turns_;
    int64_t pass_ = 0;
};

}  // namespace ovrin
