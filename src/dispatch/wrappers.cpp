// SPDX-License-Identifier: Apache-2.0
// The intended entry points: low pictures stay on the calling thread, the others go in bands.
#include <ovrinresize.h>

#include "bands/split.h"

using ovrin::kThreadedRows;

void ovrin_resize_rgba8888(const uint8_t* src, uint32_t* dst, int32_t src_w, int32_t src_h,
                           int32_t dst_w, int32_t dst_h) {
    if (src_h < kThreadedRows) {
        ovrin_resize_rgba8888_sg(src, dst, src_w, src_h, dst_w, dst_h);
    } else {
        ovrin_resize_rgba8888_tps(src, dst, src_w, src_h, dst_w, dst_h);
    }
}

void ovrin_resize_rgba8888_keep_ratio(const uint8_t* src, int32_t src_w, int32_t src_h,
                                      ovrin_resize_target* target) {
    if (src_h < kThreadedRows) {
        ovrin_resize_rgba_keep_ratio_sg(src, src_w, src_h, target);
    } else {
        ovrin_resize_rgba_keep_ratio_tps(src, src_w, src_h, target);
    }
}

void ovrin_resize_yuv420(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                         int32_t dst_w, int32_t dst_h) {
    if (src_h < kThreadedRows) {
        ovrin_resize_yuv420_sg(src, dst, src_w, src_h, dst_w, dst_h);
    } else {
        ovrin_resize_yuv420_tps(src, dst, src_w, src_h, dst_w, dst_h);
    }
}

void ovrin_resize_y_u_v(const uint8_t* src_y, const uint8_t* src_u, const uint8_t* src_v,
                        uint8_t* dst, int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h) {
    if (src_h < kThreadedRows) {
        ovrin_resize_y_u_v_sg(src_y, src_u, src_v, dst, src_w, src_h, dst_w, dst_h, nullptr);
    } else {
        ovrin_resize_y_u_v_tps(src_y, src_u, src_v, dst, src_w, src_h, dst_w, dst_h, nullptr);
    }
}

void ovrin_resize_y_u_v_keep_ratio(const uint8_t* src_y, const uint8_t* src_u, const uint8_t* src_v,
                                   int32_t src_w, int32_t src_h,
                                   const ovrin_resize_target* target) {
    if (src_h < kThreadedRows) {
        ovrin_resize_y_u_v_sg(src_y, src_u, src_v, nullptr, src_w, src_h, 0, 0, target);
    } else {
        ovrin_resize_y_u_v_tps(src_y, src_u, src_v, nullptr, src_w, src_h, 0, 0, target);
    }
}

void ovrin_resize_nv21(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                       int32_t dst_w, int32_t dst_h) {
    if (src_h < kThreadedRows) {
        ovrin_resize_nv21_sg(src, dst, src_w, src_h, dst_w, dst_h);
    } else {
        ovrin_resize_nv21_tps(src, dst, src_w, src_h, dst_w, dst_h);
    }
}

void ovrin_resize_y_nv21(const uint8_t* src_y, const uint8_t* src_vu, uint8_t* dst, int32_t src_w,
                         int32_t src_h, int32_t dst_w, int32_t dst_h) {
    if (src_h < kThreadedRows) {
        ovrin_resize_y_nv_sg(src_y, src_vu, dst, src_w, src_h, dst_w, dst_h, nullptr);
    } else {
        ovrin_resize_y_nv_tps(src_y, src_vu, dst, src_w, src_h, dst_w, dst_h, nullptr);
    }
}

void ovrin_resize_y_nv21_keep_ratio(const uint8_t* src_y, const uint8_t* src_vu, int32_t src_w,
                                    int32_t src_h, const ovrin_resize_target* target) {
    if (src_h < kThreadedRows) {
        ovrin_resize_y_nv_sg(src_y, src_vu, nullptr, src_w, src_h, 0, 0, target);
    } else {
        ovrin_resize_y_nv_tps(src_y, src_vu, nullptr, src_w, src_h, 0, 0, target);
    }
}
