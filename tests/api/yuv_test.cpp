// SPDX-License-Identifier: Apache-2.0
// Planar YUV 4:2:0: contiguous, in three planes, and letterboxed.
#include "reference/yuv.h"

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/letterbox.h"
#include "support/pictures.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

using Contiguous = decltype(ovrin_resize_yuv420);
using Planes = decltype(ovrin_resize_y_u_v_sg);
using Model = decltype(reference::keep_ratio_yuv_sg);

constexpr Contiguous* kContiguous[] = {ovrin_resize_yuv420, ovrin_resize_yuv420_sg,
                                       ovrin_resize_yuv420_tps};
constexpr Planes* kPlanes[] = {ovrin_resize_y_u_v_sg, ovrin_resize_y_u_v_tps};

struct Way {
    Planes* resize;
    Model* model;
};
constexpr Way kSingle = {ovrin_resize_y_u_v_sg, reference::keep_ratio_yuv_sg};
constexpr Way kThreaded = {ovrin_resize_y_u_v_tps, reference::keep_ratio_yuv_tps};
constexpr Way kBoth[] = {kSingle, kThreaded};

::testing::AssertionResult same(const GuardedBuffer<uint8_t>& actual,
                                const std::vector<uint8_t>& expected) {
    if (!actual.intact()) return ::testing::AssertionFailure() << "written before the buffer";
    return same_bytes(actual.data(), expected.data(), expected.size());
}

void check_contiguous(Contiguous* resize, const Sizes& s, Random& random, Flush flush) {
    SCOPED_TRACE(describe(s, flush));
    const GuardedBuffer<uint8_t> src(random.bytes(bytes_of_i420(s.src_w, s.src_h)), flush);
    GuardedBuffer<uint8_t> dst(bytes_of_i420(s.dst_w, s.dst_h), flush, 0xEE);
    resize(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    const auto expected = reference::resize_yuv(
        reference::i420_source(src.data(), s.src_w, s.src_h), s.dst_w, s.dst_h);
    ASSERT_TRUE(same(dst, expected));
}

void check_planes(Planes* resize, const Sizes& s, Random& random, Flush flush) {
    SCOPED_TRACE(describe(s, flush));
    const PlanarPicture src(random, s.src_w, s.src_h, s.src_w, flush);
    GuardedBuffer<uint8_t> dst(bytes_of_i420(s.dst_w, s.dst_h), flush, 0xEE);
    resize(src.y.first(), src.u.first(), src.v.first(), dst.data(), s.src_w, s.src_h, s.dst_w,
           s.dst_h, nullptr);
    ASSERT_TRUE(same(dst, reference::resize_yuv(src.view, s.dst_w, s.dst_h)));
}

size_t canvas_bytes(const ovrin_resize_target& target) {
    return bytes_of_i420(target.canvas_width, target.canvas_height);
}

// Letterboxes random content; compares the canvas with the definition and the target with itself.
void check_letterbox(const Way& way, ovrin_resize_target target, int32_t src_w, int32_t src_h,
                     Random& random, Flush flush = Flush::kEnd) {
    SCOPED_TRACE(describe(target, src_w, src_h));
    const PlanarPicture src(random, src_w, src_h, target.src_stride, flush);
    GuardedBuffer<uint8_t> canvas(canvas_bytes(target), flush, 0xEE);
    target.dst = canvas.data();
    std::vector<uint8_t> expected = canvas.copy();
    way.model(src.view, target, expected);

    const ovrin_resize_target before = target;
    way.resize(src.y.first(), src.u.first(), src.v.first(), nullptr, src_w, src_h, 0, 0, &target);
    ASSERT_TRUE(same_target(target, before));
    ASSERT_TRUE(same(canvas, expected));
}

// Letterboxes a white picture of `size` x `size`, giving the canvas.
std::vector<uint8_t> white_on_canvas(ovrin_resize_target target, int32_t size = 8) {
    const std::vector<uint8_t> white(static_cast<size_t>(size) * static_cast<size_t>(size), 255);
    std::vector<uint8_t> canvas(canvas_bytes(target), 0xEE);
    target.src_stride = size;
    target.dst = canvas.data();
    ovrin_resize_y_u_v_keep_ratio(white.data(), white.data(), white.data(), size, size, &target);
    return canvas;
}

}  // namespace

// ---- Whole destinations ----

TEST(Yuv420, RandomSizesEqualTheDefinition) {
    Random random(60);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(3000) && !HasFatalFailure(); ++i) {
        const Sizes s = {random.awkward_size(), random.awkward_size(), random.awkward_size(),
                         random.awkward_size()};
        const Flush flush = random.pick({Flush::kEnd, Flush::kStart});
        if (i % 2 == 0) {
            check_contiguous(kContiguous[i / 2 % 3], s, random, flush);
        } else {
            check_planes(kPlanes[i / 2 % 2], s, random, flush);
        }
    }
}

TEST(Yuv420, EverySmallSizeEqualsTheDefinition) {
    Random random(61);
    SCOPED_TRACE(random.trace());
    const int32_t limit = rounds(10) < 10 ? 3 : 9;
    for (int32_t src_w = 1; src_w <= limit; ++src_w) {
        for (int32_t src_h = 1; src_h <= limit; ++src_h) {
            for (int32_t dst_w = 1; dst_w <= limit; ++dst_w) {
                for (int32_t dst_h = 1; dst_h <= limit && !HasFatalFailure(); ++dst_h) {
                    check_contiguous(ovrin_resize_yuv420_sg, {src_w, src_h, dst_w, dst_h}, random,
                                     Flush::kEnd);
                }
            }
        }
    }
}

// The chroma grid is rounded up to a multiple of 4 and cropped.
TEST(Yuv420, EveryRemainderOfBothSizesIsSampledOntoTheGridAndCropped) {
    Random random(62);
    SCOPED_TRACE(random.trace());
    for (int32_t dst_w = 20; dst_w < 24; ++dst_w) {
        for (int32_t dst_h = 12; dst_h < 16; ++dst_h) {
            for (const int32_t src_w : {11, 20, 40, 41, 63, 64, 200}) {
                for (const int32_t src_h : {7, 12, 24, 25, 63, 64, 100}) {
                    for (Contiguous* resize : kContiguous) {
                        check_contiguous(resize, {src_w, src_h, dst_w, dst_h}, random, Flush::kEnd);
                    }
                    for (Planes* resize : kPlanes) {
                        check_planes(resize, {src_w, src_h, dst_w, dst_h}, random, Flush::kStart);
                    }
                    if (HasFatalFailure()) return;
                }
            }
        }
    }
}

TEST(Yuv420, WideRowsCrossColumnStrips) {
    Random random(63);
    SCOPED_TRACE(random.trace());
    for (const int32_t dst_w : {1023, 2047, 2048, 2049, 4096, 4097, 5001}) {
        for (const int32_t src_w : {1, 700, 3000, 10001}) {
            check_contiguous(ovrin_resize_yuv420_sg, {src_w, 3, dst_w, 2}, random, Flush::kEnd);
        }
    }
}

TEST(Yuv420, SixteenToEightSamplesEveryPlaneInPlace) {
    Random random(64);
    SCOPED_TRACE(random.trace());
    check_contiguous(ovrin_resize_yuv420_sg, {16, 16, 8, 8}, random, Flush::kEnd);
}

TEST(Yuv420, SixteenToSixCropsThreeOfFourChromaColumnsAndRows) {
    Random random(65);
    SCOPED_TRACE(random.trace());
    check_contiguous(ovrin_resize_yuv420_sg, {16, 16, 6, 6}, random, Flush::kEnd);
    check_planes(ovrin_resize_y_u_v_sg, {16, 16, 6, 6}, random, Flush::kEnd);
}

// 12 columns to 6: six chroma columns onto a grid of four, of which three are kept. They take
// columns (0, 1), (1, 2) and (3, 4); luma takes (2j, 2j + 1).
TEST(Yuv420, TwelveToSixKeepsTheLeftOfTheChroma) {
    constexpr int32_t kSrcW = 12, kDstW = 6, kH = 4;
    std::vector<uint8_t> src;
    for (int row = 0; row < kH; ++row) {
        for (int column = 0; column < kSrcW; ++column) {
            src.push_back(static_cast<uint8_t>(4 * column));
        }
    }
    for (const int base : {10, 20}) {  // U, then V
        for (int row = 0; row < kH / 2; ++row) {
            for (int column = 0; column < kSrcW / 2; ++column) {
                src.push_back(static_cast<uint8_t>(4 * (base + column)));
            }
        }
    }
    for (Contiguous* resize : kContiguous) {
        std::vector<uint8_t> dst(bytes_of_i420(kDstW, kH), 0xEE);
        resize(src.data(), dst.data(), kSrcW, kH, kDstW, kH);
        for (size_t row = 0; row < kH; ++row) {
            for (size_t column = 0; column < kDstW; ++column) {
                EXPECT_EQ(dst[row * kDstW + column], 2 * (2 * column + 2 * column + 1));
            }
        }
        for (size_t plane = 0; plane < 2; ++plane) {
            const size_t base = 10 + 10 * plane;
            for (size_t row = 0; row < kH / 2; ++row) {
                const uint8_t* kept = dst.data() + kDstW * kH + plane * 6 + row * 3;
                EXPECT_EQ(kept[0], 2 * (base + 0 + base + 1));
                EXPECT_EQ(kept[1], 2 * (base + 1 + base + 2));
                EXPECT_EQ(kept[2], 2 * (base + 3 + base + 4));
            }
        }
    }
}

TEST(Yuv420, ConstantSourcesLoseTheirTwoLowBits) {
    for (const auto& [value, result] : {std::pair{255, 252}, {3, 0}, {4, 4}, {131, 128}}) {
        const std::vector<uint8_t> src(bytes_of_i420(19, 13), static_cast<uint8_t>(value));
        for (const int32_t side : {5, 8, 19, 30}) {
            std::vector<uint8_t> dst(bytes_of_i420(side, side), 0xEE);
            ovrin_resize_yuv420(src.data(), dst.data(), 19, 13, side, side);
            EXPECT_EQ(dst, std::vector<uint8_t>(dst.size(), static_cast<uint8_t>(result)));
        }
    }
}

TEST(Yuv420, OnePixelFillsEachPlane) {
    const uint8_t src[3] = {255, 130, 7};
    std::vector<uint8_t> dst(bytes_of_i420(9, 6), 0xEE);
    ovrin_resize_yuv420(src, dst.data(), 1, 1, 9, 6);
    std::vector<uint8_t> expected(54, 252);
    expected.insert(expected.end(), 15, 128);
    expected.insert(expected.end(), 15, 4);
    EXPECT_EQ(dst, expected);
}

TEST(Yuv420, EmptySourceFillsLumaAndChromaWithZero) {
    for (const int32_t empty : {0, -1, -2, INT32_MIN}) {
        for (const int32_t side : {8, 6, 5}) {
            const std::vector<uint8_t> zeros(bytes_of_i420(side, side), 0);
            for (Contiguous* resize : kContiguous) {
                GuardedBuffer<uint8_t> dst(zeros.size(), Flush::kEnd, 0xEE);
                resize(nullptr, dst.data(), 5, empty, side, side);
                EXPECT_TRUE(same(dst, zeros)) << "height " << empty;
            }
            for (Planes* resize : kPlanes) {
                GuardedBuffer<uint8_t> dst(zeros.size(), Flush::kEnd, 0xEE);
                resize(nullptr, nullptr, nullptr, dst.data(), 5, empty, side, side, nullptr);
                EXPECT_TRUE(same(dst, zeros)) << "height " << empty;
            }
            for (const int32_t src_h : {5, 2000}) {
                for (Contiguous* resize : kContiguous) {
                    GuardedBuffer<uint8_t> dst(zeros.size(), Flush::kEnd, 0xEE);
                    resize(nullptr, dst.data(), empty, src_h, side, side);
                    EXPECT_TRUE(same(dst, zeros)) << "width " << empty;
                }
                for (Planes* resize : kPlanes) {
                    GuardedBuffer<uint8_t> dst(zeros.size(), Flush::kEnd, 0xEE);
                    resize(nullptr, nullptr, nullptr, dst.data(), empty, src_h, side, side,
                           nullptr);
                    EXPECT_TRUE(same(dst, zeros)) << "width " << empty;
                }
            }
        }
    }
}

TEST(Yuv420, EmptyDestinationWritesNothing) {
    const std::vector<uint8_t> src(bytes_of_i420(2, 2000));
    for (const int32_t empty : {0, -1, -3, -4, INT32_MIN}) {
        for (const int32_t src_h : {2, 2000}) {
            for (const int32_t other : {1, 4, 6}) {
                uint8_t byte = 0xEE;
                for (Contiguous* resize : kContiguous) {
                    resize(src.data(), &byte, 2, src_h, empty, other);
                    resize(src.data(), &byte, 2, src_h, other, empty);
                    resize(src.data(), &byte, 2, src_h, empty, empty);
                }
                for (Planes* resize : kPlanes) {
                    resize(src.data(), src.data(), src.data(), &byte, 2, src_h, empty, other,
                           nullptr);
                    resize(src.data(), src.data(), src.data(), &byte, 2, src_h, other, empty,
                           nullptr);
                }
                EXPECT_EQ(byte, 0xEE) << empty;
            }
        }
    }
}

TEST(Yuv420, ThreePlanesGiveTheContiguousPicture) {
    Random random(66);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(100); ++i) {
        const Sizes s = {random.awkward_size(), random.pick({33, 1023, 1024, 1100}),
                         random.awkward_size(), random.awkward_size()};
        SCOPED_TRACE(describe(s));
        const auto src = random.bytes(bytes_of_i420(s.src_w, s.src_h));
        const auto planes = reference::i420_source(src.data(), s.src_w, s.src_h);
        std::vector<uint8_t> whole(bytes_of_i420(s.dst_w, s.dst_h), 1);
        std::vector<uint8_t> separate(whole.size(), 2);
        ovrin_resize_yuv420(src.data(), whole.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        ovrin_resize_y_u_v(planes.y, planes.u, planes.v, separate.data(), s.src_w, s.src_h, s.dst_w,
                           s.dst_h);
        ASSERT_EQ(whole, separate);
        for (Planes* resize : kPlanes) {
            std::vector<uint8_t> direct(whole.size(), 3);
            resize(planes.y, planes.u, planes.v, direct.data(), s.src_w, s.src_h, s.dst_w, s.dst_h,
                   nullptr);
            ASSERT_EQ(direct, whole);
        }
    }
}

TEST(Yuv420, WrappersGiveTheSamePictureOnEitherSideOfTheThreshold) {
    Random random(67);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {1, 1023, 1024, 1025}) {
        for (const int32_t dst_h : {1, 300, 512, 1023, 1500}) {
            check_contiguous(ovrin_resize_yuv420, {7, src_h, 3, dst_h}, random, Flush::kEnd);
            check_contiguous(ovrin_resize_yuv420, {8, src_h, 4, dst_h}, random, Flush::kEnd);
        }
    }
}

// Products of rows pass 31 bits here; positions must not.
TEST(Yuv420, TallPicturesNeedMoreThan31Bits) {
    Random random(68);
    SCOPED_TRACE(random.trace());
    for (Contiguous* resize : {ovrin_resize_yuv420_sg, ovrin_resize_yuv420_tps}) {
        check_contiguous(resize, {1, 60000, 1, 59999}, random, Flush::kEnd);
        check_contiguous(resize, {2, 60000, 4, 40000}, random, Flush::kEnd);
        check_contiguous(resize, {1, 40000, 1, 70000}, random, Flush::kEnd);
        check_contiguous(resize, {60000, 1, 59999, 1}, random, Flush::kEnd);
    }
    for (Planes* resize : kPlanes) {
        check_planes(resize, {2, 60000, 4, 40000}, random, Flush::kEnd);
        check_planes(resize, {1, 60000, 1, 59999}, random, Flush::kEnd);
    }
}

// ---- Letterboxes ----

TEST(YuvKeepRatio, RandomPlacementsEqualTheDefinition) {
    Random random(70);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(3000) && !HasFatalFailure(); ++i) {
        const int32_t src_w = random.awkward_size();
        const int32_t src_h = random.awkward_size();
        ovrin_resize_target target = random_letterbox(random);
        target.src_stride = random_stride(random, src_w);
        check_letterbox(i % 4 == 0 ? kThreaded : kSingle, target, src_w, src_h, random,
                        random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST(YuvKeepRatio, EveryPlacementOnASmallCanvas) {
    Random random(71);
    SCOPED_TRACE(random.trace());
    const int32_t limit = rounds(10) < 10 ? 3 : 5;
    for (const int32_t side : {3, 4}) {
        for (int32_t w = 1; w <= limit; ++w) {
            for (int32_t h = 1; h <= limit; ++h) {
                for (int32_t x = 0; x <= limit; ++x) {
                    for (int32_t y = 0; y <= limit && !HasFatalFailure(); ++y) {
                        ovrin_resize_target target = letterbox(side, side, w, h, x, y);
                        target.src_stride = 9;
                        check_letterbox(kSingle, target, 9, 6, random);
                    }
                }
            }
        }
    }
}

TEST(YuvKeepRatio, TheTargetIsNeverWrittenAndItsSourceSizeNeverRead) {
    Random random(72);
    SCOPED_TRACE(random.trace());
    for (const Way& way : kBoth) {
        for (const int32_t src_h : {20, 1100}) {
            for (const int32_t garbage : {INT32_MIN, -1, 0, INT32_MAX}) {
                // Cut at both edges, which would rewrite the record of an RGBA picture.
                ovrin_resize_target target = letterbox(40, 30, 50, 40, 10, 6);
                target.src_stride = 17;
                target.src_width = garbage;
                target.src_height = garbage;
                target.src_buffer_height = garbage;
                target.format = garbage;
                check_letterbox(way, target, 17, src_h, random);
            }
        }
    }
}

TEST(YuvKeepRatio, TheCanvasAroundThePictureIsBlack) {
    const auto canvas = white_on_canvas(letterbox(12, 10, 4, 4, 4, 2));
    for (size_t i = 0; i < canvas.size(); ++i) {
        bool inside;
        if (i < 120) {
            inside = i % 12 >= 4 && i % 12 < 8 && i / 12 >= 2 && i / 12 < 6;
        } else {
            const size_t at = (i - 120) % 30;  // planes of 6 x 5
            inside = at % 6 >= 2 && at % 6 < 4 && at / 6 >= 1 && at / 6 < 3;
        }
        EXPECT_EQ(canvas[i], inside ? 252 : i < 120 ? 0 : 128) << i;
    }
}

// The part beyond the canvas is dropped, the rest is what it would be on a larger canvas.
TEST(YuvKeepRatio, PicturesThatDoNotFitAreCroppedNotRescaled) {
    Random random(73);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {50, 1100}) {
        const PlanarPicture src(random, 60, src_h, 60);
        std::vector<uint8_t> large(bytes_of_i420(64, 64)), small(bytes_of_i420(32, 32));
        ovrin_resize_target target = letterbox(64, 64, 40, 44, 8, 12);
        target.src_stride = 60;
        target.dst = large.data();
        ovrin_resize_y_u_v_keep_ratio(src.view.y, src.view.u, src.view.v, 60, src_h, &target);
        target.canvas_width = target.canvas_height = 32;
        target.dst = small.data();
        ovrin_resize_y_u_v_keep_ratio(src.view.y, src.view.u, src.view.v, 60, src_h, &target);
        for (size_t row = 0; row < 32; ++row) {
            ASSERT_TRUE(same_bytes(&small[row * 32], &large[row * 64], 32)) << "row " << row;
        }
        for (size_t plane = 0; plane < 2; ++plane) {
            for (size_t row = 0; row < 16; ++row) {
                ASSERT_TRUE(same_bytes(&small[1024 + plane * 256 + row * 16],
                                       &large[4096 + plane * 1024 + row * 32], 16));
            }
        }
    }
}

TEST(YuvKeepRatio, OddPositionsRoundChromaUp) {
    // Luma at column 3, row 1; chroma at column 2, row 1 of planes of 6 x 5.
    const auto canvas = white_on_canvas(letterbox(12, 10, 4, 4, 3, 1));
    for (size_t i = 0; i < canvas.size(); ++i) {
        bool inside;
        if (i < 120) {
            inside = i % 12 >= 3 && i % 12 < 7 && i / 12 >= 1 && i / 12 < 5;
        } else {
            const size_t at = (i - 120) % 30;
            inside = at % 6 >= 2 && at % 6 < 4 && at / 6 >= 1 && at / 6 < 3;
        }
        EXPECT_EQ(canvas[i], inside ? 252 : i < 120 ? 0 : 128) << i;
    }
}

// A chroma block rounded up runs over the right edge of its plane into the next row, and over the
// bottom edge of U into V; only what would fall past the canvas is dropped.
TEST(YuvKeepRatio, ChromaRunningOverItsPlaneStaysInTheCanvas) {
    // Canvas 4 x 4, picture 3 x 3 at (1, 1): 2 x 2 chroma from column 1, row 1 of 2 x 2 planes.
    GuardedBuffer<uint8_t> canvas(24, Flush::kEnd, 0xEE);
    const std::vector<uint8_t> u(16, 40), v(16, 80), y(64, 255);
    ovrin_resize_target target = letterbox(4, 4, 3, 3, 1, 1);
    target.src_stride = 8;
    target.dst = canvas.data();
    ovrin_resize_y_u_v_keep_ratio(y.data(), u.data(), v.data(), 8, 8, &target);
    // U goes to bytes 3, 4 and 5, 6 from the start of U, that is to U's last and V's first three;
    // V to bytes 3 and past the canvas.
    const std::vector<uint8_t> expected = {0,   0,   0,   0,    //
                                           0,   252, 252, 252,  //
                                           0,   252, 252, 252,  //
                                           0,   252, 252, 252,  //
                                           128, 128, 128, 40,   //
                                           40,  40,  40,  80};
    EXPECT_TRUE(same(canvas, expected));
}

TEST(YuvKeepRatio, EveryOddPlacementStaysInTheCanvas) {
    Random random(74);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(600) && !HasFatalFailure(); ++i) {
        const int32_t canvas_w = random.between(1, 12);
        const int32_t canvas_h = random.between(1, 12);
        ovrin_resize_target target =
            letterbox(canvas_w, canvas_h, random.between(1, 14), random.between(1, 14),
                      random.between(0, canvas_w) | 1, random.between(0, canvas_h) | 1);
        target.src_stride = 10;
        const int32_t src_h = i % 8 == 0 ? 1030 : 11;
        check_letterbox(src_h > 1023 ? kThreaded : kSingle, target, 10, src_h, random,
                        random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST(YuvKeepRatio, RejectedPlacementsTouchNothing) {
    const std::vector<uint8_t> src(4 * 2000, 255);
    const ovrin_resize_target rejected[] = {
        letterbox(8, 8, 4, 4, 9, 0),  // left edge beyond the canvas
        letterbox(8, 8, 4, 0, 0, 0),  // no height
        letterbox(8, 8, 4, 0, 4, 4),
        letterbox(8, 8, 4, 4, 9, 9),
    };
    for (const Way& way : kBoth) {
        for (const int32_t src_h : {4, 2000}) {
            for (ovrin_resize_target target : rejected) {
                std::vector<uint8_t> canvas(canvas_bytes(target), 0xEE);
                target.src_stride = 4;
                target.dst = canvas.data();
                SCOPED_TRACE(describe(target, 4, src_h));
                way.resize(src.data(), src.data(), src.data(), nullptr, 4, src_h, 0, 0, &target);
                EXPECT_EQ(canvas, std::vector<uint8_t>(canvas.size(), 0xEE));
            }
        }
    }
}

// The single-threaded function compares the canvas height with dst_y, the threaded one with dst_x.
TEST(YuvKeepRatio, TheSecondRejectionTestDependsOnTheWay) {
    const std::vector<uint8_t> src(4 * 2000, 255);
    const auto run = [&](Planes* resize, int32_t src_h, ovrin_resize_target target) {
        std::vector<uint8_t> canvas(canvas_bytes(target), 0xEE);
        target.src_stride = 4;
        target.dst = canvas.data();
        resize(src.data(), src.data(), src.data(), nullptr, 4, src_h, 0, 0, &target);
        return canvas;
    };
    const auto below = letterbox(8, 8, 4, 4, 2, 9);
    const auto right = letterbox(16, 8, 4, 4, 9, 2);
    const std::vector<uint8_t> untouched(96, 0xEE), untouched_wide(192, 0xEE);
    std::vector<uint8_t> black(64, 0);
    black.resize(96, 128);

    EXPECT_EQ(run(ovrin_resize_y_u_v_sg, 2000, below), untouched);
    EXPECT_EQ(run(ovrin_resize_y_u_v_tps, 2000, below), black);  // no row of it is visible
    EXPECT_NE(run(ovrin_resize_y_u_v_sg, 2000, right), untouched_wide);
    EXPECT_EQ(run(ovrin_resize_y_u_v_tps, 2000, right), untouched_wide);

    // Too low a source, or a single band: both tests must pass.
    EXPECT_EQ(run(ovrin_resize_y_u_v_tps, 1023, below), untouched);
    EXPECT_EQ(run(ovrin_resize_y_u_v_tps, 1023, right), untouched_wide);
    auto one_row = below;
    one_row.dst_height = 1;  // bands of 2000 rows
    EXPECT_EQ(run(ovrin_resize_y_u_v_tps, 2000, one_row), untouched);
    EXPECT_EQ(run(ovrin_resize_y_u_v_tps, 2000, letterbox(8, 8, 4, 1, 2, 7)),
              run(ovrin_resize_y_u_v_sg, 2000, letterbox(8, 8, 4, 1, 2, 7)));
}

TEST(YuvKeepRatio, TheWrapperTurnsToBandsAt1024Rows) {
    const std::vector<uint8_t> src(4 * 2000, 255);
    ovrin_resize_target target = letterbox(8, 8, 4, 4, 2, 9);  // only bands accept it
    target.src_stride = 4;
    for (const int32_t src_h : {-5, 0, 1, 1023, 1024, 1025}) {
        std::vector<uint8_t> canvas(96, 0xEE);
        target.dst = canvas.data();
        ovrin_resize_y_u_v_keep_ratio(src.data(), src.data(), src.data(), 4, src_h, &target);
        EXPECT_EQ(canvas[0], src_h < 1024 ? 0xEE : 0) << src_h;
    }
}

TEST(YuvKeepRatio, PicturesAtTheFarEdgesLeaveABlackCanvas) {
    std::vector<uint8_t> black(64, 0);
    black.resize(96, 128);
    EXPECT_EQ(white_on_canvas(letterbox(8, 8, 4, 4, 8, 0)), black);
    EXPECT_EQ(white_on_canvas(letterbox(8, 8, 4, 4, 0, 8)), black);
    EXPECT_EQ(white_on_canvas(letterbox(8, 8, 4, 4, 8, 8)), black);
    EXPECT_EQ(white_on_canvas(letterbox(8, 8, 0, 4, 2, 2)), black);  // no width
}

TEST(YuvKeepRatio, EmptySourceGivesZerosInsideTheBlackBorder) {
    for (const Way& way : kBoth) {
        for (const int32_t empty : {0, -1, -2000}) {
            for (const int32_t other : {4, 2000}) {
                for (const bool by_height : {true, false}) {
                    GuardedBuffer<uint8_t> canvas(bytes_of_i420(12, 10), Flush::kEnd, 0xEE);
                    ovrin_resize_target target = letterbox(12, 10, 4, 4, 4, 2);
                    target.src_stride = 4;
                    target.dst = canvas.data();
                    const int32_t src_w = by_height ? other : empty;
                    const int32_t src_h = by_height ? empty : other;
                    way.resize(nullptr, nullptr, nullptr, nullptr, src_w, src_h, 0, 0, &target);
                    for (size_t i = 0; i < canvas.size(); ++i) {
                        const size_t at = (i - 120) % 30;
                        const bool chroma_inside =
                            at % 6 >= 2 && at % 6 < 4 && at / 6 >= 1 && at / 6 < 3;
                        ASSERT_EQ(canvas[i], i < 120 || chroma_inside ? 0 : 128) << i;
                    }
                }
            }
        }
    }
}

TEST(YuvKeepRatio, RowLengthsWiderThanThePicture) {
    Random random(75);
    SCOPED_TRACE(random.trace());
    for (const Way& way : kBoth) {
        for (const int32_t src_h : {100, 1100}) {
            for (const int32_t stride : {17, 18, 19, 64, 1001}) {
                ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
                target.src_stride = stride;
                check_letterbox(way, target, 17, src_h, random, Flush::kEnd);
                check_letterbox(way, target, 17, src_h, random, Flush::kStart);
            }
        }
    }
}

TEST(YuvKeepRatio, RowLengthsOfZeroOrLessAreTakenAsTheyStandOnTheCallingThread) {
    Random random(76);
    SCOPED_TRACE(random.trace());
    for (const int32_t stride : {0, -1, -16, -17, -18, -19, -50}) {
        ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
        target.src_stride = stride;
        check_letterbox(kSingle, target, 17, 100, random, Flush::kEnd);
        check_letterbox(kSingle, target, 17, 1100, random, Flush::kStart);
        // Without bands the threaded function hands the target on.
        check_letterbox(kThreaded, target, 17, 1023, random, Flush::kEnd);
        target.dst_height = 1;
        check_letterbox(kThreaded, target, 17, 1100, random, Flush::kEnd);
    }
}

TEST(YuvKeepRatio, RowLengthsOfZeroOrLessAreTheWidthInBands) {
    Random random(77);
    SCOPED_TRACE(random.trace());
    for (const int32_t stride : {0, -1, -17, INT32_MIN}) {
        const PlanarPicture src(random, 17, 1100, 17);
        ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
        GuardedBuffer<uint8_t> canvas(canvas_bytes(target), Flush::kEnd, 0xEE);
        target.src_stride = stride;
        target.dst = canvas.data();
        std::vector<uint8_t> expected = canvas.copy();
        reference::draw_yuv(src.view, target, expected);
        ovrin_resize_y_u_v_tps(src.view.y, src.view.u, src.view.v, nullptr, 17, 1100, 0, 0,
                               &target);
        EXPECT_TRUE(same(canvas, expected));
    }
}

// Destination pointer and sizes among the arguments are ignored when there is a target.
TEST(YuvKeepRatio, TheTargetOverridesTheDestinationArguments) {
    Random random(78);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {40, 1100}) {
        const PlanarPicture src(random, 17, src_h, 17);
        ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
        target.src_stride = 17;
        std::vector<uint8_t> through_wrapper(canvas_bytes(target)), direct(canvas_bytes(target), 1);
        target.dst = through_wrapper.data();
        ovrin_resize_y_u_v_keep_ratio(src.view.y, src.view.u, src.view.v, 17, src_h, &target);
        target.dst = direct.data();
        for (Planes* resize : kPlanes) {
            uint8_t other = 0xEE;
            resize(src.view.y, src.view.u, src.view.v, &other, 17, src_h, 1000, 1000, &target);
            EXPECT_EQ(other, 0xEE);
            EXPECT_EQ(direct, through_wrapper);
        }
    }
}
