// SPDX-License-Identifier: Apache-2.0
// RGB888: three bytes per pixel, always on the calling thread.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include "reference/quarter.h"
#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/pictures.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

void check(const Sizes& s, Random& random, Flush flush) {
    SCOPED_TRACE(describe(s, flush));
    const GuardedPlane src(random, int64_t{s.src_w} * 3, s.src_h, int64_t{s.src_w} * 3, flush);
    const auto expected =
        reference::quarter_packed(src.first(), s.src_w, s.src_h, s.dst_w, s.dst_h, 3);
    GuardedBuffer<uint8_t> dst(expected.size(), flush,
                               static_cast<uint8_t>(random.between(1, 255)));
    ovrin_resize_rgb888(src.first(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    ASSERT_TRUE(same_bytes(dst.data(), expected.data(), expected.size()));
    ASSERT_TRUE(dst.intact());
}

}  // namespace

TEST(Rgb888, RandomSizesEqualTheDefinition) {
    Random random(40);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(3000) && !HasFatalFailure(); ++i) {
        const Sizes s = {random.awkward_size(), random.awkward_size(), random.awkward_size(),
                         random.awkward_size()};
        check(s, random, random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST(Rgb888, EverySmallSizeEqualsTheDefinition) {
    Random random(41);
    SCOPED_TRACE(random.trace());
    const int32_t limit = rounds(10) < 10 ? 4 : 8;
    for (int32_t src_w = 1; src_w <= limit; ++src_w) {
        for (int32_t src_h = 1; src_h <= limit; ++src_h) {
            for (int32_t dst_w = 1; dst_w <= limit; ++dst_w) {
                for (int32_t dst_h = 1; dst_h <= limit && !HasFatalFailure(); ++dst_h) {
                    check({src_w, src_h, dst_w, dst_h}, random, Flush::kEnd);
                }
            }
        }
    }
}

// Whole ratios, in which a vector kernel would deal with several pixels at once.
TEST(Rgb888, WholeRatiosOfEveryRemainder) {
    Random random(42);
    SCOPED_TRACE(random.trace());
    for (int32_t dst_w = 1; dst_w <= (rounds(10) < 10 ? 20 : 70); ++dst_w) {
        for (const int32_t ratio : {1, 2, 3, 4, 5, 8}) {
            check({dst_w * ratio, 3 * ratio, dst_w, 3}, random, Flush::kEnd);
            check({dst_w * ratio, 3 * ratio, dst_w, 3}, random, Flush::kStart);
        }
    }
}

TEST(Rgb888, WideRowsCrossColumnStrips) {
    Random random(43);
    SCOPED_TRACE(random.trace());
    for (const int32_t dst_w : {341, 342, 683, 1023, 1024, 1025, 2049, 5000}) {
        for (const int32_t src_w : {1, 700, 1024, 3000, 10001}) {
            check({src_w, 3, dst_w, 2}, random, Flush::kEnd);
        }
    }
}

TEST(Rgb888, EachByteOfAPixelLosesItsTwoLowBits) {
    const std::vector<uint8_t> src = {255, 128, 3, 255, 128, 3, 255, 128, 3, 255, 128, 3};
    std::vector<uint8_t> dst(3, 0xEE);
    ovrin_resize_rgb888(src.data(), dst.data(), 2, 2, 1, 1);
    EXPECT_EQ(dst, (std::vector<uint8_t>{252, 128, 0}));
}

TEST(Rgb888, TheBytesOfAPixelAreIndependent) {
    for (size_t channel = 0; channel < 3; ++channel) {
        std::vector<uint8_t> src(6 * 6 * 3, 0);
        for (size_t i = channel; i < src.size(); i += 3) src[i] = 255;
        std::vector<uint8_t> dst(3 * 3 * 3, 0xEE);
        ovrin_resize_rgb888(src.data(), dst.data(), 6, 6, 3, 3);
        for (size_t i = 0; i < dst.size(); ++i) EXPECT_EQ(dst[i], i % 3 == channel ? 252 : 0);
    }
}

TEST(Rgb888, EmptySourceClearsTheDestination) {
    for (const int32_t empty : {0, -1, INT32_MIN}) {
        GuardedBuffer<uint8_t> by_height(18, Flush::kEnd, 0xEE);
        ovrin_resize_rgb888(nullptr, by_height.data(), 5, empty, 3, 2);
        EXPECT_EQ(by_height.copy(), std::vector<uint8_t>(18, 0));
        GuardedBuffer<uint8_t> by_width(18, Flush::kEnd, 0xEE);
        ovrin_resize_rgb888(nullptr, by_width.data(), empty, 5, 3, 2);
        EXPECT_EQ(by_width.copy(), std::vector<uint8_t>(18, 0));
    }
}

TEST(Rgb888, EmptyDestinationWritesNothing) {
    const GuardedBuffer<uint8_t> src(2000 * 3);
    for (const int32_t empty : {0, -1, INT32_MIN}) {
        uint8_t byte = 0xEE;
        ovrin_resize_rgb888(src.data(), &byte, 1, 2000, empty, 1);
        ovrin_resize_rgb888(src.data(), &byte, 1, 2000, 1, empty);
        EXPECT_EQ(byte, 0xEE);
    }
}

TEST(Rgb888, TallPicturesEqualTheDefinition) {
    Random random(44);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {1023, 1024, 1025, 3000}) {
        for (const int32_t dst_h : {1, 333, 512, 1024, 1500}) {
            check({7, src_h, 3, dst_h}, random, Flush::kEnd);
        }
    }
    check({1, 60000, 1, 59999}, random, Flush::kEnd);
    check({60000, 1, 59999, 1}, random, Flush::kEnd);
}
