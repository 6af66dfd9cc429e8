// SPDX-License-Identifier: Apache-2.0
#include "yuv420/place.h"

#include <string.h>

#include "canvas/paint.h"
#include "canvas/placement.h"

namespace ovrin {

namespace {

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
void copy_rows(Rows r, uint8_t* dst, ptrdiff_t dst_size) {
    for (ptrdiff_t i = 0; i < r.rows; ++i) {
        const ptrdiff_t from = r.dst_offset < 0 ? -r.dst_offset : 0;
        const ptrdiff_t room = dst_size - r.dst_offset;
        const ptrdiff_t to = room < r.row_bytes ? room : r.row_bytes;
        if (from < to) {
            memcpy(dst + r.dst_offset + from, r.src + from, static_cast<size_t>(to - from));
        }
        r.src += r.src_pitch;
        r.dst_offset += r.dst_pitch;
    }
}

Yuv420Layout canvas_of(const Yuv420Format& format, const ovrin_resize_target& target) {
    return {format, target.canvas_width, target.canvas_height};
}

}  // namespace

Yuv420Destination picture_in_canvas(const Yuv420Format& format, const ovrin_resize_target& target) {
    Yuv420Destination dst =
        contiguous_destination(canvas_of(format, target), static_cast<uint8_t*>(target.dst));
    dst.luma +=
        ptrdiff_t{target.dst_y} * dst.luma_pitch + ptrdiff_t{target.dst_x} * format.luma_bytes();
    const ptrdiff_t chroma_offset = ptrdiff_t{target.dst_y / 2} * dst.chroma_pitch +
                                    ptrdiff_t{target.dst_x / 2} * format.chroma_bytes();
    for (int32_t plane = 0; plane < format.chroma_planes; ++plane) {
        dst.chroma[plane] += chroma_offset;
    }
    return dst;
}

void place_in_canvas(const uint8_t* grid_base, const Yuv420Layout& picture,
                     const ovrin_resize_target& target) {
    const Yuv420Format format = picture.format;
    const Yuv420Layout canvas = canvas_of(format, target);
    auto* dst = static_cast<uint8_t*>(target.dst);
    paint_planes_black(dst, canvas);
    if (canvas.is_empty()) return;
    const Yuv420Layout grid = grid_of(picture);
    const auto width = static_cast<int32_t>(visible(picture.width, target.dst_x, canvas.width));
    const auto height = static_cast<int32_t>(visible(picture.height, target.dst_y, canvas.height));
    const Yuv420Layout part = {format, width, height};
    Rows luma = {};
    luma.src = grid_base;
    luma.src_pitch = grid.luma_pitch();
    luma.dst_offset = ptrdiff_t{target.dst_y} * canvas.luma_pitch() +
                      ptrdiff_t{target.dst_x} * format.luma_bytes();
    luma.dst_pitch = canvas.luma_pitch();
    luma.row_bytes = part.luma_pitch();
    luma.rows = part.height;
    copy_rows(luma, dst, canvas.size());
    const ptrdiff_t chroma_position =
        half_rounded_up(target.dst_y) * canvas.chroma_pitch() +
        ptrdiff_t{half_rounded_up(target.dst_x)} * format.chroma_bytes();
    for (int32_t plane = 0; plane < format.chroma_planes; ++plane) {
        Rows chroma = {};
        chroma.src = grid_base + grid.chroma_offset(plane);
        chroma.src_pitch = grid.chroma_pitch();
        chroma.dst_offset = canvas.chroma_offset(plane) + chroma_position;
        chroma.dst_pitch = canvas.chroma_pitch();
        chroma.row_bytes = part.chroma_pitch();
        chroma.rows = part.chroma_height();
        copy_rows(chroma, dst, canvas.size());
    }
}

}  // namespace ovrin
