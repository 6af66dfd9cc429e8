// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "kernels/quarter_points.h"

namespace ovrin {

// The vertical state of the sampler, frozen between two source rows, as band records hold it.
//
// A destination row takes samples from a top source row (its quarter point) and a bottom one (its
// three-quarter point). The points and the base of the current source row are positions on the
// vertical axis (see QuarterPoints); the indices say where in the destination the next samples of
// each kind are added. Points and base wrap at 32 bits in tall pictures; only their distance is
// used, which stays below source + destination rows.
struct ScanState {
    int32_t top_point;
    int32_t bottom_point;
    int32_t row_base;
    int32_t top_left;
    int32_t top_right;
    int32_t bottom_left;
    int32_t bottom_right;
};

// The rows of one plane, and the destination indices from one row to the next.
struct ScanAxis {
    int32_t src_rows;
    int32_t dst_rows;
    int32_t row_indices;
};

inline int32_t wrapping_add(int32_t a, int64_t b) {
    return static_cast<int32_t>(static_cast<uint32_t>(a) + static_cast<uint32_t>(b));
}

// Position of a point relative to the top of the current source row.
inline int32_t distance_to(const ScanState& state, int32_t point) {
    return static_cast<int32_t>(static_cast<uint32_t>(point) -
                                static_cast<uint32_t>(state.row_base));
}

inline QuarterPoints top_points(const ScanState& state, const ScanAxis& axis) {
    return {distance_to(state, state.top_point), axis.src_rows, axis.dst_rows};
}

inline QuarterPoints bottom_points(const ScanState& state, const ScanAxis& axis) {
    return {distance_to(state, state.bottom_point), axis.src_rows, axis.dst_rows};
}

// Records do not hold the first points: a picture that has not been started has none yet.
inline void start_points(ScanState& state, int32_t src_rows) {
    state.top_point = quarter_point(src_rows);
    state.bottom_point = three_quarter_point(src_rows);
}

// Some destination row has received its top samples but not yet its bottom samples.
inline bool row_is_open(const ScanState& state) {
    return state.top_left != state.bottom_left || state.top_right != state.bottom_right ||
           state.top_left != state.top_right;
}

// Moves the state on as sampling `rows` source rows would, without touching pixels.
void walk_rows(ScanState& state, const ScanAxis& axis, int32_t rows);

}  // namespace ovrin
