// SPDX-License-Identifier: Apache-2.0
#include <ovrinresize.h>

#include "quarter/sampler.h"

namespace {
constexpr int32_t kRgbBytes = 3;
}

void ovrin_resize_rgb888(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                         int32_t dst_w, int32_t dst_h) {
    ovrin::QuarterPlane plane = {};
    plane.src = src;
    plane.src_pitch = ptrdiff_t{src_w} * kRgbBytes;
    plane.src_columns = src_w;
    plane.src_rows = src_h;
    plane.dst = dst;
    plane.dst_pitch = ptrdiff_t{dst_w} * kRgbBytes;
    plane.dst_columns = plane.columns = dst_w;
    plane.dst_rows = plane.rows = dst_h;
    plane.sample_bytes = kRgbBytes;
    ovrin::sample_plane(plane);
}
