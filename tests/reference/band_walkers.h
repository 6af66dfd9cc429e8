// SPDX-License-Identifier: Apache-2.0
// The four band walkers, replayed one source row at a time on the public records.
#pragma once

#include <ovrinresize.h>

#include <cstdint>

#include "reference/band_records.h"

namespace reference {

// The vertical state of one plane: the next pending point of each kind, the scaled coordinate of
// the current source row, and where the next samples go.
struct Walk {
    int32_t top_point, bottom_point, row_base;
    int32_t top_left, top_right, bottom_left, bottom_right;

    bool clean() const {
        return top_left == top_right && top_left == bottom_left && top_left == bottom_right;
    }
};

// What an axis or a plane looks like to a walk.
struct WalkSizes {
    int32_t src_rows, dst_rows;
    int32_t row_length;  // what an index moves on by when its destination row is complete
};

// Whether the current source row holds the pending points.
inline bool holds(int32_t point, const Walk& walk, int32_t dst_rows) {
    const int32_t distance = point - walk.row_base;
    return 0 <= distance && distance < dst_rows;
}

// Passes one source row, applying every hit on it first.
inline void pass_row(Walk& walk, const WalkSizes& sizes) {
    for (;;) {
        const bool top = holds(walk.top_point, walk, sizes.dst_rows);
        const bool bottom = holds(walk.bottom_point, walk, sizes.dst_rows);
        if (!top && !bottom) break;
        if (top) {
            walk.top_left += sizes.row_length;
            walk.top_right += sizes.row_length;
            walk.top_point += sizes.src_rows;
        }
        if (bottom) {
            walk.bottom_left += sizes.row_length;
            walk.bottom_right += sizes.row_length;
            walk.bottom_point += sizes.src_rows;
        }
    }
    walk.row_base += sizes.dst_rows;
}

// ---- Records to walks and back. Points are not saved before the first row. ----

template <class Band>
Walk start_walk(const Band& band, const PlaneFields<Band>& plane, int32_t src_rows) {
    Walk walk = {band.*plane.top_point,   band.*plane.bottom_point, band.*plane.row_base,
                 band.*plane.top_left,    band.*plane.top_right,    band.*plane.bottom_left,
                 band.*plane.bottom_right};
    if (band.*plane.start_row == 0) {
        walk.top_point = src_rows >> 2;
        walk.bottom_point = (3 * src_rows) >> 2;
    }
    return walk;
}

template <class Band>
void store_walk(Band& band, const PlaneFields<Band>& plane, const Walk& walk) {
    band.*plane.top_point = walk.top_point;
    band.*plane.bottom_point = walk.bottom_point;
    band.*plane.row_base = walk.row_base;
    band.*plane.top_left = walk.top_left;
    band.*plane.top_right = walk.top_right;
    band.*plane.bottom_left = walk.bottom_left;
    band.*plane.bottom_right = walk.bottom_right;
}

// ---- The walkers ----

inline int32_t grid_side(int32_t length) {
    return length % 4 != 0 ? length - length % 4 + 4 : length;
}

inline void rgba_walk(int32_t src_h, int32_t dst_h, int32_t row_length, int32_t src_row_pixels,
                      ovrin_rgba_band& band) {
    Walk walk = start_walk(band, kRgbaFields, src_h);
    int32_t passed = 0;
    while (passed < band.band_rows) {
        pass_row(walk, {src_h, dst_h, row_length});
        ++passed;
    }
    band.start_row += passed;
    band.src_offset += passed * src_row_pixels * 4;
    band.rows_to_do = src_h >= band.start_row ? passed : 0;
    store_walk(band, kRgbaFields, walk);
}

inline void rgba8888_get_pos(int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h,
                             ovrin_rgba_band& band) {
    rgba_walk(src_h, dst_h, dst_w, src_w, band);
}

inline void rgba8888_get_pos_keep_ratio(int32_t src_h, int32_t dst_h, int32_t canvas_w,
                                        ovrin_rgba_band& band) {
    rgba_walk(src_h, dst_h, canvas_w, band.src_stride, band);
}

// Luma is the same for both records of planes.
template <class Band>
void walk_luma(int32_t src_h, int32_t dst_w, int32_t dst_h, Band& band) {
    Walk walk = start_walk(band, kLumaFields<Band>, src_h);
    int32_t passed = 0;
    while (passed < band.band_rows) {
        pass_row(walk, {src_h, dst_h, grid_side(dst_w)});
        ++passed;
    }
    band.src_y_offset += band.src_row_bytes * passed;
    band.y_start_row += passed;
    band.y_rows = src_h >= band.y_start_row ? passed : 0;
    store_walk(band, kLumaFields<Band>, walk);
}

// Chroma rows of a band, clipped to the plane's `rows`.
inline int32_t clipped_rows(int32_t rows, int32_t start, int32_t passed) {
    if (rows >= start) return passed;
    const int32_t left = rows - start + passed;
    return left < 0 ? 0 : left;
}

// Lengthens a chroma band to the first row at which no destination row is half done.
inline void yuv420_get_pos(int32_t src_h, int32_t dst_w, int32_t dst_h, ovrin_yuv_band& band) {
    walk_luma(src_h, dst_w, dst_h, band);

    const int32_t rows = (src_h + 1) >> 1;
    const int32_t step = (band.src_row_bytes + 1) >> 1;
    const WalkSizes sizes = {rows, (grid_side(dst_h) + 1) >> 1, (grid_side(dst_w) + 1) >> 1};
    Walk walk = start_walk(band, kChromaFields<ovrin_yuv_band>, rows);
    int32_t passed = 0;
    while (passed < (band.band_rows + 3) >> 2) {
        pass_row(walk, sizes);
        ++passed;
        band.src_uv_offset += step;
    }
    while (!walk.clean() && band.uv_start_row + passed < rows) {
        pass_row(walk, sizes);
        ++passed;
        band.src_uv_offset += step;
    }
    band.uv_start_row += passed;
    band.uv_rows = clipped_rows(rows, band.uv_start_row, passed);
    store_walk(band, kChromaFields<ovrin_yuv_band>, walk);
}

// Lengthens a chroma band that leaves a destination row half done to the end of the plane; the
// rows of that stretch are as long as the picture, not as the record says.
inline void nv21_get_pos(int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h,
                         ovrin_nv21_band& band) {
    walk_luma(src_h, dst_w, dst_h, band);

    const int32_t rows = (src_h + 1) >> 1;
    const WalkSizes sizes = {rows, (grid_side(dst_h) + 1) >> 1, (grid_side(dst_w) + 1) & ~1};
    Walk walk = start_walk(band, kChromaFields<ovrin_nv21_band>, rows);
    int32_t passed = 0;
    while (passed < (band.band_rows + 3) >> 2) {
        pass_row(walk, sizes);
        ++passed;
        band.src_vu_offset += (band.src_row_bytes + 1) & ~1;
    }
    if (!walk.clean()) {
        while (passed < rows - band.vu_start_row) {
            pass_row(walk, sizes);
            ++passed;
            band.src_vu_offset += (src_w + 1) & ~1;
        }
    }
    band.vu_start_row += passed;
    band.vu_rows = clipped_rows(rows, band.vu_start_row, passed);
    store_walk(band, kChromaFields<ovrin_nv21_band>, walk);
}

}  // namespace reference
