// SPDX-License-Identifier: Apache-2.0
// Semi-planar 4:2:0 on the calling thread: contiguous, in two planes, letterboxed.
#include <cstring>

#include "reference/nv21.h"
#include "support.h"

using namespace fuzz;

namespace {

std::vector<uint8_t> definition(const reference::Nv21Source& src, const Sizes& s) {
    if (s.dst_w < 1 || s.dst_h < 1) return {};
    const auto bytes = static_cast<size_t>(reference::nv21_size(s.dst_w, s.dst_h));
    if (s.src_w < 1 || s.src_h < 1) return std::vector<uint8_t>(bytes);
    return reference::resize_nv21(src, s.dst_w, s.dst_h);
}

void contiguous(Input& in, const Sizes& s) {
    const uint8_t entry = in.byte() % 3;
    Pixels pixels(in);
    const Flush where = flush(in);
    const bool empty = s.src_w < 1 || s.src_h < 1;
    const Buffer src = source(pixels, empty ? 0 : reference::nv21_size(s.src_w, s.src_h), where);
    const auto planes =
        reference::nv21_source(src.data(), empty ? 0 : s.src_w, empty ? 0 : s.src_h);
    check_drawing(definition(planes, s), where, in.byte(), [&](const Buffer& dst, const char* set) {
        (entry == 0 ? ovrin_resize_nv21
         : entry == 1
             ? ovrin_resize_nv21_sg
             : ovrin_resize_nv21_tps)(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        src.check_unchanged(set);
    });
}

struct Planes {
    Plane y, vu;
    reference::Nv21Source view;

    Planes(Pixels& pixels, const Sizes& s, int32_t stride, Flush where)
        : y(pixels, s.src_w, s.src_h, stride, where),
          vu(pixels, (int64_t{s.src_w} + 1) & ~1, (int64_t{s.src_h} + 1) >> 1,
             (int64_t{stride} + 1) & ~1, where),
          view{y.first(), vu.first(), s.src_w, s.src_h, stride} {}

    void check_unchanged(const char* set) const {
        y.check_unchanged(set);
        vu.check_unchanged(set);
    }
};

void in_planes(Input& in, const Sizes& s) {
    const uint8_t entry = in.byte() % 3;
    Pixels pixels(in);
    const Flush where = flush(in);
    const Planes src(pixels, s, s.src_w, where);
    check_drawing(definition(src.view, s), where, in.byte(),
                  [&](const Buffer& dst, const char* set) {
                      if (entry == 0) {
                          ovrin_resize_y_nv21(src.view.y, src.view.vu, dst.data(), s.src_w, s.src_h,
                                              s.dst_w, s.dst_h);
                      } else {
                          (entry == 1 ? ovrin_resize_y_nv_sg : ovrin_resize_y_nv_tps)(
                              src.view.y, src.view.vu, dst.data(), s.src_w, s.src_h, s.dst_w,
                              s.dst_h, nullptr);
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
    const Planes src(pixels, s, target.src_stride, where);
    const uint8_t fill = in.byte();
    std::vector<uint8_t> canvas(
        static_cast<size_t>(reference::nv21_size(target.canvas_width, target.canvas_height)), fill);
    (entry == 2 ? reference::keep_ratio_nv21_tps : reference::keep_ratio_nv21_sg)(src.view, target,
                                                                                  canvas);
    check_drawing(canvas, where, fill, [&](const Buffer& dst, const char* set) {
        ovrin_resize_target passed = target;
        target.dst = passed.dst = dst.data();
        if (entry == 0) {
            ovrin_resize_y_nv21_keep_ratio(src.view.y, src.view.vu, s.src_w, s.src_h, &passed);
        } else {
            (entry == 1 ? ovrin_resize_y_nv_sg : ovrin_resize_y_nv_tps)(
                src.view.y, src.view.vu, nullptr, s.src_w, s.src_h, -1, -1, &passed);
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
    if (s.src_h > 47) s.src_h = 47;  // more would start threads
    if (form == 2) {
        letterboxed(in, s);
        return 0;
    }
    const uint8_t empty = in.byte() % 64;
    if (empty & 1 && empty > 47) s.src_w = in.nothing();
    if (empty & 2 && empty > 47) s.src_h = in.nothing();
    if (empty & 4 && empty > 47) s.dst_w = in.nothing();
    if (empty & 8 && empty > 47) s.dst_h = in.nothing();
    (form == 0 ? contiguous : in_planes)(in, s);
    return 0;
}
