// SPDX-License-Identifier: Apache-2.0
// What the fuzzers of the bilinear engine share: a call, and the source buffers that it may read.
#pragma once

#include <algorithm>
#include <cstring>

#include "reference/bilinear.h"
#include "support.h"

namespace fuzz {

struct BilinearCall {
    int32_t src_w, src_h, dst_w, dst_h;  // arguments
    bool with_target;
    reference::BilinearGeometry g;  // what the target says, or what holds without one
};

inline size_t canvas_bytes(const reference::BilinearGeometry& g) {
    return static_cast<size_t>(reference::luma_bytes(g.canvas_width, g.canvas_height, g.format) +
                               reference::chroma_bytes(g.canvas_width, g.canvas_height, g.format));
}

inline BilinearCall bilinear_call(Input& in, const Sizes& s) {
    const int32_t format = in.pick({2, 7, 8, 18, 19});
    BilinearCall call = {
        s.src_w, s.src_h, s.dst_w,
        s.dst_h, false,   reference::packed_geometry(s.src_w, s.src_h, s.dst_w, s.dst_h, format)};
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

// Source buffers for a call, each as long as the definition reads and not a byte longer.
class BilinearSourceBuffers {
public:
    BilinearSourceBuffers(const BilinearCall& call, const reference::BilinearSource& read,
                          Pixels& pixels, Flush where)
        : call_(call),
          luma_(source(pixels,
                       call.with_target ? read.luma.end
                                        : reference::contiguous_end(read, call.src_w, call.src_h),
                       where)),
          u_(source(pixels, read.u.end, where)),
          v_(source(pixels, read.v.end, where)),
          vu_(source(pixels, read.vu.end, where)) {}

    const uint8_t* src() const { return luma_.data(); }

    reference::BilinearSource view() const {
        if (!call_.with_target) {
            return reference::contiguous_source(luma_.data(), call_.src_w, call_.src_h);
        }
        reference::BilinearSource result;
        result.luma.bytes = luma_.data();
        result.u.bytes = u_.data();
        result.v.bytes = v_.data();
        result.vu.bytes = vu_.data();
        return result;
    }

    ovrin_resize_target target() const {
        ovrin_resize_target t;
        memset(static_cast<void*>(&t), 0x5A, sizeof t);
        t.src_vu_plane = vu_.data();
        t.src_u_plane = u_.data();
        t.src_v_plane = v_.data();
        t.src_width = call_.g.src_width;
        t.src_height = call_.g.src_height;
        t.src_stride = call_.g.src_stride;
        t.format = call_.g.format;
        t.canvas_width = call_.g.canvas_width;
        t.canvas_height = call_.g.canvas_height;
        t.dst_x = call_.g.dst_x;
        t.dst_y = call_.g.dst_y;
        return t;
    }

    void check_unchanged(const char* set) const {
        for (const Buffer* buffer : {&luma_, &u_, &v_, &vu_}) buffer->check_unchanged(set);
    }

private:
    BilinearCall call_;
    Buffer luma_, u_, v_, vu_;
};

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
    const BilinearSourceBuffers buffers(call, read, pixels, where);
    reference::BilinearSource view = buffers.view();
    std::fill(expected.begin(), expected.end(), fill);
    definition(view, expected);

    const ovrin_resize_target target = buffers.target();
    check_drawing(expected, where, fill, [&](const Buffer& dst, const char* set) {
        ovrin_resize_target passed = target;
        // With a target the argument is ignored.
        resize(buffers.src(), dst.data(), call.src_w, call.src_h, call.dst_w, call.dst_h,
               call.with_target ? -1 : call.g.format, call.with_target ? &passed : nullptr);
        require(memcmp(&passed, &target, sizeof target) == 0, "the target was written", set);
        buffers.check_unchanged(set);
    });
}

}  // namespace fuzz
