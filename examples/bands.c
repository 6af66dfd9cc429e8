/* SPDX-License-Identifier: Apache-2.0 */
/*
 * Bands on threads of one's own: an RGBA8888 and an NV21 picture, resized as the library's own
 * functions do it. In place of the threads stands any scheduler that can run all of some tasks and
 * then all of some others.
 */
#include <ovrinresize.h>
#include <pthread.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

/* Neither a whole ratio nor whole bands, and a destination that NV21 needs a work buffer for. */
enum { W = 1000, H = 1075, SMALL_W = 310, SMALL_H = 333, BAND_ROWS = 32, THREADS = 4 };
enum { BANDS = (H + BAND_ROWS - 1) / BAND_ROWS };

#define NV21_BYTES(w, h) ((w) * (h) + ((w) + 1) / 2 * (((h) + 1) / 2) * 2)

/* ---- The scheduler ---- */

typedef struct Tasks {
    void (*run)(void* band);
    char* bands;
    size_t size;  /* of a record, bytes */
    size_t first; /* this thread's first band */
    size_t step;  /* from one of its bands to the next */
} Tasks;

static void* run_tasks(void* argument) {
    const Tasks* tasks = argument;
    for (size_t i = tasks->first; i < BANDS; i += tasks->step) {
        tasks->run(tasks->bands + i * tasks->size);
    }
    return NULL;
}

/* Every second band from `first` on. They lie apart, and may run side by side. */
static void run_every_second(void (*run)(void*), void* bands, size_t size, size_t first) {
    Tasks tasks[THREADS];
    pthread_t threads[THREADS];
    for (size_t i = 0; i < THREADS; ++i) {
        tasks[i] = (Tasks){run, bands, size, first + 2 * i, (size_t)2 * THREADS};
        if (pthread_create(&threads[i], NULL, run_tasks, &tasks[i]) != 0) abort();
    }
    for (size_t i = 0; i < THREADS; ++i) pthread_join(threads[i], NULL);
}

static void run_bands(void (*run)(void*), void* bands, size_t size) {
    run_every_second(run, bands, size, 0);
    run_every_second(run, bands, size, 1);
}

/* Zeros: a walk starts at the first row. */
static void* new_records(size_t size) {
    void* records = calloc(BANDS, size);
    if (records == NULL) abort();
    return records;
}

/* ---- RGBA8888 ---- */

static void resize_rgba(const uint8_t* src, uint32_t* dst) {
    ovrin_rgba_band* bands = new_records(sizeof *bands);
    bands[0].src_w = W;
    bands[0].src_h = H;
    bands[0].dst_w = SMALL_W;
    bands[0].dst_h = SMALL_H;
    bands[0].band_rows = BAND_ROWS;
    bands[0].src = src;
    bands[0].dst = dst;
    for (int i = 1; i < BANDS; ++i) {
        bands[i] = bands[i - 1];
        ovrin_resize_rgba8888_get_pos(W, H, SMALL_W, SMALL_H, &bands[i]);
        bands[i - 1].rows_to_do = bands[i].rows_to_do;
    }
    bands[BANDS - 1].rows_to_do = H - bands[BANDS - 1].start_row;

    memset(dst, 0, sizeof(uint32_t) * SMALL_W * SMALL_H);
    run_bands(_resize_rgba8888_tp, bands, sizeof *bands);
    free(bands);
}

/* ---- NV21 ---- */

enum { GRID_W = (SMALL_W + 3) / 4 * 4, GRID_H = (SMALL_H + 3) / 4 * 4 };
enum { GRID_LUMA = GRID_W * GRID_H, SMALL_LUMA = SMALL_W * SMALL_H };
enum { SMALL_VU_BYTES = (SMALL_W + 1) / 2 * 2, SMALL_VU_ROWS = (SMALL_H + 1) / 2 };

static uint8_t work[GRID_LUMA * 3 / 2]; /* cleared, as tasks add to it */

static void copy_rows(uint8_t* dst, size_t dst_bytes, const uint8_t* src, int rows) {
    for (; rows > 0; --rows, dst += dst_bytes, src += GRID_W) memcpy(dst, src, dst_bytes);
}

static void resize_nv21(const uint8_t* src, uint8_t* dst) {
    ovrin_nv21_band* bands = new_records(sizeof *bands);
    bands[0].src_width = W;
    bands[0].src_height = H;
    bands[0].src_row_bytes = W;
    bands[0].dst_width = SMALL_W;
    bands[0].dst_height = SMALL_H;
    bands[0].band_rows = BAND_ROWS;
    bands[0].src = src;
    bands[0].dst = dst;
    bands[0].work = work;
    for (int i = 1; i < BANDS; ++i) {
        bands[i] = bands[i - 1];
        ovrin_resize_nv21_get_pos(W, H, SMALL_W, SMALL_H, &bands[i]);
        bands[i - 1].y_rows = bands[i].y_rows;
        bands[i - 1].vu_rows = bands[i].vu_rows;
    }
    ovrin_nv21_band* last = &bands[BANDS - 1];
    const int32_t vu_left = (H + 1) / 2 - last->vu_start_row;
    last->y_rows = H - last->y_start_row;
    last->vu_rows = vu_left > 0 ? vu_left : 0;

    run_bands(_resize_nv21_tp, bands, sizeof *bands);
    free(bands);
    copy_rows(dst, SMALL_W, work, SMALL_H);
    copy_rows(dst + SMALL_LUMA, SMALL_VU_BYTES, work + GRID_LUMA, SMALL_VU_ROWS);
}

/* ---- Both beside the library's own functions ---- */

static uint8_t rgba[W * H * 4], nv21[NV21_BYTES(W, H)];
static uint32_t small_rgba[SMALL_W * SMALL_H], expected_rgba[SMALL_W * SMALL_H];
static uint8_t small_nv21[NV21_BYTES(SMALL_W, SMALL_H)], expected_nv21[sizeof small_nv21];

/* Anything but flat. */
static void fill(uint8_t* bytes, size_t count) {
    uint32_t state = 1;
    for (size_t i = 0; i < count; ++i) {
        state = state * 1664525 + 1013904223;
        bytes[i] = (uint8_t)(state >> 24);
    }
}

int main(void) {
    fill(rgba, sizeof rgba);
    fill(nv21, sizeof nv21);

    resize_rgba(rgba, small_rgba);
    ovrin_resize_rgba8888_sg(rgba, expected_rgba, W, H, SMALL_W, SMALL_H);
    const int same_rgba = memcmp(small_rgba, expected_rgba, sizeof expected_rgba) == 0;

    resize_nv21(nv21, small_nv21);
    ovrin_resize_nv21_sg(nv21, expected_nv21, W, H, SMALL_W, SMALL_H);
    const int same_nv21 = memcmp(small_nv21, expected_nv21, sizeof expected_nv21) == 0;

    printf("%d bands\nRGBA8888: %s\nNV21: %s\n", (int)BANDS, same_rgba ? "the same" : "different",
           same_nv21 ? "the same" : "different");
    return same_rgba && same_nv21 ? 0 : 1;
}
