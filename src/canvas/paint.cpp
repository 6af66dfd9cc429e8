// SPDX-License-Identifier: Apache-2.0
#include "canvas/paint.h"

#include <string.h>

#include "canvas/placement.h"

namespace ovrin {

namespace {

constexpr int kBlackLuma = 0;
constexpr int kBlackChroma = 128;
constexpr ptrdiff_t kRgbaBytes = 4;

// Where a picture lies in a plane of its canvas, in bytes and rows; all of it within the plane.
struct PlaneArea {
    ptrdiff_t x;
    ptrdiff_t y;
    ptrdiff_t width;
    ptrdiff_t height;
};

// What lies to the right of one row and to the left of the next is filled in one go.
void fill_margin(uint8_t* plane, ptrdiff_t pitch, ptrdiff_t rows, const PlaneArea& picture,
                 int value) {
    const ptrdiff_t first = picture.y * pitch + picture.x;
    memset(plane, value, static_cast<size_t>(first));
    uint8_t* after = plane + first + picture.width;
    for (ptrdiff_t j = 1; j < picture.height; ++j, after += pitch) {
        memset(after, value, static_cast<size_t>(pitch - picture.width));
    }
    memset(after, value, static_cast<size_t>(plane + pitch * rows - after));
}

}  // namespace

void paint_rgba_black(void* canvas, int32_t width, int32_t height) {
    if (width < 1 || height < 1) return;
    memset(canvas, 0, static_cast<size_t>(width) * static_cast<size_t>(height) * kRgbaBytes);
}

void paint_planes_black(uint8_t* canvas, const Yuv420Layout& layout) {
    if (layout.is_empty()) return;
    const size_t luma = static_cast<size_t>(layout.luma_size());
    memset(canvas, kBlackLuma, luma);
    memset(canvas + luma, kBlackChroma, static_cast<size_t>(layout.size()) - luma);
}

void paint_around_rgba(const ovrin_resize_target& target) {
    if (!rgba_lies_inside(target)) {
        paint_rgba_black(target.dst, target.canvas_width, target.canvas_height);
        return;
    }
    fill_margin(
        static_cast<uint8_t*>(target.dst), target.canvas_width * kRgbaBytes, target.canvas_height,
        {target.dst_x * kRgbaBytes, target.dst_y, target.dst_width * kRgbaBytes, target.dst_height},
        0);
}

void paint_around_planes(const Yuv420Layout& picture, const ovrin_resize_target& target) {
    const Yuv420Format format = picture.format;
    const Yuv420Layout canvas = {format, target.canvas_width, target.canvas_height};
    auto* dst = static_cast<uint8_t*>(target.dst);
    fill_margin(dst, canvas.luma_pitch(), canvas.height,
                {ptrdiff_t{target.dst_x} * format.luma_bytes(), target.dst_y, picture.luma_pitch(),
                 picture.height},
                kBlackLuma);
    const PlaneArea chroma = {ptrdiff_t{target.dst_x / 2} * format.chroma_bytes(), target.dst_y / 2,
                              picture.chroma_pitch(), picture.chroma_height()};
    for (int32_t plane = 0; plane < format.chroma_planes; ++plane) {
        fill_margin(dst + canvas.chroma_offset(plane), canvas.chroma_pitch(),
                    canvas.chroma_height(), chroma, kBlackChroma);
    }
}

}  // namespace ovrin
