/* SPDX-License-Identifier: Apache-2.0 */
/*
 * libovrinresize: resizing of raw pictures in memory.
 *
 * Rules that hold for every function here unless its own comment says otherwise:
 *
 *  - The caller owns every buffer and every record. Buffers must stay valid until the call returns.
 *    Source and destination must not overlap.
 *  - Widths and heights are in pixels, offsets in bytes, unless a name or comment says otherwise.
 *    Rows are packed: one row starts where the one before it ends.
 *  - Nothing is reported. Bad arguments make a call return early, as each comment states.
 *    Pointers are not checked for null unless the comment says that they are.
 *  - Every function may be called from any number of threads at once, on different buffers. The
 *    library has no global state; nothing that a call makes outlives the call.
 *  - No byte outside the stated pictures is read or written. Buffers need no alignment beyond
 *    that of their type.
 */
#ifndef OVRINRESIZE_H
#define OVRINRESIZE_H

#include <pthread.h>
#include <stdint.h>

#if defined(__GNUC__)
#define OVRIN_API __attribute__((visibility("default")))
#else
#define OVRIN_API
#endif

#ifdef __cplusplus
extern "C" {
#endif

/*
 * ---- RGBA8888: four bytes per pixel, in any channel order ------------------------------------
 *
 * The quarter-point downscaler. A destination pixel is the sum of four source pixels, taken one
 * quarter and three quarters of the way across its source cell in each direction; each byte is
 * shifted right by 2 before it is added:
 *
 *     row1 = (j * src_h + (src_h >> 2)) / dst_h      row3 = (j * src_h + ((3 * src_h) >> 2)) /
 * dst_h
 *
 * and columns likewise. The shift drops the two low bits of every sample, so 252 is the largest
 * result: a white source (255) gives 252. Enlarging is allowed; it repeats samples.
 */

/*
 * Resizes src (src_w x src_h pixels) into dst (dst_w x dst_h words). Byte n of a source pixel lands
 * in bits 8n to 8n+7 of the destination word, so in memory both have the same channel order.
 *
 * Below 1024 source rows the work is done on the calling thread, otherwise in bands on four
 * worker threads that end before the call returns. Both give the same bytes.
 *
 * With a source size of 0 or less the destination is filled with 0; with a destination size of 0
 * or less nothing is written.
 */
OVRIN_API void ovrin_resize_rgba8888(const uint8_t* src, uint32_t* dst, int32_t src_w,
                                     int32_t src_h, int32_t dst_w, int32_t dst_h);

/* As ovrin_resize_rgba8888, on the calling thread whatever the height. */
OVRIN_API void ovrin_resize_rgba8888_sg(const uint8_t* src, uint32_t* dst, int32_t src_w,
                                        int32_t src_h, int32_t dst_w, int32_t dst_h);

/*
 * As ovrin_resize_rgba8888, in bands on worker threads whatever the height. Runs on the calling
 * thread instead when the picture makes fewer than two bands, when its byte offsets do not fit the
 * band record, or when memory or threads are missing.
 */
OVRIN_API void ovrin_resize_rgba8888_tps(const uint8_t* src, uint32_t* dst, int32_t src_w,
                                         int32_t src_h, int32_t dst_w, int32_t dst_h);

/*
 * One horizontal band of an RGBA8888 picture: the state of the downscaler, frozen between two
 * source rows. "Scaled coordinates" count source rows times dst_h; source row i covers
 * [i * dst_h, (i + 1) * dst_h).
 */
typedef struct ovrin_rgba_band {
    int32_t
        start_row;   /* first source row of the band; 0: the running state below is at its start */
    int32_t row_q1;  /* next pending one-quarter row point, scaled coordinates */
    int32_t row_q3;  /* next pending three-quarter row point */
    int32_t row_acc; /* start_row * dst_h */
    int32_t di_11;   /* next destination word for (one-quarter row, one-quarter column) */
    int32_t di_13;   /* ... for (one-quarter row, three-quarter column) */
    int32_t di_31;   /* ... for (three-quarter row, one-quarter column) */
    int32_t di_33;   /* ... for (three-quarter row, three-quarter column) */
    int32_t src_w;   /* source size, pixels */
    int32_t src_h;
    int32_t src_stride; /* source row length, pixels */
    int32_t src_rows;   /* rows in the source buffer */
    int32_t dst_w;      /* destination size, pixels */
    int32_t dst_h;
    int32_t dst_x;      /* picture's left edge inside a canvas row, pixels; 0 without a canvas */
    int32_t dst_skip;   /* canvas pixels to the right of the picture; 0 without a canvas */
    int32_t band_rows;  /* source rows in a band */
    int32_t src_offset; /* byte offset of the band's first source row from src */
    const uint8_t* src; /* the whole source picture */
    uint32_t* dst;      /* the whole destination picture */
    int32_t rows_to_do; /* source rows that this band processes */
    int32_t done;       /* 0 until the band's task has finished, then 1 (stored with release) */
} ovrin_rgba_band;

/*
 * Moves a band record to the following band without touching pixels: advances the running state by
 * band->band_rows source rows, sets rows_to_do to the rows walked (0 when that passes src_h), and
 * adds their bytes to src_offset. Writes no other field.
 */
OVRIN_API void ovrin_resize_rgba8888_get_pos(int32_t src_w, int32_t src_h, int32_t dst_w,
                                             int32_t dst_h, ovrin_rgba_band* band);

/*
 * Band task; band points to an ovrin_rgba_band. Adds the samples of rows_to_do source rows to what
 * the destination holds (the caller clears it beforehand), then sets done. Bands that add into one
 * destination row must not run at the same time.
 */
OVRIN_API void _resize_rgba8888_tp(void* band);

/*
 * ---- Thread pool -----------------------------------------------------------------------------
 *
 * A fixed number of workers runs tasks in the order of their submission. All memory is obtained
 * when the pool is made: adding a task allocates nothing.
 */

#define OVRIN_THREADPOOL_CAPACITY 2000

typedef struct ovrin_threadpool_queue {
    uint32_t head;                            /* index of the oldest entry */
    uint32_t tail;                            /* index where the next entry goes */
    uint32_t count;                           /* number of entries held */
    void* entries[OVRIN_THREADPOOL_CAPACITY]; /* the ring; null where empty */
} ovrin_threadpool_queue;

typedef struct ovrin_threadpool_task {
    void (*function)(void*);
    void* argument;
} ovrin_threadpool_task;

typedef struct ovrin_threadpool {
    ovrin_threadpool_queue pending;                         /* tasks waiting to be run */
    ovrin_threadpool_queue free_slots;                      /* slots available for new tasks */
    ovrin_threadpool_task tasks[OVRIN_THREADPOOL_CAPACITY]; /* the slots; queues point into them */
    uint16_t thread_count;                                  /* workers started */
    uint16_t stop;                                          /* 1 once teardown has begun */
    pthread_t* threads;                                     /* one handle per worker */
    pthread_mutex_t free_lock;                              /* guards free_slots */
    pthread_mutex_t pending_lock;                           /* guards pending */
    pthread_cond_t
        slot_freed; /* submitters wait here; broadcast when free_slots gets its first entry */
    pthread_cond_t task_ready; /* workers wait here; broadcast when pending gets its first entry */
} ovrin_threadpool;

/*
 * Makes a pool of n worker threads. With n below 1 the pool has no workers: tasks are kept, not
 * run. Null when memory or a thread is missing, or when n is above 65535.
 */
OVRIN_API ovrin_threadpool* ovrin_threadpool_init(int32_t n);

/*
 * Queues function(argument). With wait non-zero it blocks while no slot is free.
 * Returns 1 when queued, -2 when no slot is free and wait is 0, -1 on error (a null pool included).
 */
OVRIN_API int32_t ovrin_threadpool_add_task(ovrin_threadpool* pool, void (*function)(void*),
                                            void* argument, int32_t wait);

/*
 * Ends the pool; tasks that are queued still run. With sync non-zero the call returns when all
 * have run and the pool is released; with 0 a thread of its own does that in the background. The
 * pool must not be null and must not be used afterwards.
 */
OVRIN_API void ovrin_threadpool_free(ovrin_threadpool* pool, int32_t sync);

/* Blocks until a task is queued and returns its slot; null once the pool stops and is empty. */
OVRIN_API ovrin_threadpool_task* ovrin_threadpool_task_get_task(ovrin_threadpool* pool);

/* Clears a slot. */
OVRIN_API void ovrin_threadpool_task_init(ovrin_threadpool_task* task);

/* Appends entry. Returns 0, or -1 when the queue is full or its next position is occupied. */
OVRIN_API int32_t ovrin_threadpool_queue_enqueue(ovrin_threadpool_queue* queue, void* entry);

/* Takes the oldest entry; null when the queue is null or empty. */
OVRIN_API void* ovrin_threadpool_queue_dequeue(ovrin_threadpool_queue* queue);

/* 1 when the queue holds nothing, otherwise 0. */
OVRIN_API int32_t ovrin_threadpool_queue_is_empty(const ovrin_threadpool_queue* queue);

/* The number of entries held. */
OVRIN_API uint32_t ovrin_threadpool_queue_getsize(const ovrin_threadpool_queue* queue);

/* ---- Utility --------------------------------------------------------------------------------- */

/* Suspends the calling thread for useconds microseconds; returns the result of usleep. */
OVRIN_API int32_t ov_sleep(uint32_t useconds);

#ifdef __cplusplus
}
#endif

#endif
