// SPDX-License-Identifier: Apache-2.0
// Where the planes of a 4:2:0 picture lie. Planar and interleaved chroma differ only in the number
// of planes and the bytes of a sample.
#pragma once

#include <stddef.h>
#include <stdint.h>

namespace ovrin {

struct ChromaLayout {
    int32_t planes;
    int32_t sample_bytes;
};

constexpr ChromaLayout kPlanarChroma = {2, 1};       // a plane of U, a plane of V
constexpr ChromaLayout kInterleavedChroma = {1, 2};  // one plane of pairs

// Chroma samples that cover `luma` luma samples of a row or column.
constexpr int32_t half_rounded_up(int32_t luma) {
    return static_cast<int32_t>((int64_t{luma} + 1) >> 1);
}

// The planes of a contiguous picture, packed one behind the other. Sizes in bytes unless named
// rows.
struct Yuv420Layout {
    ChromaLayout chroma;
    int32_t width;
    int32_t height;

    bool is_empty() const { return width < 1 || height < 1; }
    ptrdiff_t chroma_row() const { return ptrdiff_t{half_rounded_up(width)} * chroma.sample_bytes; }
    int32_t chroma_rows() const { return half_rounded_up(height); }
    ptrdiff_t luma_plane() const { return ptrdiff_t{width} * height; }
    ptrdiff_t chroma_plane() const { return chroma_row() * chroma_rows(); }
    ptrdiff_t chroma_offset(int32_t plane) const { return luma_plane() + plane * chroma_plane(); }
    ptrdiff_t bytes() const { return chroma_offset(chroma.planes); }
};

// The planes of a source picture, wherever they lie.
struct Yuv420Source {
    ChromaLayout chroma;
    int32_t width;
    int32_t height;
    int32_t row_bytes;  // from one luma row to the next
    const uint8_t* luma;
    const uint8_t* chroma_planes[2];

    ptrdiff_t chroma_row_bytes() const {
        return ptrdiff_t{half_rounded_up(row_bytes)} * chroma.sample_bytes;
    }
};

// An empty picture has no planes; its pointer may be null.
inline Yuv420Source contiguous_source(ChromaLayout chroma, const uint8_t* picture, int32_t width,
                                      int32_t height) {
    const Yuv420Layout layout = {chroma, width, height};
    Yuv420Source source = {chroma, width, height, width, picture, {nullptr, nullptr}};
    if (layout.is_empty()) return source;
    source.chroma_planes[0] = picture + layout.chroma_offset(0);
    if (chroma.planes > 1) source.chroma_planes[1] = picture + layout.chroma_offset(1);
    return source;
}

// Chroma is sampled on a grid: the destination size rounded up to multiples of 4. A destination
// that is such a grid takes the samples itself; any other is cut out of a work buffer. Empty
// pictures, and the three largest sizes that 32 bits can name, have none.
constexpr int32_t kGridStep = 4;
constexpr int32_t kLargestGridSize = INT32_MAX / kGridStep * kGridStep;

inline bool is_grid_size(int32_t size) {
    return size % kGridStep == 0;
}

inline int32_t rounded_up_to_grid(int32_t size) {
    return static_cast<int32_t>((int64_t{size} + (kGridStep - 1)) / kGridStep * kGridStep);
}

inline bool is_own_grid(const Yuv420Layout& picture) {
    return is_grid_size(picture.width) && is_grid_size(picture.height);
}

inline bool has_grid(const Yuv420Layout& picture) {
    return !picture.is_empty() && picture.width <= kLargestGridSize &&
           picture.height <= kLargestGridSize;
}

// Only for pictures that have one.
inline Yuv420Layout grid_of(const Yuv420Layout& picture) {
    return {picture.chroma, rounded_up_to_grid(picture.width), rounded_up_to_grid(picture.height)};
}

}  // namespace ovrin
