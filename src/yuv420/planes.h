// SPDX-License-Identifier: Apache-2.0
// The planes of a 4:2:0 picture as the sampler sees them. Luma is sampled for the picture's size,
// chroma for half the grid's.
#pragma once

#include "quarter/sampler.h"
#include "yuv420/grid.h"
#include "yuv420/source.h"

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
            layout.luma_pitch(),
            layout.chroma_pitch()};
}

inline QuarterPlane luma_plane(const Yuv420Source& source, const Yuv420Layout& picture,
                               const Yuv420Destination& dst) {
    QuarterPlane plane = {};
    plane.src = source.luma;
    plane.src_pitch = source.luma_pitch();
    plane.src_columns = source.width;
    plane.src_rows = source.height;
    plane.dst = dst.luma;
    plane.dst_pitch = dst.luma_pitch;
    plane.dst_columns = plane.columns = picture.width;
    plane.dst_rows = plane.rows = picture.height;
    plane.sample_bytes = source.format.luma_bytes();
    return plane;
}

// The picture's chroma: the first columns and rows of its grid.
inline QuarterPlane chroma_plane(const Yuv420Source& source, const Yuv420Layout& picture,
                                 const Yuv420Destination& dst, int32_t index) {
    const Yuv420Layout grid = grid_of(picture);
    QuarterPlane plane = {};
    plane.src = source.chroma[index];
    plane.src_pitch = source.chroma_pitch();
    plane.src_columns = half_rounded_up(source.width);
    plane.src_rows = half_rounded_up(source.height);
    plane.dst = dst.chroma[index];
    plane.dst_pitch = dst.chroma_pitch;
    plane.dst_columns = grid.chroma_width();
    plane.dst_rows = grid.chroma_height();
    plane.columns = picture.chroma_width();
    plane.rows = picture.chroma_height();
    plane.sample_bytes = source.format.chroma_bytes();
    return plane;
}

struct PicturePlanes {
    QuarterPlane planes[3];
    int32_t count;
};

inline PicturePlanes picture_planes(const Yuv420Source& source, const Yuv420Layout& picture,
                                    const Yuv420Destination& dst) {
    PicturePlanes all = {};
    all.planes[all.count++] = luma_plane(source, picture, dst);
    for (int32_t i = 0; i < source.format.chroma_planes; ++i) {
        all.planes[all.count++] = chroma_plane(source, picture, dst, i);
    }
    return all;
}

}  // namespace ovrin
