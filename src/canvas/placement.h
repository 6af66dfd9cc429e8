// SPDX-License-Identifier: Apache-2.0
// Where a picture may lie in its target's canvas, and what of it is seen. Every entry point has a
// rule of its own; callers rely on the differences, so they stand here side by side.
#pragma once

#include <ovrinresize.h>

#include "canvas/yuv420_layout.h"

namespace ovrin {

// ---- Placements that are turned down, with nothing written ------------------------------------

// RGBA8888, on one thread and on several. The vertical test looks at the picture's height where the
// horizontal one looks at its position: a picture higher than its canvas is not cut, one that
// begins below the canvas is cut to nothing.
inline bool rejects_rgba(const ovrin_resize_target& target) {
    return target.canvas_width < target.dst_x || target.canvas_height < target.dst_height ||
           target.dst_height == 0;
}

// Planes on the calling thread: positions beyond the canvas in either direction.
inline bool rejects_planes(const ovrin_resize_target& target) {
    return target.canvas_width < target.dst_x || target.canvas_height < target.dst_y ||
           target.dst_height == 0;
}

// Planes in bands. The canvas's height is compared with the horizontal position: a picture that
// begins below the canvas is accepted, and gives a black canvas.
inline bool rejects_planes_in_bands(const ovrin_resize_target& target) {
    return target.canvas_width < target.dst_x || target.canvas_height < target.dst_x ||
           target.dst_height == 0;
}

// ---- Pictures that stay as they are -----------------------------------------------------------

// The whole RGBA8888 picture lies in the canvas's memory, though its rows may run on from one
// canvas row into the next. Positions are not checked one by one; a negative one, which centring a
// picture larger than its canvas easily gives, can move even a cut picture out of the canvas.
bool rgba_lies_in_memory(const ovrin_resize_target& target);

// The same, and no row runs on into the next one.
bool rgba_lies_inside(const ovrin_resize_target& target);

// The canvas has room for all planes of the picture where they are to lie. At odd positions chroma
// is rounded away from its luma and may not fit.
bool planes_lie_inside(const Yuv420Layout& picture, const ovrin_resize_target& target);

// ---- Pictures that are cut --------------------------------------------------------------------

struct SourceSize {
    int32_t width;
    int32_t height;
};

// Cuts an RGBA8888 picture at the canvas's right and lower edge and the source in proportion,
// writes both back into the target, and returns the source size to use: on an axis that was cut the
// target's, otherwise the argument's.
SourceSize cut_rgba(ovrin_resize_target& target, SourceSize size);

// The part of `size` samples from `position` on that a canvas of canvas_size has room for; negative
// when the position lies beyond it. Planes and bilinear pictures lose what does not fit, the source
// is not cut.
inline int64_t visible(int32_t size, int32_t position, int32_t canvas_size) {
    const int64_t room = int64_t{canvas_size} - position;
    return size > room ? room : size;
}

}  // namespace ovrin
