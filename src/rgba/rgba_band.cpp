// SPDX-License-Identifier: Apache-2.0
#include "rgba/rgba_band.h"

namespace ovrin {

namespace {

// The record's own points are not set before the first row.
ScanState scan_state(const ovrin_rgba_band& band, int32_t src_h) {
    ScanState state = {band.row_q1, band.row_q3, band.row_acc, band.di_11,
                       band.di_13,  band.di_31,  band.di_33};
    if (band.start_row == 0) start_points(state, src_h);
    return state;
}

void store_scan_state(ovrin_rgba_band& band, const ScanState& state) {
    band.row_q1 = state.top_point;
    band.row_q3 = state.bottom_point;
    band.row_acc = state.row_base;
    band.di_11 = state.top_left;
    band.di_13 = state.top_right;
    band.di_31 = state.bottom_left;
    band.di_33 = state.bottom_right;
}

}  // namespace

QuarterPlane rgba_plane(const RgbaSource& src, const RgbaDestination& dst) {
    QuarterPlane plane = {};
    plane.src = src.pixels;
    plane.src_pitch = ptrdiff_t{src.stride} * kRgbaBytes;
    plane.src_columns = src.width;
    plane.src_rows = src.height;
    plane.dst = reinterpret_cast<uint8_t*>(dst.pixels);
    plane.dst_pitch = ptrdiff_t{dst.stride} * kRgbaBytes;
    plane.dst_columns = plane.columns = dst.width;
    plane.dst_rows = plane.rows = dst.height;
    plane.sample_bytes = kRgbaBytes;
    return plane;
}

void advance_rgba_band(ovrin_rgba_band& band, int32_t src_h, int32_t dst_h, const RgbaRows& rows) {
    ScanState state = scan_state(band, src_h);
    const int32_t walked = band.band_rows > 0 ? band.band_rows : 0;
    walk_rows(state, {src_h, dst_h, rows.dst_pixels}, walked);
    store_scan_state(band, state);
    band.start_row = wrapping_add(band.start_row, walked);
    band.src_offset = wrapping_add(band.src_offset, int64_t{walked} * rows.src_pixels * kRgbaBytes);
    band.rows_to_do = src_h >= band.start_row ? walked : 0;
}

void run_rgba_band(ovrin_rgba_band& band, const RgbaRows& rows) {
    if (band.rows_to_do > 0) {
        const QuarterPlane plane =
            rgba_plane({band.src + band.src_offset, rows.src_pixels, band.src_w, band.src_h},
                       {band.dst + rows.dst_x, rows.dst_pixels, band.dst_w, band.dst_h});
        add_band(plane, scan_state(band, band.src_h), band.rows_to_do, kRgbaBytes);
    }
    __atomic_store_n(&band.done, 1, __ATOMIC_RELEASE);
}

}  // namespace ovrin
