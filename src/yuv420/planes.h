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
    return {source.luma,    source.row_bytes, source.width,  source.height,
            to.luma,        to.luma_pitch,    picture.width, picture.height,
            picture.height, picture.width,    source.width,  1};
}

// The picture's chroma: the first columns and rows of its grid. Interleaved chroma sets its ratio
// in bytes, not in pairs: its points fall between those that pairs would give.
inline QuarterPlane chroma_plane(const Yuv420Source& source, const Yuv420Layout& picture,
                                 const Yuv420Destination& to, int32_t plane) {
    const Yuv420Layout packed = {source.chroma, source.width, source.height};
    const Yuv420Layout grid = grid_of(picture);
    return {source.chroma_planes[plane],
            source.chroma_row_bytes(),
            static_cast<int32_t>(packed.chroma_row()),
            packed.chroma_rows(),
            to.chroma[plane],
            to.chroma_pitch,
            static_cast<int32_t>(grid.chroma_row()),
            grid.chroma_rows(),
            picture.chroma_rows(),
            half_rounded_up(picture.width),
            half_rounded_up(source.width),
            source.chroma.sample_bytes};
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
