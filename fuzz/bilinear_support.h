// SPDX-License-Identifier: Apache-2.0
// What the fuzzers of the bilinear engine share: a call, and the source buffers that it may read.
#pragma once

#include <algorithm>
#include <cstring>

#include "support.h"
#include "support/bilinear_buffers.h"

namespace fuzz {

using ovrin_test::BilinearCall;
using ovrin_test::call_without_target;
using ovrin_test::canvas_bytes;
using BilinearBuffers = ovrin_test::BilinearBuffers<Buffer>;

inline BilinearCall bilinear_call(Input& in, const Sizes& s) {
    const int32_t format = in.pick({2, 7, 8, 18, 19});
    BilinearCall call = call_without_target(format, s.src_w, s.src_h, s.dst_w, s.dst_h);
    call.with_target = in.flag();
    if (!call.with_target) return call;
    call.g.src_stride += in.pick({0, 0, 1, 2, 7, 16});
    call.g.dst_x = in.between(0, 9);
    call.g.dst_y = in.between(0, 9);
    call.g.canvas_width = std::max(0, s.dst_w + call.g.dst_x + in.between(-14, 8));
    call.g.canvas_height = std::max(0, s.dst_h + call.g.dst_y + in.between(-14, 8));
    call.src_w = in.pick({1, -1, 7, 7000});
    call.src_h = in.pick({1, -1, 7, 7000});
    return call;
}

inline BilinearBuffers bilinear_buffers(const BilinearCall& call,
                                        const reference::BilinearSource& read, Pixels& pixels,
                                        Flush where) {
    return {call, read, [&](int64_t size) { return source(pixels, size, where); }};
}

inline void check_unchanged(const BilinearBuffers& buffers, const char* set) {
    buffers.for_each([&](const Buffer& buffer) { buffer.check_unchanged(set); });
}

using BilinearEntry = decltype(ov_bilinear_sg);

// One call of `resize`, which must do what definition(source, canvas) does.
template <class Definition>
void check_bilinear(const BilinearCall& call, BilinearEntry* resize, Input& in,
                    Definition definition) {
    const uint8_t fill = in.byte();
    std::vector<uint8_t> expected(canvas_bytes(call.g), fill);
    reference::BilinearSource read;
    definition(read, expected);

    Pixels pixels(in);
    const Flush where = flush(in);
    const BilinearBuffers buffers = bilinear_buffers(call, read, pixels, where);
    reference::BilinearSource view = buffers.source();
    std::fill(expected.begin(), expected.end(), fill);
    definition(view, expected);

    const ovrin_resize_target target = buffers.target();
    check_drawing(expected, where, fill, [&](const Buffer& dst, const char* set) {
        ovrin_resize_target passed = target;
        // With a target the argument is ignored.
        resize(buffers.src(), dst.data(), call.src_w, call.src_h, call.dst_w, call.dst_h,
               call.with_target ? -1 : call.g.format, call.with_target ? &passed : nullptr);
        require(memcmp(&passed, &target, sizeof target) == 0, "the target was written", set);
        check_unchanged(buffers, set);
    });
}

}  // namespace fuzz
