// SPDX-License-Identifier: Apache-2.0
// The planes of a 4:2:0 picture as the sampler sees them. Luma is sampled for the picture's size,
// chroma for half the grid's.
#pragma once

#include "quarter/sampler.h"
#include "yuv420/layout.h"

namespace ovrin {

// Luma of a picture of width x height into the grid that starts at `base`.
inline QuarterPlane luma_plane(const Yuv420Source& source, const Yuv420Layout& picture,
                               const Yuv420Layout& grid, uint8_t* base) {
    return {source.luma,   source.row_bytes, source.width,  source.height, base, grid.width,
            picture.width, picture.height,   picture.width, source.width,  1};
}

// Interleaved chroma sets its ratio in bytes, not in pairs: its points fall between those that
// pairs would give.
inline QuarterPlane chroma_plane(const Yuv420Source& source, const Yuv420Layout& grid,
                                 uint8_t* base, int32_t plane) {
    const Yuv420Layout packed = {source.chroma, source.width, source.height};
    return {source.chroma_planes[plane],
            source.chroma_row_bytes(),
            static_cast<int32_t>(packed.chroma_row()),
            packed.chroma_rows(),
            base + grid.chroma_offset(plane),
            grid.chroma_row(),
            static_cast<int32_t>(grid.chroma_row()),
            grid.chroma_rows(),
            half_rounded_up(grid.width),
            half_rounded_up(source.width),
            source.chroma.sample_bytes};
}

}  // namespace ovrin
