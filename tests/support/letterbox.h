// SPDX-License-Identifier: Apache-2.0
// Random target records for letterboxing, and comparing them.
#pragma once

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <cstdint>
#include <string>
#include <tuple>

#include "support/random.h"
#include "support/target_record.h"

namespace ovrin_test {

// Pictures inside the canvas, across its edges and beyond them.
inline ovrin_resize_target random_letterbox(Random& random) {
    const int32_t canvas_w = random.awkward_size();
    const int32_t canvas_h = random.awkward_size();
    int32_t x = random.between(0, canvas_w);
    int32_t y = random.between(0, canvas_h);
    if (random.between(0, 9) == 0) x += random.between(0, 9);
    if (random.between(0, 9) == 0) y += random.between(0, 9);
    int32_t w = random.awkward_size();
    int32_t h = random.awkward_size();
    if (random.between(0, 1) == 0) w = 1 + w % canvas_w;
    if (random.between(0, 1) == 0) h = 1 + h % canvas_h;
    return letterbox(canvas_w, canvas_h, w, h, x, y);
}

// A row length for rows of `width`: packed, or wider.
inline int32_t random_stride(Random& random, int32_t width) {
    return width + random.pick({0, 1, 2, 3, random.between(0, 70)});
}

inline ::testing::Message describe(const ovrin_resize_target& t, int32_t src_w, int32_t src_h) {
    return ::testing::Message() << src_w << "x" << src_h << " stride " << t.src_stride << " to "
                                << t.dst_width << "x" << t.dst_height << " at " << t.dst_x << ","
                                << t.dst_y << " on " << t.canvas_width << "x" << t.canvas_height;
}

// Compares the fields that somebody might write.
inline ::testing::AssertionResult same_target(const ovrin_resize_target& actual,
                                              const ovrin_resize_target& expected) {
    // Not what lies between the fields.
    const auto fields = [](const ovrin_resize_target& t) {
        return std::tie(t.reserved_head, t.src_vu_plane, t.src_u_plane, t.src_v_plane, t.src_width,
                        t.src_height, t.src_stride, t.src_buffer_height, t.format, t.dst,
                        t.dst_width, t.dst_height, t.canvas_width, t.canvas_height, t.dst_x,
                        t.dst_y);
    };
    if (fields(actual) == fields(expected)) return ::testing::AssertionSuccess();
    return ::testing::AssertionFailure()
           << "target is src " << actual.src_width << "x" << actual.src_height << " dst "
           << actual.dst_width << "x" << actual.dst_height << ", not src " << expected.src_width
           << "x" << expected.src_height << " dst " << expected.dst_width << "x"
           << expected.dst_height << " (or another field was written)";
}

}  // namespace ovrin_test
