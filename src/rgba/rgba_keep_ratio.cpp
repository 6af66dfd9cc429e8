// SPDX-License-Identifier: Apache-2.0
// RGBA8888 into a canvas.
#include "bands/split.h"
#include "canvas/paint.h"
#include "canvas/placement.h"
#include "quarter/threaded.h"
#include "rgba/rgba_band.h"

namespace ovrin {

namespace {

uint32_t* first_picture_row(const ovrin_resize_target& target) {
    return static_cast<uint32_t*>(target.dst) + ptrdiff_t{target.canvas_width} * target.dst_y;
}

RgbaRows canvas_rows(const ovrin_rgba_band& band) {
    return {band.src_stride, wrapping_add(wrapping_add(band.dst_x, band.dst_w), band.dst_skip),
            band.dst_x};
}

QuarterPlane picture_plane(const uint8_t* src, int32_t src_stride, const SourceSize& size,
                           const ovrin_resize_target& target) {
    return rgba_plane({src, src_stride, size.width, size.height},
                      {first_picture_row(target) + target.dst_x, target.canvas_width,
                       target.dst_width, target.dst_height});
}

// False when nothing has been written.
bool resize_in_bands(const uint8_t* src, const SourceSize& size,
                     const ovrin_resize_target& target) {
    if (target.dst_width < 1 || target.dst_height < 1 || !rgba_lies_in_memory(target)) return false;
    const int32_t bands = picture_bands(size.height, target.dst_height);
    if (bands < 2) return false;
    BandPool pool;
    if (!pool.ready()) return false;
    paint_around_rgba(target);
    const int32_t src_stride = target.src_stride > 0 ? target.src_stride : size.width;
    const QuarterPlane plane = picture_plane(src, src_stride, size, target);
    sample_in_bands({&plane, 1, bands}, pool);
    return true;
}

}  // namespace

}  // namespace ovrin

using namespace ovrin;

void ovrin_resize_rgba_keep_ratio_sg(const uint8_t* src, int32_t src_w, int32_t src_h,
                                     ovrin_resize_target* target) {
    if (rejects_rgba(*target)) return;
    const SourceSize size = cut_rgba(*target, {src_w, src_h});
    if (!rgba_lies_in_memory(*target)) {
        paint_rgba_black(target->dst, target->canvas_width, target->canvas_height);
        return;
    }
    paint_around_rgba(*target);
    sample_plane(picture_plane(src, target->src_stride, size, *target));
}

void ovrin_resize_rgba8888_get_pos_keep_ratio(int32_t /*src_w*/, int32_t src_h, int32_t /*dst_w*/,
                                              int32_t dst_h, int32_t canvas_w, int32_t /*canvas_h*/,
                                              ovrin_rgba_band* band) {
    advance_rgba_band(*band, src_h, dst_h, {band->src_stride, canvas_w, 0});
}

void _resize_rgba8888_keep_ratio_tp(void* band) {
    auto* record = static_cast<ovrin_rgba_band*>(band);
    run_rgba_band(*record, canvas_rows(*record));
}

void ovrin_resize_rgba_keep_ratio_tps(const uint8_t* src, int32_t src_w, int32_t src_h,
                                      ovrin_resize_target* target) {
    if (target == nullptr || rejects_rgba(*target)) return;
    const SourceSize size = cut_rgba(*target, {src_w, src_h});
    if (!resize_in_bands(src, size, *target)) {
        ovrin_resize_rgba_keep_ratio_sg(src, size.width, size.height, target);
    }
}
