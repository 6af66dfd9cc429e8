// SPDX-License-Identifier: Apache-2.0
// A call of the bilinear engine, and the source buffers that it may read.
#pragma once

#include <ovrinresize.h>

#include <cstring>

#include "reference/bilinear.h"

namespace ovrin_test {

struct BilinearCall {
    int32_t src_w;  // arguments
    int32_t src_h;
    int32_t dst_w;
    int32_t dst_h;
    bool with_target;
    reference::BilinearGeometry g;  // what the target says, or what holds without one
};

inline BilinearCall call_without_target(int32_t format, int32_t src_w, int32_t src_h, int32_t dst_w,
                                        int32_t dst_h) {
    return {src_w, src_h, dst_w,
            dst_h, false, reference::packed_geometry(src_w, src_h, dst_w, dst_h, format)};
}

inline size_t canvas_bytes(const reference::BilinearGeometry& g) {
    return static_cast<size_t>(reference::luma_bytes(g.canvas_width, g.canvas_height, g.format) +
                               reference::chroma_bytes(g.canvas_width, g.canvas_height, g.format));
}

// Source buffers for a call, each as long as the definition reads and not a byte longer.
template <class Buffer>
class BilinearBuffers {
public:
    // make(size) gives a buffer of so many bytes, filled.
    template <class Make>
    BilinearBuffers(const BilinearCall& call, const reference::BilinearSource& read, Make make)
        : call_(call),
          luma_(make(call.with_target ? read.luma.end
                                      : reference::contiguous_end(read, call.src_w, call.src_h))),
          u_(make(read.u.end)),
          v_(make(read.v.end)),
          vu_(make(read.vu.end)) {}

    const uint8_t* src() const { return luma_.data(); }

    reference::BilinearSource source() const {
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

    // Fields that the engine has no use for hold values that would not go unnoticed.
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

    template <class Check>
    void for_each(Check check) const {
        for (const Buffer* buffer : {&luma_, &u_, &v_, &vu_}) check(*buffer);
    }

private:
    BilinearCall call_;
    Buffer luma_;
    Buffer u_;
    Buffer v_;
    Buffer vu_;
};

}  // namespace ovrin_test
