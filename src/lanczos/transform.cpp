// SPDX-License-Identifier: Apache-2.0
// The Lanczos engine on the calling thread.
#include <ovrinresize.h>

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

}  // namespace

int32_t checkOvImage(const lanczos_image* image) {
    return image != nullptr && image->width > 0 && image->height > 0 && image->data != nullptr &&
                   image->bytes_per_pixel > 0 && image->stride > 0
               ? 1
               : 0;
}

void OvTransformLanczos(const lanczos_image* src, const lanczos_image* dst) {
    if (checkOvImage(src) == 0 || checkOvImage(dst) == 0) return;
    // Shorter rows would be read past the picture's end.
    if (src->stride < int64_t{src->width} * src->bytes_per_pixel) return;
    LanczosPlan plan(dst->width, dst->height);
    const LanczosRows picture = {
        src->data,           src->width,      src->height, src->stride, src->bytes_per_pixel,
        dst->data,           dst->width,      dst->height, dst->stride, dst->bytes_per_pixel,
        plan.columns.data(), plan.rows.data()};
    LanczosCache cache(picture);
    if (!plan.ready() || !cache.ready()) return;
    plan.fill(src->width, src->height);
    filter_rows(picture, cache, 0, dst->height);
}

void ov_lanczos(const uint8_t* src, int32_t src_w, int32_t src_h, uint8_t* dst, int32_t dst_w,
                int32_t dst_h, int32_t bytes_per_pixel) {
    const lanczos_image source = packed_image(src_w, src_h, bytes_per_pixel, src);
    const lanczos_image target = packed_image(dst_w, dst_h, bytes_per_pixel, dst);
    OvTransformLanczos(&source, &target);
}

void ov_lanczos_nv(const uint8_t* src, int32_t src_w, int32_t src_h, uint8_t* dst, int32_t dst_w,
                   int32_t dst_h) {
    if (src == nullptr || dst == nullptr) return;
    // Otherwise the second planes would lie nowhere.
    if (src_w < 1 || src_h < 1 || dst_w < 1 || dst_h < 1) return;
    ov_lanczos(src, src_w, src_h, dst, dst_w, dst_h, 1);
    ov_lanczos(src + int64_t{src_w} * src_h, src_w, src_h, dst + int64_t{dst_w} * dst_h, dst_w,
               dst_h, 2);
}
