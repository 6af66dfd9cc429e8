// SPDX-License-Identifier: Apache-2.0
#include "yuv420/resize.h"

#include "bands/split.h"
#include "canvas/paint.h"
#include "canvas/placement.h"
#include "quarter/threaded.h"
#include "yuv420/place.h"
#include "yuv420/planes.h"
#include "yuv420/work_buffer.h"

namespace ovrin {

namespace {

Yuv420Layout picture_of(const Yuv420Source& source, const ovrin_resize_target& target) {
    return {source.format, target.dst_width, target.dst_height};
}

void paint_canvas_black(const Yuv420Source& source, const ovrin_resize_target& target) {
    paint_planes_black(static_cast<uint8_t*>(target.dst),
                       {source.format, target.canvas_width, target.canvas_height});
}

void sample(const PicturePlanes& planes) {
    for (int32_t i = 0; i < planes.count; ++i) sample_plane(planes.planes[i]);
}

// Samples straight into the canvas where the picture lies inside it, else by way of `work`.
template <class Sample>
void draw_on_canvas(const Yuv420Source& source, const ovrin_resize_target& target,
                    const WorkBuffer& work, const Sample& sample_planes) {
    const Yuv420Layout picture = picture_of(source, target);
    if (planes_lie_inside(picture, target)) {
        paint_around_planes(picture, target);
        sample_planes(picture_planes(source, picture, picture_in_canvas(source.format, target)));
        return;
    }
    const Yuv420Layout grid = grid_of(picture);
    sample_planes(picture_planes(source, picture, contiguous_destination(grid, work.data())));
    place_in_canvas(work.data(), picture, target);
}

void resize_into_canvas(const Yuv420Source& source, const ovrin_resize_target& target) {
    if (rejects_planes(target)) return;
    const Yuv420Layout picture = picture_of(source, target);
    if (picture.is_empty()) {
        paint_canvas_black(source, target);
        return;
    }
    if (!has_grid(picture)) return;
    const WorkBuffer work(grid_of(picture));
    if (work.data() == nullptr) return;
    draw_on_canvas(source, target, work, sample);
}

bool resize_into_canvas_in_bands(const Yuv420Source& source, const ovrin_resize_target& target) {
    const Yuv420Layout picture = picture_of(source, target);
    const int32_t bands = picture_bands(source.height, picture.height);
    if (bands < 2) return false;
    BandPool pool;
    if (!pool.ready()) return false;
    if (picture.is_empty()) {
        paint_canvas_black(source, target);
        return true;
    }
    if (!has_grid(picture)) return false;
    const WorkBuffer work(grid_of(picture));
    if (work.data() == nullptr) return false;
    draw_on_canvas(source, target, work, [&](const PicturePlanes& planes) {
        sample_in_bands({planes.planes, planes.count, bands}, pool);
    });
    return true;
}

}  // namespace

// Samples always go straight to the destination. What must be true all the same: a picture beside
// its grid needs memory for a work buffer, and a call that finds none writes nothing.
void resize_yuv420(const Yuv420Source& source, uint8_t* dst, int32_t width, int32_t height) {
    const Yuv420Layout picture = {source.format, width, height};
    if (!has_grid(picture)) return;
    if (!is_own_grid(picture) && WorkBuffer(grid_of(picture)).data() == nullptr) return;
    sample(picture_planes(source, picture, contiguous_destination(picture, dst)));
}

void resize_yuv420_planes(Yuv420Source source, uint8_t* dst, int32_t width, int32_t height,
                          const ovrin_resize_target* target) {
    if (target == nullptr) {
        resize_yuv420(source, dst, width, height);
        return;
    }
    source.stride = target->src_stride;
    resize_into_canvas(source, *target);
}

bool resize_yuv420_in_bands(const Yuv420Source& source, uint8_t* dst, int32_t width,
                            int32_t height) {
    const int32_t bands = picture_bands(source.height, height);
    const Yuv420Layout picture = {source.format, width, height};
    if (bands < 2 || !has_grid(picture)) return false;
    const PicturePlanes planes =
        picture_planes(source, picture, contiguous_destination(picture, dst));
    return sample_in_bands({planes.planes, planes.count, bands});
}

bool resize_yuv420_planes_in_bands(Yuv420Source source, uint8_t* dst, int32_t width, int32_t height,
                                   const ovrin_resize_target* target) {
    if (target != nullptr && rejects_planes_in_bands(*target)) return true;
    if (source.height < kThreadedRows) return false;
    if (target == nullptr) return resize_yuv420_in_bands(source, dst, width, height);
    if (target->src_stride > 0) source.stride = target->src_stride;
    return resize_into_canvas_in_bands(source, *target);
}

}  // namespace ovrin
