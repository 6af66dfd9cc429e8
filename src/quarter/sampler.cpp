// SPDX-License-Identifier: Apache-2.0
#include "quarter/sampler.h"

#include <string.h>

#include "kernels/kernels.h"

namespace ovrin {

namespace {

// Where the next samples of a source row go: those of the left columns and those of the right ones.
struct RowDestination {
    uint8_t* left;
    uint8_t* right;

    bool operator==(const RowDestination& other) const {
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
    RowDestination top_dst;
    RowDestination bottom_dst;
    int64_t rows;  // source rows in the scan

    bool has_top() const { return top.cell() < rows; }
    bool has_bottom() const { return bottom.cell() < rows; }
    // Both rows of one destination row lie in the scan and have all four samples in one place.
    bool has_pair() const {
        return has_top() && has_bottom() && top_dst == bottom_dst && top_dst.left == top_dst.right;
    }
};

// One strip of the plane: its columns, planned, and where they start.
struct Strip {
    const QuarterKernels& kernels;
    const QuarterPlan& plan;
    QuarterColumns columns;
};

// Calls walk(strip, bytes to its left) for one strip after another.
template <class Walk>
void for_each_strip(const QuarterPlane& plane, const Walk& walk) {
    PlanQuarters* const plan_quarters = kernels().plan_quarters;
    const QuarterRowShape shape = {plane.sample_bytes, plane.src_columns, plane.dst_columns};
    QuarterColumns columns = {
        {quarter_point(plane.src_columns), plane.src_columns, plane.dst_columns},
        {three_quarter_point(plane.src_columns), plane.src_columns, plane.dst_columns}};
    QuarterPlan plan;
    for (int32_t done = 0; done < plane.columns; done += plan.samples) {
        const QuarterColumns first = columns;
        const QuarterKernels& strip_kernels =
            plan_quarters(plan, shape, columns, plane.columns - done);
        walk(Strip{strip_kernels, plan, first}, ptrdiff_t{done} * plane.sample_bytes);
    }
}

const uint8_t* row_at(const QuarterPlane& plane, const QuarterPoints& points) {
    return plane.src + points.cell() * plane.src_pitch;
}

// The row of the next point, or this one's when the next lies past the plane's `rows`.
const uint8_t* row_after(const QuarterPlane& plane, QuarterPoints points, int64_t rows) {
    const uint8_t* current = row_at(plane, points);
    points.next();
    return points.cell() < rows ? row_at(plane, points) : current;
}

QuarterRows rows_at(const QuarterPlane& plane, const QuarterPoints& top,
                    const QuarterPoints& bottom, int64_t rows) {
    return {row_at(plane, top), row_at(plane, bottom), row_after(plane, top, rows),
            row_after(plane, bottom, rows)};
}

// Destination rows [first, end) of a plane.
struct RowRange {
    int32_t first;
    int32_t end;
};

// The points of a plane's rows from `row` on; `point` is that of the first row.
QuarterPoints points_from(const QuarterPlane& plane, int32_t point, int32_t row) {
    return {point + int64_t{row} * plane.src_rows, plane.src_rows, plane.dst_rows};
}

void store_strip(const QuarterPlane& plane, const Strip& strip, uint8_t* dst, RowRange range) {
    QuarterPoints top = points_from(plane, quarter_point(plane.src_rows), range.first);
    QuarterPoints bottom = points_from(plane, three_quarter_point(plane.src_rows), range.first);
    dst += range.first * plane.dst_pitch;
    for (int32_t j = range.first; j < range.end; ++j, dst += plane.dst_pitch) {
        strip.kernels.store_pair(dst, rows_at(plane, top, bottom, plane.src_rows), strip.plan);
        top.next();
        bottom.next();
    }
}

void add_taps(uint8_t* dst, const uint8_t* row, QuarterPoints points, const QuarterPlan& plan) {
    for (int32_t i = 0; i < plan.samples; ++i, points.next()) {
        const uint8_t* sample = row + points.cell() * plan.sample_bytes;
        for (int32_t c = 0; c < plan.sample_bytes; ++c, ++dst) {
            *dst = static_cast<uint8_t>(*dst + (sample[c] >> 2));
        }
    }
}

void add_row(const Strip& strip, const RowDestination& dst, const uint8_t* row) {
    if (dst.left == dst.right) {
        strip.kernels.add_row(dst.left, {row, row, row, row}, strip.plan);
        return;
    }
    // Only a record that no walk has made sends the columns' samples to two places.
    add_taps(dst.left, row, strip.columns.left, strip.plan);
    add_taps(dst.right, row, strip.columns.right, strip.plan);
}

// A destination row whose two source rows both lie in the scan is done in one go. Bands also hold
// halves of such pairs: a bottom row whose top lies in the band before, a top row whose bottom lies
// in the band after.
void add_strip(const QuarterPlane& plane, RowScan scan, const Strip& strip) {
    while (scan.has_top() || scan.has_bottom()) {
        const bool both = scan.has_pair();
        // On one source row the bottom half goes first: it closes the row that is open.
        const bool top_is_next = !scan.has_bottom() || scan.top.cell() < scan.bottom.cell();
        const bool take_top = both || (scan.has_top() && top_is_next);
        const bool take_bottom = both || !take_top;
        if (both) {
            strip.kernels.add_pair(scan.top_dst.left,
                                   rows_at(plane, scan.top, scan.bottom, scan.rows), strip.plan);
        } else if (take_top) {
            add_row(strip, scan.top_dst, row_at(plane, scan.top));
        } else {
            add_row(strip, scan.bottom_dst, row_at(plane, scan.bottom));
        }
        if (take_top) {
            scan.top.next();
            scan.top_dst.move(plane.dst_pitch);
        }
        if (take_bottom) {
            scan.bottom.next();
            scan.bottom_dst.move(plane.dst_pitch);
        }
    }
}

void clear_rows(const QuarterPlane& plane, RowRange range) {
    const size_t row_bytes =
        static_cast<size_t>(plane.columns) * static_cast<size_t>(plane.sample_bytes);
    uint8_t* row = plane.dst + range.first * plane.dst_pitch;
    for (int32_t j = range.first; j < range.end; ++j, row += plane.dst_pitch) {
        memset(row, 0, row_bytes);
    }
}

// Stores the rows that take(work) gives to work(range), once for every strip of the plane.
template <class Take>
void store_rows(const QuarterPlane& plane, const Take& take) {
    if (plane.columns < 1 || plane.rows < 1) return;
    if (plane.src_columns < 1 || plane.src_rows < 1) {
        take([&](RowRange range) { clear_rows(plane, range); });
        return;
    }
    for_each_strip(plane, [&](const Strip& strip, ptrdiff_t offset) {
        take([&](RowRange range) { store_strip(plane, strip, plane.dst + offset, range); });
    });
}

}  // namespace

void sample_plane(const QuarterPlane& plane) {
    store_rows(plane, [&](const auto& store) { store(RowRange{0, plane.rows}); });
}

void sample_plane_in_turns(const QuarterPlane& plane, TurnTaker& turns) {
    store_rows(plane, [&](const auto& store) {
        turns.take_pass([&](Turn turn) {
            const auto row = [&](int32_t band) {
                return static_cast<int32_t>(int64_t{plane.rows} * band / turns.bands());
            };
            store(RowRange{row(turn.first), row(turn.end)});
        });
    });
}

void add_band(const QuarterPlane& plane, const ScanState& state, int32_t band_rows,
              int32_t index_bytes) {
    if (plane.src_columns < 1) return;
    const auto at = [&](int32_t index) { return plane.dst + ptrdiff_t{index} * index_bytes; };
    const ScanAxis axis = {plane.src_rows, plane.dst_rows, 0};
    const RowScan whole = {
        top_points(state, axis),
        bottom_points(state, axis),
        {at(state.top_left), at(state.top_right)},
        {at(state.bottom_left), at(state.bottom_right)},
        band_rows,
    };
    for_each_strip(plane, [&](const Strip& strip, ptrdiff_t offset) {
        RowScan scan = whole;
        scan.top_dst.move(offset);
        scan.bottom_dst.move(offset);
        add_strip(plane, scan, strip);
    });
}

}  // namespace ovrin
