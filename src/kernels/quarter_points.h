// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <stdint.h>

namespace ovrin {

// The quarter or three-quarter points of successive targets along one axis, and the source cells
// (rows or columns) that hold them.
//
// With S source cells scaled to D targets, the axis is measured in units of which a source cell
// holds D and a target S. Target k's point lies at first + k * S, so in source cell
// (first + k * S) / D. Stepping keeps quotient and remainder, so that walking an axis divides only
// once and nothing overflows.
class QuarterPoints {
public:
    // Cells are counted from the one that starts at position 0. A point that lies before it is
    // behind the walk: it, and all points after it, are never met.
    QuarterPoints(int64_t first, int32_t source, int32_t target) {
        if (first < 0 || source < 1 || target < 1) return;
        cell_ = first / target;
        rest_ = static_cast<int32_t>(first % target);
        step_cells_ = source / target;
        step_rest_ = source % target;
        target_ = target;
    }

    // The source cell that holds the current target's point.
    int64_t cell() const { return cell_; }

    void next() {
        cell_ += step_cells_;
        const int64_t rest = int64_t{rest_} + step_rest_;
        const bool carry = rest >= target_;
        cell_ += carry ? 1 : 0;
        rest_ = static_cast<int32_t>(carry ? rest - target_ : rest);
    }

    // To a later target whose point lies a whole number of cells further on.
    void skip_cells(int64_t cells) { cell_ += cells; }

private:
    int64_t cell_ = INT64_MAX;
    int32_t rest_ = 0;
    int32_t step_cells_ = 0;
    int32_t step_rest_ = 0;
    int32_t target_ = 1;
};

// The source samples of one target sample within a row, as sample indices.
struct Tap {
    int32_t left;   // at the target's quarter point
    int32_t right;  // at its three-quarter point; never less than left
};

// The columns of a row from some target sample on.
struct QuarterColumns {
    QuarterPoints left;
    QuarterPoints right;

    Tap next() {
        const Tap tap = {static_cast<int32_t>(left.cell()), static_cast<int32_t>(right.cell())};
        left.next();
        right.next();
        return tap;
    }

    void skip_cells(int64_t cells) {
        left.skip_cells(cells);
        right.skip_cells(cells);
    }
};

// Where the first target's two points lie on an axis of `source` cells.
inline int32_t quarter_point(int32_t source) {
    return source >> 2;
}

inline int32_t three_quarter_point(int32_t source) {
    return static_cast<int32_t>((int64_t{3} * source) >> 2);
}

}  // namespace ovrin
