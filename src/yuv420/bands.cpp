// SPDX-License-Identifier: Apache-2.0
#include "yuv420/bands.h"

#include "yuv420/planes.h"

namespace ovrin {

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

ScanAxis luma_axis(ChromaLayout chroma, int32_t src_height, int32_t dst_width, int32_t dst_height) {
    const Yuv420Layout grid = grid_of({chroma, dst_width, dst_height});
    return {src_height, dst_height, grid.width};
}

ScanAxis chroma_axis(ChromaLayout chroma, int32_t src_height, int32_t dst_width,
                     int32_t dst_height) {
    const Yuv420Layout grid = grid_of({chroma, dst_width, dst_height});
    return {half_rounded_up(src_height), grid.chroma_rows(),
            static_cast<int32_t>(grid.chroma_row())};
}

int32_t least_chroma_rows(int32_t band_rows) {
    return static_cast<int32_t>((int64_t{band_rows} + 3) >> 2);
}

void add_yuv420_band(const BandWork& work, const BandState& state) {
    const Yuv420Layout picture = {work.source.chroma, work.width, work.height};
    if (!has_grid(picture) || work.source.width < 1 || work.source.height < 1) return;
    const Yuv420Layout grid = grid_of(picture);
    const Yuv420Destination to = contiguous_destination(grid, work.target);
    if (work.luma_rows >= 1) {
        QuarterPlane plane = luma_plane(work.source, picture, to);
        plane.src += work.luma_offset;
        ScanState scan = state.luma.scan;
        if (state.luma.start_row == 0) start_points(scan, plane.src_rows);
        add_band(plane, scan, work.luma_rows, 1);
    }
    const int32_t chroma_rows = half_rounded_up(work.source.height);
    if (work.chroma_rows < 1 || chroma_rows <= state.chroma.start_row) return;
    for (int32_t i = 0; i < work.source.chroma.planes; ++i) {
        QuarterPlane plane = chroma_plane(work.source, grid, to, i);
        plane.src += work.chroma_offset;
        ScanState scan = state.chroma.scan;
        if (state.chroma.start_row == 0) start_points(scan, plane.src_rows);
        add_band(plane, scan, work.chroma_rows, 1);
    }
}

}  // namespace ovrin
