// SPDX-License-Identifier: Apache-2.0
#include "yuv420/place.h"

#include <string.h>

#include "canvas/margin.h"

namespace ovrin {

namespace {

constexpr int kBlackLuma = 0;
constexpr int kBlackChroma = 128;

struct Rows {
    const uint8_t* src;
    ptrdiff_t src_pitch;
    ptrdiff_t dst_offset;  // from the start of the destination buffer
    ptrdiff_t dst_pitch;
    ptrdiff_t row_bytes;
    ptrdiff_t rows;
};

// Chroma that is rounded up can run past the end of its plane. It goes on into what follows, but
// bytes outside the buffer are dropped.
void copy_rows(Rows r, uint8_t* dst, ptrdiff_t dst_bytes) {
    for (ptrdiff_t i = 0; i < r.rows; ++i) {
        ptrdiff_t from = r.dst_offset < 0 ? -r.dst_offset : 0;
        ptrdiff_t to =
            dst_bytes - r.dst_offset < r.row_bytes ? dst_bytes - r.dst_offset : r.row_bytes;
        if (from < to) {
            memcpy(dst + r.dst_offset + from, r.src + from, static_cast<size_t>(to - from));
        }
        r.src += r.src_pitch;
        r.dst_offset += r.dst_pitch;
    }
}

Yuv420Layout canvas_of(ChromaLayout chroma, const ovrin_resize_target& target) {
    return {chroma, target.canvas_width, target.canvas_height};
}

// The part of `size` pixels from `position` on that lies inside the canvas.
int32_t clipped(int32_t size, int32_t position, int32_t canvas_size) {
    const int64_t room = int64_t{canvas_size} - position;
    return static_cast<int32_t>(size > room ? room : size);
}

}  // namespace

void cut_out(const uint8_t* grid_base, const Yuv420Layout& picture, uint8_t* dst) {
    const Yuv420Layout grid = grid_of(picture);
    copy_rows({grid_base, grid.width, 0, picture.width, picture.width, picture.height}, dst,
              picture.bytes());
    for (int32_t plane = 0; plane < picture.chroma.planes; ++plane) {
        copy_rows(
            {grid_base + grid.chroma_offset(plane), grid.chroma_row(), picture.chroma_offset(plane),
             picture.chroma_row(), picture.chroma_row(), picture.chroma_rows()},
            dst, picture.bytes());
    }
}

void paint_black(uint8_t* base, const Yuv420Layout& picture) {
    if (picture.is_empty()) return;
    const size_t luma = static_cast<size_t>(picture.luma_plane());
    memset(base, kBlackLuma, luma);
    memset(base + luma, kBlackChroma, static_cast<size_t>(picture.bytes()) - luma);
}

void paint_canvas(ChromaLayout chroma, const ovrin_resize_target& target) {
    paint_black(static_cast<uint8_t*>(target.dst), canvas_of(chroma, target));
}

bool fits_canvas(const Yuv420Layout& picture, const ovrin_resize_target& target) {
    return target.dst_x >= 0 && target.dst_y >= 0 && target.dst_x % 2 == 0 &&
           target.dst_y % 2 == 0 && int64_t{target.dst_x} + picture.width <= target.canvas_width &&
           int64_t{target.dst_y} + picture.height <= target.canvas_height;
}

Yuv420Destination picture_in_canvas(ChromaLayout chroma, const ovrin_resize_target& target) {
    const Yuv420Layout canvas = canvas_of(chroma, target);
    auto* dst = static_cast<uint8_t*>(target.dst);
    Yuv420Destination to = contiguous_destination(canvas, dst);
    to.luma += ptrdiff_t{target.dst_y} * to.luma_pitch + target.dst_x;
    const ptrdiff_t chroma_position = ptrdiff_t{target.dst_y / 2} * to.chroma_pitch +
                                      ptrdiff_t{target.dst_x / 2} * chroma.sample_bytes;
    for (int32_t plane = 0; plane < chroma.planes; ++plane) to.chroma[plane] += chroma_position;
    return to;
}

void paint_around(const Yuv420Layout& picture, const ovrin_resize_target& target) {
    const Yuv420Layout canvas = canvas_of(picture.chroma, target);
    auto* dst = static_cast<uint8_t*>(target.dst);
    fill_margin(dst, canvas.width, canvas.height,
                {target.dst_x, target.dst_y, picture.width, picture.height}, kBlackLuma);
    const PlaneArea chroma = {ptrdiff_t{target.dst_x / 2} * picture.chroma.sample_bytes,
                              target.dst_y / 2, picture.chroma_row(), picture.chroma_rows()};
    for (int32_t plane = 0; plane < picture.chroma.planes; ++plane) {
        fill_margin(dst + canvas.chroma_offset(plane), canvas.chroma_row(), canvas.chroma_rows(),
                    chroma, kBlackChroma);
    }
}

void place_in_canvas(const uint8_t* grid_base, const Yuv420Layout& picture,
                     const ovrin_resize_target& target) {
    paint_canvas(picture.chroma, target);
    const Yuv420Layout canvas = canvas_of(picture.chroma, target);
    if (canvas.is_empty()) return;
    const Yuv420Layout grid = grid_of(picture);
    const int32_t width = clipped(picture.width, target.dst_x, canvas.width);
    const int32_t height = clipped(picture.height, target.dst_y, canvas.height);
    auto* dst = static_cast<uint8_t*>(target.dst);
    copy_rows({grid_base, grid.width, ptrdiff_t{target.dst_y} * canvas.width + target.dst_x,
               canvas.width, width, height},
              dst, canvas.bytes());
    const ptrdiff_t x = ptrdiff_t{half_rounded_up(target.dst_x)} * picture.chroma.sample_bytes;
    const ptrdiff_t y = half_rounded_up(target.dst_y);
    for (int32_t plane = 0; plane < picture.chroma.planes; ++plane) {
        copy_rows({grid_base + grid.chroma_offset(plane), grid.chroma_row(),
                   canvas.chroma_offset(plane) + y * canvas.chroma_row() + x, canvas.chroma_row(),
                   ptrdiff_t{half_rounded_up(width)} * picture.chroma.sample_bytes,
                   half_rounded_up(height)},
                  dst, canvas.bytes());
    }
}

}  // namespace ovrin
