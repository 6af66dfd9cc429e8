// SPDX-License-Identifier: Apache-2.0
// NV21 on the calling thread.
#include "nv21/nv21.h"

#include <ovrinresize.h>

#include "yuv420/resize.h"

using namespace ovrin;

void ovrin_resize_nv21_sg(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                          int32_t dst_w, int32_t dst_h) {
    resize_yuv420(contiguous_source(kInterleavedChroma, src, src_w, src_h), dst, dst_w, dst_h);
}

void ovrin_resize_y_nv_sg(const uint8_t* src_y, const uint8_t* src_vu, uint8_t* dst, int32_t src_w,
                          int32_t src_h, int32_t dst_w, int32_t dst_h,
                          const ovrin_resize_target* target) {
    if (target != nullptr) {
        resize_yuv420_into_canvas(two_planes(src_y, src_vu, src_w, src_h, target->src_stride),
                                  *target);
    } else {
        resize_yuv420(two_planes(src_y, src_vu, src_w, src_h, src_w), dst, dst_w, dst_h);
    }
}
