// SPDX-License-Identifier: Apache-2.0
// RGBA8888 on the calling thread, and the choice between it and the threaded way.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include "reference/quarter.h"
#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

using Resize = decltype(ovrin_resize_rgba8888);

struct Sizes {
    int32_t src_w, src_h, dst_w, dst_h;
};

size_t pixels(int32_t w, int32_t h) {
    return static_cast<size_t>(w) * static_cast<size_t>(h);
}

// Resizes random content between guard pages and compares with the definition.
void check(Resize* resize, const Sizes& s, Random& random, Flush flush) {
    SCOPED_TRACE(::testing::Message() << s.src_w << "x" << s.src_h << " to " << s.dst_w << "x"
                                      << s.dst_h << (flush == Flush::kEnd ? " end" : " start"));
    const GuardedBuffer<uint8_t> src(random.bytes(pixels(s.src_w, s.src_h) * 4), flush);
    GuardedBuffer<uint32_t> dst(pixels(s.dst_w, s.dst_h), flush,
                                static_cast<uint8_t>(random.between(0, 255)));
    resize(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    const auto expected =
        reference::quarter_packed(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, 4);
    ASSERT_TRUE(
        same_bytes(reinterpret_cast<const uint8_t*>(dst.data()), expected.data(), expected.size()));
    ASSERT_TRUE(dst.intact());
}

std::vector<uint8_t> shrink_to_one(const std::vector<uint8_t>& src, int32_t w, int32_t h) {
    uint32_t word = 0xFFFFFFFF;
    ovrin_resize_rgba8888_sg(src.data(), &word, w, h, 1, 1);
    const auto* bytes = reinterpret_cast<const uint8_t*>(&word);
    return std::vector<uint8_t>(bytes, bytes + 4);
}

}  // namespace

TEST(Rgba8888, RandomSizesEqualTheDefinition) {
    Random random(1);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(4000) && !HasFatalFailure(); ++i) {
        const Sizes s = {random.awkward_size(), random.awkward_size(), random.awkward_size(),
                         random.awkward_size()};
        check(ovrin_resize_rgba8888_sg, s, random, random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST(Rgba8888, EverySmallSizeEqualsTheDefinition) {
    Random random(2);
    SCOPED_TRACE(random.trace());
    const int32_t limit = rounds(10) < 10 ? 5 : 10;
    for (int32_t src_w = 1; src_w <= limit; ++src_w) {
        for (int32_t src_h = 1; src_h <= limit; ++src_h) {
            for (int32_t dst_w = 1; dst_w <= limit; ++dst_w) {
                for (int32_t dst_h = 1; dst_h <= limit && !HasFatalFailure(); ++dst_h) {
                    check(ovrin_resize_rgba8888_sg, {src_w, src_h, dst_w, dst_h}, random,
                          Flush::kEnd);
                }
            }
        }
    }
}

TEST(Rgba8888, WideRowsCrossColumnStrips) {
    Random random(3);
    SCOPED_TRACE(random.trace());
    for (int32_t dst_w : {1023, 1024, 1025, 2047, 2048, 2049, 5000}) {
        for (int32_t src_w : {1, 700, 1024, 3000, 10001}) {
            check(ovrin_resize_rgba8888_sg, {src_w, 3, dst_w, 2}, random, Flush::kEnd);
        }
    }
}

TEST(Rgba8888, FourWhitePixelsGive252) {
    EXPECT_EQ(shrink_to_one(std::vector<uint8_t>(16, 255), 2, 2),
              (std::vector<uint8_t>{252, 252, 252, 252}));
}

TEST(Rgba8888, EqualSizesDropTheTwoLowBits) {
    EXPECT_EQ(shrink_to_one({255, 3, 4, 130}, 1, 1), (std::vector<uint8_t>{252, 0, 4, 128}));
}

TEST(Rgba8888, EmptySourceClearsTheDestination) {
    for (const int32_t empty : {0, -1, INT32_MIN}) {
        for (Resize* resize :
             {ovrin_resize_rgba8888, ovrin_resize_rgba8888_sg, ovrin_resize_rgba8888_tps}) {
            GuardedBuffer<uint32_t> by_height(6, Flush::kEnd, 0xEE);
            resize(nullptr, by_height.data(), 5, empty, 3, 2);
            EXPECT_EQ(by_height.copy(), std::vector<uint32_t>(6, 0));
            GuardedBuffer<uint32_t> by_width(6, Flush::kEnd, 0xEE);
            resize(nullptr, by_width.data(), empty, 5, 3, 2);
            EXPECT_EQ(by_width.copy(), std::vector<uint32_t>(6, 0));
        }
    }
}

TEST(Rgba8888, EmptyDestinationWritesNothing) {
    const GuardedBuffer<uint8_t> src(2000 * 4);
    for (const int32_t empty : {0, -1, INT32_MIN}) {
        for (Resize* resize :
             {ovrin_resize_rgba8888, ovrin_resize_rgba8888_sg, ovrin_resize_rgba8888_tps}) {
            GuardedBuffer<uint32_t> dst(1, Flush::kEnd, 0xEE);
            resize(src.data(), dst.data(), 1, 2000, empty, 1);
            resize(src.data(), dst.data(), 1, 2000, 1, empty);
            EXPECT_EQ(dst[0], 0xEEEEEEEE);
        }
    }
}

TEST(Rgba8888, WrapperGivesTheSamePictureOnEitherSideOfTheThreshold) {
    Random random(4);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {1, 1023, 1024, 1025}) {
        for (const int32_t dst_h : {1, 300, 512, 1023, 1024, 1500}) {
            check(ovrin_resize_rgba8888, {7, src_h, 3, dst_h}, random, Flush::kEnd);
        }
    }
}

// Products of rows pass 31 bits here; positions must not.
TEST(Rgba8888, TallPicturesNeedMoreThan31Bits) {
    Random random(5);
    SCOPED_TRACE(random.trace());
    for (Resize* resize : {ovrin_resize_rgba8888_sg, ovrin_resize_rgba8888_tps}) {
        check(resize, {1, 60000, 1, 59999}, random, Flush::kEnd);
        check(resize, {2, 60000, 1, 40000}, random, Flush::kEnd);
        check(resize, {1, 40000, 1, 70000}, random, Flush::kEnd);
        check(resize, {60000, 1, 59999, 1}, random, Flush::kEnd);
    }
}
