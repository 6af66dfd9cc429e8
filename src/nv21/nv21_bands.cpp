// SPDX-License-Identifier: Apache-2.0
// NV21 in bands.
#include "nv21/nv21.h"
#include "yuv420/bands.h"
#include "yuv420/threaded.h"

namespace ovrin {

namespace {

void run_contiguous(void* band) {
    auto& record = *static_cast<ovrin_nv21_band*>(band);
    run_yuv420_band(
        record,
        contiguous_source(kInterleavedChroma, record.src, record.src_width, record.src_height),
        contiguous_target(record), record.src_vu_offset, record.vu_rows);
}

void run_separate(void* band) {
    auto& record = *static_cast<ovrin_nv21_band*>(band);
    run_yuv420_band(record,
                    two_planes(record.src, record.src_vu, record.src_width, record.src_height,
                               record.src_row_bytes),
                    separate_target(record), record.src_vu_offset, record.vu_rows);
}

int64_t chroma_row_bytes(int32_t luma_row_bytes) {
    return int64_t{half_rounded_up(luma_row_bytes)} * kInterleavedChroma.sample_bytes;
}

}  // namespace

}  // namespace ovrin

using namespace ovrin;

void ovrin_resize_nv21_get_pos(int32_t src_width, int32_t src_height, int32_t dst_width,
                               int32_t dst_height, ovrin_nv21_band* band) {
    BandState state = load_state(*band);
    PlaneWalk luma(state.luma, luma_axis(kInterleavedChroma, src_height, dst_width, dst_height));
    luma.walk(band->band_rows);
    PlaneWalk chroma(state.chroma,
                     chroma_axis(kInterleavedChroma, src_height, dst_width, dst_height));
    chroma.walk(least_chroma_rows(band->band_rows));
    const int64_t first_rows = chroma.rows();
    if (chroma.ends_in_open_row()) chroma.walk(static_cast<int32_t>(chroma.rows_left()));
    store_state(*band, state);
    band->src_y_offset =
        wrapping_add(band->src_y_offset, int64_t{luma.rows()} * band->src_row_bytes);
    // The rows that complete a band are stepped by the picture's width, not by its row length.
    band->src_vu_offset = wrapping_add(
        band->src_vu_offset, first_rows * chroma_row_bytes(band->src_row_bytes) +
                                 (chroma.rows() - first_rows) * chroma_row_bytes(src_width));
    band->y_rows = luma.rows_or_none();
    band->vu_rows = chroma.rows_inside();
}

void _resize_nv21_tp(void* band) {
    run_contiguous(band);
}

void _resize_y_nv21_tp(void* band) {
    run_separate(band);
}

void ovrin_resize_nv21_tps(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                           int32_t dst_w, int32_t dst_h) {
    const Yuv420Source source = contiguous_source(kInterleavedChroma, src, src_w, src_h);
    if (!resize_yuv420_in_bands(source, dst, dst_w, dst_h)) {
        ovrin_resize_nv21_sg(src, dst, src_w, src_h, dst_w, dst_h);
    }
}

void ovrin_resize_y_nv_tps(const uint8_t* src_y, const uint8_t* src_vu, uint8_t* dst, int32_t src_w,
                           int32_t src_h, int32_t dst_w, int32_t dst_h,
                           const ovrin_resize_target* target) {
    if (target != nullptr && threaded_canvas_is_rejected(*target)) return;
    const Yuv420Source source =
        two_planes(src_y, src_vu, src_w, src_h, threaded_row_bytes(target, src_w));
    const bool done = src_h >= kThreadedRows &&
                      (target != nullptr ? resize_yuv420_into_canvas_in_bands(source, *target)
                                         : resize_yuv420_in_bands(source, dst, dst_w, dst_h));
    if (!done) {
        ovrin_resize_y_nv_sg(src_y, src_vu, dst, src_w, src_h, dst_w, dst_h, target);
    }
}
