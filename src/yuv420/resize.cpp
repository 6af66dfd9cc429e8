// SPDX-License-Identifier: Apache-2.0
#include "yuv420/resize.h"

#include "yuv420/place.h"
#include "yuv420/planes.h"
#include "yuv420/work_buffer.h"

namespace ovrin {

namespace {

void sample_into(const Yuv420Source& source, const Yuv420Layout& picture,
                 const Yuv420Destination& to) {
    const PicturePlanes planes = picture_planes(source, picture, to);
    for (int32_t i = 0; i < planes.count; ++i) sample_plane(planes.planes[i]);
}

}  // namespace

// Samples always go straight to the destination. Sizes beside the grid obtain a work buffer all the
// same: bands of such a picture need one, and a call without memory for it writes nothing, on
// whichever way it is run.
void resize_yuv420(const Yuv420Source& source, uint8_t* dst, int32_t width, int32_t height) {
    const Yuv420Layout picture = {source.chroma, width, height};
    if (!has_grid(picture)) return;
    if (!is_own_grid(picture) && WorkBuffer(grid_of(picture)).data() == nullptr) return;
    sample_into(source, picture, contiguous_destination(picture, dst));
}

void resize_yuv420_into_canvas(const Yuv420Source& source, const ovrin_resize_target& target) {
    if (target.canvas_width < target.dst_x || target.canvas_height < target.dst_y ||
        target.dst_height == 0) {
        return;
    }
    const Yuv420Layout picture = {source.chroma, target.dst_width, target.dst_height};
    if (picture.is_empty()) {
        paint_canvas(source.chroma, target);
        return;
    }
    if (!has_grid(picture)) return;
    const Yuv420Layout grid = grid_of(picture);
    const WorkBuffer work(grid);
    if (work.data() == nullptr) return;
    if (fits_canvas(picture, target)) {
        paint_around(picture, target);
        sample_into(source, picture, picture_in_canvas(source.chroma, target));
        return;
    }
    sample_into(source, picture, contiguous_destination(grid, work.data()));
    place_in_canvas(work.data(), picture, target);
}

}  // namespace ovrin
