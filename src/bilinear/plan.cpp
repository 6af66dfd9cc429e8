// SPDX-License-Identifier: Apache-2.0
#include "bilinear/plan.h"

#include "canvas/paint.h"
#include "canvas/placement.h"
#include "kernels/bilinear.h"

namespace ovrin {

namespace {

Yuv420Format format_of(BilinearLayout layout) {
    return layout == BilinearLayout::kPlanar ? kI420 : kNv21;
}

// Single precision can round the last positions of a very long axis up to 2^31.
int32_t truncated(float position) {
    return position < 2147483648.0F ? static_cast<int32_t>(position) : INT32_MAX;
}

// The weight is shifted by a quarter of a sample after the fraction has been split off, and not
// brought back into range: it runs from 1024 to 5119.
void fill_axis(int32_t* index, int32_t* weight, int32_t src_size, int32_t dst_size) {
    const float scale = static_cast<float>(src_size) / static_cast<float>(dst_size);
    for (int32_t i = 0; i < dst_size; ++i) {
        const float position = static_cast<float>(i) * scale;
        index[i] = truncated(position);
        const float fraction = position - static_cast<float>(index[i]);
        weight[i] = static_cast<int32_t>((static_cast<double>(fraction) + 0.25) * kBilinearOne);
    }
}

// Destination samples from the first that sits exactly on the last but one source sample; none when
// a reduction steps over it.
int32_t edge_count(const int32_t* index, int32_t dst_size, int32_t src_size) {
    for (int32_t i = 0; i < dst_size; ++i) {
        if (index[i] == src_size - 2) return dst_size - i;
    }
    return 0;
}

BilinearGeometry geometry_of_target(const BilinearCall& call, const ovrin_resize_target& target) {
    const BilinearLayout layout = bilinear_layout(target.format);
    const bool planar = layout == BilinearLayout::kPlanar;
    BilinearGeometry g = {};
    g.layout = layout;
    g.format = target.format;
    g.src_width = target.src_width;
    g.src_height = target.src_height;
    g.src_stride = target.src_stride;
    g.src = call.src;
    g.src_chroma[0] = planar ? target.src_u_plane : target.src_vu_plane;
    g.src_chroma[1] = target.src_v_plane;
    g.canvas = call.dst;
    g.canvas_width = target.canvas_width;
    g.canvas_height = target.canvas_height;
    g.dst_x = target.dst_x;
    g.dst_y = target.dst_y;
    return g;
}

BilinearGeometry geometry_of_arguments(const BilinearCall& call) {
    const BilinearLayout layout = bilinear_layout(call.format);
    const Yuv420Layout src = {format_of(layout), call.src_w, call.src_h};
    BilinearGeometry g = {};
    g.layout = layout;
    g.format = call.format;
    g.src_width = call.src_w;
    g.src_height = call.src_h;
    g.src_stride = call.src_w;
    g.src = call.src;
    if (layout != BilinearLayout::kPixels && !src.is_empty()) {
        g.src_chroma[0] = call.src + src.chroma_offset(0);
        g.src_chroma[1] = call.src + src.chroma_offset(1);
    }
    g.canvas = call.dst;
    g.canvas_width = call.dst_w;
    g.canvas_height = call.dst_h;
    return g;
}

}  // namespace

BilinearLayout bilinear_layout(int32_t format) {
    switch (format) {
        case OVRIN_FORMAT_PIXELS:
        case OVRIN_FORMAT_PIXELS_2:
            return BilinearLayout::kPixels;
        case OVRIN_FORMAT_PLANAR:
            return BilinearLayout::kPlanar;
        case OVRIN_FORMAT_SEMI_PLANAR:
        case OVRIN_FORMAT_SEMI_PLANAR_2:
            return BilinearLayout::kSemiPlanar;
        default:
            return BilinearLayout::kUnknown;
    }
}

Yuv420Layout BilinearGeometry::canvas_planes() const {
    return {format_of(layout), canvas_width, canvas_height};
}

BilinearGeometry geometry_of(const BilinearCall& call) {
    return call.target != nullptr ? geometry_of_target(call, *call.target)
                                  : geometry_of_arguments(call);
}

BilinearTables::BilinearTables(int32_t w, int32_t h)
    : BilinearAxes{},
      dst_w(w),
      dst_h(h),
      memory_(static_cast<int32_t*>(
          malloc((static_cast<size_t>(w) + static_cast<size_t>(h)) * 2 * sizeof(int32_t)))) {}

void BilinearTables::fill(const BilinearGeometry& geometry) {
    int32_t* columns = memory_;
    int32_t* rows = columns + ptrdiff_t{2} * dst_w;
    fill_axis(columns, columns + dst_w, geometry.src_width, dst_w);
    fill_axis(rows, rows + dst_h, geometry.src_height, dst_h);
    col_index = columns;
    col_weight = columns + dst_w;
    row_index = rows;
    row_weight = rows + dst_h;
}

// Either clip takes the edge columns away; the edge rows stay.
BilinearExtent extent_of(const BilinearGeometry& geometry, const BilinearTables& tables) {
    BilinearExtent extent = {tables.dst_w, tables.dst_h,
                             edge_count(tables.col_index, tables.dst_w, geometry.src_width),
                             edge_count(tables.row_index, tables.dst_h, geometry.src_height)};
    const int64_t columns = visible(tables.dst_w, geometry.dst_x, geometry.canvas_width);
    const int64_t rows = visible(tables.dst_h, geometry.dst_y, geometry.canvas_height);
    if (columns < extent.columns || rows < extent.rows) extent.edge_cols = 0;
    extent.columns = columns < 0 ? 0 : static_cast<int32_t>(columns);
    extent.rows = rows < 0 ? 0 : static_cast<int32_t>(rows);
    return extent;
}

void clear_canvas(const BilinearGeometry& geometry, const BilinearExtent& extent) {
    const bool is_covered = geometry.dst_x == 0 && geometry.dst_y == 0 &&
                            extent.columns == geometry.canvas_width &&
                            extent.rows == geometry.canvas_height;
    if (is_covered) return;
    if (geometry.layout != BilinearLayout::kPixels) {
        paint_planes_black(geometry.canvas, geometry.canvas_planes());
    } else {
        paint_rgba_black(geometry.canvas, geometry.canvas_width, geometry.canvas_height);
    }
}

}  // namespace ovrin
