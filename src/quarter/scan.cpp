// SPDX-License-Identifier: Apache-2.0
#include "quarter/scan.h"

namespace ovrin {

namespace {

int64_t count_points(QuarterPoints points, int32_t rows) {
    int64_t count = 0;
    for (; points.cell() < rows; points.next()) ++count;
    return count;
}

}  // namespace

void walk_rows(ScanState& state, const ScanAxis& axis, int32_t rows) {
    const int64_t top = count_points(top_points(state, axis), rows);
    const int64_t bottom = count_points(bottom_points(state, axis), rows);
    state.top_point = wrapping_add(state.top_point, top * axis.src_rows);
    state.bottom_point = wrapping_add(state.bottom_point, bottom * axis.src_rows);
    state.row_base = wrapping_add(state.row_base, int64_t{rows} * axis.dst_rows);
    state.top_left = wrapping_add(state.top_left, top * axis.row_indices);
    state.top_right = wrapping_add(state.top_right, top * axis.row_indices);
    state.bottom_left = wrapping_add(state.bottom_left, bottom * axis.row_indices);
    state.bottom_right = wrapping_add(state.bottom_right, bottom * axis.row_indices);
}

}  // namespace ovrin
