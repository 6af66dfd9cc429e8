// SPDX-License-Identifier: Apache-2.0
#include "yuv420/threaded.h"

#include "bands/split.h"
#include "quarter/threaded.h"
#include "yuv420/place.h"
#include "yuv420/planes.h"
#include "yuv420/work_buffer.h"

namespace ovrin {

namespace {

void sample_in_bands(const Yuv420Source& source, const Yuv420Layout& picture,
                     const Yuv420Destination& to, int32_t bands, BandPool& pool) {
    const PicturePlanes planes = picture_planes(source, picture, to);
    sample_in_bands({planes.planes, planes.count, bands}, pool);
}

}  // namespace

bool resize_yuv420_in_bands(const Yuv420Source& source, uint8_t* dst, int32_t width,
                            int32_t height) {
    const int32_t bands = picture_bands(source.height, height);
    const Yuv420Layout picture = {source.chroma, width, height};
    if (bands < 2 || !has_grid(picture)) return false;
    const PicturePlanes planes =
        picture_planes(source, picture, contiguous_destination(picture, dst));
    return sample_in_bands({planes.planes, planes.count, bands});
}

bool resize_yuv420_into_canvas_in_bands(const Yuv420Source& source,
                                        const ovrin_resize_target& target) {
    const int32_t bands = picture_bands(source.height, target.dst_height);
    const Yuv420Layout picture = {source.chroma, target.dst_width, target.dst_height};
    if (bands < 2 || (!picture.is_empty() && !has_grid(picture))) return false;
    BandPool pool;
    if (!pool.ready()) return false;
    if (picture.is_empty()) {
        paint_canvas(source.chroma, target);
        return true;
    }
    if (fits_canvas(picture, target)) {
        paint_around(picture, target);
        sample_in_bands(source, picture, picture_in_canvas(source.chroma, target), bands, pool);
        return true;
    }
    const Yuv420Layout grid = grid_of(picture);
    const WorkBuffer work(grid);
    if (work.data() == nullptr) return false;
    sample_in_bands(source, picture, contiguous_destination(grid, work.data()), bands, pool);
    place_in_canvas(work.data(), picture, target);
    return true;
}

}  // namespace ovrin
