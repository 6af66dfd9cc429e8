// SPDX-License-Identifier: Apache-2.0
#include "dispatch/banded_run.h"
#include "rgba/rgba_band.h"

namespace ovrin {

namespace {

RgbaRows packed_rows(const ovrin_rgba_band& band) {
    return {band.src_w, band.dst_w, 0};
}

struct PackedBands : RgbaBands {
    static void task(void* band) {
        auto* record = static_cast<Band*>(band);
        run_rgba_band(*record, packed_rows(*record), BandRows::kStore);
    }

    static void clear_shared_row(const Band& band) { clear_open_row(band, packed_rows(band)); }

    static void advance(Band& next, Band& previous) {
        ovrin_resize_rgba8888_get_pos(next.src_w, next.src_h, next.dst_w, next.dst_h, &next);
        end_where_next_begins(previous, next);
    }
};

// A band record counts source bytes and destination words in 32 bits.
bool fits_band_record(int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h) {
    return int64_t{src_w} * src_h <= INT32_MAX / kRgbaBytes && int64_t{dst_w} * dst_h <= INT32_MAX;
}

ovrin_rgba_band first_band(const uint8_t* src, uint32_t* dst, int32_t src_w, int32_t src_h,
                           int32_t dst_w, int32_t dst_h) {
    ovrin_rgba_band band = {};
    band.src_w = src_w;
    band.src_h = src_h;
    band.src_stride = src_w;
    band.src_rows = src_h;
    band.dst_w = dst_w;
    band.dst_h = dst_h;
    band.src = src;
    band.dst = dst;
    return band;
}

bool resize_in_bands(const ovrin_rgba_band& first) {
    const BandSplit split = split_into_bands(first.src_h, first.dst_h);
    // Nothing is sampled from a source without columns.
    if (split.count < 2 || first.src_w < 1) return false;
    BandedRun<PackedBands> bands(first, split);
    if (!bands.ready()) return false;
    bands.run();
    return true;
}

}  // namespace

}  // namespace ovrin

using namespace ovrin;

void ovrin_resize_rgba8888_sg(const uint8_t* src, uint32_t* dst, int32_t src_w, int32_t src_h,
                              int32_t dst_w, int32_t dst_h) {
    QuarterPlane plane = {};
    plane.src = src;
    plane.src_pitch = ptrdiff_t{src_w} * kRgbaBytes;
    plane.src_columns = src_w;
    plane.src_rows = src_h;
    plane.dst = reinterpret_cast<uint8_t*>(dst);
    plane.dst_pitch = ptrdiff_t{dst_w} * kRgbaBytes;
    plane.dst_columns = plane.columns = dst_w;
    plane.dst_rows = plane.rows = dst_h;
    plane.sample_bytes = kRgbaBytes;
    sample_plane(plane);
}

void ovrin_resize_rgba8888_get_pos(int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h,
                                   ovrin_rgba_band* band) {
    advance_rgba_band(*band, src_h, dst_h, {src_w, dst_w, 0});
}

void _resize_rgba8888_tp(void* band) {
    auto* record = static_cast<ovrin_rgba_band*>(band);
    run_rgba_band(*record, packed_rows(*record), BandRows::kAdd);
}

void ovrin_resize_rgba8888_tps(const uint8_t* src, uint32_t* dst, int32_t src_w, int32_t src_h,
                               int32_t dst_w, int32_t dst_h) {
    const bool done = fits_band_record(src_w, src_h, dst_w, dst_h) &&
                      resize_in_bands(first_band(src, dst, src_w, src_h, dst_w, dst_h));
    if (!done) ovrin_resize_rgba8888_sg(src, dst, src_w, src_h, dst_w, dst_h);
}
