// SPDX-License-Identifier: Apache-2.0
#include <ovrinresize.h>

#include "quarter/sampler.h"

namespace {
constexpr int32_t kRgbBytes = 3;
}

void ovrin_resize_rgb888(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                         int32_t dst_w, int32_t dst_h) {
    ovrin::sample_plane({
        src,
        ptrdiff_t{src_w} * kRgbBytes,
        src_w,
        src_h,
        dst,
        ptrdiff_t{dst_w} * kRgbBytes,
        dst_w,
        dst_h,
        dst_h,
        dst_w,
        src_w,
        kRgbBytes,
    });
}
