// SPDX-License-Identifier: Apache-2.0
// The planes of a 4:2:0 source picture, wherever they lie.
#pragma once

#include "canvas/yuv420_layout.h"

namespace ovrin {

struct Yuv420Source {
    Yuv420Format format;
    int32_t width;
    int32_t height;
    int32_t stride;  // luma samples from one row to the next
    const uint8_t* luma;
    const uint8_t* chroma[2];

    ptrdiff_t luma_pitch() const { return ptrdiff_t{stride} * format.luma_bytes(); }
    ptrdiff_t chroma_pitch() const {
        return ptrdiff_t{half_rounded_up(stride)} * format.chroma_bytes();
    }
};

// A picture in one piece. An empty one has no planes; its pointer may be null.
inline Yuv420Source contiguous_source(const Yuv420Format& format, const uint8_t* picture,
                                      int32_t width, int32_t height) {
    const Yuv420Layout layout = {format, width, height};
    Yuv420Source source = {format, width, height, width, picture, {nullptr, nullptr}};
    if (layout.is_empty()) return source;
    source.chroma[0] = picture + layout.chroma_offset(0);
    if (format.chroma_planes > 1) source.chroma[1] = picture + layout.chroma_offset(1);
    return source;
}

}  // namespace ovrin
