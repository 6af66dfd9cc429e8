// SPDX-License-Identifier: Apache-2.0
// Band records, field by field.
#pragma once

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <cstdint>
#include <vector>

namespace ovrin_test {

template <class Band>
struct Field {
    const char* name;
    int32_t Band::*member;
};

inline const std::vector<Field<ovrin_rgba_band>>& fields_of(const ovrin_rgba_band&) {
    using B = ovrin_rgba_band;
    static const std::vector<Field<B>> fields = {
        {"start_row", &B::start_row},   {"row_q1", &B::row_q1},
        {"row_q3", &B::row_q3},         {"row_acc", &B::row_acc},
        {"di_11", &B::di_11},           {"di_13", &B::di_13},
        {"di_31", &B::di_31},           {"di_33", &B::di_33},
        {"src_w", &B::src_w},           {"src_h", &B::src_h},
        {"src_stride", &B::src_stride}, {"src_rows", &B::src_rows},
        {"dst_w", &B::dst_w},           {"dst_h", &B::dst_h},
        {"dst_x", &B::dst_x},           {"dst_skip", &B::dst_skip},
        {"band_rows", &B::band_rows},   {"src_offset", &B::src_offset},
        {"rows_to_do", &B::rows_to_do}, {"done", &B::done}};
    return fields;
}

inline const std::vector<Field<ovrin_yuv_band>>& fields_of(const ovrin_yuv_band&) {
    using B = ovrin_yuv_band;
    static const std::vector<Field<B>> fields = {{"y_start_row", &B::y_start_row},
                                                 {"y_top_point", &B::y_top_point},
                                                 {"y_bottom_point", &B::y_bottom_point},
                                                 {"y_row_base", &B::y_row_base},
                                                 {"y_top_left", &B::y_top_left},
                                                 {"y_top_right", &B::y_top_right},
                                                 {"y_bottom_left", &B::y_bottom_left},
                                                 {"y_bottom_right", &B::y_bottom_right},
                                                 {"uv_start_row", &B::uv_start_row},
                                                 {"uv_top_point", &B::uv_top_point},
                                                 {"uv_bottom_point", &B::uv_bottom_point},
                                                 {"uv_row_base", &B::uv_row_base},
                                                 {"uv_top_left", &B::uv_top_left},
                                                 {"uv_top_right", &B::uv_top_right},
                                                 {"uv_bottom_left", &B::uv_bottom_left},
                                                 {"uv_bottom_right", &B::uv_bottom_right},
                                                 {"src_width", &B::src_width},
                                                 {"src_height", &B::src_height},
                                                 {"src_row_bytes", &B::src_row_bytes},
                                                 {"src_rows", &B::src_rows},
                                                 {"dst_width", &B::dst_width},
                                                 {"dst_height", &B::dst_height},
                                                 {"band_rows", &B::band_rows},
                                                 {"src_y_offset", &B::src_y_offset},
                                                 {"src_uv_offset", &B::src_uv_offset},
                                                 {"y_rows", &B::y_rows},
                                                 {"uv_rows", &B::uv_rows},
                                                 {"done", &B::done}};
    return fields;
}

inline const std::vector<Field<ovrin_nv21_band>>& fields_of(const ovrin_nv21_band&) {
    using B = ovrin_nv21_band;
    static const std::vector<Field<B>> fields = {{"y_start_row", &B::y_start_row},
                                                 {"y_top_point", &B::y_top_point},
                                                 {"y_bottom_point", &B::y_bottom_point},
                                                 {"y_row_base", &B::y_row_base},
                                                 {"y_top_left", &B::y_top_left},
                                                 {"y_top_right", &B::y_top_right},
                                                 {"y_bottom_left", &B::y_bottom_left},
                                                 {"y_bottom_right", &B::y_bottom_right},
                                                 {"vu_start_row", &B::vu_start_row},
                                                 {"vu_top_point", &B::vu_top_point},
                                                 {"vu_bottom_point", &B::vu_bottom_point},
                                                 {"vu_row_base", &B::vu_row_base},
                                                 {"vu_top_left", &B::vu_top_left},
                                                 {"vu_top_right", &B::vu_top_right},
                                                 {"vu_bottom_left", &B::vu_bottom_left},
                                                 {"vu_bottom_right", &B::vu_bottom_right},
                                                 {"src_width", &B::src_width},
                                                 {"src_height", &B::src_height},
                                                 {"src_row_bytes", &B::src_row_bytes},
                                                 {"src_rows", &B::src_rows},
                                                 {"dst_width", &B::dst_width},
                                                 {"dst_height", &B::dst_height},
                                                 {"band_rows", &B::band_rows},
                                                 {"src_y_offset", &B::src_y_offset},
                                                 {"src_vu_offset", &B::src_vu_offset},
                                                 {"y_rows", &B::y_rows},
                                                 {"vu_rows", &B::vu_rows},
                                                 {"done", &B::done}};
    return fields;
}

inline bool same_pointers(const ovrin_rgba_band& a, const ovrin_rgba_band& b) {
    return a.src == b.src && a.dst == b.dst;
}
inline bool same_pointers(const ovrin_yuv_band& a, const ovrin_yuv_band& b) {
    return a.src == b.src && a.dst == b.dst && a.src_u == b.src_u && a.src_v == b.src_v &&
           a.work == b.work;
}
inline bool same_pointers(const ovrin_nv21_band& a, const ovrin_nv21_band& b) {
    return a.src == b.src && a.dst == b.dst && a.src_vu == b.src_vu && a.work == b.work;
}

// Compares two records and names the first field that differs.
template <class Band>
::testing::AssertionResult same_record(const Band& actual, const Band& expected) {
    for (const Field<Band>& field : fields_of(actual)) {
        if (actual.*field.member != expected.*field.member) {
            return ::testing::AssertionFailure() << field.name << " is " << actual.*field.member
                                                 << ", not " << expected.*field.member;
        }
    }
    if (!same_pointers(actual, expected)) {
        return ::testing::AssertionFailure() << "a pointer was changed";
    }
    return ::testing::AssertionSuccess();
}

// A record whose every field holds a value of its own, none of them plausible.
template <class Band>
Band marked_record() {
    Band band = {};
    int32_t mark = -1000003;
    for (const Field<Band>& field : fields_of(band)) band.*field.member = mark -= 1009;
    return band;
}

}  // namespace ovrin_test
