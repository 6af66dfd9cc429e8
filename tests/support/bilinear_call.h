// SPDX-License-Identifier: Apache-2.0
// One call of the bilinear engine, between guard pages, compared with its definition.
#pragma once

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <algorithm>
#include <cstring>
#include <vector>

#include "reference/bilinear.h"
#include "support/bilinear_buffers.h"
#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/random.h"

namespace ovrin_test {

using BilinearResize = decltype(ov_bilinear_sg);
using BilinearDefinition = void(const reference::BilinearGeometry&, int32_t, int32_t, int32_t,
                                int32_t, reference::BilinearSource&, std::vector<uint8_t>&);

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

// Either any bytes or only the two extremes, which make the sums wrap most.
inline std::vector<uint8_t> any_or_extreme_bytes(Random& random, int64_t size) {
    std::vector<uint8_t> bytes = random.bytes(static_cast<size_t>(size));
    if (random.between(0, 1) == 0) {
        for (uint8_t& byte : bytes) byte = byte & 1 ? 255 : 0;
    }
    return bytes;
}

using BilinearGuardedBuffers = BilinearBuffers<GuardedBuffer<uint8_t>>;

inline BilinearGuardedBuffers bilinear_buffers(const BilinearCall& call,
                                               const reference::BilinearSource& read,
                                               Random& random, Flush flush) {
    return {call, read, [&](int64_t size) {
                return GuardedBuffer<uint8_t>(any_or_extreme_bytes(random, size), flush);
            }};
}

inline void check_bilinear(BilinearResize* resize, BilinearDefinition* definition,
                           const BilinearCall& call, Random& random, Flush flush = Flush::kEnd) {
    SCOPED_TRACE(describe(call) << (flush == Flush::kEnd ? ", end" : ", start"));
    const auto fill = static_cast<uint8_t>(random.between(0, 255));
    std::vector<uint8_t> expected(canvas_bytes(call.g), fill);
    reference::BilinearSource read;
    definition(call.g, call.src_w, call.src_h, call.dst_w, call.dst_h, read, expected);

    const BilinearGuardedBuffers buffers = bilinear_buffers(call, read, random, flush);
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
