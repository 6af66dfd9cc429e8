// SPDX-License-Identifier: Apache-2.0
// The Lanczos engine on the calling thread.
#include <ovrinresize.h>

#include "kernels/kernels.h"
#include "lanczos/rows.h"

using namespace ovrin;

namespace {

lanczos_image packed_image(int32_t width, int32_t height, int32_t bytes_per_pixel,
                           const uint8_t* data) {
    const int64_t stride = int64_t{width} * bytes_per_pixel;
    // An image whose rows its fields cannot name is as good as none.
    const bool fits = stride <= INT32_MAX;
    return {width, height, fits ? static_cast<int32_t>(stride) : 0, bytes_per_pixel,
            const_cast<uint8_t*>(data)};
}

void transform(PlanLanczos* plan_lanczos, const lanczos_image& src, const lanczos_image& dst) {
    if (checkOvImage(&src) == 0 || checkOvImage(&dst) == 0) return;
    // Shorter rows would be read past the picture's end.
    if (src.stride < int64_t{src.width} * src.bytes_per_pixel) return;
    LanczosPlan plan(dst.width, dst.height);
    LanczosPicture picture = {};
    picture.src = src.data;
    picture.src_w = src.width;
    picture.src_h = src.height;
    picture.src_pitch = src.stride;
    picture.src_components = src.bytes_per_pixel;
    picture.dst = dst.data;
    picture.dst_w = dst.width;
    picture.dst_h = dst.height;
    picture.dst_pitch = dst.stride;
    picture.dst_components = dst.bytes_per_pixel;
    picture.column_weights = plan.columns.data();
    picture.row_weights = plan.rows.data();
    LanczosCache cache(picture);
    if (!plan.ready() || !cache.ready()) return;
    plan.fill(src.width, src.height);
    filter_rows(plan_lanczos, picture, cache, 0, dst.height);
}

void transform_packed(PlanLanczos* plan_lanczos, const uint8_t* src, int32_t src_w, int32_t src_h,
                      uint8_t* dst, int32_t dst_w, int32_t dst_h, int32_t bytes_per_pixel) {
    transform(plan_lanczos, packed_image(src_w, src_h, bytes_per_pixel, src),
              packed_image(dst_w, dst_h, bytes_per_pixel, dst));
}

}  // namespace

int32_t checkOvImage(const lanczos_image* image) {
    return image != nullptr && image->width > 0 && image->height > 0 && image->data != nullptr &&
                   image->bytes_per_pixel > 0 && image->stride > 0
               ? 1
               : 0;
}

void OvTransformLanczos(const lanczos_image* src, const lanczos_image* dst) {
    if (src != nullptr && dst != nullptr) transform(kernels().plan_lanczos, *src, *dst);
}

void ov_lanczos(const uint8_t* src, int32_t src_w, int32_t src_h, uint8_t* dst, int32_t dst_w,
                int32_t dst_h, int32_t bytes_per_pixel) {
    transform_packed(kernels().plan_lanczos, src, src_w, src_h, dst, dst_w, dst_h, bytes_per_pixel);
}

void ov_lanczos_nv(const uint8_t* src, int32_t src_w, int32_t src_h, uint8_t* dst, int32_t dst_w,
                   int32_t dst_h) {
    if (src == nullptr || dst == nullptr) return;
    // Otherwise the second planes would lie nowhere.
    if (src_w < 1 || src_h < 1 || dst_w < 1 || dst_h < 1) return;
    PlanLanczos* plan_lanczos = kernels().plan_lanczos;
    transform_packed(plan_lanczos, src, src_w, src_h, dst, dst_w, dst_h, 1);
    transform_packed(plan_lanczos, src + int64_t{src_w} * src_h, src_w, src_h,
                     dst + int64_t{dst_w} * dst_h, dst_w, dst_h, 2);
}
