// SPDX-License-Identifier: Apache-2.0
// The planes of a 4:2:0 picture as the sampler sees them. Luma is sampled for the picture's size,
// chroma for half the grid's.
#pragma once

#include "quarter/sampler.h"
#include "yuv420/layout.h"

namespace ovrin {

// Where a picture's samples go: the planes of some layout, which may be larger than the picture.
struct Yuv420Destination {
    uint8_t* luma;
    uint8_t* chroma[2];
    ptrdiff_t luma_pitch;
    ptrdiff_t chroma_pitch;
};

inline Yuv420Destination contiguous_destination(const Yuv420Layout& layout, uint8_t* base) {
    return {base,
            {base + layout.chroma_offset(0), base + layout.chroma_offset(1)},
            layout.width,
            layout.chroma_row()};
}

inline QuarterPlane luma_plane(const Yuv420Source& source, const Yuv420Layout& picture,
                               const Yuv420Destination& to) {
    QuarterPlane plane = {};
    plane.src = source.luma;
    plane.src_pitch = source.row_bytes;
    plane.src_columns = source.width;
    plane.src_rows = source.height;
    plane.dst = to.luma;
    plane.dst_pitch = to.luma_pitch;
    plane.dst_columns = plane.columns = picture.width;
    plane.dst_rows = plane.rows = picture.height;
    plane.sample_bytes = 1;
    return plane;
}

// The picture's chroma: the first columns and rows of its grid.
inline QuarterPlane chroma_plane(const Yuv420Source& source, const Yuv420Layout& picture,
                                 const Yuv420Destination& to, int32_t index) {
    const Yuv420Layout grid = grid_of(picture);
    QuarterPlane plane = {};
    plane.src = source.chroma_planes[index];
    plane.src_pitch = source.chroma_row_bytes();
    plane.src_columns = half_rounded_up(source.width);
    plane.src_rows = half_rounded_up(source.height);
    plane.dst = to.chroma[index];
    plane.dst_pitch = to.chroma_pitch;
    plane.dst_columns = half_rounded_up(grid.width);
    plane.dst_rows = half_rounded_up(grid.height);
    plane.columns = half_rounded_up(picture.width);
    plane.rows = half_rounded_up(picture.height);
    plane.sample_bytes = source.chroma.sample_bytes;
    return plane;
}

struct PicturePlanes {
    QuarterPlane planes[3];
    int32_t count;
};

inline PicturePlanes picture_planes(const Yuv420Source& source, const Yuv420Layout& picture,
                                    const Yuv420Destination& to) {
    PicturePlanes all = {};
    all.planes[all.count++] = luma_plane(source, picture, to);
    for (int32_t plane = 0; plane < source.chroma.planes; ++plane) {
        all.planes[all.count++] = chroma_plane(source, picture, to, plane);
    }
    return all;
}

}  // namespace ovrin
