// SPDX-License-Identifier: Apache-2.0
// The entry points that choose between the calling thread and several: the source height decides,
// and nothing else. Where both ways give other bytes for one target, that shows.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <cstring>
#include <vector>

#include "reference/keep_ratio_rgba.h"
#include "reference/yuv420.h"
#include "support/compare.h"
#include "support/letterbox.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

constexpr int32_t kWidth = 30;
constexpr int32_t kThreadedHeight = 1024;

// Sources start in its middle, so that rows may lie in either direction.
const uint8_t* source() {
    static const std::vector<uint8_t> bytes =
        Random(170).bytes(size_t{2} * 4 * (kWidth + 1) * (kThreadedHeight + 1));
    return bytes.data() + bytes.size() / 2;
}

// A canvas before the call, what the call makes of it, and what it should.
struct Canvas {
    std::vector<uint32_t> words;

    explicit Canvas(const ovrin_resize_target& target)
        : words(
              static_cast<size_t>(target.canvas_width) * static_cast<size_t>(target.canvas_height),
              0xEEEEEEEE) {}

    uint8_t* bytes() { return reinterpret_cast<uint8_t*>(words.data()); }
    size_t size() const { return words.size() * 4; }
};

bool goes_in_bands(int32_t src_h) {
    return src_h >= kThreadedHeight;
}

void check_rgba(const ovrin_resize_target& given, int32_t src_h) {
    Canvas actual(given), expected(given);
    ovrin_resize_target target = given, expected_target = given;
    target.dst = actual.words.data();
    ovrin_resize_rgba8888_keep_ratio(source(), kWidth, src_h, &target);
    (goes_in_bands(src_h) ? reference::keep_ratio_rgba_tps : reference::keep_ratio_rgba_sg)(
        source(), kWidth, src_h, expected_target, expected.words);
    EXPECT_TRUE(same_bytes(actual.bytes(), expected.bytes(), expected.size()));
    expected_target.dst = target.dst;
    EXPECT_TRUE(same_target(target, expected_target));
}

// The canvas's planes lie at the start of a buffer that has room for more.
void check_planes(const reference::ChromaLayout& layout,
                  void (*resize)(int32_t, const ovrin_resize_target*),
                  const ovrin_resize_target& given, int32_t src_h) {
    Canvas actual(given), expected(given);
    ovrin_resize_target target = given;
    target.dst = actual.words.data();
    resize(src_h, &target);
    const int64_t canvas_bytes =
        reference::yuv420_size(layout, given.canvas_width, given.canvas_height);
    std::vector<uint8_t> planes(expected.bytes(), expected.bytes() + canvas_bytes);
    const reference::Yuv420Source src = {layout, source(), {source() + 1, source() + 2},
                                         kWidth, src_h,    kWidth};
    (goes_in_bands(src_h) ? reference::keep_ratio_yuv420_tps : reference::keep_ratio_yuv420_sg)(
        src, given, planes);
    memcpy(expected.bytes(), planes.data(), planes.size());
    EXPECT_TRUE(same_bytes(actual.bytes(), expected.bytes(), expected.size()));
}

void check_yuv(const ovrin_resize_target& given, int32_t src_h) {
    check_planes(
        reference::kI420,
        [](int32_t h, const ovrin_resize_target* target) {
            ovrin_resize_y_u_v_keep_ratio(source(), source() + 1, source() + 2, kWidth, h, target);
        },
        given, src_h);
}

void check_nv21(const ovrin_resize_target& given, int32_t src_h) {
    check_planes(
        reference::kNv21,
        [](int32_t h, const ovrin_resize_target* target) {
            ovrin_resize_y_nv21_keep_ratio(source(), source() + 1, kWidth, h, target);
        },
        given, src_h);
}

// Every combination of what makes one way or the other return early, cut the picture away, or take
// the row length for another.
template <class Check>
void check_all_targets(const Check& check) {
    for (const int32_t canvas_w : {30, 60}) {
        for (const int32_t x : {0, 3, 20, 30, 31, 55, 61}) {
            for (const int32_t y : {0, 1, 20, 50, 51}) {
                for (const int32_t dst_h : {0, 40, 60}) {
                    ovrin_resize_target target = letterbox(canvas_w, 50, 20, dst_h, x, y);
                    target.src_width = kWidth;
                    for (const int32_t src_h : {-5, 0, 1023, 1024}) {
                        target.src_height = src_h;
                        for (const int32_t stride : {kWidth, 0, -kWidth}) {
                            target.src_stride = stride;
                            SCOPED_TRACE(describe(target, kWidth, src_h));
                            check(target, src_h);
                            if (::testing::Test::HasFailure()) return;
                        }
                    }
                }
            }
        }
    }
}

}  // namespace

TEST(Wrappers, RgbaOnACanvas) {
    check_all_targets(check_rgba);
}

TEST(Wrappers, PlanesOnACanvas) {
    check_all_targets(check_yuv);
}

TEST(Wrappers, SemiPlanarOnACanvas) {
    check_all_targets(check_nv21);
}

// In bands, a picture whose height is cut to nothing leaves the canvas as it was; the calling
// thread would clear it.
TEST(Wrappers, ATallPictureBelowItsCanvasLeavesItUntouched) {
    ovrin_resize_target target = letterbox(30, 50, 20, 40, 3, 50);
    target.src_width = target.src_stride = 30;
    for (const int32_t src_h : {1023, 1024}) {
        Canvas canvas(target);
        ovrin_resize_target copy = target;
        copy.src_height = src_h;
        copy.dst = canvas.words.data();
        ovrin_resize_rgba8888_keep_ratio(source(), 30, src_h, &copy);
        EXPECT_EQ(canvas.words[0], src_h < 1024 ? 0 : 0xEEEEEEEE) << src_h;
    }
}
