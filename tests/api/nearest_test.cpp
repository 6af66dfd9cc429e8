// SPDX-License-Identifier: Apache-2.0
// Nearest neighbour by whole-number steps.
#include "reference/nearest.h"

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <numeric>

#include "support/guarded_buffer.h"
#include "support/pictures.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

constexpr uint32_t kOld = 0xEEEEEEEE;

size_t pixels(int32_t w, int32_t h) {
    return static_cast<size_t>(w) * static_cast<size_t>(h);
}

// Pixel i holds i.
std::vector<uint32_t> numbered(int32_t w, int32_t h) {
    std::vector<uint32_t> src(pixels(w, h));
    std::iota(src.begin(), src.end(), 0U);
    return src;
}

std::vector<uint32_t> shrink(const std::vector<uint32_t>& src, const Sizes& s) {
    std::vector<uint32_t> dst(pixels(s.dst_w, s.dst_h), kOld);
    ovrin_resize_nearest_rgba8888(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    return dst;
}

void check(const Sizes& s, Flush flush) {
    SCOPED_TRACE(describe(s, flush));
    const GuardedBuffer<uint32_t> src(numbered(s.src_w, s.src_h), flush);
    GuardedBuffer<uint32_t> dst(pixels(s.dst_w, s.dst_h), flush, 0xEE);
    std::vector<uint32_t> expected = dst.copy();
    reference::nearest(src.data(), expected, s.src_w, s.src_h, s.dst_w, s.dst_h);
    ovrin_resize_nearest_rgba8888(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    ASSERT_EQ(dst.copy(), expected);
    ASSERT_TRUE(dst.intact());
}

}  // namespace

TEST(Nearest, RandomSizesEqualTheDefinition) {
    Random random(50);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(3000) && !HasFatalFailure(); ++i) {
        const Sizes s = {random.awkward_size(), random.awkward_size(), random.awkward_size(),
                         random.awkward_size()};
        check(s, random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST(Nearest, EverySmallRatioEqualsTheDefinition) {
    const int32_t limit = rounds(10) < 10 ? 12 : 40;
    for (int32_t src = 1; src <= limit; ++src) {
        for (int32_t dst = 1; dst <= limit && !HasFatalFailure(); ++dst) {
            check({src, 3, dst, 2}, Flush::kEnd);
            check({3, src, 2, dst}, Flush::kEnd);
        }
    }
}

TEST(Nearest, HalfSizeTakesEverySecondPixel) {
    const auto dst = shrink(numbered(100, 100), {100, 100, 50, 50});
    for (uint32_t j = 0; j < 50; ++j) {
        for (uint32_t k = 0; k < 50; ++k) {
            ASSERT_EQ(dst[j * 50 + k], (2 * j + 1) * 100 + 2 * k + 1);
        }
    }
}

// 2.5 is rounded to a step of 3 and an offset of 2: 33 samples per axis lie inside, the other 7
// leave what the buffer held.
TEST(Nearest, AStepRoundedUpKeepsOldContentsAtTheEnd) {
    const auto dst = shrink(numbered(100, 100), {100, 100, 40, 40});
    for (uint32_t j = 0; j < 40; ++j) {
        for (uint32_t k = 0; k < 40; ++k) {
            const uint32_t expected = j < 33 && k < 33 ? (3 * j + 2) * 100 + 3 * k + 2 : kOld;
            ASSERT_EQ(dst[j * 40 + k], expected) << j << "," << k;
        }
    }
}

// 2.4 is rounded to 2: the last columns and rows of the source are never sampled.
TEST(Nearest, AStepRoundedDownLeavesTheEndOfTheSourceOut) {
    const auto dst = shrink(numbered(12, 12), {12, 12, 5, 5});
    for (uint32_t j = 0; j < 5; ++j) {
        for (uint32_t k = 0; k < 5; ++k) {
            ASSERT_EQ(dst[j * 5 + k], (2 * j + 1) * 12 + 2 * k + 1);
        }
    }
}

TEST(Nearest, EnlargingByTwoCopiesOnceFromTheSecondPixel) {
    const auto dst = shrink(numbered(10, 10), {10, 10, 20, 20});
    for (uint32_t j = 0; j < 20; ++j) {
        for (uint32_t k = 0; k < 20; ++k) {
            const uint32_t expected = j < 9 && k < 9 ? (j + 1) * 10 + k + 1 : kOld;
            ASSERT_EQ(dst[j * 20 + k], expected) << j << "," << k;
        }
    }
}

// Below one half the step is 0: all samples are the first pixel.
TEST(Nearest, EnlargingFurtherRepeatsTheFirstPixel) {
    const std::vector<uint32_t> src = {5, 6, 7, 8, 9, 10, 11, 12, 13};
    EXPECT_EQ(shrink(src, {3, 3, 7, 7}), std::vector<uint32_t>(49, 5));
}

TEST(Nearest, StepsOfTheTwoAxesAreIndependent) {
    // Columns 9 to 3 (step 3, offset 2), rows 4 to 2 (step 2, offset 1).
    EXPECT_EQ(shrink(numbered(9, 4), {9, 4, 3, 2}),
              (std::vector<uint32_t>{11, 14, 17, 29, 32, 35}));
}

TEST(Nearest, NullPointersReturn) {
    uint32_t pixel = kOld;
    ovrin_resize_nearest_rgba8888(nullptr, &pixel, 1, 1, 1, 1);
    EXPECT_EQ(pixel, kOld);
    ovrin_resize_nearest_rgba8888(&pixel, nullptr, 4, 4, 2, 2);
    ovrin_resize_nearest_rgba8888(nullptr, nullptr, 4, 4, 2, 2);
}

// A ratio to 0 is infinite and has no step; neither it nor a size below 0 writes.
TEST(Nearest, EmptyDestinationWritesNothing) {
    const std::vector<uint32_t> src = numbered(4, 4);
    for (const int32_t empty : {0, -1, -4, INT32_MIN}) {
        uint32_t pixel = kOld;
        ovrin_resize_nearest_rgba8888(src.data(), &pixel, 4, 4, empty, 1);
        ovrin_resize_nearest_rgba8888(src.data(), &pixel, 4, 4, 1, empty);
        ovrin_resize_nearest_rgba8888(src.data(), &pixel, 4, 4, empty, empty);
        ovrin_resize_nearest_rgba8888(src.data(), &pixel, 0, 0, empty, empty);
        EXPECT_EQ(pixel, kOld);
    }
}

TEST(Nearest, EmptySourceWritesNothing) {
    const std::vector<uint32_t> src = numbered(4, 4);
    for (const int32_t empty : {0, -1, -4, INT32_MIN}) {
        std::vector<uint32_t> dst(4, kOld);
        ovrin_resize_nearest_rgba8888(src.data(), dst.data(), empty, 4, 2, 2);
        ovrin_resize_nearest_rgba8888(src.data(), dst.data(), 4, empty, 2, 2);
        ovrin_resize_nearest_rgba8888(src.data(), dst.data(), empty, empty, 2, 2);
        EXPECT_EQ(dst, std::vector<uint32_t>(4, kOld));
    }
}

// Positions pass through single precision, which holds no odd number above 2 to the 24th.
TEST(Nearest, PositionsBeyond24BitsRoundToSinglePrecision) {
    constexpr int32_t kLong = (1 << 24) + 60000;
    GuardedBuffer<uint32_t> src(size_t{kLong} * 2);
    for (size_t i = 0; i < 60000; ++i) {
        src[src.size() - 1 - i] = static_cast<uint32_t>(i + 1);         // row 1, or the last rows
        src[size_t{kLong} - 1 - i] = static_cast<uint32_t>(i + 70000);  // row 0
    }
    for (const int32_t dst_length : {16793, 5001, 5600}) {
        for (const bool wide : {true, false}) {
            const Sizes s = wide ? Sizes{kLong, 2, dst_length, 1} : Sizes{2, kLong, 1, dst_length};
            SCOPED_TRACE(describe(s));
            std::vector<uint32_t> dst(static_cast<size_t>(dst_length), kOld);
            std::vector<uint32_t> expected = dst;
            reference::nearest(src.data(), expected, s.src_w, s.src_h, s.dst_w, s.dst_h);
            ovrin_resize_nearest_rgba8888(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w,
                                          s.dst_h);
            ASSERT_EQ(dst, expected);
        }
    }
}

// The same on more rows than one: a step of 1 takes the second and the third row of three.
TEST(Nearest, PositionsBeyond24BitsOnEveryRow) {
    constexpr int32_t kLong = (1 << 24) + 60000;
    const Sizes s = {kLong, 3, 5001, 3};
    std::vector<uint32_t> src(size_t{kLong} * 3);
    for (size_t i = 0; i < src.size(); ++i) src[i] = static_cast<uint32_t>(i) * 2654435761U;
    std::vector<uint32_t> expected(size_t{5001} * 3, kOld);
    reference::nearest(src.data(), expected, s.src_w, s.src_h, s.dst_w, s.dst_h);
    ASSERT_NE(expected[0], expected[5001]);
    EXPECT_EQ(expected[size_t{2} * 5001], kOld);
    EXPECT_EQ(shrink(src, s), expected);
}
