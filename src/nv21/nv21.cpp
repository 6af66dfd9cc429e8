// SPDX-License-Identifier: Apache-2.0
// NV21, whole pictures.
#include "nv21/nv21.h"

#include <ovrinresize.h>

#include "yuv420/resize.h"

using namespace ovrin;

void ovrin_resize_nv21_sg(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                          int32_t dst_w, int32_t dst_h) {
    resize_yuv420(contiguous_source(kNv21, src, src_w, src_h), dst, dst_w, dst_h);
}

void ovrin_resize_nv21_tps(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                           int32_t dst_w, int32_t dst_h) {
    const Yuv420Source source = contiguous_source(kNv21, src, src_w, src_h);
    if (!resize_yuv420_in_bands(source, dst, dst_w, dst_h)) {
        resize_yuv420(source, dst, dst_w, dst_h);
    }
}

void ovrin_resize_y_nv_sg(const uint8_t* src_y, const uint8_t* src_vu, uint8_t* dst, int32_t src_w,
                          int32_t src_h, int32_t dst_w, int32_t dst_h,
                          const ovrin_resize_target* target) {
    resize_yuv420_planes(two_planes(src_y, src_vu, src_w, src_h), dst, dst_w, dst_h, target);
}

void ovrin_resize_y_nv_tps(const uint8_t* src_y, const uint8_t* src_vu, uint8_t* dst, int32_t src_w,
                           int32_t src_h, int32_t dst_w, int32_t dst_h,
                           const ovrin_resize_target* target) {
    const Yuv420Source source = two_planes(src_y, src_vu, src_w, src_h);
    if (!resize_yuv420_planes_in_bands(source, dst, dst_w, dst_h, target)) {
        resize_yuv420_planes(source, dst, dst_w, dst_h, target);
    }
}
