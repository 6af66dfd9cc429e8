// SPDX-License-Identifier: Apache-2.0
#include "ours.h"

#include <ovrinresize.h>

namespace bench {

namespace {

// A picture's bytes, as the pointer that an export wants.
struct Pixels {
    uint8_t* data;

    template <class Pixel>
    operator Pixel*() const {
        return reinterpret_cast<Pixel*>(data);
    }
};

// Exports that take the two pictures and their sizes.
template <auto resize>
void plain(const Job& /*job*/, const Picture& src, const Picture& dst) {
    resize(Pixels{src.data()}, Pixels{dst.data()}, src.size.width, src.size.height, dst.size.width,
           dst.size.height);
}

ovrin_resize_target target_of(const Job& job, const Picture& src, const Picture& canvas) {
    ovrin_resize_target target = {};
    target.src_width = src.size.width;
    target.src_height = src.size.height;
    target.src_stride = src.size.width;
    target.src_buffer_height = src.size.height;
    target.dst = canvas.data();
    target.dst_width = job.dst.width;
    target.dst_height = job.dst.height;
    target.canvas_width = canvas.size.width;
    target.canvas_height = canvas.size.height;
    target.dst_x = job.x;
    target.dst_y = job.y;
    return target;
}

void letterbox_nv21(const Job& job, const Picture& src, const Picture& canvas) {
    const ovrin_resize_target target = target_of(job, src, canvas);
    ovrin_resize_y_nv_sg(src.data(), src.planes[1].data, nullptr, src.size.width, src.size.height,
                         0, 0, &target);
}

void letterbox_nv21_wrapper(const Job& job, const Picture& src, const Picture& canvas) {
    const ovrin_resize_target target = target_of(job, src, canvas);
    ovrin_resize_y_nv21_keep_ratio(src.data(), src.planes[1].data, src.size.width, src.size.height,
                                   &target);
}

void letterbox_i420(const Job& job, const Picture& src, const Picture& canvas) {
    const ovrin_resize_target target = target_of(job, src, canvas);
    ovrin_resize_y_u_v_sg(src.data(), src.planes[1].data, src.planes[2].data, nullptr,
                          src.size.width, src.size.height, 0, 0, &target);
}

void letterbox_i420_wrapper(const Job& job, const Picture& src, const Picture& canvas) {
    const ovrin_resize_target target = target_of(job, src, canvas);
    ovrin_resize_y_u_v_keep_ratio(src.data(), src.planes[1].data, src.planes[2].data,
                                  src.size.width, src.size.height, &target);
}

void letterbox_rgba(const Job& job, const Picture& src, const Picture& canvas) {
    ovrin_resize_target target = target_of(job, src, canvas);
    ovrin_resize_rgba_keep_ratio_sg(src.data(), src.size.width, src.size.height, &target);
}

void letterbox_rgba_wrapper(const Job& job, const Picture& src, const Picture& canvas) {
    ovrin_resize_target target = target_of(job, src, canvas);
    ovrin_resize_rgba8888_keep_ratio(src.data(), src.size.width, src.size.height, &target);
}

template <auto resize, int32_t format>
void bilinear(const Job& /*job*/, const Picture& src, const Picture& dst) {
    resize(src.data(), dst.data(), src.size.width, src.size.height, dst.size.width, dst.size.height,
           format, nullptr);
}

void lanczos(const Job& /*job*/, const Picture& src, const Picture& dst) {
    ov_lanczos(src.data(), src.size.width, src.size.height, dst.data(), dst.size.width,
               dst.size.height, src.planes[0].sample_bytes);
}

void lanczos_wrapper(const Job& /*job*/, const Picture& src, const Picture& dst) {
    ovrin_resize_lanczos(src.data(), dst.data(), src.size.width, src.size.height, dst.size.width,
                         dst.size.height, src.planes[0].sample_bytes);
}

}  // namespace

OurCalls our_nv21() {
    return {plain<ovrin_resize_nv21_sg>, plain<ovrin_resize_nv21>};
}

OurCalls our_i420() {
    return {plain<ovrin_resize_yuv420_sg>, plain<ovrin_resize_yuv420>};
}

OurCalls our_rgba() {
    return {plain<ovrin_resize_rgba8888_sg>, plain<ovrin_resize_rgba8888>};
}

OurCalls our_rgb() {
    return {plain<ovrin_resize_rgb888>, nullptr};
}

OurCalls our_nearest() {
    return {plain<ovrin_resize_nearest_rgba8888>, nullptr};
}

OurCalls our_bilinear(Layout layout) {
    if (layout == Layout::kNv21)
        return {bilinear<ov_bilinear_sg, OVRIN_FORMAT_SEMI_PLANAR>, nullptr};
    return {bilinear<ov_bilinear_sg, OVRIN_FORMAT_PIXELS>, nullptr};
}

OurCalls our_banded_bilinear(Layout layout) {
    if (layout == Layout::kNv21) return {nullptr, bilinear<ov_bilinear, OVRIN_FORMAT_SEMI_PLANAR>};
    return {nullptr, bilinear<ov_bilinear, OVRIN_FORMAT_PIXELS>};
}

OurCalls our_lanczos() {
    return {lanczos, lanczos_wrapper};
}

OurCalls our_letterbox(Layout layout) {
    if (layout == Layout::kNv21) return {letterbox_nv21, letterbox_nv21_wrapper};
    if (layout == Layout::kI420) return {letterbox_i420, letterbox_i420_wrapper};
    return {letterbox_rgba, letterbox_rgba_wrapper};
}

}  // namespace bench
