// SPDX-License-Identifier: Apache-2.0
// Calls that start threads: the drivers of the quarter-point formats, and both engines.
#include <algorithm>

#include "bilinear_support.h"
#include "reference/keep_ratio_rgba.h"
#include "reference/lanczos.h"
#include "support.h"
#include "support/yuv420_format.h"

using namespace fuzz;

namespace {

// Narrow pictures of a few bands or many; the wrappers start threads from 1024 rows on.
Sizes tall(Input& in) {
    Sizes s;
    s.src_w = in.between(1, 12);
    s.src_h = in.pick({in.between(48, 303), in.between(48, 303), in.between(1000, 1255)});
    s.dst_w = in.between(1, 12);
    const int32_t ratio = in.between(1, 40);
    s.dst_h = in.pick({std::max(1, s.src_h / ratio), s.src_h, s.src_h + 1, in.between(1, 256),
                       in.between(1, 256)});
    return s;
}

// A canvas that the picture fills, fits into or passes, which both the driver and the function on
// the calling thread draw on: it shows a row at least, and is as high as the picture lies to the
// right.
ovrin_resize_target around(Input& in, const Sizes& s, int32_t low) {
    ovrin_resize_target target = letterbox(in, s.dst_w, s.dst_h);
    target.canvas_width = std::max(target.canvas_width, target.dst_x + 1);
    target.canvas_height = std::max({target.canvas_height, target.dst_x, target.dst_y + 1, low});
    target.src_width = s.src_w;
    target.src_height = s.src_h;
    target.src_stride = s.src_w + in.between(0, 4);
    return target;
}

void rgba(Input& in) {
    const Sizes s = tall(in);
    const bool wrapper = in.flag();
    Pixels pixels(in);
    const Flush where = flush(in);
    const Plane src(pixels, s.src_w * 4, s.src_h, s.src_w * 4, where);
    check_drawing(reference::quarter_packed(src.first(), s.src_w, s.src_h, s.dst_w, s.dst_h, 4),
                  where, in.byte(), [&](const Buffer& dst, const char*) {
                      (wrapper ? ovrin_resize_rgba8888 : ovrin_resize_rgba8888_tps)(
                          src.first(), dst.words(), s.src_w, s.src_h, s.dst_w, s.dst_h);
                  });
}

void canvas(Input& in) {
    const Sizes s = tall(in);
    ovrin_resize_target target = around(in, s, s.dst_h);
    Pixels pixels(in);
    const Flush where = flush(in);
    const Plane src(pixels, s.src_w * 4, s.src_h, target.src_stride * 4, where);
    std::vector<uint32_t> words(static_cast<size_t>(target.canvas_width * target.canvas_height));
    ovrin_resize_target expected = target;
    reference::keep_ratio_rgba_tps(src.first(), s.src_w, s.src_h, expected, words);
    const auto* bytes = reinterpret_cast<const uint8_t*>(words.data());
    check_drawing({bytes, bytes + bytes_of(words)}, where, in.byte(),
                  [&](const Buffer& dst, const char* set) {
                      ovrin_resize_target passed = target;
                      passed.dst = expected.dst = dst.data();
                      ovrin_resize_rgba_keep_ratio_tps(src.first(), s.src_w, s.src_h, &passed);
                      require(memcmp(&passed, &expected, sizeof passed) == 0,
                              "the target is not what clipping gives", set);
                  });
}

void yuv420(Input& in, const ovrin_test::Yuv420Format& format) {
    const Sizes s = tall(in);
    const uint8_t form = in.byte() % 3;
    ovrin_resize_target target = around(in, s, 0);
    const int32_t stride = form == 2 ? target.src_stride : s.src_w;
    Pixels pixels(in);
    const Flush where = flush(in);
    if (form == 0) {
        const Buffer src =
            source(pixels, reference::yuv420_size(format.layout, s.src_w, s.src_h), where);
        const auto view = reference::contiguous(format.layout, src.data(), s.src_w, s.src_h);
        check_drawing(reference::resize_yuv420(view, s.dst_w, s.dst_h), where, in.byte(),
                      [&](const Buffer& dst, const char*) {
                          format.contiguous_tps(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w,
                                                s.dst_h);
                      });
        return;
    }
    const Yuv420Planes src(format.layout, pixels, s.src_w, s.src_h, stride, where);
    std::vector<uint8_t> expected;
    if (form == 1) {
        expected = reference::resize_yuv420(src.view, s.dst_w, s.dst_h);
    } else {
        expected.resize(static_cast<size_t>(
            reference::yuv420_size(format.layout, target.canvas_width, target.canvas_height)));
        reference::keep_ratio_yuv420_tps(src.view, target, expected);
    }
    check_drawing(expected, where, in.byte(), [&](const Buffer& dst, const char*) {
        target.dst = dst.data();
        format.planes_tps(src.view, dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h,
                          form == 2 ? &target : nullptr);
    });
}

// Bands from 1024 destination rows on.
void bilinear(Input& in) {
    const Sizes s = {in.between(1, 12), in.between(1, 256), in.between(1, 8),
                     in.between(1016, 1120)};
    const BilinearCall call = bilinear_call(in, s);
    check_bilinear(
        call, ov_bilinear, in, [&](reference::BilinearSource& src, std::vector<uint8_t>& dst) {
            reference::bilinear(call.g, call.src_w, call.src_h, call.dst_w, call.dst_h, src, dst);
        });
}

void lanczos(Input& in) {
    const Sizes s = {in.between(1, 12), in.between(1, 100), in.between(1, 8), in.between(40, 140)};
    const int32_t bytes = in.pick({4, 4, 3, 2, 1});
    Pixels pixels(in);
    const Flush where = flush(in);
    const Buffer src = source(pixels, int64_t{s.src_w} * s.src_h * bytes, where);
    check_drawing(reference::resize_lanczos(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, bytes),
                  where, in.byte(), [&](const Buffer& dst, const char*) {
                      ovrin_resize_lanczos(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w,
                                           s.dst_h, bytes);
                  });
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    switch (in.byte() % 6) {
        case 0:
            rgba(in);
            break;
        case 1:
            canvas(in);
            break;
        case 2:
            yuv420(in, ovrin_test::kI420Format);
            break;
        case 3:
            yuv420(in, ovrin_test::kNv21Format);
            break;
        case 4:
            bilinear(in);
            break;
        default:
            lanczos(in);
    }
    return 0;
}
