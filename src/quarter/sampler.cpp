// SPDX-License-Identifier: Apache-2.0
#include "quarter/sampler.h"

#include <string.h>

#include "kernels/kernels.h"

namespace ovrin {

namespace {

using PairKernel = decltype(QuarterKernels::store_pair);

// Where the next samples of a source row go: those of the left columns and those of the right ones.
struct RowTarget {
    uint8_t* left;
    uint8_t* right;

    bool operator==(const RowTarget& other) const {
        return left == other.left && right == other.right;
    }
    void move(ptrdiff_t bytes) {
        left += bytes;
        right += bytes;
    }
};

// The rows to sample: which source rows hold the pending points, and where their samples go.
struct RowScan {
    QuarterPoints top;
    QuarterPoints bottom;
    RowTarget top_target;
    RowTarget bottom_target;
    int64_t rows;  // source rows in the scan

    bool has_top() const { return top.cell() < rows; }
    bool has_bottom() const { return bottom.cell() < rows; }
    // Both rows of one target row lie in the scan and have all four samples in one place.
    bool has_pair() const {
        return has_top() && has_bottom() && top_target == bottom_target &&
               top_target.left == top_target.right;
    }
};

ColumnPlan plan_strip(QuarterPoints& left, QuarterPoints& right, int32_t count) {
    ColumnPlan columns;
    columns.count = count;
    for (int32_t i = 0; i < count; ++i, left.next(), right.next()) {
        columns.left[i] = static_cast<int32_t>(left.cell());
        columns.right[i] = static_cast<int32_t>(right.cell());
    }
    return columns;
}

void add_row(const QuarterKernels& kernel, const RowTarget& target, const uint8_t* row,
             const ColumnPlan& columns) {
    kernel.add_taps(target.left, row, columns.left, columns.count);
    kernel.add_taps(target.right, row, columns.right, columns.count);
}

// A target row whose two source rows both lie in the scan is done in one go. Bands also hold halves
// of such pairs: a bottom row whose top lies in the band before, a top row whose bottom lies
// behind.
void scan_strip(const QuarterPlane& plane, RowScan scan, const QuarterKernels& kernel,
                PairKernel pair, const ColumnPlan& columns) {
    const auto row = [&](const QuarterPoints& points) {
        return plane.src + points.cell() * plane.src_pitch;
    };
    while (scan.has_top() || scan.has_bottom()) {
        const bool both = scan.has_pair();
        // On one source row the bottom half goes first: it closes the row that is open.
        const bool top_is_next = !scan.has_bottom() || scan.top.cell() < scan.bottom.cell();
        const bool take_top = both || (scan.has_top() && top_is_next);
        const bool take_bottom = both || !take_top;
        if (both) {
            pair(scan.top_target.left, row(scan.top), row(scan.bottom), columns);
        } else if (take_top) {
            add_row(kernel, scan.top_target, row(scan.top), columns);
        } else {
            add_row(kernel, scan.bottom_target, row(scan.bottom), columns);
        }
        if (take_top) {
            scan.top.next();
            scan.top_target.move(plane.dst_pitch);
        }
        if (take_bottom) {
            scan.bottom.next();
            scan.bottom_target.move(plane.dst_pitch);
        }
    }
}

void scan_plane(const QuarterPlane& plane, RowScan scan, const QuarterKernels& kernel,
                PairKernel pair) {
    QuarterPoints left(quarter_point(plane.src_columns), plane.src_columns, plane.dst_columns);
    QuarterPoints right(three_quarter_point(plane.src_columns), plane.src_columns,
                        plane.dst_columns);
    for (int32_t done = 0; done < plane.samples;) {
        const int32_t rest = plane.samples - done;
        const int32_t count = rest < kStripColumns ? rest : kStripColumns;
        const ColumnPlan columns = plan_strip(left, right, count);
        scan_strip(plane, scan, kernel, pair, columns);
        const ptrdiff_t strip_bytes = ptrdiff_t{count} * plane.sample_bytes;
        scan.top_target.move(strip_bytes);
        scan.bottom_target.move(strip_bytes);
        done += count;
    }
}

void clear_plane(const QuarterPlane& plane) {
    const size_t row_bytes =
        static_cast<size_t>(plane.samples) * static_cast<size_t>(plane.sample_bytes);
    uint8_t* row = plane.dst;
    for (int32_t j = 0; j < plane.dst_rows; ++j, row += plane.dst_pitch) memset(row, 0, row_bytes);
}

}  // namespace

void sample_plane(const QuarterPlane& plane) {
    if (plane.samples < 1 || plane.dst_rows < 1) return;
    if (plane.src_columns < 1 || plane.src_rows < 1) {
        clear_plane(plane);
        return;
    }
    const RowTarget target = {plane.dst, plane.dst};
    const RowScan scan = {
        {quarter_point(plane.src_rows), plane.src_rows, plane.dst_rows},
        {three_quarter_point(plane.src_rows), plane.src_rows, plane.dst_rows},
        target,
        target,
        plane.src_rows,
    };
    const QuarterKernels& kernel = kernels().quarter[plane.sample_bytes - 1];
    scan_plane(plane, scan, kernel, kernel.store_pair);
}

void add_band(const QuarterPlane& plane, const ScanState& state, int32_t rows,
              int32_t index_bytes) {
    if (plane.src_columns < 1) return;
    const auto at = [&](int32_t index) { return plane.dst + ptrdiff_t{index} * index_bytes; };
    const ScanAxis axis = {plane.src_rows, plane.dst_rows, 0};
    const RowScan scan = {
        top_points(state, axis),
        bottom_points(state, axis),
        {at(state.top_left), at(state.top_right)},
        {at(state.bottom_left), at(state.bottom_right)},
        rows,
    };
    const QuarterKernels& kernel = kernels().quarter[plane.sample_bytes - 1];
    scan_plane(plane, scan, kernel, kernel.add_pair);
}

}  // namespace ovrin
