// SPDX-License-Identifier: Apache-2.0
#include "bands/split.h"
#include "quarter/threaded.h"
#include "rgba/rgba_band.h"

namespace ovrin {

namespace {

RgbaRows packed_rows(const ovrin_rgba_band& band) {
    return {band.src_w, band.dst_w, 0};
}

}  // namespace

}  // namespace ovrin

using namespace ovrin;

void ovrin_resize_rgba8888_sg(const uint8_t* src, uint32_t* dst, int32_t src_w, int32_t src_h,
                              int32_t dst_w, int32_t dst_h) {
    sample_plane(rgba_plane({src, src_w, src_w, src_h}, {dst, dst_w, dst_w, dst_h}));
}

void ovrin_resize_rgba8888_get_pos(int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h,
                                   ovrin_rgba_band* band) {
    advance_rgba_band(*band, src_h, dst_h, {src_w, dst_w, 0});
}

void _resize_rgba8888_tp(void* band) {
    auto* record = static_cast<ovrin_rgba_band*>(band);
    run_rgba_band(*record, packed_rows(*record));
}

void ovrin_resize_rgba8888_tps(const uint8_t* src, uint32_t* dst, int32_t src_w, int32_t src_h,
                               int32_t dst_w, int32_t dst_h) {
    const QuarterPlane plane = rgba_plane({src, src_w, src_w, src_h}, {dst, dst_w, dst_w, dst_h});
    const int32_t bands = picture_bands(src_h, dst_h);
    if (bands < 2 || !sample_in_bands({&plane, 1, bands})) sample_plane(plane);
}
