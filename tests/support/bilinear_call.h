// SPDX-License-Identifier: Apache-2.0
// One call of the bilinear engine, between guard pages, compared with its definition.
#pragma once

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <algorithm>
#include <cstring>
#include <vector>

#include "reference/bilinear.h"
#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/random.h"

namespace ovrin_test {

using BilinearResize = decltype(ov_bilinear_sg);
using BilinearDefinition = void(const reference::BilinearGeometry&, int32_t, int32_t, int32_t,
                                int32_t, reference::BilinearSource&, std::vector<uint8_t>&);

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

inline ::testing::Message describe(const BilinearCall& call) {
    ::testing::Message text;
    text << "format " << call.g.format << ", " << call.g.src_width << "x" << call.g.src_height
         << " to " << call.dst_w << "x" << call.dst_h;
    if (call.with_target) {
        text << " at (" << call.g.dst_x << ", " << call.g.dst_y << ") of " << call.g.canvas_width
             << "x" << call.g.canvas_height << ", stride " << call.g.src_stride << ", arguments "
             << call.src_w << "x" << call.src_h;
    }
    return text;
}

// Source buffers for a call, each as long as the definition reads and not a byte longer.
class BilinearBuffers {
public:
    BilinearBuffers(const BilinearCall& call, const reference::BilinearSource& read, Random& random,
                    Flush flush)
        : call_(call),
          luma_(content(random, call.with_target
                                    ? read.luma.end
                                    : reference::contiguous_end(read, call.src_w, call.src_h)),
                flush),
          u_(content(random, read.u.end), flush),
          v_(content(random, read.v.end), flush),
          vu_(content(random, read.vu.end), flush) {}

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
        memset(&t, 0x5A, sizeof t);
        t.src_vu_plane = vu_.data();
        t.src_u_plane = u_.data();
        t.src_v_plane = v_.data();
        t.src_width = call_.g.src_width;
        t.src_height = call_.g.src_height;
        t.src_stride = call_.g.src_stride;
        t.src_buffer_height = call_.g.src_height;
        t.format = call_.g.format;
        t.dst = nullptr;
        t.canvas_width = call_.g.canvas_width;
        t.canvas_height = call_.g.canvas_height;
        t.dst_x = call_.g.dst_x;
        t.dst_y = call_.g.dst_y;
        return t;
    }

private:
    // Either any bytes or only the two extremes, which make the sums wrap most.
    static std::vector<uint8_t> content(Random& random, int64_t size) {
        std::vector<uint8_t> bytes = random.bytes(static_cast<size_t>(size));
        if (random.between(0, 1) == 0) {
            for (uint8_t& byte : bytes) byte = byte & 1 ? 255 : 0;
        }
        return bytes;
    }

    BilinearCall call_;
    GuardedBuffer<uint8_t> luma_;
    GuardedBuffer<uint8_t> u_;
    GuardedBuffer<uint8_t> v_;
    GuardedBuffer<uint8_t> vu_;
};

inline size_t canvas_bytes(const reference::BilinearGeometry& g) {
    return static_cast<size_t>(reference::luma_bytes(g.canvas_width, g.canvas_height, g.format) +
                               reference::chroma_bytes(g.canvas_width, g.canvas_height, g.format));
}

inline void check_bilinear(BilinearResize* resize, BilinearDefinition* definition,
                           const BilinearCall& call, Random& random, Flush flush = Flush::kEnd) {
    SCOPED_TRACE(describe(call) << (flush == Flush::kEnd ? ", end" : ", start"));
    const auto fill = static_cast<uint8_t>(random.between(0, 255));
    std::vector<uint8_t> expected(canvas_bytes(call.g), fill);
    reference::BilinearSource read;
    definition(call.g, call.src_w, call.src_h, call.dst_w, call.dst_h, read, expected);

    const BilinearBuffers buffers(call, read, random, flush);
    reference::BilinearSource source = buffers.source();
    std::fill(expected.begin(), expected.end(), fill);
    definition(call.g, call.src_w, call.src_h, call.dst_w, call.dst_h, source, expected);

    GuardedBuffer<uint8_t> dst(expected.size(), flush, fill);
    const ovrin_resize_target target = buffers.target();
    ovrin_resize_target passed = target;
    // With a target the argument is ignored.
    resize(buffers.src(), dst.data(), call.src_w, call.src_h, call.dst_w, call.dst_h,
           call.with_target ? -1 : call.g.format, call.with_target ? &passed : nullptr);
    ASSERT_TRUE(same_bytes(dst.data(), expected.data(), expected.size()));
    ASSERT_TRUE(dst.intact());
    ASSERT_EQ(memcmp(&passed, &target, sizeof target), 0);
}

}  // namespace ovrin_test
