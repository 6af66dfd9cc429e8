// SPDX-License-Identifier: Apache-2.0
#include "bilinear/rows.h"

#include "kernels/prefetch.h"

namespace ovrin {

namespace {

// One plane of source and canvas. Chroma has a sample for every second column and row, blended with
// the weights of the luma sample there.
struct Plane {
    const uint8_t* src;
    ptrdiff_t src_pitch;
    ptrdiff_t edge_pitch;  // from upper to lower sample where columns are not blended
    uint8_t* dst;          // where the picture begins in the canvas
    ptrdiff_t dst_pitch;
    int32_t sample_bytes;
    int32_t subsampling;     // 1 for luma and pixels, 2 for chroma
    bool rounds_columns_up;  // chroma column of source column i: (i + 1) / 2 instead of i / 2

    int32_t column(int32_t col_index) const {
        if (subsampling == 1) return col_index;
        return rounds_columns_up ? half_rounded_up(col_index) : col_index >> 1;
    }
    const uint8_t* src_row(int32_t row_index) const {
        return src + ptrdiff_t{row_index / subsampling} * src_pitch;
    }
    uint8_t* dst_row(int64_t row) const { return dst + row / subsampling * dst_pitch; }
    int32_t samples(int32_t columns) const {
        return columns < 1 ? 0 : static_cast<int32_t>((int64_t{columns} - 1) / subsampling + 1);
    }
    // The first of the rows from `row` on that has samples.
    int64_t first_row(int64_t row) const { return row + row % subsampling; }
};

Plane first_plane(const BilinearGeometry& g) {
    const int32_t bpp = bytes_per_pixel(g.layout);
    Plane plane = {};
    plane.src = g.src;
    plane.src_pitch = ptrdiff_t{g.src_stride} * bpp;
    plane.edge_pitch = plane.src_pitch;
    plane.dst_pitch = ptrdiff_t{g.canvas_width} * bpp;
    plane.dst = g.canvas + g.dst_y * plane.dst_pitch + ptrdiff_t{g.dst_x} * bpp;
    plane.sample_bytes = bpp;
    plane.subsampling = 1;
    return plane;
}

Plane chroma_plane(const BilinearGeometry& g, int32_t number) {
    const Yuv420Layout canvas = g.canvas_planes();
    const bool planar = g.layout == BilinearLayout::kPlanar;
    const int32_t bytes = canvas.format.chroma_bytes();
    Plane plane = {};
    plane.src = g.src_chroma[number];
    plane.src_pitch = ptrdiff_t{half_rounded_up(g.src_stride)} * bytes;
    // Planar edge columns take their lower sample a luma row further on, about two chroma rows
    // down.
    plane.edge_pitch = planar ? ptrdiff_t{g.src_stride} : plane.src_pitch;
    plane.dst_pitch = canvas.chroma_pitch();
    plane.dst = g.canvas + canvas.chroma_offset(number) + (g.dst_y >> 1) * plane.dst_pitch +
                ptrdiff_t{g.dst_x >> 1} * bytes;
    plane.sample_bytes = bytes;
    plane.subsampling = 2;
    plane.rounds_columns_up = planar;
    return plane;
}

template <class Function>
void for_each_plane(const BilinearGeometry& g, const Function& function) {
    function(first_plane(g));
    if (g.layout == BilinearLayout::kPixels) return;
    const int32_t planes = g.canvas_planes().format.chroma_planes;
    for (int32_t i = 0; i < planes; ++i) function(chroma_plane(g, i));
}

struct Range {
    int32_t first;
    int32_t end;
};

// Calls function(columns, first sample) for strips of a range of samples of a plane's rows.
template <class Function>
void for_each_strip(const Plane& plane, const BilinearAxes& axes, Range samples, int32_t to_right,
                    const Function& function) {
    BilinearColumns columns;
    columns.sample_bytes = plane.sample_bytes;
    columns.to_right = to_right;
    for (int32_t first = samples.first; first < samples.end; first += columns.count) {
        const int32_t left = samples.end - first;
        columns.count = left < kBilinearColumns ? left : kBilinearColumns;
        for (int32_t i = 0; i < columns.count; ++i) {
            const int32_t c = (first + i) * plane.subsampling;
            columns.index[i] = plane.column(axes.col_index[c]);
            columns.weight[i] = axes.col_weight[c];
        }
        function(columns, first);
    }
}

// The part of a source row that the columns name.
struct Span {
    int64_t first;
    int64_t bytes;
};

Span span_of(const BilinearColumns& columns) {
    const int64_t bytes = columns.sample_bytes;
    const int64_t first = bytes * columns.index[0];
    return {first, bytes * (columns.index[columns.count - 1] + int64_t{2}) - first};
}

// A strip of a plane, and two of its source rows, blended horizontally. A destination row takes two
// neighbouring ones, and the next destination row often takes one or both of them again.
class BlendedStrip {
public:
    BlendedStrip(const Kernels& set, const BilinearColumns& columns)
        : columns_(columns), kernels_(set.plan_bilinear(plan_, columns)) {}

    // Blends destination rows. Their lower samples lie `below` bytes past the upper ones: 0 where
    // rows are not blended.
    void blend(const Plane& plane, const BilinearAxes& axes, Range rows, ptrdiff_t below,
               int32_t first_sample) {
        const ptrdiff_t offset = ptrdiff_t{first_sample} * plane.sample_bytes;
        const int32_t step = plane.subsampling;
        for (int64_t r = plane.first_row(rows.first); r < rows.end; r += step) {
            const uint8_t* top = plane.src_row(axes.row_index[r]);
            const uint8_t* bottom = top + below;
            const BilinearSums& upper = sums(top, bottom);
            const BilinearSums& lower = sums(bottom, top);
            const uint8_t* next =
                r + step < rows.end ? plane.src_row(axes.row_index[r + step]) : top;
            kernels_.down(plane.dst_row(r) + offset, upper, lower, axes.row_weight[r], plan_,
                          rows_to_fetch(top, bottom, next, below));
        }
    }

private:
    // What `next` and the row below it take that `top` and `bottom` do not.
    BilinearNext rows_to_fetch(const uint8_t* top, const uint8_t* bottom, const uint8_t* next,
                               ptrdiff_t below) const {
        if (next <= top) return {};
        const Span span = span_of(columns_);
        const uint8_t* second = next + below + span.first;
        return {{next > bottom ? next + span.first : second, second}, span.bytes};
    }

    // The sums of `row`; those of `kept` stay as well if they are there.
    const BilinearSums& sums(const uint8_t* row, const uint8_t* kept) {
        const int held = row == rows_[0] ? 0 : 1;
        if (row == rows_[held]) return sums_[held];
        const int free = kept == rows_[0] ? 1 : 0;
        kernels_.across(sums_[free], row, plan_);
        rows_[free] = row;
        return sums_[free];
    }

    BilinearSums sums_[2];
    BilinearPlan plan_;
    const BilinearColumns& columns_;
    const uint8_t* rows_[2] = {nullptr, nullptr};
    const BilinearKernels kernels_;
};

// The last columns are blended with what lies below only, the last rows with what lies to the right
// only.
void blend_plane(const Kernels& set, const Plane& plane, const BilinearAxes& axes,
                 const BilinearExtent& extent) {
    const int32_t all = plane.samples(extent.columns);
    const int32_t inner = plane.samples(extent.columns - extent.edge_cols);
    const int32_t inner_rows = extent.rows > extent.edge_rows ? extent.rows - extent.edge_rows : 0;
    const Range upper_rows = {0, inner_rows};
    const Range last_rows = {inner_rows, extent.rows};
    for_each_strip(plane, axes, {0, inner}, 1, [&](const BilinearColumns& columns, int32_t first) {
        BlendedStrip strip(set, columns);
        strip.blend(plane, axes, upper_rows, plane.src_pitch, first);
        strip.blend(plane, axes, last_rows, 0, first);
    });
    for_each_strip(
        plane, axes, {inner, all}, 0, [&](const BilinearColumns& columns, int32_t first) {
            BlendedStrip(set, columns).blend(plane, axes, upper_rows, plane.edge_pitch, first);
        });
    for_each_strip(plane, axes, {inner, all}, 1,
                   [&](const BilinearColumns& columns, int32_t first) {
                       BlendedStrip(set, columns).blend(plane, axes, last_rows, 0, first);
                   });
}

void copy_plane(const Kernels& set, const Plane& plane, const BilinearAxes& axes, int32_t columns,
                Range rows) {
    const auto copy_strip = [&](const BilinearColumns& strip, int32_t first) {
        BilinearPlan plan;
        BilinearCopy* copy = set.plan_bilinear_copy(plan, strip);
        const Span span = span_of(strip);
        for (int64_t r = plane.first_row(rows.first); r < rows.end; r += plane.subsampling) {
            const int64_t next = r + plane.subsampling;
            if (next < rows.end) {
                prefetch(plane.src_row(axes.row_index[next]) + span.first, span.bytes);
            }
            copy(plane.dst_row(r) + ptrdiff_t{first} * plane.sample_bytes,
                 plane.src_row(axes.row_index[r]), plan);
        }
    };
    for_each_strip(plane, axes, {0, plane.samples(columns)}, 0, copy_strip);
}

}  // namespace

void blend_rows(const Kernels& set, const BilinearGeometry& geometry, const BilinearAxes& axes,
                const BilinearExtent& extent) {
    if (extent.columns < 1 || extent.rows < 1) return;
    for_each_plane(geometry, [&](const Plane& plane) { blend_plane(set, plane, axes, extent); });
}

void copy_rows(const Kernels& set, const BilinearGeometry& geometry, const BilinearAxes& axes,
               int32_t columns, int32_t first_row, int32_t end_row) {
    if (columns < 1 || first_row >= end_row) return;
    for_each_plane(geometry, [&](const Plane& plane) {
        copy_plane(set, plane, axes, columns, {first_row, end_row});
    });
}

}  // namespace ovrin
