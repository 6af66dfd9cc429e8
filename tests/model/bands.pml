// SPDX-License-Identifier: Apache-2.0
// Bands on their way through the pool. Checked: no two bands that add into one destination row run
// at the same time, every band runs once and is finished when the call returns, nobody waits for
// ever.
//
// DRIVER says who may take which band:
//     QUEUED   run_bands in src/dispatch/band_schedule.cpp: even bands and those that share no row
//              first, an odd one when the neighbours that it shares a row with are finished; whoever
//              comes across a band claims it before running it, the caller those that it has
//              released
//     CLAIMED  the rule by itself, in any order: a thread claims any band none of whose neighbours
//              in a shared row is running, and looks again after each band; it may leave when it
//              finds none; the caller is one of these threads and waits for the rest. Holds for
//              every schedule that keeps to it
//     HELPED   run_bands_with_caller in src/dispatch/helping_run.cpp: bands that share no rows
//
// pool.pml shows that the pool is a queue that loses nothing; here it is just that, though it may
// refuse any task, or take it and report an error all the same.

#define QUEUED 1
#define CLAIMED 2
#define HELPED 3

#define MAX_WORKERS 4
#define MAX_BANDS 6

byte workers, bands;

bool shares[MAX_BANDS + 1];   /* this band and the one before it add into one row */
bool skips_last;              /* nothing is left for the last band */
bool released[MAX_BANDS];
bool claimed[MAX_BANDS];
bool running[MAX_BANDS + 1];
bool by_worker[MAX_BANDS];    /* it is a worker that runs it */
bool finished[MAX_BANDS];
byte runs[MAX_BANDS];

chan queue = [MAX_BANDS] of { byte };
bool stop, workers_gone;
byte idle;

/* Only in a step of its own. A band runs from the moment when a thread claims it, which leaves out
   nothing that a later start could show. */
inline begin(k) {
    runs[k]++;
    assert(runs[k] == 1);
    assert(!(k > 0 && shares[k] && running[k - 1]));
    assert(!(shares[k + 1] && running[k + 1]));
    running[k] = true
}
inline end(k) {
    running[k] = false;
    finished[k] = true
}

/* run_if_unclaimed in band_schedule.cpp */
#ifdef BREAK_CLAIM
inline claim(k) {
    mine = !claimed[k];       /* looks and claims in two steps */
    d_step {
        claimed[k] = true;
        if
        :: mine -> begin(k)
        :: else
        fi
    }
}
#else
inline claim(k) {
    d_step {
        mine = !claimed[k];
        claimed[k] = true;
        if
        :: mine -> begin(k)
        :: else
        fi
    }
}
#endif

/* On the calling thread. */
inline run_once(k) {
    claim(k);
    if
    :: mine -> d_step { end(k); mine = false }
    :: else
    fi
}
inline run_always(k) {
    d_step { begin(k) };
    d_step { end(k) }
}

/* A claimed band counts as running until it is finished. */
#define BUSY(k) (claimed[k] && !finished[k])
#ifdef BREAK_ORDER
#define NEIGHBOUR_RUNS(k) false
#else
#define NEIGHBOUR_RUNS(k) ((shares[k] && BUSY((k + MAX_BANDS - 1) % MAX_BANDS)) || \
                           (shares[k + 1] && BUSY((k + 1) % MAX_BANDS)))
#endif
#define CLAIMABLE(k) (k < bands && !(skips_last && k == bands - 1) && !claimed[k] && \
                      !NEIGHBOUR_RUNS(k))

/* Chooses a band into k, or MAX_BANDS. */
inline look() {
    if
    :: CLAIMABLE(0) -> k = 0
    :: CLAIMABLE(1) -> k = 1
    :: CLAIMABLE(2) -> k = 2
    :: CLAIMABLE(3) -> k = 3
    :: CLAIMABLE(4) -> k = 4
    :: CLAIMABLE(5) -> k = 5
    :: else -> k = MAX_BANDS
    fi
}

#define WORKER_ENDS(n) by_worker[n] -> by_worker[n] = false; end(n)

/* All workers: they do not differ, so this need not say which of them runs what. */
proctype pool() {
    byte k;
    bool mine;
    do
#if DRIVER == CLAIMED
    ::  atomic {
            idle > 0 -> look();
            if
            :: k < MAX_BANDS -> claimed[k] = true; begin(k); by_worker[k] = true
            :: else
            fi;
            idle--; k = 0
        }
#else
    ::  atomic {
            idle > 0 && nempty(queue) -> queue ? k;
#if DRIVER == QUEUED
            mine = !claimed[k]; claimed[k] = true;
#else
            mine = true;
#endif
            if
            :: mine -> begin(k); by_worker[k] = true; idle--
            :: else
            fi;
            k = 0; mine = false
        }
#endif
    ::  atomic {
            if
            :: WORKER_ENDS(0)
            :: WORKER_ENDS(1)
            :: WORKER_ENDS(2)
            :: WORKER_ENDS(3)
            :: WORKER_ENDS(4)
            :: WORKER_ENDS(5)
            fi;
#if !(DRIVER == CLAIMED && defined(BREAK_REFUSED))
            idle++            /* broken: it leaves without looking again */
#endif
        }
#if DRIVER == CLAIMED
    :: atomic { stop && idle == 0 && !(by_worker[0] || by_worker[1] || by_worker[2] ||
                                       by_worker[3] || by_worker[4] || by_worker[5]) -> break }
#else
    :: atomic { stop && empty(queue) && idle == workers -> break }
#endif
    od;
    workers_gone = true
}

#if DRIVER == QUEUED
inline release(b) {
    if
    :: skips_last && b == bands - 1
    :: else ->
        released[b] = true;
        if
        :: queue ! b
        :: true               /* refused: left to the caller */
        fi
    fi
}

#define LEFT(b) (released[b] && !claimed[b])

/* Chooses a band that no thread has taken into k, or MAX_BANDS. */
inline look_for_work() {
    atomic {
        if
        :: LEFT(0) -> k = 0
        :: LEFT(1) -> k = 1
        :: LEFT(2) -> k = 2
        :: LEFT(3) -> k = 3
        :: LEFT(4) -> k = 4
        :: LEFT(5) -> k = 5
        :: else -> k = MAX_BANDS
        fi
    }
}

inline help() {
#ifndef BREAK_REFUSED
    look_for_work();
    if
    :: k < MAX_BANDS -> run_once(k)
    :: else
    fi;
#endif
    k = 0
}

inline wait_for(b) {
    do
    :: !released[b] || finished[b] -> break
    :: released[b] && !finished[b] -> help() /* sleeps a little when there is nothing to do */
    od
}

#define MAY_RUN_AT_ONCE(b) ((b % 2 == 0 && b != bands - 1) || (!shares[b] && !shares[b + 1]))

inline drive() {
    for (band : 0 .. bands - 1) {
        if
        :: MAY_RUN_AT_ONCE(band) -> release(band)
        :: else
        fi
    };
    for (band : 1 .. bands - 1) {
        if
        :: MAY_RUN_AT_ONCE(band)
        :: else ->
#ifndef BREAK_ORDER
            if
            :: shares[band] -> wait_for(band - 1)
            :: else
            fi;
            if
            :: band + 1 < bands && shares[band + 1] -> wait_for(band + 1)
            :: else
            fi;
#endif
            release(band)
        fi
    };
#ifndef BREAK_REFUSED
    do
    :: look_for_work();
        if
        :: k < MAX_BANDS -> run_once(k)
        :: else -> break
        fi
    od;
#endif
    k = 0
}
#elif DRIVER == CLAIMED
inline drive() {
    do
    ::  atomic {
            look();
            if
            :: k == MAX_BANDS -> k = 0; break
            :: else
            fi;
#ifdef BREAK_CLAIM
        };
        atomic {              /* looks and claims in two steps */
#endif
            claimed[k] = true;
            begin(k)
        };
        d_step { end(k); k = 0 }
#ifdef BREAK_REFUSED
        ; break
#endif
    od;
    for (band : 0 .. bands - 1) {
        if
        :: skips_last && band == bands - 1
        :: else -> finished[band]     /* waited for */
        fi
    }
}
#else
inline submit(b) {
    if
    :: queue ! b
#ifdef BREAK_REFUSED
    :: true                   /* refused, and forgotten */
#else
    :: run_always(b)          /* refused */
#endif
    fi
}

inline drive() {
    for (band : 0 .. bands - 1) { submit(band) };
    do
    :: queue ? k -> run_always(k); k = 0
    :: atomic { empty(queue) -> break }
    od
}
#endif

init {
    byte k, band;
    bool mine;
    select(workers : 2 .. MAX_WORKERS);
    select(bands : 2 .. MAX_BANDS);
#if DRIVER != HELPED
    for (band : 1 .. bands - 1) {
        if
        :: shares[band] = true
        :: true
        fi
    };
    if
    :: skips_last = true
    :: true
    fi;
#endif
    atomic { idle = workers; run pool() };
    drive();
#ifndef BREAK_STOP
    stop = true;              /* ovrin_threadpool_free */
#endif
    workers_gone;
    for (band : 0 .. bands - 1) {
        assert(runs[band] == (skips_last && band == bands - 1 -> 0 : 1));
        assert(finished[band] || (skips_last && band == bands - 1))
    }
}
