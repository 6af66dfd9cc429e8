// SPDX-License-Identifier: Apache-2.0
// The functions for both formats of 4:2:0 pictures, each under one name for both.
#pragma once

#include <ovrinresize.h>

#include <cstdint>

#include "reference/yuv420.h"

namespace ovrin_test {

struct Yuv420Format {
    using Contiguous = decltype(ovrin_resize_yuv420);
    using Planes = void(const reference::Yuv420Source& src, uint8_t* dst, int32_t src_w,
                        int32_t src_h, int32_t dst_w, int32_t dst_h);
    // Of either a destination or a target.
    using PlanesOrTarget = void(const reference::Yuv420Source& src, uint8_t* dst, int32_t src_w,
                                int32_t src_h, int32_t dst_w, int32_t dst_h,
                                ovrin_resize_target* target);
    using KeepRatio = void(const reference::Yuv420Source& src, int32_t src_w, int32_t src_h,
                           ovrin_resize_target* target);

    const char* name;
    reference::ChromaLayout layout;
    Contiguous* contiguous;
    Contiguous* contiguous_sg;
    Contiguous* contiguous_tps;
    Planes* planes;
    PlanesOrTarget* planes_sg;
    PlanesOrTarget* planes_tps;
    KeepRatio* keep_ratio;
};

inline constexpr Yuv420Format kI420Format = {
    "I420",
    reference::kI420,
    ovrin_resize_yuv420,
    ovrin_resize_yuv420_sg,
    ovrin_resize_yuv420_tps,
    [](const reference::Yuv420Source& src, uint8_t* dst, int32_t src_w, int32_t src_h,
       int32_t dst_w, int32_t dst_h) {
        ovrin_resize_y_u_v(src.y, src.chroma[0], src.chroma[1], dst, src_w, src_h, dst_w, dst_h);
    },
    [](const reference::Yuv420Source& src, uint8_t* dst, int32_t src_w, int32_t src_h,
       int32_t dst_w, int32_t dst_h, ovrin_resize_target* target) {
        ovrin_resize_y_u_v_sg(src.y, src.chroma[0], src.chroma[1], dst, src_w, src_h, dst_w, dst_h,
                              target);
    },
    [](const reference::Yuv420Source& src, uint8_t* dst, int32_t src_w, int32_t src_h,
       int32_t dst_w, int32_t dst_h, ovrin_resize_target* target) {
        ovrin_resize_y_u_v_tps(src.y, src.chroma[0], src.chroma[1], dst, src_w, src_h, dst_w, dst_h,
                               target);
    },
    [](const reference::Yuv420Source& src, int32_t src_w, int32_t src_h,
       ovrin_resize_target* target) {
        ovrin_resize_y_u_v_keep_ratio(src.y, src.chroma[0], src.chroma[1], src_w, src_h, target);
    }};

inline constexpr Yuv420Format kNv21Format = {
    "NV21",
    reference::kNv21,
    ovrin_resize_nv21,
    ovrin_resize_nv21_sg,
    ovrin_resize_nv21_tps,
    [](const reference::Yuv420Source& src, uint8_t* dst, int32_t src_w, int32_t src_h,
       int32_t dst_w, int32_t dst_h) {
        ovrin_resize_y_nv21(src.y, src.chroma[0], dst, src_w, src_h, dst_w, dst_h);
    },
    [](const reference::Yuv420Source& src, uint8_t* dst, int32_t src_w, int32_t src_h,
       int32_t dst_w, int32_t dst_h, ovrin_resize_target* target) {
        ovrin_resize_y_nv_sg(src.y, src.chroma[0], dst, src_w, src_h, dst_w, dst_h, target);
    },
    [](const reference::Yuv420Source& src, uint8_t* dst, int32_t src_w, int32_t src_h,
       int32_t dst_w, int32_t dst_h, ovrin_resize_target* target) {
        ovrin_resize_y_nv_tps(src.y, src.chroma[0], dst, src_w, src_h, dst_w, dst_h, target);
    },
    [](const reference::Yuv420Source& src, int32_t src_w, int32_t src_h,
       ovrin_resize_target* target) {
        ovrin_resize_y_nv21_keep_ratio(src.y, src.chroma[0], src_w, src_h, target);
    }};

}  // namespace ovrin_test
