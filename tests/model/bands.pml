// SPDX-License-Identifier: Apache-2.0
// How the threads of one call share its bands: TurnTaker in src/bands/turns.h, and the two ways of
// src/bands/pool.cpp to run it. Checked: every band of every pass runs once, no thread waits for
// another, and everything is finished when the call returns.
//
// A worker may begin at any time or, where it could not be started or the pool refused its task,
// never. pool.pml shows that the pool loses no task and ends its workers.

#ifndef MAX_WORKERS
#define MAX_WORKERS 3
#define MAX_BANDS 3
#endif
#define MAX_PASSES 2
#define ALL (MAX_BANDS * MAX_PASSES)

byte workers, bands, passes;

byte next;                    /* Turns::next */
bool all_taken;
byte runs[ALL];               /* of band b of pass p: runs[p * bands + b] */
byte finished[ALL];
byte ended;                   /* workers that have ended, or never began */

inline begin_turn() {
    for (i : first .. after - 1) { runs[i]++; assert(runs[i] == 1) };
    i = 0
}

inline end_turn() {
    for (i : first .. after - 1) { finished[i]++ };
    i = 0; first = 0; after = 0
}

/* Of any length: what holds does not depend on it. */
inline choose_turn() {
    after = first + 1;
    do
    :: after < end -> after++
    :: break
    od
}

/* A step is one look at what others can change, or one change, with what follows from it for the
   thread's own numbers. `left` passes are to be gone through, the present one ends at `end`. */
inline work() {
    atomic {
        if
        :: all_taken          /* late */
        :: else -> left = passes; end = bands
        fi
    };
    do
    :: left == 0 -> break
    :: atomic {
            left > 0 && after == 0 ->
            first = next;
#ifdef BREAK_PASS
            if :: first > end -> next = end; first = end :: else fi;
#endif
            if
            :: first < end -> choose_turn()
            :: else -> first = 0; left--; end = end + bands
            fi;
#ifdef BREAK_LEAVE
            if :: end > bands -> left = 0 :: else fi;
#endif
            if :: left == 0 -> all_taken = true; end = 0 :: else fi
        };
        if
        :: after == 0         /* the pass is over */
        :: after > 0 ->
#ifdef BREAK_CLAIM
            atomic { if :: next == first :: else -> first = 0; after = 0 fi };
            atomic { if :: after > 0 -> next = after; begin_turn() :: else fi };
#else
            atomic {
                if
                :: next == first -> next = after; begin_turn()
                :: else -> first = 0; after = 0
                fi
            };
#endif
            if
            :: atomic { after > 0 -> end_turn() }
            :: after == 0     /* another thread was faster */
            fi
        fi
    od
}

#define WAY byte left, end, first, after, i

proctype worker() {
    WAY;
    if
    :: work()
    :: true                   /* not started, or its task refused */
    fi;
    ended++
}

init {
    WAY;
    select(workers : 1 .. MAX_WORKERS);
    select(bands : 1 .. MAX_BANDS);
    select(passes : 1 .. MAX_PASSES);
    atomic {
        for (i : 1 .. workers) { run worker() }
    };
    work();
#ifndef BREAK_STOP
    ended == workers;         /* ovrin_threadpool_free */
#endif
    for (i : 0 .. passes * bands - 1) { assert(finished[i] == 1) }
}
