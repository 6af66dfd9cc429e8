// SPDX-License-Identifier: Apache-2.0
// Band records as a driver makes them, by the replayed walkers.
#pragma once

#include <algorithm>

#include "reference/band_walkers.h"
#include "support/extents.h"

namespace ovrin_test {

inline void replay_walk(const Sizes& s, ovrin_yuv_band& band) {
    reference::yuv420_get_pos(s.src_h, s.dst_w, s.dst_h, band);
}
inline void replay_walk(const Sizes& s, ovrin_nv21_band& band) {
    reference::nv21_get_pos(s.src_w, s.src_h, s.dst_w, s.dst_h, band);
}

// Turns `band`, of which other fields stay as they are, into the record of band `index` of a
// picture in planes. It has the rows that a driver gives it: the last band takes what is left.
template <class Band>
Band walk_to(Band band, const Sizes& s, int32_t band_rows, int32_t stride, int32_t index) {
    constexpr auto chroma = reference::kChromaFields<Band>;
    reference::start_at_the_top(band);
    band.src_width = s.src_w;
    band.src_height = s.src_h;
    band.src_row_bytes = stride;
    band.dst_width = s.dst_w;
    band.dst_height = s.dst_h;
    band.band_rows = band_rows;
    for (int32_t i = 0; i < index; ++i) replay_walk(s, band);
    Band next = band;
    replay_walk(s, next);
    band.y_rows = next.y_rows;
    band.*chroma.rows = next.*chroma.rows;
    if (band.y_start_row + band_rows >= s.src_h) {
        band.y_rows = s.src_h - band.y_start_row;
        const int32_t rows = (s.src_h + 1) >> 1;
        if (rows > band.*chroma.start_row) band.*chroma.rows = rows - band.*chroma.start_row;
    }
    return band;
}

// The same for RGBA8888; with a canvas, `x` and `skip` pixels lie beside the picture.
inline ovrin_rgba_band walk_to(ovrin_rgba_band band, const Sizes& s, int32_t band_rows,
                               int32_t stride, int32_t x, int32_t skip, int32_t index) {
    reference::start_at_the_top(band);
    band.src_w = s.src_w;
    band.src_h = s.src_h;
    band.src_stride = stride;
    band.dst_w = s.dst_w;
    band.dst_h = s.dst_h;
    band.dst_x = x;
    band.dst_skip = skip;
    band.band_rows = band_rows;
    for (int32_t i = 0; i < index; ++i) {
        reference::rgba8888_get_pos_keep_ratio(s.src_h, s.dst_h, x + s.dst_w + skip, band);
    }
    band.rows_to_do = std::min(band_rows, s.src_h - band.start_row);
    return band;
}

}  // namespace ovrin_test
