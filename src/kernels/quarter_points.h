// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <stdint.h>

#include "kernels/inline.h"

namespace ovrin {

// The quarter or three-quarter points of successive destination cells (rows or columns) along one
// axis, and the source cells that hold them.
//
// With S source cells scaled to D destination cells, the axis is measured in units of which a
// source cell holds D and a destination cell S. The point of destination cell k lies at
// first + k * S, so in source cell (first + k * S) / D. Stepping keeps quotient and remainder:
// walking an axis divides only once, and nothing overflows.
class QuarterPoints {
public:
    // Source cells are counted from the one that starts at position 0. When the first point lies
    // before that, the walk never meets a point.
    QuarterPoints(int64_t first, int32_t source, int32_t destination) {
        if (first < 0 || source < 1 || destination < 1) return;
        cell_ = first / destination;
        remainder_ = static_cast<int32_t>(first % destination);
        step_cells_ = source / destination;
        step_remainder_ = source % destination;
        destination_ = destination;
    }

    // The source cell that holds the current point.
    OVRIN_ALWAYS_INLINE int64_t cell() const { return cell_; }

    OVRIN_ALWAYS_INLINE void next() {
        cell_ += step_cells_;
        const int64_t remainder = int64_t{remainder_} + step_remainder_;
        const bool carry = remainder >= destination_;
        cell_ += carry ? 1 : 0;
        remainder_ = static_cast<int32_t>(carry ? remainder - destination_ : remainder);
    }

    // To a later point that lies a whole number of source cells further on.
    OVRIN_ALWAYS_INLINE void skip_cells(int64_t cells) { cell_ += cells; }

private:
    int64_t cell_ = INT64_MAX;
    int32_t remainder_ = 0;
    int32_t step_cells_ = 0;
    int32_t step_remainder_ = 0;
    int32_t destination_ = 1;
};

// The source samples of one destination sample within a row, as sample indices.
struct Tap {
    int32_t left;   // at the destination sample's quarter point
    int32_t right;  // at its three-quarter point; never less than left
};

// The columns of a row from some destination sample on.
struct QuarterColumns {
    QuarterPoints left;
    QuarterPoints right;

    OVRIN_ALWAYS_INLINE Tap next() {
        const Tap tap = {static_cast<int32_t>(left.cell()), static_cast<int32_t>(right.cell())};
        left.next();
        right.next();
        return tap;
    }

    OVRIN_ALWAYS_INLINE void skip_cells(int64_t cells) {
        left.skip_cells(cells);
        right.skip_cells(cells);
    }
};

// Where the first destination cell's two points lie on an axis of `source` cells.
inline int32_t quarter_point(int32_t source) {
    return source >> 2;
}

inline int32_t three_quarter_point(int32_t source) {
    return static_cast<int32_t>((int64_t{3} * source) >> 2);
}

}  // namespace ovrin
