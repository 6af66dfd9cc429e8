// SPDX-License-Identifier: Apache-2.0
// What the packed and the letterboxed RGBA paths share of the band record.
#pragma once

#include <ovrinresize.h>

#include "quarter/sampler.h"

namespace ovrin {

constexpr int32_t kRgbaBytes = 4;

// RGBA8888 pixels; the stride counts pixels too.
struct RgbaSource {
    const uint8_t* pixels;
    int32_t stride;
    int32_t width;
    int32_t height;
};
struct RgbaDestination {
    uint32_t* pixels;
    int32_t stride;
    int32_t width;
    int32_t height;
};

QuarterPlane rgba_plane(const RgbaSource& src, const RgbaDestination& dst);

// The lengths in which the two paths differ, in pixels.
struct RgbaRows {
    int32_t src_pixels;  // from one source row to the next
    int32_t dst_pixels;  // from one destination row to the next
    int32_t dst_x;       // from the start of a destination row to the picture
};

// Moves the record from one band to the next.
void advance_rgba_band(ovrin_rgba_band& band, int32_t src_h, int32_t dst_h, const RgbaRows& rows);

// Adds the band's samples to the destination and reports the band done.
void run_rgba_band(ovrin_rgba_band& band, const RgbaRows& rows);

}  // namespace ovrin
