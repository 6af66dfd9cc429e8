// SPDX-License-Identifier: Apache-2.0
// Whole calls of the Lanczos engine. Each makes the table of weights, which takes most of its time.
#include "reference/lanczos.h"

#include "support.h"

using namespace fuzz;

namespace {

void packed(Input& in, const Sizes& s) {
    const int32_t bytes = in.between(1, 5);
    Pixels pixels(in);
    const Flush where = flush(in);
    const Buffer src = source(pixels, int64_t{s.src_w} * s.src_h * bytes, where);
    check_drawing(reference::lanczos(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, bytes), where,
                  in.byte(), [&](const Buffer& dst, const char* set) {
                      ov_lanczos(src.data(), s.src_w, s.src_h, dst.data(), s.dst_w, s.dst_h, bytes);
                      src.check_unchanged(set);
                  });
}

void pairs(Input& in, const Sizes& s) {
    Pixels pixels(in);
    const Flush where = flush(in);
    const Buffer src = source(pixels, int64_t{s.src_w} * s.src_h * 3, where);
    check_drawing(reference::lanczos_nv(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h), where,
                  in.byte(), [&](const Buffer& dst, const char* set) {
                      ov_lanczos_nv(src.data(), s.src_w, s.src_h, dst.data(), s.dst_w, s.dst_h);
                      src.check_unchanged(set);
                  });
}

// Rows of both longer than their pixels; fewer components in the destination.
void images(Input& in, const Sizes& s) {
    const int32_t src_bytes = in.between(1, 5);
    const int32_t dst_bytes = in.between(1, src_bytes);
    const int32_t src_stride = s.src_w * src_bytes + in.between(0, 20);
    const int32_t dst_stride = s.dst_w * dst_bytes + in.between(0, 20);
    Pixels pixels(in);
    const Flush where = flush(in);
    const Plane src(pixels, int64_t{s.src_w} * src_bytes, s.src_h, src_stride, where);
    std::vector<uint8_t> packed_src;
    for (int32_t row = 0; row < s.src_h; ++row) {
        const uint8_t* first = src.first() + int64_t{row} * src_stride;
        packed_src.insert(packed_src.end(), first, first + int64_t{s.src_w} * src_bytes);
    }
    const auto picture = reference::lanczos(
        {s.src_w, s.src_h, s.dst_w, s.dst_h, src_bytes, dst_bytes}, packed_src.data());
    const uint8_t fill = in.byte();
    const int64_t row_bytes = int64_t{s.dst_w} * dst_bytes;
    std::vector<uint8_t> expected(
        static_cast<size_t>(int64_t{dst_stride} * (s.dst_h - 1) + row_bytes), fill);
    for (int64_t row = 0; row < s.dst_h; ++row) {
        std::copy(picture.begin() + row * row_bytes, picture.begin() + (row + 1) * row_bytes,
                  expected.begin() + row * dst_stride);
    }
    check_drawing(expected, where, fill, [&](const Buffer& dst, const char* set) {
        const lanczos_image from = {s.src_w, s.src_h, src_stride, src_bytes,
                                    const_cast<uint8_t*>(src.first())};
        const lanczos_image to = {s.dst_w, s.dst_h, dst_stride, dst_bytes, dst.data()};
        OvTransformLanczos(&from, &to);
        src.check_unchanged(set);
    });
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    const uint8_t entry = in.byte() % 3;
    const Sizes s = short_sizes(in);
    (entry == 0 ? packed : entry == 1 ? pairs : images)(in, s);
    return 0;
}
