// SPDX-License-Identifier: Apache-2.0
#include "yuv420/bands.h"

#include <stddef.h>

#include "yuv420/planes.h"

namespace ovrin {

// The running state of either record is read and written as one block.
static_assert(sizeof(BandState) == offsetof(ovrin_yuv_band, src_width), "");
static_assert(sizeof(BandState) == offsetof(ovrin_nv21_band, src_width), "");

PlaneWalk::PlaneWalk(PlaneState& plane, const ScanAxis& axis)
    : plane_(plane), axis_(axis), start_row_(plane.start_row) {
    if (plane.start_row == 0) start_points(plane.scan, axis.src_rows);
}

void PlaneWalk::walk(int32_t rows) {
    if (rows < 1) return;
    walk_rows(plane_.scan, axis_, rows);
    plane_.start_row = wrapping_add(plane_.start_row, rows);
    walked_ = wrapping_add(walked_, rows);
}

int32_t PlaneWalk::rows_inside() const {
    const int64_t inside = rows_left() < 0 ? walked_ + rows_left() : walked_;
    return inside < 0 ? 0 : static_cast<int32_t>(inside);
}

ScanAxis luma_axis(const Yuv420Layout& picture, int32_t src_height) {
    return {src_height, picture.height, static_cast<int32_t>(grid_of(picture).luma_pitch())};
}

ScanAxis chroma_axis(const Yuv420Layout& picture, int32_t src_height) {
    const Yuv420Layout grid = grid_of(picture);
    return {half_rounded_up(src_height), grid.chroma_height(),
            static_cast<int32_t>(grid.chroma_pitch())};
}

int32_t min_chroma_rows(int32_t band_rows) {
    return static_cast<int32_t>((int64_t{band_rows} + 3) >> 2);
}

namespace {

// Indices in a record count bytes.
constexpr int32_t kIndexBytes = 1;

void add_plane(QuarterPlane plane, int32_t src_offset, const PlaneState& state, int32_t rows) {
    plane.src += src_offset;
    ScanState scan = state.scan;
    if (state.start_row == 0) start_points(scan, plane.src_rows);
    add_band(plane, scan, rows, kIndexBytes);
}

}  // namespace

void add_yuv420_band(const BandWork& work, const BandState& state) {
    const Yuv420Source& source = work.source;
    if (!has_grid(work.picture) || source.width < 1 || source.height < 1) return;
    const Yuv420Layout grid = grid_of(work.picture);
    const Yuv420Destination dst = contiguous_destination(grid, work.dst);
    if (work.luma_rows >= 1) {
        add_plane(luma_plane(source, work.picture, dst), work.luma_offset, state.luma,
                  work.luma_rows);
    }
    const int32_t chroma_rows = half_rounded_up(source.height);
    if (work.chroma_rows < 1 || chroma_rows <= state.chroma.start_row) return;
    for (int32_t i = 0; i < source.format.chroma_planes; ++i) {
        add_plane(chroma_plane(source, grid, dst, i), work.chroma_offset, state.chroma,
                  work.chroma_rows);
    }
}

}  // namespace ovrin
