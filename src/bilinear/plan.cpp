// SPDX-License-Identifier: Apache-2.0
#include "bilinear/plan.h"

#include <stdlib.h>
#include <string.h>

#include "yuv420/place.h"

namespace ovrin {

namespace {

ChromaLayout chroma_of(BilinearLayout layout) {
    return layout == BilinearLayout::kPlanar ? kPlanarChroma : kInterleavedChroma;
}

int32_t* new_table(int32_t entries) {
    return static_cast<int32_t*>(malloc(static_cast<size_t>(entries) * sizeof(int32_t)));
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
        weight[i] = static_cast<int32_t>((static_cast<double>(fraction) + 0.25) * 4096.0);
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
    return {layout,
            target.format,
            target.src_width,
            target.src_height,
            target.src_stride,
            call.src,
            {planar ? target.src_u_plane : target.src_vu_plane, target.src_v_plane},
            call.dst,
            target.canvas_width,
            target.canvas_height,
            target.dst_x,
            target.dst_y};
}

BilinearGeometry geometry_of_arguments(const BilinearCall& call) {
    const BilinearLayout layout = bilinear_layout(call.format);
    const Yuv420Source source =
        contiguous_source(chroma_of(layout), call.src, call.src_w, call.src_h);
    return {layout,
            call.format,
            call.src_w,
            call.src_h,
            call.src_w,
            call.src,
            {source.chroma_planes[0], source.chroma_planes[1]},
            call.dst,
            call.dst_w,
            call.dst_h,
            0,
            0};
}

}  // namespace

BilinearLayout bilinear_layout(int32_t format) {
    switch (format) {
        case 7:
        case 8:
            return BilinearLayout::kPixels;
        case 2:
            return BilinearLayout::kPlanar;
        case 18:
        case 19:
            return BilinearLayout::kSemiPlanar;
        default:
            return BilinearLayout::kUnknown;
    }
}

Yuv420Layout BilinearGeometry::canvas_planes() const {
    return {chroma_of(layout), canvas_width, canvas_height};
}

BilinearGeometry geometry_of(const BilinearCall& call) {
    return call.target != nullptr ? geometry_of_target(call, *call.target)
                                  : geometry_of_arguments(call);
}

BilinearTables::BilinearTables(int32_t w, int32_t h)
    : dst_w(w),
      dst_h(h),
      col_weight(new_table(w)),
      row_weight(new_table(h)),
      col_index(new_table(w)),
      row_index(new_table(h)) {}

BilinearTables::~BilinearTables() {
    free(col_weight);
    free(row_weight);
    free(col_index);
    free(row_index);
}

bool BilinearTables::ready() const {
    return col_weight != nullptr && row_weight != nullptr && col_index != nullptr &&
           row_index != nullptr;
}

void BilinearTables::fill(const BilinearGeometry& geometry) {
    fill_axis(col_index, col_weight, geometry.src_width, dst_w);
    fill_axis(row_index, row_weight, geometry.src_height, dst_h);
}

// Either clip takes the edge columns away; the edge rows stay.
BilinearExtent extent_of(const BilinearGeometry& geometry, const BilinearTables& tables) {
    BilinearExtent extent = {tables.dst_w, tables.dst_h,
                             edge_count(tables.col_index, tables.dst_w, geometry.src_width),
                             edge_count(tables.row_index, tables.dst_h, geometry.src_height)};
    const int64_t room_right = int64_t{geometry.canvas_width} - geometry.dst_x;
    const int64_t room_below = int64_t{geometry.canvas_height} - geometry.dst_y;
    if (room_right < extent.columns) {
        extent.columns = room_right < 0 ? 0 : static_cast<int32_t>(room_right);
        extent.edge_cols = 0;
    }
    if (room_below < extent.rows) {
        extent.rows = room_below < 0 ? 0 : static_cast<int32_t>(room_below);
        extent.edge_cols = 0;
    }
    return extent;
}

void clear_canvas(const BilinearGeometry& geometry, const BilinearExtent& extent) {
    const bool is_covered = geometry.dst_x == 0 && geometry.dst_y == 0 &&
                            extent.columns == geometry.canvas_width &&
                            extent.rows == geometry.canvas_height;
    if (is_covered) return;
    if (geometry.layout != BilinearLayout::kPixels) {
        paint_black(geometry.canvas, geometry.canvas_planes());
    } else if (geometry.canvas_width > 0 && geometry.canvas_height > 0) {
        memset(geometry.canvas, 0,
               static_cast<size_t>(geometry.canvas_width) *
                   static_cast<size_t>(geometry.canvas_height) * 4);
    }
}

}  // namespace ovrin
