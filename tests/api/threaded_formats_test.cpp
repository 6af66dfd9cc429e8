// SPDX-License-Identifier: Apache-2.0
// The threaded functions give the bytes of the single-threaded ones, every time.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <algorithm>

#include "reference/keep_ratio_rgba.h"
#include "reference/yuv420.h"
#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/letterbox.h"
#include "support/pictures.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

// Narrow pictures of at least 1024 rows. Whole ratios share no destination rows between bands, the
// others do; enlargements share them more often than not.
Sizes tall_sizes(Random& random) {
    const int32_t src_h = random.pick({1024, 1025, random.between(1024, 2600)});
    const int32_t ratio = random.between(1, 40);
    return {random.between(1, 24), src_h, random.between(1, 24),
            random.pick({src_h / ratio, src_h, src_h - 1, src_h + 1, random.between(1, 300),
                         random.between(300, 1500), random.between(1500, 5000)})};
}

// A canvas which the picture fills, fits into or passes. It is at least `low` rows high, and as
// high as the picture lies to the right: the drivers of planes would reject anything else.
ovrin_resize_target around(Random& random, const Sizes& s, int32_t low) {
    const int32_t x = random.between(0, 5);
    const int32_t y = random.between(0, 5);
    const int32_t w = x + s.dst_w + random.pick({0, 0, random.between(0, 9), -s.dst_w / 2});
    const int32_t h = y + s.dst_h + random.pick({0, 0, random.between(0, 9), -s.dst_h / 2, -y});
    return letterbox(w, std::max({h, x, y, low}), s.dst_w, s.dst_h, x, y);
}

// What both ways made of one call, and what the definition makes of it.
struct Results {
    GuardedBuffer<uint8_t> single, threaded;
    std::vector<uint8_t> expected;

    explicit Results(size_t size)
        : single(size, Flush::kEnd, 0xEE), threaded(size, Flush::kEnd, 0xDD) {}

    ::testing::AssertionResult agree() const {
        const auto same = same_bytes(single.data(), expected.data(), expected.size());
        if (!same) return ::testing::AssertionFailure() << "single-threaded: " << same.message();
        return same_bytes(threaded.data(), expected.data(), expected.size());
    }
};

void check_rgba(const Sizes& s, Random& random) {
    const GuardedPlane src(random, s.src_w * 4, s.src_h, s.src_w * 4);
    Results results(static_cast<size_t>(s.dst_w) * static_cast<size_t>(s.dst_h) * 4);
    results.expected =
        reference::quarter_packed(src.first(), s.src_w, s.src_h, s.dst_w, s.dst_h, 4);
    ovrin_resize_rgba8888_sg(src.first(), reinterpret_cast<uint32_t*>(results.single.data()),
                             s.src_w, s.src_h, s.dst_w, s.dst_h);
    ovrin_resize_rgba8888_tps(src.first(), reinterpret_cast<uint32_t*>(results.threaded.data()),
                              s.src_w, s.src_h, s.dst_w, s.dst_h);
    ASSERT_TRUE(results.agree());
}

void check_keep_ratio_rgba(const Sizes& s, Random& random) {
    // As high as the picture, or it would be rejected; a row of it visible, or only the
    // single-threaded function would clear the canvas.
    ovrin_resize_target target = around(random, s, std::max(s.dst_h, 6));
    target.src_width = s.src_w;
    target.src_height = s.src_h;
    target.src_stride = random_stride(random, s.src_w);
    SCOPED_TRACE(describe(target, s.src_w, s.src_h));
    const GuardedPlane src(random, s.src_w * 4, s.src_h, target.src_stride * 4);
    std::vector<uint32_t> canvas(static_cast<size_t>(target.canvas_width) *
                                 static_cast<size_t>(target.canvas_height));
    ovrin_resize_target expected_target = target;
    reference::keep_ratio_rgba_tps(src.first(), s.src_w, s.src_h, expected_target, canvas);
    Results results(canvas.size() * 4);
    results.expected.resize(canvas.size() * 4);
    memcpy(results.expected.data(), canvas.data(), canvas.size() * 4);

    ovrin_resize_target single = target, threaded = target;
    single.dst = results.single.data();
    threaded.dst = results.threaded.data();
    ovrin_resize_rgba_keep_ratio_sg(src.first(), s.src_w, s.src_h, &single);
    ovrin_resize_rgba_keep_ratio_tps(src.first(), s.src_w, s.src_h, &threaded);
    ASSERT_TRUE(results.agree());
    single.dst = threaded.dst = expected_target.dst;
    ASSERT_TRUE(same_target(single, expected_target));
    ASSERT_TRUE(same_target(threaded, expected_target));
}

void check_yuv420(const Sizes& s, Random& random) {
    const GuardedBuffer<uint8_t> src(random.bytes(bytes_of_i420(s.src_w, s.src_h)));
    Results results(bytes_of_i420(s.dst_w, s.dst_h));
    results.expected = reference::resize_yuv420(
        reference::contiguous(reference::kI420, src.data(), s.src_w, s.src_h), s.dst_w, s.dst_h);
    ovrin_resize_yuv420_sg(src.data(), results.single.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    ovrin_resize_yuv420_tps(src.data(), results.threaded.data(), s.src_w, s.src_h, s.dst_w,
                            s.dst_h);
    ASSERT_TRUE(results.agree());
}

void check_y_u_v(const Sizes& s, Random& random) {
    const Yuv420Picture src(reference::kI420, random, s.src_w, s.src_h, s.src_w);
    Results results(bytes_of_i420(s.dst_w, s.dst_h));
    results.expected = reference::resize_yuv420(src.view, s.dst_w, s.dst_h);
    ovrin_resize_y_u_v_sg(src.view.y, src.view.chroma[0], src.view.chroma[1], results.single.data(),
                          s.src_w, s.src_h, s.dst_w, s.dst_h, nullptr);
    ovrin_resize_y_u_v_tps(src.view.y, src.view.chroma[0], src.view.chroma[1],
                           results.threaded.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, nullptr);
    ASSERT_TRUE(results.agree());
}

void check_y_u_v_keep_ratio(const Sizes& s, Random& random) {
    ovrin_resize_target target = around(random, s, 0);
    target.src_stride = random_stride(random, s.src_w);
    SCOPED_TRACE(describe(target, s.src_w, s.src_h));
    const Yuv420Picture src(reference::kI420, random, s.src_w, s.src_h, target.src_stride);
    Results results(bytes_of_i420(target.canvas_width, target.canvas_height));
    results.expected.resize(results.single.size());
    reference::keep_ratio_yuv420_tps(src.view, target, results.expected);
    target.dst = results.single.data();
    ovrin_resize_y_u_v_sg(src.view.y, src.view.chroma[0], src.view.chroma[1], nullptr, s.src_w,
                          s.src_h, 0, 0, &target);
    target.dst = results.threaded.data();
    ovrin_resize_y_u_v_tps(src.view.y, src.view.chroma[0], src.view.chroma[1], nullptr, s.src_w,
                           s.src_h, 0, 0, &target);
    ASSERT_TRUE(results.agree());
}

void check_nv21(const Sizes& s, Random& random) {
    const GuardedBuffer<uint8_t> src(random.bytes(bytes_of_nv21(s.src_w, s.src_h)));
    Results results(bytes_of_nv21(s.dst_w, s.dst_h));
    results.expected = reference::resize_yuv420(
        reference::contiguous(reference::kNv21, src.data(), s.src_w, s.src_h), s.dst_w, s.dst_h);
    ovrin_resize_nv21_sg(src.data(), results.single.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    ovrin_resize_nv21_tps(src.data(), results.threaded.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    ASSERT_TRUE(results.agree());
}

void check_y_nv21(const Sizes& s, Random& random) {
    const Yuv420Picture src(reference::kNv21, random, s.src_w, s.src_h, s.src_w);
    Results results(bytes_of_nv21(s.dst_w, s.dst_h));
    results.expected = reference::resize_yuv420(src.view, s.dst_w, s.dst_h);
    ovrin_resize_y_nv_sg(src.view.y, src.view.chroma[0], results.single.data(), s.src_w, s.src_h,
                         s.dst_w, s.dst_h, nullptr);
    ovrin_resize_y_nv_tps(src.view.y, src.view.chroma[0], results.threaded.data(), s.src_w, s.src_h,
                          s.dst_w, s.dst_h, nullptr);
    ASSERT_TRUE(results.agree());
}

// With rows wider than the picture, too: a band whose chroma runs to the end of the plane leaves
// later bands none, so that they never read from the offset it gives them.
void check_y_nv21_keep_ratio(const Sizes& s, Random& random) {
    ovrin_resize_target target = around(random, s, 0);
    target.src_stride = random_stride(random, s.src_w);
    SCOPED_TRACE(describe(target, s.src_w, s.src_h));
    const Yuv420Picture src(reference::kNv21, random, s.src_w, s.src_h, target.src_stride);
    Results results(bytes_of_nv21(target.canvas_width, target.canvas_height));
    results.expected.resize(results.single.size());
    reference::keep_ratio_yuv420_tps(src.view, target, results.expected);
    target.dst = results.single.data();
    ovrin_resize_y_nv_sg(src.view.y, src.view.chroma[0], nullptr, s.src_w, s.src_h, 0, 0, &target);
    target.dst = results.threaded.data();
    ovrin_resize_y_nv_tps(src.view.y, src.view.chroma[0], nullptr, s.src_w, s.src_h, 0, 0, &target);
    ASSERT_TRUE(results.agree());
}

struct Format {
    const char* name;
    void (*check)(const Sizes&, Random&);
};

std::ostream& operator<<(std::ostream& out, const Format& format) {
    return out << format.name;
}

class ThreadedFormats : public ::testing::TestWithParam<Format> {
protected:
    void check(const Sizes& s, Random& random) {
        SCOPED_TRACE(describe(s));
        GetParam().check(s, random);
    }
};

}  // namespace

TEST_P(ThreadedFormats, RandomTallSizes) {
    Random random(120);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(150) && !HasFatalFailure(); ++i) check(tall_sizes(random), random);
}

// Below 1024 rows, where the wrappers would not go; two bands and a few more.
TEST_P(ThreadedFormats, FewBands) {
    Random random(121);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(100) && !HasFatalFailure(); ++i) {
        check({random.between(1, 40), random.between(30, 200), random.between(1, 40),
               random.between(1, 200)},
              random);
    }
}

// Ratios whose bands end inside destination rows, repeated: an unlucky order would show.
TEST_P(ThreadedFormats, BandsThatShareRowsTimeAndAgain) {
    Random random(122);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(12) && !HasFatalFailure(); ++i) {
        check({200, 1024, 300, 700}, random);
        check({200, 1030, 300, 1031}, random);
        check({200, 1024, 300, 95}, random);
    }
}

TEST_P(ThreadedFormats, NamedHeights) {
    Random random(123);
    SCOPED_TRACE(random.trace());
    check({12, 2048, 8, 512}, random);   // 64 bands of 32 rows
    check({12, 1024, 8, 512}, random);   // 32 bands of 32
    check({12, 1100, 7, 100}, random);   // 25 bands of 44
    check({12, 3000, 8, 50}, random);    // 50 bands of 60
    check({12, 3000, 8, 750}, random);   // 94 bands of 32
    check({12, 1100, 9, 2500}, random);  // enlarged
    check({12, 40, 8, 1}, random);       // one band
    check({12, 64, 8, 32}, random);      // two bands
    check({12, 2000, 8, 1}, random);     // one band, though tall
}

// More bands than the pool has slots.
TEST_P(ThreadedFormats, MoreThan2000Bands) {
    Random random(124);
    SCOPED_TRACE(random.trace());
    check({2, 70000, 4, 30000}, random);
    check({3, 64100, 1, 32100}, random);
}

INSTANTIATE_TEST_SUITE_P(
    All, ThreadedFormats,
    ::testing::Values(Format{"Rgba", check_rgba}, Format{"RgbaKeepRatio", check_keep_ratio_rgba},
                      Format{"Yuv420", check_yuv420}, Format{"Yuv", check_y_u_v},
                      Format{"YuvKeepRatio", check_y_u_v_keep_ratio}, Format{"Nv21", check_nv21},
                      Format{"YNv21", check_y_nv21},
                      Format{"YNv21KeepRatio", check_y_nv21_keep_ratio}),
    [](const auto& format) { return format.param.name; });
