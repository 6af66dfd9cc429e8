/* SPDX-License-Identifier: Apache-2.0 */
/*
 * libovrinresize: resizing of raw pictures in memory.
 *
 * These rules hold for every function, unless its own comment says otherwise:
 *
 *  - The caller owns every buffer and every record, and keeps them valid until the call returns.
 *    Source and destination do not overlap.
 *  - Widths and heights are in pixels, offsets in bytes. Rows are packed: each starts where the one
 *    before it ends.
 *  - Nothing is reported. With bad arguments a call returns early; its comment says when, and what
 *    it has written by then. Null pointers are looked for only where the comment says so.
 *  - Any number of threads may call any functions at once, on different buffers. The library has no
 *    global state, and nothing that a call makes outlives it.
 *  - Nobody cancels a thread (pthread_cancel) inside a call that uses worker threads or a pool:
 *    they would go on with what is gone, and locks would stay taken. Let the thread disable
 *    cancellation around the call (pthread_setcancelstate); it ends afterwards then. Calls that
 *    stay on the calling thread, but for ov_sleep, are no cancellation points; asynchronous
 *    cancellation is for none.
 *  - Signals end no call early but ov_sleep. Worker threads have the signal mask of the thread that
 *    started them, so handlers may run on them. Handlers must not call the library.
 *  - A child of fork() may call any function, even if other threads were inside calls, where its C
 *    library lets it have memory and threads, as glibc does. A pool from before the fork has no
 *    workers there and must not be touched.
 *  - The library does not know how long a buffer is. It reads and writes as much as sizes and row
 *    lengths say. A size of 0 or less means that there is no picture and no buffer.
 *  - Band records come from a walk that starts at the first band, as "Bands" below says; other
 *    values are not checked. The source height, and band_rows, each times the destination height,
 *    fit 32 bits.
 *  - Floating-point numbers are rounded to the nearest, and their exceptions are not trapped, as
 *    threads start out. In another rounding mode the bilinear and the Lanczos engine give other
 *    bytes. Flushing to zero and the precision of the x87 make no difference.
 *  - No byte outside the pictures is read or written. Buffers need no alignment beyond that of
 *    their type.
 */
#ifndef OVRINRESIZE_H
#define OVRINRESIZE_H

#include <pthread.h>
#include <stdint.h>

/* The version of the library that this header belongs to. */
#define OVRINRESIZE_VERSION_MAJOR 1
#define OVRINRESIZE_VERSION_MINOR 0
#define OVRINRESIZE_VERSION_PATCH 0
#define OVRINRESIZE_VERSION "1.0.0"

#if defined(__GNUC__)
#define OVRIN_API __attribute__((visibility("default")))
#else
#define OVRIN_API
#endif

#ifdef __cplusplus
extern "C" {
#endif

/*
 * ---- Placing a picture in a larger canvas ------------------------------------------------------
 */

/*
 * Where the keep-ratio functions and the bilinear engine find their source rows and put the scaled
 * picture. The caller fills it. Only ovrin_resize_rgba8888_keep_ratio and the two functions that it
 * calls ever write it. Each function reads (r), writes (w) or ignores (-) a field:
 *
 *     field                       RGBA8888   planes   bilinear   _ov_bilinear_tp
 *     reserved_head               -          -        -          -
 *     src_vu_plane                -          -        r (1)      r (1)
 *     src_u_plane, src_v_plane    -          -        r (2)      r (2)
 *     src_width, src_height       r w (3)    - (4)    r          -
 *     src_stride                  r          r        r          r
 *     src_buffer_height           -          -        -          -
 *     format                      -          -        r          r
 *     dst                         r          r        - (5)      - (5)
 *     dst_width, dst_height       r w (3)    r        - (5)      - (5)
 *     canvas_width                r          r        r          r
 *     canvas_height               r          r        r          r
 *     dst_x, dst_y                r          r        r          r
 *
 *     RGBA8888   ovrin_resize_rgba8888_keep_ratio, ovrin_resize_rgba_keep_ratio_sg and _tps
 *     planes     ovrin_resize_y_u_v_keep_ratio, ovrin_resize_y_nv21_keep_ratio, and with a target
 *                ovrin_resize_y_u_v_sg, ovrin_resize_y_nv_sg and their _tps
 *     bilinear   ov_bilinear, ov_bilinear_sg, ov_bilinear_ex
 *     (1)        for the semi-planar format codes
 *     (2)        for the planar format code
 *     (3)        src_width and dst_width are written when the picture is cut at the right, the
 *                heights when it is cut at the bottom; the source's size is read only then
 *     (4)        the arguments src_w and src_h are the source's size
 *     (5)        an argument or a field of the band record takes its place
 *
 * dst_x and dst_y must not be negative.
 */
typedef struct ovrin_resize_target {
    void* reserved_head;         /* the caller's */
    const uint8_t* src_vu_plane; /* source chroma pairs: bilinear engine, semi-planar formats */
    const uint8_t* src_u_plane;  /* source U plane: bilinear engine, planar format */
    const uint8_t* src_v_plane;  /* source V plane: bilinear engine, planar format */
    int32_t src_width; /* source size, pixels; rewritten when an RGBA picture is clipped */
    int32_t src_height;
    int32_t src_stride;        /* source row length: pixels (RGBA8888), bytes (planes) */
    int32_t src_buffer_height; /* rows in the source buffer; not used */
    int32_t format;            /* bilinear engine: an OVRIN_FORMAT_ code */
    void* dst;                 /* the canvas: 32-bit pixels or planes */
    int32_t dst_width;         /* size of the scaled picture, pixels; rewritten when an RGBA */
    int32_t dst_height;        /* picture is clipped */
    int32_t canvas_width;      /* size of the canvas, pixels */
    int32_t canvas_height;
    int32_t dst_x; /* canvas position of the picture's top left pixel */
    int32_t dst_y;
} ovrin_resize_target;

/*
 * ---- Bands: parts of a picture for a scheduler of the caller's own -----------------------------
 *
 * A band is a number of source rows. A record (ovrin_rgba_band, ovrin_yuv_band, ovrin_nv21_band)
 * says where sampling stands before the first of them, a walker (..._get_pos) moves a record from
 * one band to the next, and a task (..._tp) adds the samples of one band to the destination:
 *
 *  1. Clear the destination, or the work buffer where one is used: tasks add to what it holds.
 *  2. Make the first record: sizes, row lengths, pointers and band_rows (at least 1) are set, and
 *     all else is 0, above all the running state in front of src_w (src_width), the offsets and
 *     done. A start row of 0 is what starts a walk.
 *  3. For each band but the first copy the record before it and let the walker move the copy. What
 *     the walker counts in rows_to_do (y_rows with uv_rows or vu_rows) are the rows of the band it
 *     has left: copy them back into the record before.
 *  4. No walk counts the last band's rows, and one that passes the end of the source gives 0 rows
 *     of pixels or luma. Set what is left: rows_to_do = src_h - start_row; for 4:2:0 y_rows =
 *     src_height - y_start_row, and (src_height + 1) / 2 - uv_start_row (vu_start_row) rows of
 *     chroma, or 0 when that is negative.
 *  5. When all records are made, run each one's task once. Its last act is to set done; read that
 *     with acquire, or wait for the threads.
 *
 * Bands that add into one destination row must not run at the same time. With band_rows of at
 * least src_h / dst_h, rounded up, these are neighbours at most: all bands with an even number may
 * run side by side, and when they are done, all with an odd one. Where band_rows * dst_h is a
 * multiple of src_h no row is shared, and all bands may run at once. Bands never share chroma rows.
 * The order of the bands does not matter.
 */

/*
 * ---- RGBA8888: four bytes per pixel, in any channel order ------------------------------------
 *
 * The quarter-point downscaler. A destination pixel is the sum of four source pixels, taken one
 * quarter and three quarters of the way across its source cell in each direction; each byte is
 * shifted right by 2 before it is added:
 *
 *     row1 = (j * src_h + (src_h >> 2)) / dst_h
 *     row3 = (j * src_h + ((3 * src_h) >> 2)) / dst_h
 *
 * and columns likewise. The shift drops the two low bits of every sample, so 252 is the largest
 * result: a white source (255) gives 252. Enlarging is allowed; it repeats samples.
 */

/*
 * Resizes src (src_w x src_h pixels) into dst (dst_w x dst_h words). Byte n of a source pixel lands
 * in bits 8n to 8n+7 of the destination word, so in memory both have the same channel order.
 *
 * From 1024 source rows on, the picture is resized in bands, on four worker threads that end before
 * the call returns and on the calling thread; below that, on the calling thread alone. Nothing but
 * the source height decides. Both give the same bytes.
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
 * thread alone when the picture makes fewer than two bands, or when there is no memory for the
 * threads; a thread that cannot be started is left out.
 */
OVRIN_API void ovrin_resize_rgba8888_tps(const uint8_t* src, uint32_t* dst, int32_t src_w,
                                         int32_t src_h, int32_t dst_w, int32_t dst_h);

/*
 * One horizontal band of an RGBA8888 picture: the state of the downscaler, frozen between two
 * source rows. "Scaled coordinates" count source rows times dst_h; source row i covers
 * [i * dst_h, (i + 1) * dst_h).
 */
typedef struct ovrin_rgba_band {
    int32_t start_row; /* first source row; when 0, the running state below is at its start */
    int32_t row_q1;    /* next pending one-quarter row point, scaled coordinates */
    int32_t row_q3;    /* next pending three-quarter row point */
    int32_t row_acc;   /* start_row * dst_h */
    int32_t di_11;     /* next destination word for (one-quarter row, one-quarter column) */
    int32_t di_13;     /* ... for (one-quarter row, three-quarter column) */
    int32_t di_31;     /* ... for (three-quarter row, one-quarter column) */
    int32_t di_33;     /* ... for (three-quarter row, three-quarter column) */
    int32_t src_w;     /* source size, pixels */
    int32_t src_h;
    int32_t src_stride; /* source row length, pixels; not used without a canvas */
    int32_t src_rows;   /* rows in the source buffer; not used */
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
 * band->band_rows source rows, adds their bytes to src_offset, and sets rows_to_do to the rows of
 * the band that it leaves: band_rows, or 0 when these pass src_h. Writes no other field, and of the
 * record's reads these and band_rows only.
 */
OVRIN_API void ovrin_resize_rgba8888_get_pos(int32_t src_w, int32_t src_h, int32_t dst_w,
                                             int32_t dst_h, ovrin_rgba_band* band);

/*
 * Band task; band points to an ovrin_rgba_band. Adds the samples of rows_to_do source rows to what
 * the destination holds (the caller clears it beforehand), then sets done. "Bands" above says which
 * may run at the same time.
 */
OVRIN_API void _resize_rgba8888_tp(void* band);

/*
 * ---- RGBA8888 in a canvas ----------------------------------------------------------------------
 */

/*
 * Fills the target's canvas with 0 and resizes src into the rectangle dst_width x dst_height at
 * (dst_x, dst_y). src_w x src_h is the source size; its rows lie target->src_stride pixels apart.
 *
 * A rectangle that passes the canvas's right or lower edge is cut there, and the source is cut in
 * proportion: dst_width becomes canvas_width - dst_x, and the source width becomes
 * (int)(target->src_width * ((double)new_dst_width / old_dst_width)); both are written back into
 * the target, likewise for heights. Keep target->src_width and src_height equal to the arguments:
 * they are what is cut. A rectangle that a negative position puts outside the canvas's memory is
 * not drawn.
 *
 * Returns without touching anything if canvas_width < dst_x, or canvas_height < dst_height (not
 * dst_y), or dst_height is 0. From 1024 source rows on as ovrin_resize_rgba_keep_ratio_tps, below
 * that as ovrin_resize_rgba_keep_ratio_sg: they differ for a src_stride of 0 or less, and for a
 * rectangle that begins at canvas row canvas_height. Set src_stride, also where rows are packed:
 * with 0 every row of a picture below 1024 rows is its first one. From there on 0 stands for the
 * source width, except where the calling thread does the work alone.
 */
OVRIN_API void ovrin_resize_rgba8888_keep_ratio(const uint8_t* src, int32_t src_w, int32_t src_h,
                                                ovrin_resize_target* target);

/*
 * On the calling thread. A src_stride of 0 samples the first row for every destination row. A
 * rectangle of which the cut leaves nothing gives an empty canvas.
 */
OVRIN_API void ovrin_resize_rgba_keep_ratio_sg(const uint8_t* src, int32_t src_w, int32_t src_h,
                                               ovrin_resize_target* target);

/*
 * In bands. Returns at once when target is null. A src_stride of 0 or less counts as the source
 * width here. A rectangle that begins at canvas row canvas_height leaves the canvas untouched. Does
 * as ovrin_resize_rgba_keep_ratio_sg with what is left of the picture when that makes fewer than
 * two bands, or when memory or a thread is missing.
 */
OVRIN_API void ovrin_resize_rgba_keep_ratio_tps(const uint8_t* src, int32_t src_w, int32_t src_h,
                                                ovrin_resize_target* target);

/*
 * As ovrin_resize_rgba8888_get_pos, for a picture in a canvas: destination indices count canvas
 * words from canvas row dst_y, without dst_x; source rows lie band->src_stride pixels apart.
 * canvas_h is not used.
 */
OVRIN_API void ovrin_resize_rgba8888_get_pos_keep_ratio(int32_t src_w, int32_t src_h, int32_t dst_w,
                                                        int32_t dst_h, int32_t canvas_w,
                                                        int32_t canvas_h, ovrin_rgba_band* band);

/* As _resize_rgba8888_tp, for a picture in a canvas: band->dst is the first word of row dst_y. */
OVRIN_API void _resize_rgba8888_keep_ratio_tp(void* band);

/*
 * ---- RGB888 and nearest neighbour --------------------------------------------------------------
 */

/*
 * As ovrin_resize_rgba8888_sg with three bytes per pixel, in any channel order; always on the
 * calling thread.
 */
OVRIN_API void ovrin_resize_rgb888(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                                   int32_t dst_w, int32_t dst_h);

/*
 * Copies one source pixel per destination pixel, on the calling thread. The step between samples is
 * a whole number, the ratio rounded to the nearest (sx = (int)(src_w / dst_w + 0.5)); the first
 * sample lies half a step in, rounded up. Samples beyond the source are dropped, not clamped: what
 * is written to a row closes up to its left, and the rest of the destination keeps its contents.
 *
 * Returns without writing when a pointer is null or a size is 0 or less.
 */
OVRIN_API void ovrin_resize_nearest_rgba8888(const uint32_t* src, uint32_t* dst, int32_t src_w,
                                             int32_t src_h, int32_t dst_w, int32_t dst_h);

/*
 * ---- 4:2:0 pictures: planar YUV and NV21 -------------------------------------------------------
 *
 * A picture of w x h pixels has w * h bytes of luma, then its chroma at half the size in either
 * direction, rounded up:
 *
 *     I420   a plane of U, then a plane of V, each (h + 1) >> 1 rows of (w + 1) >> 1 bytes
 *     NV21   one plane of (h + 1) >> 1 rows of (w + 1) >> 1 pairs, V before U
 *
 * Both are resized as RGBA8888 is, byte by byte. Chroma is sampled for the destination size rounded
 * up to multiples of 4 in each direction, and then cut to its own size: where the destination's
 * width or height is not a multiple of 4, the chroma that is kept covers a little less of the
 * source than the luma. On the calling thread, such sizes need a work buffer of 2 * width * height
 * bytes, both rounded up; without memory for it nothing is written. A destination size of 0 or less
 * writes nothing; a source size of 0 or less fills the destination with 0, chroma included.
 *
 * The keep-ratio forms paint the target's canvas black (luma 0, chroma 128) and place the picture,
 * scaled to dst_width x dst_height, at (dst_x, dst_y). What does not fit into the canvas is cut
 * off, not rescaled. Chroma goes to half the position rounded up, so with an odd dst_x or dst_y it
 * lies one pixel further right or down than the luma; chroma that would pass the end of the canvas
 * is dropped. Source luma rows lie target->src_stride bytes apart, chroma rows half as many
 * samples, rounded up. The target is never written. Nothing is touched if canvas_width < dst_x,
 * canvas_height < dst_y or dst_height is 0.
 *
 * Which of them use threads, and what they do without, is as for RGBA8888.
 */

/* I420 to I420, contiguous buffers. */
OVRIN_API void ovrin_resize_yuv420(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                                   int32_t dst_w, int32_t dst_h);

/* As ovrin_resize_yuv420, on the calling thread whatever the height. */
OVRIN_API void ovrin_resize_yuv420_sg(const uint8_t* src, uint8_t* dst, int32_t src_w,
                                      int32_t src_h, int32_t dst_w, int32_t dst_h);

/* As ovrin_resize_yuv420, in bands on worker threads whatever the height. */
OVRIN_API void ovrin_resize_yuv420_tps(const uint8_t* src, uint8_t* dst, int32_t src_w,
                                       int32_t src_h, int32_t dst_w, int32_t dst_h);

/* Three source planes to a contiguous I420 buffer. */
OVRIN_API void ovrin_resize_y_u_v(const uint8_t* src_y, const uint8_t* src_u, const uint8_t* src_v,
                                  uint8_t* dst, int32_t src_w, int32_t src_h, int32_t dst_w,
                                  int32_t dst_h);

/*
 * Three source planes into an I420 canvas: as ovrin_resize_y_u_v_sg below 1024 source rows, as
 * ovrin_resize_y_u_v_tps from there on. They differ for a src_stride of 0 or less, and in which
 * placements they turn down. Set src_stride, also where rows are packed: with 0 every row of a
 * picture below 1024 rows is its first one, in all planes. From there on 0 stands for src_w, except
 * where the calling thread does the work alone.
 */
OVRIN_API void ovrin_resize_y_u_v_keep_ratio(const uint8_t* src_y, const uint8_t* src_u,
                                             const uint8_t* src_v, int32_t src_w, int32_t src_h,
                                             const ovrin_resize_target* target);

/*
 * On the calling thread whatever the height. A null target selects the contiguous destination;
 * with a target, dst, dst_w and dst_h are ignored. A src_stride of 0 samples the first row for
 * every destination row.
 */
OVRIN_API void ovrin_resize_y_u_v_sg(const uint8_t* src_y, const uint8_t* src_u,
                                     const uint8_t* src_v, uint8_t* dst, int32_t src_w,
                                     int32_t src_h, int32_t dst_w, int32_t dst_h,
                                     const ovrin_resize_target* target);

/*
 * As ovrin_resize_y_u_v_sg, in bands on worker threads from 1024 source rows on. With a target it
 * takes a src_stride of 0 or less for src_w, and its second test compares canvas_height with dst_x,
 * not dst_y: a picture that starts below the canvas gives a black canvas. Does as
 * ovrin_resize_y_u_v_sg when the picture makes fewer than two bands or memory is missing; with a
 * target also when a thread is.
 */
OVRIN_API void ovrin_resize_y_u_v_tps(const uint8_t* src_y, const uint8_t* src_u,
                                      const uint8_t* src_v, uint8_t* dst, int32_t src_w,
                                      int32_t src_h, int32_t dst_w, int32_t dst_h,
                                      const ovrin_resize_target* target);

/*
 * One band of a planar picture. Points, bases and indices as in ovrin_rgba_band, once for luma and
 * once for the two chroma planes together; indices count bytes from the start of the plane in the
 * work buffer or destination. "Top" is the quarter point of a destination row, "left" that of a
 * column.
 *
 * The work buffer is a picture of W x H, the destination's size rounded up to multiples of 4:
 *
 *     luma     H rows of W bytes
 *     chroma   U, then V, each H / 2 rows of W / 2 bytes; in NV21 H / 2 rows of W / 2 pairs
 *
 * 3 * W * H / 2 bytes in all. When all bands are done, the caller copies the result out of it: of
 * the first dst_height luma rows the first dst_width bytes, and of each chroma plane's first
 * (dst_height + 1) / 2 rows the first (dst_width + 1) / 2 samples.
 */
typedef struct ovrin_yuv_band {
    int32_t y_start_row; /* luma rows before this band; 0: the points below are not set yet */
    int32_t y_top_point;
    int32_t y_bottom_point;
    int32_t y_row_base;
    int32_t y_top_left;
    int32_t y_top_right;
    int32_t y_bottom_left;
    int32_t y_bottom_right;
    int32_t uv_start_row; /* chroma rows before this band; 0: the points below are not set yet */
    int32_t uv_top_point;
    int32_t uv_bottom_point;
    int32_t uv_row_base;
    int32_t uv_top_left;
    int32_t uv_top_right;
    int32_t uv_bottom_left;
    int32_t uv_bottom_right;
    int32_t src_width; /* source size, pixels */
    int32_t src_height;
    int32_t src_row_bytes; /* from one source luma row to the next; contiguous: src_width */
    int32_t src_rows;      /* rows in the source buffer; not used */
    int32_t dst_width;     /* size of the scaled picture, pixels */
    int32_t dst_height;
    int32_t band_rows;     /* luma rows in a band */
    int32_t src_y_offset;  /* bytes from the luma plane to the band's first row */
    int32_t src_uv_offset; /* bytes from either chroma plane to the band's first row */
    const uint8_t* src;    /* the whole source buffer, or its luma plane */
    uint8_t* dst;          /* the destination buffer, or the canvas */
    const uint8_t* src_u;  /* chroma planes of a source in three planes */
    const uint8_t* src_v;
    uint8_t* work;   /* work buffer shared by all bands; null when dst takes the samples itself */
    int32_t y_rows;  /* luma rows that this band processes */
    int32_t uv_rows; /* chroma rows that this band processes */
    int32_t done;    /* 0 until the band's task has finished, then 1 (stored with release) */
} ovrin_yuv_band;

/*
 * Moves a band record to the following band without touching pixels: advances the running state,
 * adds the bytes of the rows walked to src_y_offset and src_uv_offset, and sets y_rows and uv_rows
 * to the rows of the band that it leaves. Writes no other field, and of the record's reads these,
 * band_rows and src_row_bytes only. src_width is not used.
 *
 * A band has band_rows luma rows; its chroma is a quarter of that, rounded up, and then as many
 * rows more as it takes to complete a destination row. Luma rows beyond the source give y_rows 0,
 * chroma rows beyond it are cut off. As luma goes ahead of chroma, about half of the chroma is left
 * for the last band.
 */
OVRIN_API void ovrin_resize_yuv420_get_pos(int32_t src_width, int32_t src_height, int32_t dst_width,
                                           int32_t dst_height, ovrin_yuv_band* band);

/*
 * Band task for a source in three planes; band points to an ovrin_yuv_band. Adds to what the work
 * buffer holds or, without one, the destination, then sets done. A work buffer is needed where the
 * destination's width or height is not a multiple of 4; without it the task then only sets done.
 */
OVRIN_API void _resize_y_u_v_tp(void* band);

/*
 * Band task for a contiguous source. As _resize_y_u_v_tp, except that it uses the work buffer only
 * where the destination's width or height is not a multiple of 4.
 */
OVRIN_API void _resize_yuv420_tp(void* band);

/* NV21 to NV21, contiguous buffers. */
OVRIN_API void ovrin_resize_nv21(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                                 int32_t dst_w, int32_t dst_h);

/* As ovrin_resize_nv21, on the calling thread whatever the height. */
OVRIN_API void ovrin_resize_nv21_sg(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                                    int32_t dst_w, int32_t dst_h);

/* As ovrin_resize_nv21, in bands on worker threads whatever the height. */
OVRIN_API void ovrin_resize_nv21_tps(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                                     int32_t dst_w, int32_t dst_h);

/* Luma and chroma plane apart, to a contiguous NV21 buffer. */
OVRIN_API void ovrin_resize_y_nv21(const uint8_t* src_y, const uint8_t* src_vu, uint8_t* dst,
                                   int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h);

/*
 * Luma and chroma plane apart, into an NV21 canvas. As ovrin_resize_y_u_v_keep_ratio, also for a
 * src_stride of 0.
 */
OVRIN_API void ovrin_resize_y_nv21_keep_ratio(const uint8_t* src_y, const uint8_t* src_vu,
                                              int32_t src_w, int32_t src_h,
                                              const ovrin_resize_target* target);

/* As ovrin_resize_y_u_v_sg, for NV21. */
OVRIN_API void ovrin_resize_y_nv_sg(const uint8_t* src_y, const uint8_t* src_vu, uint8_t* dst,
                                    int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h,
                                    const ovrin_resize_target* target);

/* As ovrin_resize_y_u_v_tps, for NV21. */
OVRIN_API void ovrin_resize_y_nv_tps(const uint8_t* src_y, const uint8_t* src_vu, uint8_t* dst,
                                     int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h,
                                     const ovrin_resize_target* target);

/* One band of an NV21 picture; as ovrin_yuv_band, with one plane of chroma pairs. */
typedef struct ovrin_nv21_band {
    int32_t y_start_row;
    int32_t y_top_point;
    int32_t y_bottom_point;
    int32_t y_row_base;
    int32_t y_top_left;
    int32_t y_top_right;
    int32_t y_bottom_left;
    int32_t y_bottom_right;
    int32_t vu_start_row;
    int32_t vu_top_point;
    int32_t vu_bottom_point;
    int32_t vu_row_base;
    int32_t vu_top_left;
    int32_t vu_top_right;
    int32_t vu_bottom_left;
    int32_t vu_bottom_right;
    int32_t src_width;
    int32_t src_height;
    int32_t src_row_bytes;
    int32_t src_rows;
    int32_t dst_width;
    int32_t dst_height;
    int32_t band_rows;
    int32_t src_y_offset;
    int32_t src_vu_offset;
    const uint8_t* src;
    uint8_t* dst;
    const uint8_t* src_vu; /* chroma plane of a source in two planes */
    uint8_t* work;
    int32_t y_rows;
    int32_t vu_rows;
    int32_t done;
} ovrin_nv21_band;

/*
 * As ovrin_resize_yuv420_get_pos, except that a chroma band which does not end on a destination row
 * takes all chroma rows that are left, and the bands after it get none. src_vu_offset moves by
 * src_width, not src_row_bytes, for each of those rows: the chroma of rows that are longer than
 * their pixels asks for src_row_bytes as the argument src_width.
 */
OVRIN_API void ovrin_resize_nv21_get_pos(int32_t src_width, int32_t src_height, int32_t dst_width,
                                         int32_t dst_height, ovrin_nv21_band* band);

/* Band task for a contiguous source; band points to an ovrin_nv21_band. As _resize_yuv420_tp. */
OVRIN_API void _resize_nv21_tp(void* band);

/* Band task for a source in two planes; band points to an ovrin_nv21_band. As _resize_y_u_v_tp. */
OVRIN_API void _resize_y_nv21_tp(void* band);

/*
 * ---- Bilinear engine ---------------------------------------------------------------------------
 *
 * Shrinks or enlarges by any ratio with 12-bit fixed-point weights. Planar pictures are a Y plane,
 * then U, then V; semi-planar ones a Y plane, then one plane of two-byte chroma pairs. Chroma
 * planes have (height + 1) / 2 rows; a row of U or V has (width + 1) / 2 bytes, a row of pairs
 * twice that.
 *
 * Output column i lies at source position i * src_width / dst_w, whose whole part is its left
 * source column; the weight of the column to the right of that is the fraction plus one quarter.
 * Rows likewise. What follows from this, and is meant:
 *
 *  - Equal sizes do not copy: pixels are blended with their right and lower neighbours.
 *  - A weight may reach 1.25. Results are neither rounded nor limited to 0 ... 255, they wrap:
 *    beside a much brighter sample a dark one can come out bright.
 *  - From the first column that lies on the last but one source column, columns are blended with
 *    their lower neighbours only; rows likewise, with their right neighbours only. When columns
 *    step over the last but one, as in many reductions, none is.
 *  - Chroma takes the weights of its luma pixel. The columns of U and V round up.
 *  - Samples just outside the picture are read and can reach the result: those one column to the
 *    right, one row below and, in U and V, two rows below. After every source plane src_stride + 1
 *    samples (pixels, bytes or pairs) must be readable, whatever they hold.
 *  - Positions are counted in single precision. From 8388608 destination columns or rows on it may
 *    round the last of them up to the source's size: one column, or row, more is read then.
 *
 * The whole canvas is cleared first: 0, chroma 128. Only sizes of 0 are tested for; those of the
 * source must not be negative.
 */

/*
 * Format codes: the planes and the bytes of a pixel. Which channel comes first makes no difference,
 * so the two codes of a layout do the same. With any other code nothing is written.
 */
enum {
    OVRIN_FORMAT_PLANAR = 2,        /* 4:2:0 in three planes, such as I420 */
    OVRIN_FORMAT_PIXELS = 7,        /* four 8-bit channels, such as RGBA8888 */
    OVRIN_FORMAT_PIXELS_2 = 8,      /* the same */
    OVRIN_FORMAT_SEMI_PLANAR = 18,  /* 4:2:0 with pairs of chroma, such as NV21 */
    OVRIN_FORMAT_SEMI_PLANAR_2 = 19 /* the same */
};

/*
 * Resizes src (src_w x src_h pixels) into dst (dst_w x dst_h pixels) on the calling thread.
 *
 * With a target record, dst is its canvas and dst_w x dst_h the rectangle at (dst_x, dst_y) to be
 * filled. The record gives the source's size and row length (src_width, src_height, src_stride),
 * its chroma planes, the format code and the canvas's size; format is ignored, src_w and src_h are
 * only tested for 0. Its dst, dst_width and dst_height are not used. A rectangle that overhangs the
 * canvas is cut to fit. The last columns are then blended in both directions, whichever side was
 * cut; the number of rows at the bottom that are not stays what it was before the cut.
 *
 * A size of 0, a negative dst_w or dst_h, an unknown format code or missing memory: nothing is
 * written.
 */
OVRIN_API void ov_bilinear_sg(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                              int32_t dst_w, int32_t dst_h, int32_t format,
                              const ovrin_resize_target* target);

/*
 * As ov_bilinear_sg, except that results of 1024 rows or more are cut into bands, which four worker
 * threads and the calling thread share, and that bands do not interpolate: every sample is the top
 * left of the four that ov_bilinear_sg would blend. Tall results therefore look like those of a
 * point sampler; call ov_bilinear_sg to have them interpolated.
 *
 * When threads, or memory for the bands, are missing, or src_stride * 4 does not fit 32 bits, it
 * does what ov_bilinear_sg does, whatever the height.
 */
OVRIN_API void ov_bilinear(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                           int32_t dst_w, int32_t dst_h, int32_t format,
                           const ovrin_resize_target* target);

/*
 * As ov_bilinear, for large reductions: a picture that shrinks to a quarter or less in both
 * directions is halved first, repeatedly, until what is left is a reduction by about 2, so that
 * more of its samples count. Smaller reductions and enlargements are one ov_bilinear call, and so
 * is a reduction for which there is no memory.
 *
 * A target record is meant for that single call. It is handed to every pass as it is; halving
 * passes then read and draw the record's sizes, not those of their own pictures.
 */
OVRIN_API void ov_bilinear_ex(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                              int32_t dst_w, int32_t dst_h, int32_t format,
                              const ovrin_resize_target* target);

/*
 * One band of destination rows. The tables hold, for each column or row of the output rectangle,
 * the source column or row, and the weight of the next one with 12 fractional bits; bands share
 * them.
 */
typedef struct ovrin_bilinear_band {
    const ovrin_resize_target* target; /* or null */
    int32_t src_width;                 /* source size, pixels */
    int32_t src_height;
    int32_t dst_w; /* the part of the output rectangle that lies in the canvas, pixels */
    int32_t dst_h;
    const uint8_t* src; /* the whole source picture */
    uint8_t* dst;       /* the whole canvas */
    int32_t format;
    void* reserved_pointer; /* null */
    const int32_t* col_weight;
    const int32_t* row_weight;
    const int32_t* col_index;
    const int32_t* row_index;
    int32_t first_row; /* the band's rows are [first_row, end_row) of the output rectangle */
    int32_t end_row;
    int32_t reserved;     /* 0 */
    int32_t canvas_width; /* canvas row length, pixels */
    int32_t src_pitch;    /* source row length of the pixels or luma, bytes */
    int32_t bpp;          /* bytes per pixel: 4, or 1 for the luma of YUV */
    int32_t edge_cols;    /* columns at the right that have no right neighbour */
    int32_t edge_rows;    /* rows at the bottom of the last band that have no lower one; else 0 */
} ovrin_bilinear_band;

/*
 * Band task; band points to an ovrin_bilinear_band. Stores the samples of the band's rows; the rest
 * of the canvas stays as it is. Of a target it takes src_stride, format, the canvas's size, dst_x,
 * dst_y and the chroma planes. With an unknown format code it does nothing.
 */
OVRIN_API void _ov_bilinear_tp(void* band);

/*
 * ---- Lanczos engine ----------------------------------------------------------------------------
 *
 * Shrinks or enlarges pictures of interleaved 8-bit components with a seven-tap Lanczos filter of
 * three lobes in each direction, in double precision. The sharpest resampler here and by far the
 * slowest. Samples beyond the borders are those on the border; results are rounded and limited to
 * 0 ... 255; equal sizes copy.
 *
 * Reductions widen the filter but keep its seven taps, so strong ones skip samples.
 */

/*
 * The filter's weights at distances of i / 4000 source pixels: 16000 floats, 0 from entry 12001 on.
 * The caller releases the table with free(). Null when there is no memory.
 */
OVRIN_API float* create_lanczos_lookup(void);

/*
 * A picture of interleaved 8-bit components. A source is not written; rows of either may be longer
 * than their pixels.
 */
typedef struct lanczos_image {
    int32_t width;           /* pixels in a row */
    int32_t height;          /* rows */
    int32_t stride;          /* bytes from one row to the next */
    int32_t bytes_per_pixel; /* components: 1 for a grey or Y plane, 2 for VU, 3 or 4 for colour */
    uint8_t* data;           /* the first byte */
} lanczos_image;

/* 1 when image and its data are not null and its four numbers are above 0, otherwise 0. */
OVRIN_API int32_t checkOvImage(const lanczos_image* image);

/*
 * Resizes src into dst, on the calling thread. Nothing is written when checkOvImage rejects either,
 * when the source's rows are shorter than their pixels, or when there is no memory.
 *
 * Both should have the same bytes_per_pixel. The filter steps from one source pixel to the next by
 * those of the destination: with others the result is not a picture.
 */
OVRIN_API void OvTransformLanczos(const lanczos_image* src, const lanczos_image* dst);

/*
 * As OvTransformLanczos, for packed pictures of bytes_per_pixel components. Nothing is written when
 * a pointer is null, a size is below 1, or a row of either has more than 2^31 - 1 bytes.
 */
OVRIN_API void ov_lanczos(const uint8_t* src, int32_t src_w, int32_t src_h, uint8_t* dst,
                          int32_t dst_w, int32_t dst_h, int32_t bytes_per_pixel);

/*
 * Resizes a Y plane and the VU pairs after it, one pair per pixel. Unlike NV21, which has a pair
 * for every four pixels, the second plane has the full height, and rows of twice the width: 3 * w *
 * h bytes in all, for source and destination alike. A plain NV21 buffer is too short on both sides.
 *
 * Nothing is written when a pointer is null or a size is below 1.
 */
OVRIN_API void ov_lanczos_nv(const uint8_t* src, int32_t src_w, int32_t src_h, uint8_t* dst,
                             int32_t dst_w, int32_t dst_h);

/*
 * As ov_lanczos, for pictures of 4 bytes per pixel, in bands that four worker threads and the
 * calling thread share; mind the order of the arguments. Gives the same bytes. Runs on the calling
 * thread when the result makes fewer than two bands, as one of less than 48 rows does, or when
 * threads or memory for the bands are missing.
 *
 * dst needs room for dst_w * dst_h * 4 bytes, because bands are placed and cleared as for 4 bytes
 * per pixel, whatever bytes_per_pixel says. With fewer, each band's rows are packed at the start of
 * its place, and the rest of that is 0; more than 4 must not be passed. In bands, a null src
 * leaves dst cleared, and a band for whose work there is no memory stays so.
 * Nothing is written when dst is null, a size is below 1 or there is no memory for the weights.
 */
OVRIN_API void ovrin_resize_lanczos(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                                    int32_t dst_w, int32_t dst_h, int32_t bytes_per_pixel);

/*
 * One band of destination rows. Weights are seven per column or row of the whole destination; bands
 * share them.
 */
typedef struct ovrin_lanczos_band {
    int32_t src_w; /* source size, pixels */
    int32_t src_h;
    int32_t dst_w; /* size of the whole destination, pixels */
    int32_t dst_h;
    const uint8_t* src;      /* the whole source picture */
    uint8_t* dst;            /* the band's first row */
    int32_t bytes_per_pixel; /* components */
    int32_t first_row;       /* the band's first destination row */
    int32_t rows;            /* destination rows in the band */
    const float* table;      /* what create_lanczos_lookup gave; only tested for null */
    const double* column_weights;
    const double* row_weights;
} ovrin_lanczos_band;

/*
 * Band task; band points to an ovrin_lanczos_band. Stores the band's rows. Does nothing when src,
 * dst or table is null, a size or bytes_per_pixel is below 1, or there is no memory.
 */
OVRIN_API void _resize_lanczos_tp(void* band);

/*
 * ---- Thread pool -----------------------------------------------------------------------------
 *
 * A fixed number of workers runs tasks in the order of their submission. All memory is obtained
 * when the pool is made: adding a task allocates nothing.
 */

#define OVRIN_THREADPOOL_CAPACITY 2000

typedef struct ovrin_threadpool_queue {
    uint32_t head;  /* index of the oldest entry */
    uint32_t tail;  /* index where the next entry goes */
    uint32_t count; /* number of entries held */
    /* the ring; null where empty */
    void* entries[OVRIN_THREADPOOL_CAPACITY];
} ovrin_threadpool_queue;

typedef struct ovrin_threadpool_task {
    void (*function)(void*);
    void* argument;
} ovrin_threadpool_task;

typedef struct ovrin_threadpool {
    ovrin_threadpool_queue pending;    /* tasks waiting to be run */
    ovrin_threadpool_queue free_slots; /* slots available for new tasks */
    /* the slots; queues point into them */
    ovrin_threadpool_task tasks[OVRIN_THREADPOOL_CAPACITY];
    uint16_t thread_count;        /* workers started */
    uint16_t stop;                /* 1 once teardown has begun */
    pthread_t* threads;           /* one handle per worker */
    pthread_mutex_t free_lock;    /* guards free_slots */
    pthread_mutex_t pending_lock; /* guards pending */
    /* submitters wait here; broadcast when free_slots gets its first entry */
    pthread_cond_t slot_freed;
    /* workers wait here; broadcast when pending gets its first entry */
    pthread_cond_t task_ready;
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
