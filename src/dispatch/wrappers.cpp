// SPDX-License-Identifier: Apache-2.0
// The intended entry points: pictures that are short, or sooner done than threads are started, stay
// on the calling thread, others go in bands.
#include <ovrinresize.h>

#include "dispatch/band_size.h"

namespace {

// Bytes of a picture's pixels, in halves: 4:2:0 has a byte and a half.
constexpr int32_t kRgbaHalfBytes = 8;
constexpr int32_t kYuv420HalfBytes = 3;

// To start and end the pool takes about 85 us, and two threads do half as much again as one: memory
// is what they wait for. The calling thread samples 20 MB in about 300 us.
constexpr int64_t kThreadedBytes = int64_t{20} << 20;

bool is_worth_threads(int32_t src_w, int32_t src_h, int32_t dst_h, int32_t half_bytes) {
    if (src_w < 1 || src_h < ovrin::kThreadedRows || dst_h < 1) return false;
    const int64_t sampled = int64_t{2} * dst_h;
    const int64_t rows = sampled < src_h ? sampled : src_h;
    return rows * src_w >= kThreadedBytes * 2 / half_bytes;
}

// Where the two ways disagree about a target, its height alone decides which of them is taken.
bool both_ways_agree(const ovrin_resize_target* target) {
    return target != nullptr && target->src_stride > 0 && target->canvas_height >= target->dst_x &&
           target->canvas_height >= target->dst_y;
}

bool is_worth_threads(int32_t src_w, int32_t src_h, const ovrin_resize_target* target,
                      int32_t half_bytes) {
    if (!both_ways_agree(target)) return src_h >= ovrin::kThreadedRows;
    return is_worth_threads(src_w, src_h, target->dst_height, half_bytes);
}

}  // namespace

void ovrin_resize_rgba8888(const uint8_t* src, uint32_t* dst, int32_t src_w, int32_t src_h,
                           int32_t dst_w, int32_t dst_h) {
    const bool threaded = is_worth_threads(src_w, src_h, dst_h, kRgbaHalfBytes);
    const auto resize = threaded ? ovrin_resize_rgba8888_tps : ovrin_resize_rgba8888_sg;
    resize(src, dst, src_w, src_h, dst_w, dst_h);
}

void ovrin_resize_rgba8888_keep_ratio(const uint8_t* src, int32_t src_w, int32_t src_h,
                                      ovrin_resize_target* target) {
    const bool threaded = is_worth_threads(src_w, src_h, target, kRgbaHalfBytes);
    const auto resize =
        threaded ? ovrin_resize_rgba_keep_ratio_tps : ovrin_resize_rgba_keep_ratio_sg;
    resize(src, src_w, src_h, target);
}

void ovrin_resize_yuv420(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                         int32_t dst_w, int32_t dst_h) {
    const bool threaded = is_worth_threads(src_w, src_h, dst_h, kYuv420HalfBytes);
    const auto resize = threaded ? ovrin_resize_yuv420_tps : ovrin_resize_yuv420_sg;
    resize(src, dst, src_w, src_h, dst_w, dst_h);
}

void ovrin_resize_y_u_v(const uint8_t* src_y, const uint8_t* src_u, const uint8_t* src_v,
                        uint8_t* dst, int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h) {
    const bool threaded = is_worth_threads(src_w, src_h, dst_h, kYuv420HalfBytes);
    const auto resize = threaded ? ovrin_resize_y_u_v_tps : ovrin_resize_y_u_v_sg;
    resize(src_y, src_u, src_v, dst, src_w, src_h, dst_w, dst_h, nullptr);
}

void ovrin_resize_y_u_v_keep_ratio(const uint8_t* src_y, const uint8_t* src_u, const uint8_t* src_v,
                                   int32_t src_w, int32_t src_h,
                                   const ovrin_resize_target* target) {
    const bool threaded = is_worth_threads(src_w, src_h, target, kYuv420HalfBytes);
    const auto resize = threaded ? ovrin_resize_y_u_v_tps : ovrin_resize_y_u_v_sg;
    resize(src_y, src_u, src_v, nullptr, src_w, src_h, 0, 0, target);
}

void ovrin_resize_nv21(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                       int32_t dst_w, int32_t dst_h) {
    const bool threaded = is_worth_threads(src_w, src_h, dst_h, kYuv420HalfBytes);
    const auto resize = threaded ? ovrin_resize_nv21_tps : ovrin_resize_nv21_sg;
    resize(src, dst, src_w, src_h, dst_w, dst_h);
}

void ovrin_resize_y_nv21(const uint8_t* src_y, const uint8_t* src_vu, uint8_t* dst, int32_t src_w,
                         int32_t src_h, int32_t dst_w, int32_t dst_h) {
    const bool threaded = is_worth_threads(src_w, src_h, dst_h, kYuv420HalfBytes);
    const auto resize = threaded ? ovrin_resize_y_nv_tps : ovrin_resize_y_nv_sg;
    resize(src_y, src_vu, dst, src_w, src_h, dst_w, dst_h, nullptr);
}

void ovrin_resize_y_nv21_keep_ratio(const uint8_t* src_y, const uint8_t* src_vu, int32_t src_w,
                                    int32_t src_h, const ovrin_resize_target* target) {
    const bool threaded = is_worth_threads(src_w, src_h, target, kYuv420HalfBytes);
    const auto resize = threaded ? ovrin_resize_y_nv_tps : ovrin_resize_y_nv_sg;
    resize(src_y, src_vu, nullptr, src_w, src_h, 0, 0, target);
}
