// SPDX-License-Identifier: Apache-2.0
// The six band tasks, streaming the source pixel by pixel from a record's state. They add into the
// target and return; setting `done` is left to the caller.
#pragma once

#include <ovrinresize.h>

#include <cstdint>
#include <initializer_list>

#include "reference/band_walkers.h"
#include "reference/yuv420.h"

namespace reference {

// One plane's worth of scanning.
struct Scan {
    const uint8_t* row;    // the first source row
    int32_t rows;          // source rows to pass
    int32_t row_bytes;     // from one source row to the next
    int32_t columns;       // samples in a source row
    int32_t sample_bytes;  // from one sample to the next
    int32_t src_extent_x, dst_extent_x;
    int32_t src_extent_y, dst_extent_y;
    int32_t skip_before, skip_after;  // what an index moves on by before and after a row
    int32_t index_step;               // ... and per sample
};

// Scans one source row. `add(index, sample)` is called for each sample due; null indices sit out.
template <class Add>
void scan_row(const Scan& scan, const uint8_t* sample, int32_t* top_left, int32_t* top_right,
              int32_t* bottom_left, int32_t* bottom_right, Add add) {
    int32_t* const all[] = {top_left, top_right, bottom_left, bottom_right};
    for (int32_t* index : all) {
        if (index != nullptr) *index += scan.skip_before;
    }
    int32_t left = scan.src_extent_x >> 2;
    int32_t right = (3 * scan.src_extent_x) >> 2;
    int32_t base = 0;
    for (int32_t column = 0; column < scan.columns;) {
        const bool left_hit = 0 <= left - base && left - base < scan.dst_extent_x;
        const bool right_hit = 0 <= right - base && right - base < scan.dst_extent_x;
        if (!left_hit && !right_hit) {
            base += scan.dst_extent_x;
            sample += scan.sample_bytes;
            ++column;
            continue;
        }
        const auto put = [&](int32_t* index) {
            if (index == nullptr) return;
            add(*index, sample);
            *index += scan.index_step;
        };
        if (left_hit) {
            put(top_left);
            put(bottom_left);
            left += scan.src_extent_x;
        }
        if (right_hit) {
            put(top_right);
            put(bottom_right);
            right += scan.src_extent_x;
        }
    }
    for (int32_t* index : all) {
        if (index != nullptr) *index += scan.skip_after;
    }
}

template <class Add>
void scan_rows(Walk walk, const Scan& scan, Add add) {
    const uint8_t* row = scan.row;
    for (int32_t passed = 0; passed < scan.rows;) {
        const bool top = holds(walk.top_point, walk, scan.dst_extent_y);
        const bool bottom = holds(walk.bottom_point, walk, scan.dst_extent_y);
        if (!top && !bottom) {
            row += scan.row_bytes;
            walk.row_base += scan.dst_extent_y;
            ++passed;
            continue;
        }
        scan_row(scan, row, top ? &walk.top_left : nullptr, top ? &walk.top_right : nullptr,
                 bottom ? &walk.bottom_left : nullptr, bottom ? &walk.bottom_right : nullptr, add);
        if (top) walk.top_point += scan.src_extent_y;
        if (bottom) walk.bottom_point += scan.src_extent_y;
    }
}

// ---- RGBA8888 ----

inline void rgba_task(const ovrin_rgba_band& band, uint32_t* dst, int32_t row_pixels,
                      int32_t skip_before, int32_t skip_after) {
    const Scan scan = {band.src + band.src_offset,
                       band.rows_to_do,
                       row_pixels * 4,
                       band.src_w,
                       4,
                       band.src_w,
                       band.dst_w,
                       band.src_h,
                       band.dst_h,
                       skip_before,
                       skip_after,
                       1};
    scan_rows(start_walk(band, kRgbaFields, band.src_h), scan,
              [&](int32_t index, const uint8_t* sample) {
                  for (int c = 0; c < 4; ++c)
                      dst[index] += static_cast<uint32_t>(sample[c] >> 2) << (8 * c);
              });
}

inline void resize_rgba8888_tp(const ovrin_rgba_band& band, uint32_t* dst) {
    rgba_task(band, dst, band.src_w, 0, 0);
}

inline void resize_rgba8888_keep_ratio_tp(const ovrin_rgba_band& band, uint32_t* dst) {
    rgba_task(band, dst, band.src_stride, band.dst_x, band.dst_skip);
}

// ---- Planes: `target` is the destination or the work buffer, whichever is due ----

template <class Band>
void luma_task(const Band& band, int32_t row_bytes, uint8_t* target) {
    if (band.y_rows < 1) return;
    const int32_t gap = grid_side(band.dst_width) - band.dst_width;
    const Scan scan = {band.src + band.src_y_offset,
                       band.y_rows,
                       row_bytes,
                       band.src_width,
                       1,
                       band.src_width,
                       band.dst_width,
                       band.src_height,
                       band.dst_height,
                       0,
                       gap,
                       1};
    scan_rows(start_walk(band, kLumaFields<Band>, band.src_height), scan,
              [&](int32_t index, const uint8_t* sample) {
                  target[index] = static_cast<uint8_t>(target[index] + (*sample >> 2));
              });
}

// `planes` are U and V, or VU.
template <class Band>
void chroma_task(const Band& band, const ChromaLayout& layout,
                 std::initializer_list<const uint8_t*> planes, int32_t row_bytes, uint8_t* target) {
    constexpr auto fields = kChromaFields<Band>;
    const auto bytes = static_cast<int32_t>(layout.sample_bytes);
    const int32_t src_w = (band.src_width + 1) >> 1;
    const int32_t src_h = (band.src_height + 1) >> 1;
    if (band.*fields.rows == 0 || src_h <= band.*fields.start_row) return;
    const int32_t grid_w = grid_side(band.dst_width);
    const int32_t grid_h = grid_side(band.dst_height);
    const int32_t dst_row = grid_w / 2 * bytes;
    const int32_t dst_h = grid_h / 2;
    uint8_t* plane = target + grid_w * grid_h;
    for (const uint8_t* src : planes) {
        const Scan scan = {src + band.*fields.src_offset,
                           band.*fields.rows,
                           row_bytes,
                           src_w,
                           bytes,
                           src_w * bytes,
                           dst_row,
                           src_h,
                           dst_h,
                           0,
                           0,
                           bytes};
        scan_rows(start_walk(band, fields, src_h), scan, [&](int32_t index, const uint8_t* sample) {
            for (int b = 0; b < bytes; ++b) {
                plane[index + b] = static_cast<uint8_t>(plane[index + b] + (sample[b] >> 2));
            }
        });
        plane += dst_row * dst_h;
    }
}

inline void resize_y_u_v_tp(const ovrin_yuv_band& band, uint8_t* target) {
    luma_task(band, band.src_row_bytes, target);
    chroma_task(band, kI420, {band.src_u, band.src_v}, (band.src_row_bytes + 1) >> 1, target);
}

inline void resize_yuv420_tp(const ovrin_yuv_band& band, uint8_t* target) {
    const int32_t chroma_w = (band.src_width + 1) >> 1;
    const int32_t chroma_h = (band.src_height + 1) >> 1;
    const uint8_t* u = band.src + band.src_width * band.src_height;
    luma_task(band, band.src_width, target);
    chroma_task(band, kI420, {u, u + chroma_w * chroma_h}, chroma_w, target);
}

inline void resize_nv21_tp(const ovrin_nv21_band& band, uint8_t* target) {
    luma_task(band, band.src_width, target);
    chroma_task(band, kNv21, {band.src + band.src_width * band.src_height},
                (band.src_width + 1) & ~1, target);
}

inline void resize_y_nv21_tp(const ovrin_nv21_band& band, uint8_t* target) {
    luma_task(band, band.src_row_bytes, target);
    chroma_task(band, kNv21, {band.src_vu}, (band.src_row_bytes + 1) & ~1, target);
}

}  // namespace reference
