// SPDX-License-Identifier: Apache-2.0
// Band records, field by field.
#pragma once

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <cstdint>
#include <vector>

#include "reference/band_records.h"

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

// Either record of planes.
template <class Band>
const std::vector<Field<Band>>& fields_of(const Band&) {
    constexpr auto luma = reference::kLumaFields<Band>;
    constexpr auto chroma = reference::kChromaFields<Band>;
    static const std::vector<Field<Band>> fields = {{"luma's start row", luma.start_row},
                                                    {"luma's top point", luma.top_point},
                                                    {"luma's bottom point", luma.bottom_point},
                                                    {"luma's row base", luma.row_base},
                                                    {"luma's top left", luma.top_left},
                                                    {"luma's top right", luma.top_right},
                                                    {"luma's bottom left", luma.bottom_left},
                                                    {"luma's bottom right", luma.bottom_right},
                                                    {"luma's source offset", luma.src_offset},
                                                    {"luma's rows", luma.rows},
                                                    {"chroma's start row", chroma.start_row},
                                                    {"chroma's top point", chroma.top_point},
                                                    {"chroma's bottom point", chroma.bottom_point},
                                                    {"chroma's row base", chroma.row_base},
                                                    {"chroma's top left", chroma.top_left},
                                                    {"chroma's top right", chroma.top_right},
                                                    {"chroma's bottom left", chroma.bottom_left},
                                                    {"chroma's bottom right", chroma.bottom_right},
                                                    {"chroma's source offset", chroma.src_offset},
                                                    {"chroma's rows", chroma.rows},
                                                    {"src_width", &Band::src_width},
                                                    {"src_height", &Band::src_height},
                                                    {"src_row_bytes", &Band::src_row_bytes},
                                                    {"src_rows", &Band::src_rows},
                                                    {"dst_width", &Band::dst_width},
                                                    {"dst_height", &Band::dst_height},
                                                    {"band_rows", &Band::band_rows},
                                                    {"done", &Band::done}};
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
