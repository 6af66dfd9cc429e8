// SPDX-License-Identifier: Apache-2.0
// Callers lay the public records out in their own memory, so their layout is part of the interface.
#include <ovrinresize.h>
#include <stddef.h>

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__,
              "pixels are handled byte-wise where the interface says 32-bit words");
static_assert(sizeof(void*) == 8, "record layouts are given for 64-bit platforms");

static_assert(offsetof(ovrin_rgba_band, start_row) == 0, "");
static_assert(offsetof(ovrin_rgba_band, row_acc) == 12, "");
static_assert(offsetof(ovrin_rgba_band, di_11) == 16, "");
static_assert(offsetof(ovrin_rgba_band, di_33) == 28, "");
static_assert(offsetof(ovrin_rgba_band, src_w) == 32, "");
static_assert(offsetof(ovrin_rgba_band, dst_w) == 48, "");
static_assert(offsetof(ovrin_rgba_band, dst_x) == 56, "");
static_assert(offsetof(ovrin_rgba_band, src_offset) == 68, "");
static_assert(offsetof(ovrin_rgba_band, src) == 72, "");
static_assert(offsetof(ovrin_rgba_band, dst) == 80, "");
static_assert(offsetof(ovrin_rgba_band, rows_to_do) == 88, "");
static_assert(offsetof(ovrin_rgba_band, done) == 92, "");
static_assert(sizeof(ovrin_rgba_band) == 96, "");

static_assert(offsetof(ovrin_threadpool_queue, entries) == 16, "");
static_assert(sizeof(ovrin_threadpool_queue) == 16016, "");
static_assert(sizeof(ovrin_threadpool_task) == 16, "");
static_assert(offsetof(ovrin_threadpool, pending) == 0, "");
static_assert(offsetof(ovrin_threadpool, free_slots) == 16016, "");
static_assert(offsetof(ovrin_threadpool, tasks) == 32032, "");
static_assert(offsetof(ovrin_threadpool, thread_count) == 64032, "");
static_assert(offsetof(ovrin_threadpool, stop) == 64034, "");
static_assert(offsetof(ovrin_threadpool, threads) == 64040, "");
static_assert(offsetof(ovrin_threadpool, free_lock) == 64048, "");
