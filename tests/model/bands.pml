// SPDX-License-Identifier: Apache-2.0
// Bands on their way through the pool. Checked: no two bands that add into one destination row run
// at the same time, every band runs once and is finished when the call returns, nobody waits for
// ever.
//
// DRIVER says who may take which band:
//     QUEUED   run_bands in src/dispatch/band_schedule.cpp: even bands first, an odd one when its
//              neighbours are finished; whoever comes across a band claims it before running it
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

/* run_once in band_schedule.cpp */
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

inline submit(k) {
    if
    :: queue ! k
#if DRIVER == QUEUED
    :: queue ! k; run_once(k) /* taken, and an error reported all the same */
#endif
#ifdef BREAK_REFUSED
    :: true                   /* refused, and forgotten */
#elif DRIVER == QUEUED
    :: run_once(k)            /* refused */
#else
    :: run_always(k)          /* refused */
#endif
    fi
}

#if DRIVER == QUEUED
inline finish(k) {
#ifndef BREAK_REFUSED
    run_once(k);
#endif
    finished[k]               /* polled */
}

inline drive() {
    byte last = bands - 1;
    for (band : 0 .. last - 1) {
        if
        :: band % 2 == 0 -> submit(band)
        :: else
        fi
    };
    band = 1;
    do
    :: band < last ->
#ifndef BREAK_ORDER
        finish(band - 1);
        if
        :: band + 1 < last && shares[band + 1] -> finish(band + 1)
        :: else
        fi;
#endif
        submit(band);
        band = band + 2
    :: else -> break
    od;
#ifndef BREAK_ORDER
    finish(last - 1);
#endif
    if
    :: skips_last
    :: else -> submit(last)
    fi;
    for (band : 0 .. last) {
        if
        :: skips_last && band == last
        :: else -> finish(band)
        fi
    }
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
