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

static_assert(offsetof(ovrin_resize_target, reserved_head) == 0, "");
static_assert(offsetof(ovrin_resize_target, src_vu_plane) == 8, "");
static_assert(offsetof(ovrin_resize_target, src_v_plane) == 24, "");
static_assert(offsetof(ovrin_resize_target, src_width) == 32, "");
static_assert(offsetof(ovrin_resize_target, src_stride) == 40, "");
static_assert(offsetof(ovrin_resize_target, src_buffer_height) == 44, "");
static_assert(offsetof(ovrin_resize_target, format) == 48, "");
static_assert(offsetof(ovrin_resize_target, dst) == 56, "");
static_assert(offsetof(ovrin_resize_target, dst_width) == 64, "");
static_assert(offsetof(ovrin_resize_target, canvas_width) == 72, "");
static_assert(offsetof(ovrin_resize_target, dst_x) == 80, "");
static_assert(offsetof(ovrin_resize_target, dst_y) == 84, "");
static_assert(sizeof(ovrin_resize_target) == 88, "");

static_assert(offsetof(ovrin_yuv_band, y_bottom_right) == 28, "");
static_assert(offsetof(ovrin_yuv_band, uv_start_row) == 32, "");
static_assert(offsetof(ovrin_yuv_band, uv_bottom_right) == 60, "");
static_assert(offsetof(ovrin_yuv_band, src_width) == 64, "");
static_assert(offsetof(ovrin_yuv_band, band_rows) == 88, "");
static_assert(offsetof(ovrin_yuv_band, src_uv_offset) == 96, "");
static_assert(offsetof(ovrin_yuv_band, src) == 104, "");
static_assert(offsetof(ovrin_yuv_band, src_v) == 128, "");
static_assert(offsetof(ovrin_yuv_band, work) == 136, "");
static_assert(offsetof(ovrin_yuv_band, y_rows) == 144, "");
static_assert(offsetof(ovrin_yuv_band, done) == 152, "");
static_assert(sizeof(ovrin_yuv_band) == 160, "");

static_assert(offsetof(ovrin_nv21_band, y_bottom_right) == 28, "");
static_assert(offsetof(ovrin_nv21_band, vu_start_row) == 32, "");
static_assert(offsetof(ovrin_nv21_band, vu_bottom_right) == 60, "");
static_assert(offsetof(ovrin_nv21_band, src_width) == 64, "");
static_assert(offsetof(ovrin_nv21_band, band_rows) == 88, "");
static_assert(offsetof(ovrin_nv21_band, src_vu_offset) == 96, "");
static_assert(offsetof(ovrin_nv21_band, src) == 104, "");
static_assert(offsetof(ovrin_nv21_band, src_vu) == 120, "");
static_assert(offsetof(ovrin_nv21_band, work) == 128, "");
static_assert(offsetof(ovrin_nv21_band, y_rows) == 136, "");
static_assert(offsetof(ovrin_nv21_band, done) == 144, "");
static_assert(sizeof(ovrin_nv21_band) == 152, "");

static_assert(offsetof(ovrin_bilinear_band, target) == 0, "");
static_assert(offsetof(ovrin_bilinear_band, src_width) == 8, "");
static_assert(offsetof(ovrin_bilinear_band, src) == 24, "");
static_assert(offsetof(ovrin_bilinear_band, format) == 40, "");
static_assert(offsetof(ovrin_bilinear_band, col_weight) == 56, "");
static_assert(offsetof(ovrin_bilinear_band, first_row) == 88, "");
static_assert(offsetof(ovrin_bilinear_band, canvas_width) == 100, "");
static_assert(offsetof(ovrin_bilinear_band, edge_rows) == 116, "");
static_assert(sizeof(ovrin_bilinear_band) == 120, "");

static_assert(offsetof(lanczos_image, data) == 16, "");
static_assert(sizeof(lanczos_image) == 24, "");

static_assert(offsetof(ovrin_lanczos_band, src) == 16, "");
static_assert(offsetof(ovrin_lanczos_band, bytes_per_pixel) == 32, "");
static_assert(offsetof(ovrin_lanczos_band, rows) == 40, "");
static_assert(offsetof(ovrin_lanczos_band, table) == 48, "");
static_assert(offsetof(ovrin_lanczos_band, row_weights) == 64, "");
static_assert(sizeof(ovrin_lanczos_band) == 72, "");
