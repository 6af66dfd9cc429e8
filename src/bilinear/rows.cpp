// SPDX-License-Identifier: Apache-2.0
#include "bilinear/rows.h"

#include "kernels/kernels.h"

namespace ovrin {

namespace {

// One plane of source and canvas. Chroma has a sample for every second column and row, blended with
// the weights of the luma sample there.
struct Plane {
    const uint8_t* src;
    ptrdiff_t src_pitch;
    ptrdiff_t
        edge_pitch;  // from the upper to the lower tap of the columns without horizontal blend
    uint8_t* dst;    // canvas position of the picture
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
    uint8_t* dst_row(int32_t row) const { return dst + ptrdiff_t{row / subsampling} * dst_pitch; }
    int32_t samples(int32_t columns) const {
        return columns < 1 ? 0 : static_cast<int32_t>((int64_t{columns} - 1) / subsampling + 1);
    }
    // The first of the rows from `row` on that has samples.
    int32_t first_row(int32_t row) const { return row + row % subsampling; }
};

Plane first_plane(const BilinearGeometry& g) {
    const int32_t bpp = bytes_per_pixel(g.layout);
    const ptrdiff_t src_pitch = ptrdiff_t{g.src_stride} * bpp;
    const ptrdiff_t dst_pitch = ptrdiff_t{g.canvas_width} * bpp;
    return {
        g.src,     src_pitch, src_pitch, g.canvas + g.dst_y * dst_pitch + ptrdiff_t{g.dst_x} * bpp,
        dst_pitch, bpp,       1,         false};
}

Plane chroma_plane(const BilinearGeometry& g, int32_t plane) {
    const Yuv420Layout canvas = g.canvas_planes();
    const bool planar = g.layout == BilinearLayout::kPlanar;
    const int32_t bytes = canvas.chroma.sample_bytes;
    const ptrdiff_t src_pitch = ptrdiff_t{half_rounded_up(g.src_stride)} * bytes;
    uint8_t* dst = g.canvas + canvas.chroma_offset(plane) + (g.dst_y >> 1) * canvas.chroma_row() +
                   ptrdiff_t{g.dst_x >> 1} * bytes;
    // The lower tap of planar edge columns lies a luma row further on, about two chroma rows down.
    return {g.src_chroma[plane],
            src_pitch,
            planar ? ptrdiff_t{g.src_stride} : src_pitch,
            dst,
            canvas.chroma_row(),
            bytes,
            2,
            planar};
}

template <class Function>
void for_each_plane(const BilinearGeometry& g, const Function& function) {
    function(first_plane(g));
    if (g.layout == BilinearLayout::kPixels) return;
    const int32_t planes = g.canvas_planes().chroma.planes;
    for (int32_t i = 0; i < planes; ++i) function(chroma_plane(g, i));
}

int32_t strip_length(int32_t first, int32_t end) {
    return end - first < kBilinearColumns ? end - first : kBilinearColumns;
}

// Calls function(columns, first sample) for the samples [first, end) of a plane's rows.
template <class Function>
void for_each_strip(const Plane& plane, const BilinearAxes& axes, int32_t first, int32_t end,
                    const Function& function) {
    BilinearColumns columns;
    for (; first < end; first += columns.count) {
        columns.count = strip_length(first, end);
        for (int32_t i = 0; i < columns.count; ++i) {
            const int32_t c = (first + i) * plane.subsampling;
            columns.index[i] = plane.column(axes.col_index[c]);
            columns.weight[i] = axes.col_weight[c];
        }
        function(columns, first);
    }
}

// A strip's part of a row lies a whole row behind the last one, where the processor does not look
// by itself.
void prefetch(const Plane& plane, const BilinearColumns& columns, const uint8_t* row) {
    constexpr int64_t kCacheLine = 64;
    const int64_t end = plane.sample_bytes * (columns.index[columns.count - 1] + int64_t{2});
    for (int64_t i = plane.sample_bytes * int64_t{columns.index[0]}; i < end; i += kCacheLine) {
        __builtin_prefetch(row + i);
    }
}

// Two source rows of a strip, blended horizontally. A result row takes two neighbouring rows, and
// the next one often takes one or both of them again.
class BlendedRows {
public:
    BlendedRows(const BilinearBlend& blend, const BilinearColumns& columns)
        : blend_(blend), columns_(columns) {}

    // The sums of `row`; those of `kept` stay as well if they are there.
    const BilinearSums& sums(const uint8_t* row, const uint8_t* kept) {
        const int held = row == rows_[0] ? 0 : 1;
        if (row == rows_[held]) return sums_[held];
        const int free = kept == rows_[0] ? 1 : 0;
        blend_.across(sums_[free], row, columns_);
        rows_[free] = row;
        return sums_[free];
    }

private:
    const BilinearBlend& blend_;
    const BilinearColumns& columns_;
    const uint8_t* rows_[2] = {nullptr, nullptr};
    BilinearSums sums_[2];
};

void blend_plane(const Plane& plane, const BilinearAxes& axes, const BilinearExtent& extent) {
    const BilinearBlend& blend = kernels().bilinear_blend[plane.sample_bytes >> 1];
    const BilinearEdges& edges = kernels().bilinear_edges[plane.sample_bytes >> 1];
    const int32_t all = plane.samples(extent.columns);
    const int32_t blended = plane.samples(extent.columns - extent.edge_cols);
    const int32_t first_edge_row =
        extent.rows > extent.edge_rows ? extent.rows - extent.edge_rows : 0;
    const auto dst = [&](int32_t r, int32_t first) {
        return plane.dst_row(r) + ptrdiff_t{first} * plane.sample_bytes;
    };
    const auto src = [&](int32_t r) { return plane.src_row(axes.row_index[r]); };
    // A row without vertical blend is blended with itself.
    const auto blend_edge_rows = [&](BlendedRows& rows, const BilinearColumns& s, int32_t first) {
        for (int32_t r = plane.first_row(first_edge_row); r < extent.rows; r += plane.subsampling) {
            const BilinearSums& row = rows.sums(src(r), nullptr);
            blend.down(dst(r, first), row, row, 0, s.count * plane.sample_bytes);
        }
    };
    for_each_strip(plane, axes, 0, blended, [&](BilinearColumns& s, int32_t first) {
        blend.prepare(s);
        BlendedRows rows(blend, s);
        for (int32_t r = 0; r < first_edge_row; r += plane.subsampling) {
            const uint8_t* top = src(r);
            const uint8_t* bottom = top + plane.src_pitch;
            const BilinearSums& upper = rows.sums(top, bottom);
            const BilinearSums& lower = rows.sums(bottom, top);
            if (r + plane.subsampling < first_edge_row) {
                const uint8_t* next = src(r + plane.subsampling);
                if (next > bottom) prefetch(plane, s, next);
                if (next > top) prefetch(plane, s, next + plane.src_pitch);
            }
            blend.down(dst(r, first), upper, lower, axes.row_weight[r],
                       s.count * plane.sample_bytes);
        }
        blend_edge_rows(rows, s, first);
    });
    for_each_strip(plane, axes, blended, all, [&](BilinearColumns& s, int32_t first) {
        for (int32_t r = 0; r < first_edge_row; r += plane.subsampling) {
            edges.vertical(dst(r, first), src(r), src(r) + plane.edge_pitch, axes.row_weight[r], s);
        }
        blend.prepare(s);
        BlendedRows rows(blend, s);
        blend_edge_rows(rows, s, first);
    });
}

}  // namespace

void blend_rows(const BilinearGeometry& geometry, const BilinearAxes& axes,
                const BilinearExtent& extent) {
    if (extent.columns < 1 || extent.rows < 1) return;
    for_each_plane(geometry, [&](const Plane& plane) { blend_plane(plane, axes, extent); });
}

void copy_rows(const BilinearGeometry& geometry, const BilinearAxes& axes, int32_t columns,
               int32_t first_row, int32_t end_row) {
    if (columns < 1 || first_row >= end_row) return;
    for_each_plane(geometry, [&](const Plane& plane) {
        const BilinearCopy& copy = kernels().bilinear_copy[plane.sample_bytes >> 1];
        const auto strip = [&](BilinearColumns& s, int32_t first) {
            copy.prepare(s);
            for (int32_t r = plane.first_row(first_row); r < end_row; r += plane.subsampling) {
                const int32_t next = r + plane.subsampling;
                if (next < end_row) prefetch(plane, s, plane.src_row(axes.row_index[next]));
                copy.copy(plane.dst_row(r) + ptrdiff_t{first} * plane.sample_bytes,
                          plane.src_row(axes.row_index[r]), s);
            }
        };
        for_each_strip(plane, axes, 0, plane.samples(columns), strip);
    });
}

}  // namespace ovrin
