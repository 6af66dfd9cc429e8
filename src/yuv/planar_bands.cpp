// SPDX-License-Identifier: Apache-2.0
// Planar 4:2:0, bands for callers with a scheduler of their own.
#include "yuv/planar.h"
#include "yuv420/bands.h"

using namespace ovrin;

void ovrin_resize_yuv420_get_pos(int32_t /*src_width*/, int32_t src_height, int32_t dst_width,
                                 int32_t dst_height, ovrin_yuv_band* band) {
    BandWalk walk(*band, {kI420, dst_width, dst_height}, src_height);
    PlaneWalk& chroma = walk.chroma();
    while (chroma.ends_in_open_row() && chroma.rows_left() > 0) chroma.walk(1);
    const int64_t chroma_pitch = half_rounded_up(band->src_row_bytes);
    walk.finish({band->src_uv_offset, band->uv_rows}, chroma.rows() * chroma_pitch);
}

void _resize_yuv420_tp(void* record) {
    auto& band = *static_cast<ovrin_yuv_band*>(record);
    run_band(band, contiguous_source(kI420, band.src, band.src_width, band.src_height),
             {band.src_uv_offset, band.uv_rows}, contiguous_destination(band));
}

void _resize_y_u_v_tp(void* record) {
    auto& band = *static_cast<ovrin_yuv_band*>(record);
    Yuv420Source source =
        three_planes(band.src, band.src_u, band.src_v, band.src_width, band.src_height);
    source.stride = band.src_row_bytes;
    run_band(band, source, {band.src_uv_offset, band.uv_rows}, separate_destination(band));
}
