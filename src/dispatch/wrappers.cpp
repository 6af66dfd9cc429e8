// SPDX-License-Identifier: Apache-2.0
// The intended entry points: short pictures stay on the calling thread, tall ones go in bands.
#include <ovrinresize.h>

#include "dispatch/band_size.h"

using ovrin::kThreadedRows;

void ovrin_resize_rgba8888(const uint8_t* src, uint32_t* dst, int32_t src_w, int32_t src_h,
                           int32_t dst_w, int32_t dst_h) {
    const auto resize =
        src_h < kThreadedRows ? ovrin_resize_rgba8888_sg : ovrin_resize_rgba8888_tps;
    resize(src, dst, src_w, src_h, dst_w, dst_h);
}
