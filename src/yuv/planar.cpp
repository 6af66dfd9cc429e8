// SPDX-License-Identifier: Apache-2.0
// Planar 4:2:0, whole pictures.
#include "yuv/planar.h"

#include <ovrinresize.h>

#include "yuv420/resize.h"

using namespace ovrin;

void ovrin_resize_yuv420_sg(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                            int32_t dst_w, int32_t dst_h) {
    resize_yuv420(contiguous_source(kI420, src, src_w, src_h), dst, dst_w, dst_h);
}

void ovrin_resize_yuv420_tps(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                             int32_t dst_w, int32_t dst_h) {
    const Yuv420Source source = contiguous_source(kI420, src, src_w, src_h);
    if (!resize_yuv420_in_bands(source, dst, dst_w, dst_h)) {
        resize_yuv420(source, dst, dst_w, dst_h);
    }
}

void ovrin_resize_y_u_v_sg(const uint8_t* src_y, const uint8_t* src_u, const uint8_t* src_v,
                           uint8_t* dst, int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h,
                           const ovrin_resize_target* target) {
    resize_yuv420_planes(three_planes(src_y, src_u, src_v, src_w, src_h), dst, dst_w, dst_h,
                         target);
}

void ovrin_resize_y_u_v_tps(const uint8_t* src_y, const uint8_t* src_u, const uint8_t* src_v,
                            uint8_t* dst, int32_t src_w, int32_t src_h, int32_t dst_w,
                            int32_t dst_h, const ovrin_resize_target* target) {
    const Yuv420Source source = three_planes(src_y, src_u, src_v, src_w, src_h);
    if (!resize_yuv420_planes_in_bands(source, dst, dst_w, dst_h, target)) {
        resize_yuv420_planes(source, dst, dst_w, dst_h, target);
    }
}
