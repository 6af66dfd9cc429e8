// SPDX-License-Identifier: Apache-2.0
// RGBA8888 into a canvas.
#include <string.h>

#include "bands/split.h"
#include "canvas/margin.h"
#include "quarter/threaded.h"
#include "rgba/rgba_band.h"

namespace ovrin {

namespace {

struct SourceSize {
    int32_t width;
    int32_t height;
};

// The vertical test looks at the picture's height where the horizontal one looks at its position.
bool is_rejected(const ovrin_resize_target& target) {
    return target.canvas_width < target.dst_x || target.canvas_height < target.dst_height ||
           target.dst_height == 0;
}

int32_t scaled(int32_t size, int32_t new_extent, int32_t old_extent) {
    const double result = size * (static_cast<double>(new_extent) / old_extent);
    // Only a negative height can leave the range; what it means is not defined, a trap would be.
    if (!(result > INT32_MIN && result < INT32_MAX)) return 0;
    return static_cast<int32_t>(result);
}

// Cuts one axis of the picture at the canvas's edge, and the source in proportion. Returns the
// source size to use: the target's when it was cut, otherwise the argument's.
int32_t clip(int32_t canvas, int32_t position, int32_t& dst_size, int32_t& target_src_size,
             int32_t src_size) {
    if (canvas >= int64_t{dst_size} + position) return src_size;
    const int32_t cut = wrapping_add(canvas, -int64_t{position});
    target_src_size = scaled(target_src_size, cut, dst_size);
    dst_size = cut;
    return target_src_size;
}

SourceSize clip_to_canvas(ovrin_resize_target& target, int32_t src_w, int32_t src_h) {
    const int32_t width =
        clip(target.canvas_width, target.dst_x, target.dst_width, target.src_width, src_w);
    const int32_t height =
        clip(target.canvas_height, target.dst_y, target.dst_height, target.src_height, src_h);
    return {width, height};
}

uint32_t* first_picture_row(const ovrin_resize_target& target) {
    return static_cast<uint32_t*>(target.dst) + ptrdiff_t{target.canvas_width} * target.dst_y;
}

// Positions are not checked one by one; a negative one, which centring a picture larger than its
// canvas easily gives, can still move the clipped picture out of the canvas's memory.
bool lies_in_canvas(const ovrin_resize_target& target) {
    const int64_t width = target.canvas_width;
    if (width < target.dst_width) return false;
    const int64_t first = width * target.dst_y + target.dst_x;
    const int64_t last_row = first + width * (int64_t{target.dst_height} - 1);
    return first >= 0 && last_row + target.dst_width <= width * target.canvas_height;
}

// No row of the picture runs on into the next one of the canvas.
bool is_inside_canvas(const ovrin_resize_target& target) {
    return target.dst_x >= 0 && target.dst_y >= 0 && target.dst_width > 0 &&
           target.dst_height > 0 &&
           int64_t{target.dst_x} + target.dst_width <= target.canvas_width &&
           int64_t{target.dst_y} + target.dst_height <= target.canvas_height;
}

void clear_canvas(const ovrin_resize_target& target) {
    if (target.canvas_width < 1 || target.canvas_height < 1) return;
    memset(target.dst, 0,
           static_cast<size_t>(target.canvas_width) * static_cast<size_t>(target.canvas_height) *
               kRgbaBytes);
}

// For a picture that stores every pixel of its own.
void clear_around_picture(const ovrin_resize_target& target) {
    if (!is_inside_canvas(target)) {
        clear_canvas(target);
        return;
    }
    fill_margin(static_cast<uint8_t*>(target.dst), ptrdiff_t{target.canvas_width} * kRgbaBytes,
                target.canvas_height,
                {ptrdiff_t{target.dst_x} * kRgbaBytes, target.dst_y,
                 ptrdiff_t{target.dst_width} * kRgbaBytes, target.dst_height},
                0);
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
    if (target.dst_width < 1 || target.dst_height < 1 || !lies_in_canvas(target)) return false;
    const int32_t bands = picture_bands(size.height, target.dst_height);
    if (bands < 2) return false;
    BandPool pool;
    if (!pool.ready()) return false;
    clear_around_picture(target);
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
    if (is_rejected(*target)) return;
    const SourceSize size = clip_to_canvas(*target, src_w, src_h);
    if (!lies_in_canvas(*target)) {
        clear_canvas(*target);
        return;
    }
    clear_around_picture(*target);
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
    if (target == nullptr || is_rejected(*target)) return;
    const SourceSize size = clip_to_canvas(*target, src_w, src_h);
    if (!resize_in_bands(src, size, *target)) {
        ovrin_resize_rgba_keep_ratio_sg(src, size.width, size.height, target);
    }
}
