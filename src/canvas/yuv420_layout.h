// SPDX-License-Identifier: Apache-2.0
// Where the planes of a contiguous 4:2:0 picture lie.
#pragma once

#include <stddef.h>
#include <stdint.h>

namespace ovrin {

// A sample has one component in a plane of luma, of U or of V, and two in one of pairs.
struct Yuv420Format {
    int32_t component_bytes;
    int32_t chroma_planes;
    int32_t chroma_components;  // in a sample of a chroma plane

    constexpr int32_t luma_bytes() const { return component_bytes; }
    constexpr int32_t chroma_bytes() const { return component_bytes * chroma_components; }
};

constexpr Yuv420Format kI420 = {1, 2, 1};
constexpr Yuv420Format kNv21 = {1, 1, 2};

// Chroma samples that cover `luma` luma samples of a row or column.
constexpr int32_t half_rounded_up(int32_t luma) {
    return static_cast<int32_t>((int64_t{luma} + 1) >> 1);
}

// The planes of a picture of width x height luma samples, packed one after the other. Lengths and
// offsets in bytes.
struct Yuv420Layout {
    Yuv420Format format;
    int32_t width;
    int32_t height;

    bool is_empty() const { return width < 1 || height < 1; }
    int32_t chroma_width() const { return half_rounded_up(width); }
    int32_t chroma_height() const { return half_rounded_up(height); }
    ptrdiff_t luma_pitch() const { return ptrdiff_t{width} * format.luma_bytes(); }
    ptrdiff_t chroma_pitch() const { return ptrdiff_t{chroma_width()} * format.chroma_bytes(); }
    ptrdiff_t luma_size() const { return luma_pitch() * height; }
    ptrdiff_t chroma_size() const { return chroma_pitch() * chroma_height(); }
    ptrdiff_t chroma_offset(int32_t plane) const { return luma_size() + plane * chroma_size(); }
    ptrdiff_t size() const { return chroma_offset(format.chroma_planes); }
};

}  // namespace ovrin
