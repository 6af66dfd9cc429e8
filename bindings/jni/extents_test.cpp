// SPDX-License-Identifier: Apache-2.0
// Buffers of exactly the stated bytes, flush against inaccessible pages: a byte too few faults.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <cstring>

#include "extents.h"
#include "support/guarded_buffer.h"
#include "support/random.h"

using namespace ovrin_jni;
using ovrin_test::GuardedBuffer;
using ovrin_test::Random;
using ovrin_test::rounds;

namespace {

constexpr BilinearFormat kFormats[] = {kPlanar, kPixels, kSemiPlanar};

size_t picture_bytes(Size size, BilinearFormat format) {
    return static_cast<size_t>(format == kPixels ? 4 * size.pixels() : yuv420_bytes(size));
}

using Resize = void(const uint8_t*, uint8_t*, int32_t, int32_t, int32_t, int32_t, int32_t,
                    const ovrin_resize_target*);

void resize_exact(Resize* resize, int64_t bytes, Size src, Size dst, BilinearFormat format) {
    const GuardedBuffer<uint8_t> source(static_cast<size_t>(bytes));
    GuardedBuffer<uint8_t> result(picture_bytes(dst, format));
    resize(source.data(), result.data(), src.width, src.height, dst.width, dst.height, format,
           nullptr);
    EXPECT_TRUE(result.intact());
}

void resize_all_ways(Size src, Size dst) {
    SCOPED_TRACE(::testing::Message()
                 << src.width << "x" << src.height << " to " << dst.width << "x" << dst.height);
    for (const BilinearFormat format : kFormats) {
        const int64_t bytes = bilinear_source_bytes(src, dst, format);
        EXPECT_GE(bytes, static_cast<int64_t>(picture_bytes(src, format)));
        resize_exact(ov_bilinear_sg, bytes, src, dst, format);
        resize_exact(ov_bilinear, bytes, src, dst, format);
        resize_exact(ov_bilinear_ex, bilinear_ex_source_bytes(src, dst, format), src, dst, format);
    }
}

}  // namespace

TEST(Extents, BilinearSourcesOfSmallPictures) {
    for (int32_t src_w = 1; src_w <= 7; ++src_w) {
        for (int32_t src_h = 1; src_h <= 7; ++src_h) {
            for (int32_t dst_w = 1; dst_w <= 9; ++dst_w) {
                for (int32_t dst_h = 1; dst_h <= 9; dst_h += 2) {
                    resize_all_ways({src_w, src_h}, {dst_w, dst_h});
                }
            }
        }
    }
}

TEST(Extents, BilinearSourcesOfRandomPictures) {
    Random random(1);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(1500); ++i) {
        const Size src = {random.awkward_size(), random.awkward_size()};
        resize_all_ways(src, {random.awkward_size(), random.awkward_size()});
    }
}

// Single precision moves positions of long axes across whole numbers.
TEST(Extents, BilinearSourcesOfLongPictures) {
    Random random(2);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(100); ++i) {
        const int32_t length = random.between(1000, kLargestSide - 8);
        const int32_t other = length + random.between(-8, 8);
        const int32_t thickness = random.between(1, 3);
        resize_all_ways({thickness, length}, {random.between(1, 3), other});
        resize_all_ways({length, thickness}, {other, random.between(1, 3)});
        resize_all_ways({kLargestSide, thickness}, {kLargestSide, random.between(1, 3)});
    }
}

// The usual reductions need nothing behind the picture.
TEST(Extents, HalvesAndQuartersNeedThePictureOnly) {
    for (const BilinearFormat format : kFormats) {
        for (const Size src : {Size{4000, 3000}, Size{1920, 1080}, Size{16, 8}}) {
            for (const int32_t divisor : {2, 4}) {
                const Size dst = {src.width / divisor, src.height / divisor};
                const auto picture = static_cast<int64_t>(picture_bytes(src, format));
                EXPECT_EQ(bilinear_source_bytes(src, dst, format), picture);
                EXPECT_EQ(bilinear_ex_source_bytes(src, dst, format), picture);
            }
        }
    }
}

// The bytes behind the picture that equal sizes need do reach the result.
TEST(Extents, EqualSizesReadBehindThePicture) {
    const Size size = {1, 1};
    EXPECT_EQ(bilinear_source_bytes(size, size, kPixels), 12);
    uint8_t source[12] = {};
    uint8_t dark[4], bright[4];
    ov_bilinear_sg(source, dark, 1, 1, 1, 1, kPixels, nullptr);
    memset(source + 8, 255, 4);
    ov_bilinear_sg(source, bright, 1, 1, 1, 1, kPixels, nullptr);
    EXPECT_NE(memcmp(dark, bright, sizeof dark), 0);
}

TEST(Extents, PlanesWithStrides) {
    EXPECT_EQ(strided(10, 3, 16), 42);
    EXPECT_EQ(strided_chroma({9, 5}, 17), 2 * 9 + 5);
    EXPECT_EQ(yuv420_bytes({3, 3}), 9 + 8);
    EXPECT_EQ(yuv420_bytes({kLargestSide, kLargestSide}),
              int64_t{32767} * 32767 + int64_t{2} * 16384 * 16384);
}
