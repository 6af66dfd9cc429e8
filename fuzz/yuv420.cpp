// SPDX-License-Identifier: Apache-2.0
// 4:2:0 pictures of FUZZ_FORMAT on the calling thread: contiguous, in planes, letterboxed.
#include <cstring>

#include "reference/yuv420.h"
#include "support.h"
#include "support/yuv420_format.h"

using namespace fuzz;

namespace {

constexpr ovrin_test::Yuv420Format format = ovrin_test::FUZZ_FORMAT;

std::vector<uint8_t> definition(const reference::Yuv420Source& src, const Sizes& s) {
    if (s.dst_w < 1 || s.dst_h < 1) return {};
    if (s.src_w < 1 || s.src_h < 1) {
        return std::vector<uint8_t>(
            static_cast<size_t>(reference::yuv420_size(format.layout, s.dst_w, s.dst_h)));
    }
    return reference::resize_yuv420(src, s.dst_w, s.dst_h);
}

void contiguous(Input& in, const Sizes& s) {
    const uint8_t entry = in.byte() % 3;
    Pixels pixels(in);
    const Flush where = flush(in);
    const bool empty = s.src_w < 1 || s.src_h < 1;
    const int32_t w = empty ? 0 : s.src_w;
    const int32_t h = empty ? 0 : s.src_h;
    const Buffer src = source(pixels, reference::yuv420_size(format.layout, w, h), where);
    const auto view = reference::contiguous(format.layout, src.data(), w, h);
    check_drawing(definition(view, s), where, in.byte(), [&](const Buffer& dst, const char* set) {
        (entry == 0 ? format.contiguous
         : entry == 1
             ? format.contiguous_sg
             : format.contiguous_tps)(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        src.check_unchanged(set);
    });
}

void in_planes(Input& in, const Sizes& s) {
    const uint8_t entry = in.byte() % 3;
    Pixels pixels(in);
    const Flush where = flush(in);
    const Yuv420Planes src(format.layout, pixels, s.src_w, s.src_h, s.src_w, where);
    check_drawing(definition(src.view, s), where, in.byte(),
                  [&](const Buffer& dst, const char* set) {
                      if (entry == 0) {
                          format.planes(src.view, dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
                      } else {
                          (entry == 1 ? format.planes_sg : format.planes_tps)(
                              src.view, dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, nullptr);
                      }
                      src.check_unchanged(set);
                  });
}

void letterboxed(Input& in, const Sizes& s) {
    const uint8_t entry = in.byte() % 3;
    ovrin_resize_target target = letterbox(in, s.dst_w, s.dst_h);
    target.src_stride = s.src_w + in.pick({0, 0, 1, 2, 7, 40, -s.src_w, -2 * s.src_w - 3});
    Pixels pixels(in);
    const Flush where = flush(in);
    const Yuv420Planes src(format.layout, pixels, s.src_w, s.src_h, target.src_stride, where);
    const uint8_t fill = in.byte();
    std::vector<uint8_t> canvas(static_cast<size_t>(reference::yuv420_size(
                                    format.layout, target.canvas_width, target.canvas_height)),
                                fill);
    (entry == 2 ? reference::keep_ratio_yuv420_tps : reference::keep_ratio_yuv420_sg)(
        src.view, target, canvas);
    check_drawing(canvas, where, fill, [&](const Buffer& dst, const char* set) {
        ovrin_resize_target passed = target;
        target.dst = passed.dst = dst.data();
        if (entry == 0) {
            format.keep_ratio(src.view, s.src_w, s.src_h, &passed);
        } else {
            (entry == 1 ? format.planes_sg : format.planes_tps)(src.view, nullptr, s.src_w, s.src_h,
                                                                -1, -1, &passed);
        }
        require(memcmp(&passed, &target, sizeof passed) == 0, "the target was written", set);
        src.check_unchanged(set);
    });
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    const uint8_t form = in.byte() % 3;
    Sizes s = sizes(in);
    if (s.src_h > kMostRowsWithoutThreads) s.src_h = kMostRowsWithoutThreads;
    if (form == 2) {
        letterboxed(in, s);
        return 0;
    }
    empty_some(in, s);
    (form == 0 ? contiguous : in_planes)(in, s);
    return 0;
}
