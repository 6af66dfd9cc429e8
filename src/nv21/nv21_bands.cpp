// SPDX-License-Identifier: Apache-2.0
// NV21, bands for callers with a scheduler of their own.
#include "nv21/nv21.h"
#include "yuv420/bands.h"

using namespace ovrin;

void ovrin_resize_nv21_get_pos(int32_t src_width, int32_t src_height, int32_t dst_width,
                               int32_t dst_height, ovrin_nv21_band* band) {
    BandWalk walk(*band, {kNv21, dst_width, dst_height}, src_height);
    PlaneWalk& chroma = walk.chroma();
    const int64_t first_rows = chroma.rows();
    if (chroma.ends_in_open_row()) chroma.walk(static_cast<int32_t>(chroma.rows_left()));
    // The rows that complete a band are stepped by the picture's width, not by its row length.
    const auto pitch = [](int32_t luma_row) {
        return int64_t{half_rounded_up(luma_row)} * kNv21.chroma_bytes();
    };
    walk.finish(
        {band->src_vu_offset, band->vu_rows},
        first_rows * pitch(band->src_row_bytes) + (chroma.rows() - first_rows) * pitch(src_width));
}

void _resize_nv21_tp(void* record) {
    auto& band = *static_cast<ovrin_nv21_band*>(record);
    run_band(band, contiguous_source(kNv21, band.src, band.src_width, band.src_height),
             {band.src_vu_offset, band.vu_rows}, contiguous_destination(band));
}

void _resize_y_nv21_tp(void* record) {
    auto& band = *static_cast<ovrin_nv21_band*>(record);
    Yuv420Source source = two_planes(band.src, band.src_vu, band.src_width, band.src_height);
    source.stride = band.src_row_bytes;
    run_band(band, source, {band.src_vu_offset, band.vu_rows}, separate_destination(band));
}
