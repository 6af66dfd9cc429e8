// SPDX-License-Identifier: Apache-2.0
#include "picture.h"

#include <string.h>

namespace bench {

namespace {

struct PlaneShape {
    int32_t sample_bytes;
    bool half_size;
};

struct LayoutShape {
    int32_t plane_count;
    std::array<PlaneShape, 3> planes;
};

LayoutShape shape_of(Layout layout) {
    switch (layout) {
        case Layout::kRgba:
            return {1, {{{4, false}}}};
        case Layout::kRgb:
            return {1, {{{3, false}}}};
        case Layout::kI420:
            return {3, {{{1, false}, {1, true}, {1, true}}}};
        case Layout::kNv21:
            break;
    }
    return {2, {{{1, false}, {2, true}}}};
}

int32_t extent(int32_t pixels, bool half_size) {
    return half_size ? (pixels + 1) / 2 : pixels;
}

}  // namespace

Picture picture_at(uint8_t* data, Layout layout, Size size) {
    const LayoutShape shape = shape_of(layout);
    Picture picture = {layout, size, shape.plane_count, {}};
    for (size_t p = 0; p < static_cast<size_t>(shape.plane_count); ++p) {
        const PlaneShape& plane = shape.planes[p];
        const Size samples = {extent(size.width, plane.half_size),
                              extent(size.height, plane.half_size)};
        const ptrdiff_t pitch = ptrdiff_t{samples.width} * plane.sample_bytes;
        picture.planes[p] = {data, pitch, samples, plane.sample_bytes};
        data += pitch * samples.height;
    }
    return picture;
}

size_t picture_bytes(Layout layout, Size size) {
    const Picture picture = picture_at(nullptr, layout, size);
    size_t bytes = 0;
    for (const Plane& plane : picture.planes) {
        bytes += plane.row_bytes() * static_cast<size_t>(plane.size.height);
    }
    return bytes;
}

Picture part_of(const Picture& canvas, int32_t x, int32_t y, Size size) {
    Picture part = picture_at(nullptr, canvas.layout, size);
    const LayoutShape shape = shape_of(canvas.layout);
    for (size_t p = 0; p < static_cast<size_t>(shape.plane_count); ++p) {
        const Plane& whole = canvas.planes[p];
        const bool half = shape.planes[p].half_size;
        part.planes[p].pitch = whole.pitch;
        part.planes[p].data = whole.sample(extent(x, half), extent(y, half));
    }
    return part;
}

void paint_black(const Picture& picture) {
    for (int32_t p = 0; p < picture.plane_count; ++p) {
        const Plane& plane = picture.planes[static_cast<size_t>(p)];
        for (int32_t y = 0; y < plane.size.height; ++y) {
            memset(plane.row(y), p == 0 ? 0 : 128, plane.row_bytes());
        }
    }
}

}  // namespace bench
