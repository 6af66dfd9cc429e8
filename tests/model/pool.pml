// SPDX-License-Identifier: Apache-2.0
// The thread pool of src/pool/threadpool.cpp: two queues, each with its mutex and its condition, and
// a flag that ends it. Checked: nobody waits for ever, every task runs once, every slot comes back.
//
// Mutexes and conditions behave as POSIX says, except that there are no spurious wake-ups: those
// could hide one that is lost. What a thread does under a lock is one step, as nobody else can see
// its parts; only `stop` is set without the lock, so that a worker's look at it and the wait that
// follows are two steps under one lock.

#define MAX_WORKERS 4
#define MAX_TASKS 6
#define SLOTS 2               /* fewer than tasks, so that submitters find them all in use */
#define SUBMITTERS 2          /* one waits for a slot, the other runs itself what is refused */

byte workers, tasks;

byte free_slots = SLOTS;
chan pending = [SLOTS] of { byte };
bool pending_lock;
bool waits_for_task[MAX_WORKERS];
bool waits_for_slot;
bool stop;

byte runs[MAX_TASKS];
byte next_task, tasks_run;
byte running_workers, running_submitters;

inline wake_workers() {
    waits_for_task[0] = false; waits_for_task[1] = false;
    waits_for_task[2] = false; waits_for_task[3] = false
}

inline run_task(task) {
    runs[task]++; tasks_run++; assert(runs[task] == 1)
}

proctype worker(byte self) {
    byte task;
    do
    ::  atomic {              /* ovrin_threadpool_task_get_task */
            !waits_for_task[self] && !pending_lock;
            if
#ifdef BREAK_DRAIN
            :: stop -> break  /* leaves what is still queued */
#endif
            :: nempty(pending) -> pending ? task
            :: empty(pending) && stop -> break
            :: empty(pending) && !stop -> pending_lock = true; goto sleep
            fi
        };
        d_step { run_task(task); task = 0 };
        /* return_slot */
#ifdef BREAK_SLOT
        waits_for_slot = false;       /* before there is one */
        free_slots++;
#else
        d_step {
            free_slots++;
            if
            :: free_slots == 1 -> waits_for_slot = false
            :: else
            fi
        };
#endif
        goto again;
sleep:  atomic { waits_for_task[self] = true; pending_lock = false };
again:  skip
    od;
    running_workers--
}

/* ovrin_threadpool_add_task, with wait = 1 from submitter 0 and wait = 0 from the other */
proctype submitter(byte self) {
    byte task;
    do
    ::  atomic {
            if
            :: next_task == tasks -> break
            :: else -> task = next_task; next_task++
            fi
        };
        /* acquire_slot */
wait:   atomic {
            self != 0 || !waits_for_slot;
            if
            :: free_slots > 0 -> free_slots--; goto submit
            :: free_slots == 0 && self == 0 -> waits_for_slot = true; goto wait
            :: free_slots == 0 && self != 0 -> run_task(task); task = 0; goto again
            fi
        };
        /* submit_slot */
submit: atomic {
            !pending_lock -> pending ! task; task = 0;
            if
#ifdef BREAK_WAKE_UP
            :: len(pending) == 2 -> wake_workers()    /* not at the step from none to one */
#else
            :: len(pending) == 1 -> wake_workers()
#endif
            :: else
            fi
        };
again:  skip
    od;
    running_submitters--
}

/* ovrin_threadpool_init; when all is submitted, ovrin_threadpool_free with sync = 1 */
init {
    byte i;
    select(workers : 2 .. MAX_WORKERS);
    select(tasks : 2 .. MAX_TASKS);
    atomic {
        running_workers = workers;
        running_submitters = SUBMITTERS;
        for (i : 0 .. workers - 1) { run worker(i) };
        for (i : 0 .. SUBMITTERS - 1) { run submitter(i) };
        i = 0
    };
    running_submitters == 0;
    /* Ends the pool at once, or waits first for what it was to do: a lost wake-up shows only then,
       as ending wakes everybody. */
    if
    :: true -> tasks_run == tasks
    :: true
    fi;
    stop = true;
    atomic {
#ifndef BREAK_STOP
        !pending_lock;        /* otherwise between a worker's look at `stop` and its wait */
#endif
        wake_workers()
    };
    running_workers == 0;     /* pthread_join */
    for (i : 0 .. tasks - 1) { assert(runs[i] == 1) };
    assert(free_slots == SLOTS && empty(pending))
}
