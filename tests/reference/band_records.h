// SPDX-License-Identifier: Apache-2.0
// The running fields of the band records, each under one name for all planes and records.
#pragma once

#include <ovrinresize.h>

#include <cstdint>
#include <initializer_list>

namespace reference {

// Of one plane: where a band starts, the next pending point of each kind, the scaled coordinate of
// the current source row, where the next samples go, and where the source's rows lie.
template <class Band>
struct PlaneFields {
    using Field = int32_t Band::*;
    Field start_row, top_point, bottom_point, row_base;
    Field top_left, top_right, bottom_left, bottom_right;
    Field src_offset, rows;
};

inline constexpr PlaneFields<ovrin_rgba_band> kRgbaFields = {
    &ovrin_rgba_band::start_row,  &ovrin_rgba_band::row_q1, &ovrin_rgba_band::row_q3,
    &ovrin_rgba_band::row_acc,    &ovrin_rgba_band::di_11,  &ovrin_rgba_band::di_13,
    &ovrin_rgba_band::di_31,      &ovrin_rgba_band::di_33,  &ovrin_rgba_band::src_offset,
    &ovrin_rgba_band::rows_to_do,
};

// Luma of either record of planes.
template <class Band>
inline constexpr PlaneFields<Band> kLumaFields = {
    &Band::y_start_row,  &Band::y_top_point, &Band::y_bottom_point, &Band::y_row_base,
    &Band::y_top_left,   &Band::y_top_right, &Band::y_bottom_left,  &Band::y_bottom_right,
    &Band::src_y_offset, &Band::y_rows,
};

template <class Band>
inline constexpr PlaneFields<Band> kChromaFields = {};
template <>
inline constexpr PlaneFields<ovrin_yuv_band> kChromaFields<ovrin_yuv_band> = {
    &ovrin_yuv_band::uv_start_row,    &ovrin_yuv_band::uv_top_point,
    &ovrin_yuv_band::uv_bottom_point, &ovrin_yuv_band::uv_row_base,
    &ovrin_yuv_band::uv_top_left,     &ovrin_yuv_band::uv_top_right,
    &ovrin_yuv_band::uv_bottom_left,  &ovrin_yuv_band::uv_bottom_right,
    &ovrin_yuv_band::src_uv_offset,   &ovrin_yuv_band::uv_rows,
};
template <>
inline constexpr PlaneFields<ovrin_nv21_band> kChromaFields<ovrin_nv21_band> = {
    &ovrin_nv21_band::vu_start_row,    &ovrin_nv21_band::vu_top_point,
    &ovrin_nv21_band::vu_bottom_point, &ovrin_nv21_band::vu_row_base,
    &ovrin_nv21_band::vu_top_left,     &ovrin_nv21_band::vu_top_right,
    &ovrin_nv21_band::vu_bottom_left,  &ovrin_nv21_band::vu_bottom_right,
    &ovrin_nv21_band::src_vu_offset,   &ovrin_nv21_band::vu_rows,
};

// What the first band of a plane starts from. Its points are not read.
template <class Band>
void start_at_the_top(Band& band, const PlaneFields<Band>& plane) {
    for (const auto field : {plane.start_row, plane.row_base, plane.top_left, plane.top_right,
                             plane.bottom_left, plane.bottom_right, plane.src_offset}) {
        band.*field = 0;
    }
}

inline void start_at_the_top(ovrin_rgba_band& band) {
    start_at_the_top(band, kRgbaFields);
}
template <class Band>
void start_at_the_top(Band& band) {
    start_at_the_top(band, kLumaFields<Band>);
    start_at_the_top(band, kChromaFields<Band>);
}

}  // namespace reference
