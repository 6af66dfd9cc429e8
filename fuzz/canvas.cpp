// SPDX-License-Identifier: Apache-2.0
// RGBA8888 in a canvas, on the calling thread.
#include <cstring>

#include "reference/keep_ratio_rgba.h"
#include "support.h"

using namespace fuzz;

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    const uint8_t entry = in.byte() % 3;
    Sizes s = sizes(in);
    if (s.src_h > kMostRowsWithoutThreads) s.src_h = kMostRowsWithoutThreads;
    ovrin_resize_target target = letterbox(in, s.dst_w, s.dst_h);
    target.src_width = s.src_w;
    target.src_height = s.src_h;
    target.src_stride = s.src_w + in.pick({0, 0, 1, 2, 7, 40, -s.src_w, -2 * s.src_w - 3});

    ovrin_resize_target clipped = target;
    int32_t used_w = s.src_w;
    int32_t used_h = s.src_h;
    reference::clip_rgba(clipped, used_w, used_h);
    // A driver with a band or none leaves the row length as it is.
    Pixels pixels(in);
    const Flush where = flush(in);
    const Plane src(pixels, int64_t{used_w} * 4, used_h, int64_t{target.src_stride} * 4, where);

    const uint8_t fill = in.byte();
    std::vector<uint32_t> canvas(
        static_cast<size_t>(target.canvas_width) * static_cast<size_t>(target.canvas_height),
        fill * 0x01010101U);
    ovrin_resize_target expected = target;
    (entry == 2 ? reference::keep_ratio_rgba_tps : reference::keep_ratio_rgba_sg)(
        src.first(), s.src_w, s.src_h, expected, canvas);
    const auto* bytes = reinterpret_cast<const uint8_t*>(canvas.data());
    check_drawing(
        {bytes, bytes + canvas.size() * 4}, where, fill, [&](const Buffer& dst, const char* set) {
            ovrin_resize_target passed = target;
            expected.dst = passed.dst = dst.data();
            (entry == 0 ? ovrin_resize_rgba8888_keep_ratio
             : entry == 1
                 ? ovrin_resize_rgba_keep_ratio_sg
                 : ovrin_resize_rgba_keep_ratio_tps)(src.first(), s.src_w, s.src_h, &passed);
            require(memcmp(&passed, &expected, sizeof passed) == 0,
                    "the target is not what clipping gives", set);
            src.check_unchanged(set);
        });
    return 0;
}
