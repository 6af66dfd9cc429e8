// SPDX-License-Identifier: Apache-2.0
// Planar 4:2:0 in bands.
#include "yuv/planar.h"
#include "yuv420/bands.h"
#include "yuv420/threaded.h"

namespace ovrin {

namespace {

void run_contiguous(void* band) {
    auto& record = *static_cast<ovrin_yuv_band*>(band);
    run_yuv420_band(
        record, contiguous_source(kPlanarChroma, record.src, record.src_width, record.src_height),
        contiguous_target(record), record.src_uv_offset, record.uv_rows);
}

void run_separate(void* band) {
    auto& record = *static_cast<ovrin_yuv_band*>(band);
    run_yuv420_band(record,
                    three_planes(record.src, record.src_u, record.src_v, record.src_width,
                                 record.src_height, record.src_row_bytes),
                    separate_target(record), record.src_uv_offset, record.uv_rows);
}

}  // namespace

}  // namespace ovrin

using namespace ovrin;

void ovrin_resize_yuv420_get_pos(int32_t /*src_width*/, int32_t src_height, int32_t dst_width,
                                 int32_t dst_height, ovrin_yuv_band* band) {
    BandState state = load_state(*band);
    PlaneWalk luma(state.luma, luma_axis(kPlanarChroma, src_height, dst_width, dst_height));
    luma.walk(band->band_rows);
    PlaneWalk chroma(state.chroma, chroma_axis(kPlanarChroma, src_height, dst_width, dst_height));
    chroma.walk(least_chroma_rows(band->band_rows));
    while (chroma.ends_in_open_row() && chroma.rows_left() > 0) chroma.walk(1);
    store_state(*band, state);
    band->src_y_offset =
        wrapping_add(band->src_y_offset, int64_t{luma.rows()} * band->src_row_bytes);
    band->src_uv_offset = wrapping_add(
        band->src_uv_offset, int64_t{chroma.rows()} * half_rounded_up(band->src_row_bytes));
    band->y_rows = luma.rows_or_none();
    band->uv_rows = chroma.rows_inside();
}

void _resize_yuv420_tp(void* band) {
    run_contiguous(band);
}

void _resize_y_u_v_tp(void* band) {
    run_separate(band);
}

void ovrin_resize_yuv420_tps(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                             int32_t dst_w, int32_t dst_h) {
    const Yuv420Source source = contiguous_source(kPlanarChroma, src, src_w, src_h);
    if (!resize_yuv420_in_bands(source, dst, dst_w, dst_h)) {
        ovrin_resize_yuv420_sg(src, dst, src_w, src_h, dst_w, dst_h);
    }
}

void ovrin_resize_y_u_v_tps(const uint8_t* src_y, const uint8_t* src_u, const uint8_t* src_v,
                            uint8_t* dst, int32_t src_w, int32_t src_h, int32_t dst_w,
                            int32_t dst_h, const ovrin_resize_target* target) {
    if (target != nullptr && threaded_canvas_is_rejected(*target)) return;
    const Yuv420Source source =
        three_planes(src_y, src_u, src_v, src_w, src_h, threaded_row_bytes(target, src_w));
    const bool done = src_h >= kThreadedRows &&
                      (target != nullptr ? resize_yuv420_into_canvas_in_bands(source, *target)
                                         : resize_yuv420_in_bands(source, dst, dst_w, dst_h));
    if (!done) {
        ovrin_resize_y_u_v_sg(src_y, src_u, src_v, dst, src_w, src_h, dst_w, dst_h, target);
    }
}
