// SPDX-License-Identifier: Apache-2.0
// The Lanczos engine: table, transform, and the threaded entry.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <cmath>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <thread>

#include "reference/lanczos.h"
#include "support/compare.h"
#include "support/float_mode.h"
#include "support/guarded_buffer.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

struct Sizes {
    int32_t src_w, src_h, dst_w, dst_h, bpp;
};

::testing::Message describe(const Sizes& s) {
    return ::testing::Message() << s.src_w << "x" << s.src_h << " to " << s.dst_w << "x" << s.dst_h
                                << ", " << s.bpp << " bytes";
}

size_t bytes_of(int32_t w, int32_t h, int32_t bpp) {
    return static_cast<size_t>(w) * static_cast<size_t>(h) * static_cast<size_t>(bpp);
}

// Any bytes; the extremes only, which overshoot; or two halves around a middle column and row,
// whose blends are the mean of two bytes, as often as not exactly between two results.
std::vector<uint8_t> content(const Sizes& s, Random& random) {
    std::vector<uint8_t> bytes = random.bytes(bytes_of(s.src_w, s.src_h, s.bpp));
    const int32_t kind = random.between(0, 3);
    if (kind == 0) {
        for (uint8_t& byte : bytes) byte = byte & 1 ? 255 : 0;
    } else if (kind == 1) {
        const uint8_t one = bytes.front();
        const uint8_t other = bytes.back();
        size_t at = 0;
        for (int32_t y = 0; y < s.src_h; ++y) {
            for (int32_t x = 0; x < s.src_w; ++x) {
                for (int32_t n = 0; n < s.bpp; ++n) {
                    bytes[at++] = (y < s.src_h / 2) == (x < s.src_w / 2) ? one : other;
                }
            }
        }
    }
    return bytes;
}

void check(const Sizes& s, Random& random, Flush flush = Flush::kEnd) {
    SCOPED_TRACE(describe(s) << (flush == Flush::kEnd ? ", end" : ", start"));
    const GuardedBuffer<uint8_t> src(content(s, random), flush);
    const auto expected = reference::lanczos(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, s.bpp);
    GuardedBuffer<uint8_t> dst(expected.size(), flush,
                               static_cast<uint8_t>(random.between(0, 255)));
    ov_lanczos(src.data(), s.src_w, s.src_h, dst.data(), s.dst_w, s.dst_h, s.bpp);
    ASSERT_TRUE(same_bytes(dst.data(), expected.data(), expected.size()));
    ASSERT_TRUE(dst.intact());
}

void check_threaded(const Sizes& s, Random& random, Flush flush = Flush::kEnd) {
    SCOPED_TRACE(describe(s) << (flush == Flush::kEnd ? ", end" : ", start"));
    const GuardedBuffer<uint8_t> src(content(s, random), flush);
    const auto expected =
        reference::resize_lanczos(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, s.bpp);
    GuardedBuffer<uint8_t> dst(expected.size(), flush,
                               static_cast<uint8_t>(random.between(0, 255)));
    ovrin_resize_lanczos(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, s.bpp);
    ASSERT_TRUE(same_bytes(dst.data(), expected.data(), expected.size()));
    ASSERT_TRUE(dst.intact());
}

std::vector<uint8_t> draw(const std::vector<uint8_t>& src, int32_t src_w, int32_t src_h,
                          int32_t dst_w, int32_t dst_h, int32_t bpp) {
    std::vector<uint8_t> dst(bytes_of(dst_w, dst_h, bpp), 0xEE);
    ov_lanczos(src.data(), src_w, src_h, dst.data(), dst_w, dst_h, bpp);
    return dst;
}

struct Free {
    void operator()(float* table) const { free(table); }
};
std::unique_ptr<float, Free> lookup() {
    return std::unique_ptr<float, Free>(create_lanczos_lookup());
}

}  // namespace

TEST(LanczosTable, HoldsTheStatedValues) {
    const auto owner = lookup();
    const float* table = owner.get();
    ASSERT_NE(table, nullptr);
    EXPECT_EQ(table[0], 1.0f);
    // The wide factor counts as 1 up to entry 2.
    EXPECT_EQ(table[1], 0.999999881f);
    EXPECT_EQ(table[2], 0.999999583f);
    EXPECT_EQ(table[3], 0.999998987f);
    EXPECT_EQ(table[6000], -0.13509491f);
    for (const int zero : {4000, 8000}) {
        EXPECT_GT(std::fabs(table[zero]), 1e-14f);
        EXPECT_LT(std::fabs(table[zero]), 1e-12f);
    }
    EXPECT_GT(table[12000], 0.0f);
    EXPECT_LT(table[12000], 1e-25f);
    for (int i = 12001; i < 16000; ++i) EXPECT_EQ(table[i], 0.0f) << i;
}

TEST(LanczosTable, EqualsTheDefinition) {
    const auto owner = lookup();
    const std::vector<float> expected = reference::lanczos_table();
    for (size_t i = 0; i < expected.size(); ++i) EXPECT_EQ(owner.get()[i], expected[i]) << i;
}

TEST(LanczosImage, IsValidWhenEveryFieldIs) {
    uint8_t byte = 0;
    const lanczos_image good = {1, 1, 1, 1, &byte};
    EXPECT_EQ(checkOvImage(&good), 1);
    EXPECT_EQ(checkOvImage(nullptr), 0);
    for (const int32_t bad : {0, -1, INT32_MIN}) {
        lanczos_image image = good;
        image.width = bad;
        EXPECT_EQ(checkOvImage(&image), 0);
        image = good;
        image.height = bad;
        EXPECT_EQ(checkOvImage(&image), 0);
        image = good;
        image.stride = bad;
        EXPECT_EQ(checkOvImage(&image), 0);
        image = good;
        image.bytes_per_pixel = bad;
        EXPECT_EQ(checkOvImage(&image), 0);
    }
    lanczos_image image = good;
    image.data = nullptr;
    EXPECT_EQ(checkOvImage(&image), 0);
}

TEST(Lanczos, RandomSizesEqualTheDefinition) {
    Random random(81);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(400) && !HasFatalFailure(); ++i) {
        check({random.awkward_size(), random.between(1, 70), random.awkward_size(),
               random.between(1, 40), random.between(1, 4)},
              random, random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST(Lanczos, EverySmallSizeEqualsTheDefinition) {
    Random random(82);
    SCOPED_TRACE(random.trace());
    const int32_t limit = rounds(7) < 7 ? 4 : 7;
    for (int32_t src_w = 1; src_w <= limit; ++src_w) {
        for (int32_t src_h = 1; src_h <= limit; ++src_h) {
            for (int32_t dst_w = 1; dst_w <= limit; ++dst_w) {
                for (int32_t dst_h = 1; dst_h <= limit && !HasFatalFailure(); ++dst_h) {
                    check({src_w, src_h, dst_w, dst_h, random.between(1, 4)}, random,
                          random.pick({Flush::kEnd, Flush::kStart}));
                }
            }
        }
    }
}

TEST(Lanczos, OddRatiosEqualTheDefinition) {
    Random random(83);
    SCOPED_TRACE(random.trace());
    for (const auto& [src, dst] : {std::pair<int32_t, int32_t>{97, 89},
                                   {89, 97},
                                   {300, 7},
                                   {7, 300},
                                   {1000, 333},
                                   {333, 1000},
                                   {2, 1001},
                                   {1001, 2},
                                   {5000, 4},
                                   {3, 1},
                                   {2, 3},
                                   {4, 3}}) {
        for (const int32_t bpp : {1, 2, 3, 4}) {
            check({src, 5, dst, 3, bpp}, random);
            check({5, src, 3, dst, bpp}, random);
        }
    }
}

// Pictures are filtered in strips of columns.
TEST(Lanczos, WidePicturesEqualTheDefinition) {
    Random random(34);
    SCOPED_TRACE(random.trace());
    for (const int32_t dst_w : {255, 256, 257, 511, 512, 513, 800}) {
        for (const int32_t bpp : {1, 2, 3, 4, 5}) {
            const int32_t src_w = random.pick({7, dst_w / 2, dst_w, dst_w * 3 / 2, dst_w * 4});
            check({src_w, random.between(1, 9), dst_w, random.between(1, 9), bpp}, random);
        }
    }
}

TEST(Lanczos, AnyNumberOfComponents) {
    Random random(84);
    SCOPED_TRACE(random.trace());
    for (int32_t bpp = 1; bpp <= 9; ++bpp) {
        check({19, 11, 23, 7, bpp}, random, Flush::kEnd);
        check({19, 11, 8, 17, bpp}, random, Flush::kStart);
    }
}

TEST(Lanczos, EqualSizesAreACopy) {
    Random random(85);
    SCOPED_TRACE(random.trace());
    for (const int32_t bpp : {1, 2, 3, 4}) {
        auto src = random.bytes(bytes_of(61, 37, bpp));
        EXPECT_EQ(draw(src, 61, 37, 61, 37, bpp), src);
        for (uint8_t& byte : src) byte = byte & 1 ? 255 : 0;
        EXPECT_EQ(draw(src, 61, 37, 61, 37, bpp), src);
    }
}

TEST(Lanczos, OnePixelGivesAUniformPicture) {
    for (const int32_t bpp : {1, 2, 3, 4}) {
        const std::vector<uint8_t> pixel = {7, 255, 0, 131};
        const auto dst = draw(pixel, 1, 1, 33, 21, bpp);
        for (size_t i = 0; i < dst.size(); ++i) {
            ASSERT_EQ(dst[i], pixel[i % static_cast<size_t>(bpp)]) << i;
        }
        EXPECT_EQ(draw(pixel, 1, 1, 1, 1, bpp).front(), 7);
    }
}

TEST(Lanczos, UniformPicturesStayUniformToTheBorder) {
    for (const uint8_t value : {uint8_t{0}, uint8_t{1}, uint8_t{128}, uint8_t{254}, uint8_t{255}}) {
        const std::vector<uint8_t> src(20 * 20, value);
        for (const auto& [w, h] : {std::pair<int32_t, int32_t>{31, 47}, {9, 3}, {20, 20}}) {
            EXPECT_EQ(draw(src, 20, 20, w, h, 1), std::vector<uint8_t>(bytes_of(w, h, 1), value));
        }
    }
}

// Every float of it is not a number, and stays so times zero.
[[gnu::noinline]] void fill_stack_with_ones() {
    uint8_t bytes[1 << 18];
    memset(bytes, 0xFF, sizeof bytes);
    __asm__ volatile("" : : "r"(bytes) : "memory");
}

TEST(Lanczos, WhatLayOnTheStackCountsForNothing) {
    Random random(100);
    SCOPED_TRACE(random.trace());
    for (const int32_t bpp : {1, 2, 3, 4}) {
        for (int i = 0; i < rounds(40) && !HasFatalFailure(); ++i) {
            const Sizes s = {random.between(1, 90), random.between(1, 20), random.between(1, 90),
                             random.between(1, 20), bpp};
            const auto src = content(s, random);
            const auto expected =
                reference::resize_lanczos(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, bpp);
            std::vector<uint8_t> dst(expected.size());
            fill_stack_with_ones();
            ov_lanczos(src.data(), s.src_w, s.src_h, dst.data(), s.dst_w, s.dst_h, bpp);
            ASSERT_EQ(dst, expected) << describe(s);
        }
    }
}

// The sample before the first is the first again, and so on: the same as a picture whose border was
// repeated by hand, away from its own border.
TEST(Lanczos, BorderPixelsAreRepeated) {
    constexpr int32_t kSize = 8, kMargin = 4, kWide = kSize + 2 * kMargin;
    Random random(86);
    const auto src = random.bytes(kSize * kSize);
    std::vector<uint8_t> wide;
    for (int32_t y = 0; y < kWide; ++y) {
        for (int32_t x = 0; x < kWide; ++x) {
            const int32_t from_y = std::min(std::max(y - kMargin, 0), kSize - 1);
            const int32_t from_x = std::min(std::max(x - kMargin, 0), kSize - 1);
            wide.push_back(src[static_cast<size_t>(from_y * kSize + from_x)]);
        }
    }
    const auto small = draw(src, kSize, kSize, 2 * kSize, 2 * kSize, 1);
    const auto large = draw(wide, kWide, kWide, 2 * kWide, 2 * kWide, 1);
    for (size_t y = 0; y < 2 * kSize; ++y) {
        for (size_t x = 0; x < 2 * kSize; ++x) {
            EXPECT_EQ(small[y * 2 * kSize + x],
                      large[(y + 2 * kMargin) * 2 * kWide + x + 2 * kMargin]);
        }
    }
}

TEST(Lanczos, OvershootIsClipped) {
    std::vector<uint8_t> src;
    for (int i = 0; i < 16 * 16; ++i) src.push_back(i % 16 < 8 ? 0 : 255);
    const auto dst = draw(src, 16, 16, 32, 32, 1);
    // Next to the edge the kernel's negative lobe would leave the range on either side.
    EXPECT_EQ(dst[14], 0);
    EXPECT_EQ(dst[17], 255);
    for (uint8_t& byte : src) byte = byte == 0 ? 50 : 200;
    const auto within = draw(src, 16, 16, 32, 32, 1);
    EXPECT_LT(*std::min_element(within.begin(), within.end()), 50);
    EXPECT_GT(*std::max_element(within.begin(), within.end()), 200);
}

// Halfway between two samples on either side of an edge the value is their mean. Where that lies
// between two bytes the last bit of the sum decides, and a sum whose products are rounded, or one
// in another order, decides differently for hundreds of the pairs.
TEST(Lanczos, TheSumIsFusedAndInOrder) {
    Random random(100);
    SCOPED_TRACE(random.trace());
    for (const int32_t bpp : {1, 2, 3, 4}) {
        int distinguishing = 0;
        for (int i = 0; i < rounds(500) || (distinguishing == 0 && i < 500); ++i) {
            const std::vector<uint8_t> left = random.bytes(static_cast<size_t>(bpp));
            std::vector<uint8_t> right = random.bytes(left.size());
            for (size_t k = 0; k < left.size(); ++k) {
                right[k] = static_cast<uint8_t>((right[k] & ~1) | (~left[k] & 1));
            }
            std::vector<uint8_t> src;
            for (int x = 0; x < 8 * 2; ++x) {
                const std::vector<uint8_t>& pixel = x % 8 < 4 ? left : right;
                src.insert(src.end(), pixel.begin(), pixel.end());
            }
            const auto expected = reference::lanczos(src.data(), 8, 2, 16, 2, bpp);
            const auto rounded =
                reference::lanczos(src.data(), 8, 2, 16, 2, bpp, reference::rounded_step);
            distinguishing += expected != rounded;
            ASSERT_EQ(draw(src, 8, 2, 16, 2, bpp), expected) << ::testing::PrintToString(src);
        }
        EXPECT_GT(distinguishing, 0);
    }
}

TEST(Lanczos, TheSumIsFusedAndInOrderInBothDirections) {
    Random random(87);
    SCOPED_TRACE(random.trace());
    int distinguishing = 0;
    for (int i = 0; i < rounds(300) || (distinguishing == 0 && i < 300); ++i) {
        const std::vector<uint8_t> pair = random.bytes(2);
        std::vector<uint8_t> src;
        for (int k = 0; k < 64 * 4; ++k) src.push_back(pair[(k / 4 % 8 < 4) == (k / 32 < 4)]);
        const auto expected = reference::lanczos(src.data(), 8, 8, 16, 16, 4);
        const auto rounded =
            reference::lanczos(src.data(), 8, 8, 16, 16, 4, reference::rounded_step);
        distinguishing += expected != rounded;
        ASSERT_EQ(draw(src, 8, 8, 16, 16, 4), expected) << int{pair[0]} << ", " << int{pair[1]};
    }
    EXPECT_GT(distinguishing, 0);
}

// From 117 rows to 120 the fractions of many positions lie on a step of the table, and a position
// that was rounded once instead of twice takes the step before or after.
TEST(Lanczos, RowPositionsRoundTwice) {
    constexpr int32_t kSrc = 117, kDst = 120;
    const double ratio = static_cast<double>(kSrc) / kDst;
    int moved = 0;
    for (int32_t y = 0; y < kDst; ++y) {
        const double p = ratio * y;
        const double f = std::fma(ratio, y, -std::floor(p));
        moved += static_cast<int32_t>(std::fabs(f) * 4000) !=
                 static_cast<int32_t>((p - std::floor(p)) * 4000);
    }
    EXPECT_GE(moved, 20);
    Random random(88);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < 2; ++i) check({64, kSrc, 64, kDst, 1}, random);
}

// 18 / 66 * 55 is 15, but its double falls just short: row 55 looks at row 14 and a fraction of
// nearly 1.
TEST(Lanczos, RowsMayFallJustShortOfASourceRow) {
    Random random(101);
    SCOPED_TRACE(random.trace());
    for (const auto& [src, dst] :
         {std::pair<int32_t, int32_t>{18, 66}, {14, 110}, {3, 147}, {2, 98}}) {
        int short_of = 0;
        for (int32_t y = 0; y < dst; ++y) {
            const double p = static_cast<double>(src) / dst * y;
            short_of += static_cast<int32_t>(p) < src * y / dst;
        }
        EXPECT_GE(short_of, 1) << src << " to " << dst;
        check({32, src, 32, dst, 1}, random);
    }
}

// Rows that lie a last bit away from a source row have one large weight and tiny ones, whose sum
// depends on the order of its terms. The columns' mean of two bytes makes the last bit decide.
TEST(Lanczos, WeightsAreAddedInOrder) {
    Random random(102);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(200) && !HasFatalFailure(); ++i) {
        const std::vector<uint8_t> pair = random.bytes(8);
        std::vector<uint8_t> src;
        for (size_t k = 0; k < 8 * 84 * 4; ++k) src.push_back(pair[k / 4 % 8 / 4 * 4 + k % 4]);
        const auto expected = reference::lanczos(src.data(), 8, 84, 16, 44, 4);
        const auto dst = draw(src, 8, 84, 16, 44, 4);
        ASSERT_TRUE(same_bytes(dst.data(), expected.data(), expected.size()));
    }
}

// Columns add the ratio up, which drifts away from the products that rows use.
TEST(Lanczos, ColumnPositionsAreARunningSum) {
    constexpr int32_t kSrc = 120, kDst = 112;
    const double ratio = static_cast<double>(kSrc) / kDst;
    int moved = 0;
    double p = 0;
    for (int32_t x = 0; x < kDst; ++x) {
        const double product = ratio * x;
        moved += static_cast<int32_t>((p - std::floor(p)) * 4000) !=
                 static_cast<int32_t>((product - std::floor(product)) * 4000);
        p += ratio;
    }
    EXPECT_GE(moved, 5);
    Random random(89);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < 2; ++i) check({kSrc, 64, kDst, 64, 1}, random);
}

TEST(Lanczos, InvalidArgumentsWriteNothing) {
    std::vector<uint8_t> bytes(64, 0xEE);
    const std::vector<uint8_t> before = bytes;
    const std::vector<uint8_t> src(64);
    ov_lanczos(nullptr, 4, 4, bytes.data(), 2, 2, 4);
    ov_lanczos(src.data(), 4, 4, nullptr, 2, 2, 4);
    for (const int32_t bad : {0, -1, -1000}) {
        ov_lanczos(src.data(), bad, 4, bytes.data(), 2, 2, 4);
        ov_lanczos(src.data(), 4, bad, bytes.data(), 2, 2, 4);
        ov_lanczos(src.data(), 4, 4, bytes.data(), bad, 2, 4);
        ov_lanczos(src.data(), 4, 4, bytes.data(), 2, bad, 4);
        ov_lanczos(src.data(), 4, 4, bytes.data(), 2, 2, bad);
        ov_lanczos_nv(src.data(), bad, 4, bytes.data(), 2, 2);
        ov_lanczos_nv(src.data(), 4, bad, bytes.data(), 2, 2);
        ov_lanczos_nv(src.data(), 4, 4, bytes.data(), bad, 2);
        ov_lanczos_nv(src.data(), 4, 4, bytes.data(), 2, bad);
        for (const int32_t tall : {2, 100}) {
            ovrin_resize_lanczos(src.data(), bytes.data(), bad, 4, 2, 2, 4);
            ovrin_resize_lanczos(src.data(), bytes.data(), 4, bad, 2, 2, 4);
            ovrin_resize_lanczos(src.data(), bytes.data(), 4, 4, bad, tall, 4);
            ovrin_resize_lanczos(src.data(), bytes.data(), 4, 4, 2, bad, 4);
            ovrin_resize_lanczos(src.data(), bytes.data(), 4, 4, 2, 2, bad);
        }
    }
    EXPECT_EQ(bytes, before);
}

TEST(LanczosTransform, InvalidDescriptorsWriteNothing) {
    std::vector<uint8_t> bytes(64, 0xEE);
    const std::vector<uint8_t> before = bytes;
    std::vector<uint8_t> pixels(64);
    const lanczos_image good_src = {4, 4, 16, 4, pixels.data()};
    const lanczos_image good_dst = {2, 2, 8, 4, bytes.data()};
    OvTransformLanczos(nullptr, &good_dst);
    for (int field = 0; field < 5; ++field) {
        for (lanczos_image bad : {good_src, good_dst}) {
            const bool is_src = bad.data == pixels.data();
            if (field == 0) bad.width = 0;
            if (field == 1) bad.height = -1;
            if (field == 2) bad.stride = 0;
            if (field == 3) bad.bytes_per_pixel = 0;
            if (field == 4) bad.data = nullptr;
            OvTransformLanczos(is_src ? &bad : &good_src, is_src ? &good_dst : &bad);
        }
    }
    EXPECT_EQ(bytes, before);
}

TEST(LanczosTransform, DestinationRowsMayBeApart) {
    Random random(90);
    auto src = random.bytes(9 * 8 * 3);
    constexpr int32_t kStride = 12 * 3 + 5;
    GuardedBuffer<uint8_t> dst(kStride * 6 + 12 * 3, Flush::kEnd, 0x77);
    const lanczos_image from = {9, 8, 9 * 3, 3, src.data()};
    const lanczos_image to = {12, 7, kStride, 3, dst.data()};
    OvTransformLanczos(&from, &to);
    const auto expected = reference::lanczos(src.data(), 9, 8, 12, 7, 3);
    for (size_t y = 0; y < 7; ++y) {
        EXPECT_TRUE(same_bytes(dst.data() + y * kStride, &expected[y * 36], 36));
        for (size_t x = 36; x < kStride && y < 6; ++x) EXPECT_EQ(dst[y * kStride + x], 0x77);
    }
}

// Taps start at the source's pixels and step by the destination's.
TEST(LanczosTransform, TheDestinationsComponentCountIsTheStepBetweenTaps) {
    Random random(91);
    for (const auto& [src_bpp, dst_bpp] :
         {std::pair<int32_t, int32_t>{4, 1}, {4, 3}, {3, 1}, {2, 1}, {7, 2}, {5, 4}}) {
        for (const auto& [dst_w, dst_h] : {std::pair<int32_t, int32_t>{17, 9}, {5, 20}, {12, 11}}) {
            SCOPED_TRACE(::testing::Message() << src_bpp << " to " << dst_bpp);
            const reference::LanczosSizes s = {12, 11, dst_w, dst_h, src_bpp, dst_bpp};
            const GuardedBuffer<uint8_t> src(random.bytes(bytes_of(12, 11, src_bpp)));
            const auto expected = reference::lanczos(s, src.data());
            GuardedBuffer<uint8_t> dst(expected.size());
            const lanczos_image from = {12, 11, 12 * src_bpp, src_bpp,
                                        const_cast<uint8_t*>(src.data())};
            const lanczos_image to = {dst_w, dst_h, dst_w * dst_bpp, dst_bpp, dst.data()};
            OvTransformLanczos(&from, &to);
            EXPECT_TRUE(same_bytes(dst.data(), expected.data(), expected.size()));
        }
    }
}

// With more components than the source has, a slot's taps run into the next slot. One column keeps
// those of the last slot inside.
TEST(LanczosTransform, MoreComponentsThanTheSourceHasReadOn) {
    Random random(92);
    const GuardedBuffer<uint8_t> src(random.bytes(30 * 4));
    const reference::LanczosSizes s = {30, 4, 1, 9, 1, 4};
    const auto expected = reference::lanczos(s, src.data());
    std::vector<uint8_t> dst(expected.size());
    const lanczos_image from = {30, 4, 30, 1, const_cast<uint8_t*>(src.data())};
    const lanczos_image to = {1, 9, 4, 4, dst.data()};
    OvTransformLanczos(&from, &to);
    EXPECT_EQ(dst, expected);
}

TEST(LanczosNv, TransformsPairsAtFullLumaSize) {
    Random random(93);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(60) && !HasFatalFailure(); ++i) {
        const Sizes s = {random.between(1, 50), random.between(1, 40), random.between(1, 60),
                         random.between(1, 40), 3};
        SCOPED_TRACE(describe(s));
        const Flush flush = random.pick({Flush::kEnd, Flush::kStart});
        const GuardedBuffer<uint8_t> src(random.bytes(bytes_of(s.src_w, s.src_h, 3)), flush);
        GuardedBuffer<uint8_t> dst(bytes_of(s.dst_w, s.dst_h, 3), flush, 0x77);
        ov_lanczos_nv(src.data(), s.src_w, s.src_h, dst.data(), s.dst_w, s.dst_h);
        const auto expected = reference::lanczos_nv(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        ASSERT_TRUE(same_bytes(dst.data(), expected.data(), expected.size()));
        ASSERT_TRUE(dst.intact());
    }
}

TEST(LanczosNv, ReadsAndWritesThreeBytesForEveryPixel) {
    Random random(94);
    const GuardedBuffer<uint8_t> src(random.bytes(640 * 480 * 3));
    GuardedBuffer<uint8_t> dst(40 * 30 * 3, Flush::kEnd, 0x77);
    ov_lanczos_nv(src.data(), 640, 480, dst.data(), 40, 30);
    const auto expected = reference::lanczos_nv(src.data(), 640, 480, 40, 30);
    EXPECT_TRUE(same_bytes(dst.data(), expected.data(), expected.size()));
}

TEST(LanczosThreaded, EqualsTheSingleThreadedPictureForFourBytes) {
    Random random(95);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(40) && !HasFatalFailure(); ++i) {
        const Sizes s = {random.between(1, 40), random.between(1, 200), random.between(1, 24),
                         random.between(1, 300), 4};
        SCOPED_TRACE(describe(s));
        const Flush flush = random.pick({Flush::kEnd, Flush::kStart});
        const GuardedBuffer<uint8_t> src(content(s, random), flush);
        GuardedBuffer<uint8_t> dst(bytes_of(s.dst_w, s.dst_h, 4), flush, 0x77);
        ovrin_resize_lanczos(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, 4);
        ASSERT_EQ(dst.copy(), draw(src.copy(), s.src_w, s.src_h, s.dst_w, s.dst_h, 4));
        ASSERT_TRUE(dst.intact());
    }
}

TEST(LanczosThreaded, BothSidesOfTheSecondBandEqualTheDefinition) {
    Random random(96);
    SCOPED_TRACE(random.trace());
    for (const int32_t dst_h : {1, 31, 40, 47, 48, 49, 63, 64, 65, 100}) {
        check_threaded({9, dst_h, 11, dst_h, 4}, random, Flush::kEnd);
        check_threaded({9, 7, 11, dst_h, 4}, random, Flush::kStart);
        check_threaded({9, 5 * dst_h, 11, dst_h, 4}, random, Flush::kEnd);
        check_threaded({2, 40 * dst_h, 3, dst_h, 4}, random, Flush::kStart);
    }
}

// 63 rows make two bands, which lie four bytes a pixel apart; 40 make one, and the picture is
// packed.
TEST(LanczosThreaded, BandsLieFourBytesAPixelApartWhateverAPixelHas) {
    Random random(97);
    SCOPED_TRACE(random.trace());
    for (const int32_t bpp : {1, 2, 3, 4}) {
        check_threaded({9, 63, 7, 63, bpp}, random);
        check_threaded({9, 40, 7, 40, bpp}, random);
        check_threaded({9, 20, 7, 150, bpp}, random);
        check_threaded({9, 1, 7, 150, bpp}, random);
        check_threaded({1, 20, 1, 150, bpp}, random);
    }
}

TEST(LanczosThreaded, MoreBandsThanThePoolHasSlots) {
    Random random(98);
    SCOPED_TRACE(random.trace());
    check_threaded({1, 9, 1, 66000, 4}, random);
}

TEST(LanczosThreaded, WithoutASourceTheDestinationIsCleared) {
    std::vector<uint8_t> dst(7 * 63 * 4, 0xEE);
    ovrin_resize_lanczos(nullptr, dst.data(), 9, 63, 7, 63, 4);
    EXPECT_EQ(dst, std::vector<uint8_t>(dst.size(), 0));
}

class LanczosBandTask : public ::testing::Test {
protected:
    LanczosBandTask()
        : random_(99), src_(random_.bytes(bytes_of(kSrcW, kSrcH, kBpp))), table_(lookup()) {
        const std::vector<float> values = reference::lanczos_table();
        for (const auto& taps : reference::lanczos_columns(values, kSrcW, kDstW).taps) {
            column_weights_.insert(column_weights_.end(), taps.begin(), taps.end());
        }
        for (const auto& taps : reference::lanczos_rows(values, kSrcH, kDstH).taps) {
            row_weights_.insert(row_weights_.end(), taps.begin(), taps.end());
        }
    }

    // A record for `rows` rows from `first`, drawn to `dst`.
    ovrin_lanczos_band band(int32_t first, int32_t rows, uint8_t* dst) const {
        ovrin_lanczos_band record = {};
        record.src_w = kSrcW;
        record.src_h = kSrcH;
        record.dst_w = kDstW;
        record.dst_h = kDstH;
        record.src = src_.data();
        record.dst = dst;
        record.bytes_per_pixel = kBpp;
        record.first_row = first;
        record.rows = rows;
        record.table = table_.get();
        record.column_weights = column_weights_.data();
        record.row_weights = row_weights_.data();
        return record;
    }

    static constexpr int32_t kSrcW = 13, kSrcH = 9, kDstW = 10, kDstH = 15, kBpp = 3;
    Random random_;
    std::vector<uint8_t> src_;
    std::unique_ptr<float, Free> table_;
    std::vector<double> column_weights_;
    std::vector<double> row_weights_;
};

TEST_F(LanczosBandTask, DrawsItsRowsFromItsFirstByteOn) {
    const auto picture = reference::lanczos(src_.data(), kSrcW, kSrcH, kDstW, kDstH, kBpp);
    for (const auto& [first, rows] :
         {std::pair<int32_t, int32_t>{0, 15}, {0, 4}, {4, 7}, {14, 1}}) {
        GuardedBuffer<uint8_t> dst(bytes_of(kDstW, rows, kBpp));
        ovrin_lanczos_band record = band(first, rows, dst.data());
        _resize_lanczos_tp(&record);
        EXPECT_TRUE(same_bytes(dst.data(), &picture[bytes_of(kDstW, first, kBpp)], dst.size()));
    }
}

TEST_F(LanczosBandTask, WithoutBufferTableOrRowsNothingIsWritten) {
    std::vector<uint8_t> dst(bytes_of(kDstW, kDstH, kBpp), 0xEE);
    const auto before = dst;
    ovrin_lanczos_band record = band(0, kDstH, dst.data());
    record.table = nullptr;
    _resize_lanczos_tp(&record);
    record = band(0, kDstH, dst.data());
    record.src = nullptr;
    _resize_lanczos_tp(&record);
    record = band(0, kDstH, nullptr);
    _resize_lanczos_tp(&record);
    for (const int32_t rows : {0, -1}) {
        record = band(3, rows, dst.data());
        _resize_lanczos_tp(&record);
    }
    EXPECT_EQ(dst, before);
}

TEST(LanczosThreads, EightCallersAtOnceGetTheirOwnBytes) {
    constexpr int kCallers = 8;
    std::vector<std::thread> callers;
    for (int caller = 0; caller < kCallers; ++caller) {
        callers.emplace_back([caller] {
            Random random(110 + static_cast<uint64_t>(caller));
            for (int i = 0; i < rounds(4); ++i) {
                check_threaded({10 + caller, 30 + i, 8, 90 + caller, 4}, random);
                check({10 + caller, 30, 20, 10 + i, 1 + caller % 4}, random);
            }
        });
    }
    for (std::thread& caller : callers) caller.join();
}
