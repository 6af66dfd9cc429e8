// SPDX-License-Identifier: Apache-2.0
// Band records, filled with what the fuzzer's bytes say.
#pragma once

#include <cstring>

#include "support.h"

namespace fuzz {

// A record of garbage: a field that a function should not read differs from what it should be.
template <class Band>
Band garbage() {
    Band band;
    memset(static_cast<void*>(&band), 0x5A, sizeof band);
    return band;
}

template <class Band>
bool same(const Band& a, const Band& b) {
    return memcmp(&a, &b, sizeof a) == 0;
}

inline void start(ovrin_rgba_band& band) {
    band.start_row = band.row_acc = band.src_offset = 0;
    band.di_11 = band.di_13 = band.di_31 = band.di_33 = 0;
}

template <class Band>
void start_luma(Band& band) {
    band.y_start_row = band.y_row_base = band.src_y_offset = 0;
    band.y_top_left = band.y_top_right = band.y_bottom_left = band.y_bottom_right = 0;
}

inline void start(ovrin_yuv_band& band) {
    start_luma(band);
    band.uv_start_row = band.uv_row_base = band.src_uv_offset = 0;
    band.uv_top_left = band.uv_top_right = band.uv_bottom_left = band.uv_bottom_right = 0;
}

inline void start(ovrin_nv21_band& band) {
    start_luma(band);
    band.vu_start_row = band.vu_row_base = band.src_vu_offset = 0;
    band.vu_top_left = band.vu_top_right = band.vu_bottom_left = band.vu_bottom_right = 0;
}

}  // namespace fuzz
