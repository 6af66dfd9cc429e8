// SPDX-License-Identifier: Apache-2.0
// Semi-planar YUV 4:2:0 (NV21): contiguous, in two planes, and letterboxed.
#include "reference/nv21.h"

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/letterbox.h"
#include "support/pictures.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

using Contiguous = decltype(ovrin_resize_nv21);
using Planes = decltype(ovrin_resize_y_nv_sg);
using Model = decltype(reference::keep_ratio_nv21_sg);

constexpr Contiguous* kContiguous[] = {ovrin_resize_nv21, ovrin_resize_nv21_sg,
                                       ovrin_resize_nv21_tps};
constexpr Planes* kPlanes[] = {ovrin_resize_y_nv_sg, ovrin_resize_y_nv_tps};

struct Way {
    Planes* resize;
    Model* model;
};
constexpr Way kSingle = {ovrin_resize_y_nv_sg, reference::keep_ratio_nv21_sg};
constexpr Way kThreaded = {ovrin_resize_y_nv_tps, reference::keep_ratio_nv21_tps};
constexpr Way kBoth[] = {kSingle, kThreaded};

::testing::AssertionResult same(const GuardedBuffer<uint8_t>& actual,
                                const std::vector<uint8_t>& expected) {
    if (!actual.intact()) return ::testing::AssertionFailure() << "written before the buffer";
    return same_bytes(actual.data(), expected.data(), expected.size());
}

void check_contiguous(Contiguous* resize, const Sizes& s, Random& random, Flush flush) {
    SCOPED_TRACE(describe(s, flush));
    const GuardedBuffer<uint8_t> src(random.bytes(bytes_of_nv21(s.src_w, s.src_h)), flush);
    GuardedBuffer<uint8_t> dst(bytes_of_nv21(s.dst_w, s.dst_h), flush, 0xEE);
    resize(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    const auto expected = reference::resize_nv21(
        reference::nv21_source(src.data(), s.src_w, s.src_h), s.dst_w, s.dst_h);
    ASSERT_TRUE(same(dst, expected));
}

void check_planes(Planes* resize, const Sizes& s, Random& random, Flush flush) {
    SCOPED_TRACE(describe(s, flush));
    const SemiPlanarPicture src(random, s.src_w, s.src_h, s.src_w, flush);
    GuardedBuffer<uint8_t> dst(bytes_of_nv21(s.dst_w, s.dst_h), flush, 0xEE);
    resize(src.view.y, src.view.vu, dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, nullptr);
    ASSERT_TRUE(same(dst, reference::resize_nv21(src.view, s.dst_w, s.dst_h)));
}

size_t canvas_bytes(const ovrin_resize_target& target) {
    return bytes_of_nv21(target.canvas_width, target.canvas_height);
}

// Letterboxes random content; compares the canvas with the definition and the target with itself.
void check_letterbox(const Way& way, ovrin_resize_target target, int32_t src_w, int32_t src_h,
                     Random& random, Flush flush = Flush::kEnd) {
    SCOPED_TRACE(describe(target, src_w, src_h));
    const SemiPlanarPicture src(random, src_w, src_h, target.src_stride, flush);
    GuardedBuffer<uint8_t> canvas(canvas_bytes(target), flush, 0xEE);
    target.dst = canvas.data();
    std::vector<uint8_t> expected = canvas.copy();
    way.model(src.view, target, expected);

    const ovrin_resize_target before = target;
    way.resize(src.view.y, src.view.vu, nullptr, src_w, src_h, 0, 0, &target);
    ASSERT_TRUE(same_target(target, before));
    ASSERT_TRUE(same(canvas, expected));
}

// Letterboxes a white picture of `size` x `size`, giving the canvas.
std::vector<uint8_t> white_on_canvas(ovrin_resize_target target, int32_t size = 8) {
    const std::vector<uint8_t> white(static_cast<size_t>(size) * static_cast<size_t>(size), 255);
    std::vector<uint8_t> canvas(canvas_bytes(target), 0xEE);
    target.src_stride = size;
    target.dst = canvas.data();
    ovrin_resize_y_nv21_keep_ratio(white.data(), white.data(), size, size, &target);
    return canvas;
}

}  // namespace

// ---- Whole destinations ----

TEST(Nv21, RandomSizesEqualTheDefinition) {
    Random random(80);
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

TEST(Nv21, EverySmallSizeEqualsTheDefinition) {
    Random random(81);
    SCOPED_TRACE(random.trace());
    const int32_t limit = rounds(10) < 10 ? 3 : 9;
    for (int32_t src_w = 1; src_w <= limit; ++src_w) {
        for (int32_t src_h = 1; src_h <= limit; ++src_h) {
            for (int32_t dst_w = 1; dst_w <= limit; ++dst_w) {
                for (int32_t dst_h = 1; dst_h <= limit && !HasFatalFailure(); ++dst_h) {
                    check_contiguous(ovrin_resize_nv21_sg, {src_w, src_h, dst_w, dst_h}, random,
                                     Flush::kEnd);
                }
            }
        }
    }
}

// The chroma grid is rounded up to a multiple of 4 and cropped.
TEST(Nv21, EveryRemainderOfBothSizesIsSampledOntoTheGridAndCropped) {
    Random random(82);
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

TEST(Nv21, WideRowsCrossColumnStrips) {
    Random random(83);
    SCOPED_TRACE(random.trace());
    for (const int32_t dst_w : {1023, 2047, 2048, 2049, 4096, 4097, 5001}) {
        for (const int32_t src_w : {1, 700, 3000, 10001}) {
            check_contiguous(ovrin_resize_nv21_sg, {src_w, 3, dst_w, 2}, random, Flush::kEnd);
        }
    }
}

TEST(Nv21, FourToTwoTakesEachPixelOnce) {
    std::vector<uint8_t> src(24, 0);
    for (size_t i = 0; i < 16; ++i) src[i] = static_cast<uint8_t>(4 * i);
    std::vector<uint8_t> dst(6, 0xEE);
    ovrin_resize_nv21_sg(src.data(), dst.data(), 4, 4, 2, 2);
    EXPECT_EQ(dst[0], 0 + 1 + 4 + 5);
    EXPECT_EQ(dst[1], 2 + 3 + 6 + 7);
    EXPECT_EQ(dst[2], 8 + 9 + 12 + 13);
    EXPECT_EQ(dst[3], 10 + 11 + 14 + 15);
}

TEST(Nv21, EqualSizesDropTheTwoLowBits) {
    Random random(84);
    SCOPED_TRACE(random.trace());
    const auto src = random.bytes(bytes_of_nv21(20, 12));
    std::vector<uint8_t> dst(src.size(), 0xEE);
    ovrin_resize_nv21(src.data(), dst.data(), 20, 12, 20, 12);
    for (size_t i = 0; i < src.size(); ++i) EXPECT_EQ(dst[i], src[i] & ~3) << i;
}

TEST(Nv21, WhiteGives252) {
    const std::vector<uint8_t> src(bytes_of_nv21(19, 13), 255);
    for (const int32_t side : {5, 8, 19, 30}) {
        std::vector<uint8_t> dst(bytes_of_nv21(side, side), 0xEE);
        ovrin_resize_nv21(src.data(), dst.data(), 19, 13, side, side);
        EXPECT_EQ(dst, std::vector<uint8_t>(dst.size(), 252));
    }
}

// 12 x 8 to 6 x 4: six pairs onto a grid of four, of which three are kept. They take pairs (0, 1),
// (1, 2) and (3, 4).
TEST(Nv21, TwelveToSixKeepsTheLeftOfTheChroma) {
    std::vector<uint8_t> src(96, 0);
    for (int row = 0; row < 4; ++row) {
        for (int pair = 0; pair < 6; ++pair) {
            src.push_back(static_cast<uint8_t>(4 * (10 + pair)));
            src.push_back(static_cast<uint8_t>(4 * (20 + pair)));
        }
    }
    for (Contiguous* resize : kContiguous) {
        std::vector<uint8_t> dst(bytes_of_nv21(6, 4), 0xEE);
        resize(src.data(), dst.data(), 12, 8, 6, 4);
        for (size_t row = 0; row < 2; ++row) {
            const uint8_t* kept = dst.data() + 24 + row * 6;
            for (size_t b = 0; b < 2; ++b) {
                const size_t base = 10 + 10 * b;
                EXPECT_EQ(kept[0 + b], 2 * (base + 0 + base + 1));
                EXPECT_EQ(kept[2 + b], 2 * (base + 1 + base + 2));
                EXPECT_EQ(kept[4 + b], 2 * (base + 3 + base + 4));
            }
        }
    }
}

// Points are quarters of the byte lengths and count pairs. Both lengths are even, so that a point
// rounded to a byte, not to a pair, never reaches another pair: quarters of the numbers of pairs
// would give the same samples, which this holds against the definition over all small widths.
TEST(Nv21, ChromaPointsComeFromByteLengths) {
    Random random(85);
    SCOPED_TRACE(random.trace());
    for (int32_t src_w = 1; src_w <= 40; ++src_w) {
        for (int32_t dst_w = 4; dst_w <= 40; dst_w += 4) {
            const auto src = random.bytes(bytes_of_nv21(src_w, 4));
            const uint8_t* vu = src.data() + src_w * 4;
            const int64_t row = reference::even_length(src_w);
            const auto by_bytes = reference::quarter_pairs(vu, row, row, 2, dst_w, 2);
            ASSERT_EQ(by_bytes, reference::quarter_packed(vu, row / 2, 2, dst_w / 2, 2, 2));
            std::vector<uint8_t> dst(bytes_of_nv21(dst_w, 4), 0xEE);
            ovrin_resize_nv21_sg(src.data(), dst.data(), src_w, 4, dst_w, 4);
            ASSERT_TRUE(same_bytes(dst.data() + dst_w * 4, by_bytes.data(), by_bytes.size()))
                << src_w << " to " << dst_w;
        }
    }
}

TEST(Nv21, TheTwoBytesOfAPairAreIndependent) {
    Random random(86);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(50); ++i) {
        const Sizes s = {random.awkward_size(), random.awkward_size(), random.awkward_size(),
                         random.awkward_size()};
        SCOPED_TRACE(describe(s));
        const size_t src_luma = static_cast<size_t>(s.src_w) * static_cast<size_t>(s.src_h);
        const size_t dst_luma = static_cast<size_t>(s.dst_w) * static_cast<size_t>(s.dst_h);
        auto src = random.bytes(bytes_of_nv21(s.src_w, s.src_h));
        std::vector<uint8_t> dst(bytes_of_nv21(s.dst_w, s.dst_h)), swapped(dst.size());
        ovrin_resize_nv21(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        for (size_t at = src_luma; at < src.size(); at += 2) std::swap(src[at], src[at + 1]);
        ovrin_resize_nv21(src.data(), swapped.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        for (size_t at = dst_luma; at < dst.size(); at += 2) std::swap(dst[at], dst[at + 1]);
        ASSERT_EQ(dst, swapped);
        for (size_t at = src_luma; at < src.size(); at += 2) src[at] = 255;
        ovrin_resize_nv21(src.data(), swapped.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        for (size_t at = dst_luma; at < dst.size(); at += 2) {
            ASSERT_EQ(swapped[at], 252);
            ASSERT_EQ(swapped[at + 1], dst[at + 1]);
        }
    }
}

TEST(Nv21, OddSourcesHaveTheLargerHalfOfChroma) {
    Random random(87);
    SCOPED_TRACE(random.trace());
    EXPECT_EQ(bytes_of_nv21(5, 3), 15U + 2 * 6);
    for (const auto& [w, h] : {std::pair{5, 3}, {1, 1}, {3, 1}, {1, 3}, {17, 9}, {63, 31}}) {
        for (const int32_t side : {1, 2, 3, 4, 5, 8, 9, 32}) {
            for (Contiguous* resize : kContiguous) {
                check_contiguous(resize, {w, h, side, side}, random, Flush::kEnd);
            }
            check_planes(ovrin_resize_y_nv_sg, {w, h, side, side}, random, Flush::kStart);
        }
    }
}

TEST(Nv21, EmptySourceFillsLumaAndChromaWithZero) {
    for (const int32_t empty : {0, -1, -2, INT32_MIN}) {
        for (const int32_t side : {8, 6, 5}) {
            const std::vector<uint8_t> zeros(bytes_of_nv21(side, side), 0);
            for (Contiguous* resize : kContiguous) {
                GuardedBuffer<uint8_t> dst(zeros.size(), Flush::kEnd, 0xEE);
                resize(nullptr, dst.data(), 5, empty, side, side);
                EXPECT_TRUE(same(dst, zeros)) << "height " << empty;
            }
            for (Planes* resize : kPlanes) {
                GuardedBuffer<uint8_t> dst(zeros.size(), Flush::kEnd, 0xEE);
                resize(nullptr, nullptr, dst.data(), 5, empty, side, side, nullptr);
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
                    resize(nullptr, nullptr, dst.data(), empty, src_h, side, side, nullptr);
                    EXPECT_TRUE(same(dst, zeros)) << "width " << empty;
                }
            }
        }
    }
}

TEST(Nv21, EmptyDestinationWritesNothing) {
    const std::vector<uint8_t> src(bytes_of_nv21(2, 2000));
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
                    resize(src.data(), src.data(), &byte, 2, src_h, empty, other, nullptr);
                    resize(src.data(), src.data(), &byte, 2, src_h, other, empty, nullptr);
                }
                EXPECT_EQ(byte, 0xEE) << empty;
            }
        }
    }
}

TEST(Nv21, TwoPlanesGiveTheContiguousPicture) {
    Random random(88);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(100); ++i) {
        const Sizes s = {random.awkward_size(), random.pick({33, 1023, 1024, 1100}),
                         random.awkward_size(), random.awkward_size()};
        SCOPED_TRACE(describe(s));
        const auto src = random.bytes(bytes_of_nv21(s.src_w, s.src_h));
        const auto planes = reference::nv21_source(src.data(), s.src_w, s.src_h);
        std::vector<uint8_t> whole(bytes_of_nv21(s.dst_w, s.dst_h), 1);
        std::vector<uint8_t> separate(whole.size(), 2);
        ovrin_resize_nv21(src.data(), whole.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        ovrin_resize_y_nv21(planes.y, planes.vu, separate.data(), s.src_w, s.src_h, s.dst_w,
                            s.dst_h);
        ASSERT_EQ(whole, separate);
        for (Planes* resize : kPlanes) {
            std::vector<uint8_t> direct(whole.size(), 3);
            resize(planes.y, planes.vu, direct.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, nullptr);
            ASSERT_EQ(direct, whole);
        }
    }
}

TEST(Nv21, WrappersGiveTheSamePictureOnEitherSideOfTheThreshold) {
    Random random(89);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {1, 1023, 1024, 1025}) {
        for (const int32_t dst_h : {1, 300, 512, 1023, 1500}) {
            check_contiguous(ovrin_resize_nv21, {7, src_h, 3, dst_h}, random, Flush::kEnd);
            check_contiguous(ovrin_resize_nv21, {8, src_h, 4, dst_h}, random, Flush::kEnd);
        }
    }
}

// Products of rows pass 31 bits here; positions must not.
TEST(Nv21, TallPicturesNeedMoreThan31Bits) {
    Random random(90);
    SCOPED_TRACE(random.trace());
    for (Contiguous* resize : {ovrin_resize_nv21_sg, ovrin_resize_nv21_tps}) {
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

TEST(Nv21KeepRatio, RandomPlacementsEqualTheDefinition) {
    Random random(91);
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

TEST(Nv21KeepRatio, EveryPlacementOnASmallCanvas) {
    Random random(92);
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

TEST(Nv21KeepRatio, TheTargetIsNeverWrittenAndItsSourceSizeNeverRead) {
    Random random(93);
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

TEST(Nv21KeepRatio, TheCanvasAroundThePictureIsBlack) {
    const auto canvas = white_on_canvas(letterbox(12, 10, 4, 4, 4, 2));
    for (size_t i = 0; i < canvas.size(); ++i) {
        // Chroma rows of 12 bytes; the picture's two pairs are bytes 4 to 7 of rows 1 and 2.
        const size_t row = i < 120 ? i / 12 : (i - 120) / 12;
        const size_t column = i % 12;
        const bool inside =
            column >= 4 && column < 8 && (i < 120 ? row >= 2 && row < 6 : row >= 1 && row < 3);
        EXPECT_EQ(canvas[i], inside ? 252 : i < 120 ? 0 : 128) << i;
    }
}

// The part beyond the canvas is dropped, the rest is what it would be on a larger canvas.
TEST(Nv21KeepRatio, PicturesThatDoNotFitAreCroppedNotRescaled) {
    Random random(94);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {50, 1100}) {
        const SemiPlanarPicture src(random, 60, src_h, 60);
        std::vector<uint8_t> large(bytes_of_nv21(64, 64)), small(bytes_of_nv21(32, 32));
        ovrin_resize_target target = letterbox(64, 64, 40, 44, 8, 12);
        target.src_stride = 60;
        target.dst = large.data();
        ovrin_resize_y_nv21_keep_ratio(src.view.y, src.view.vu, 60, src_h, &target);
        target.canvas_width = target.canvas_height = 32;
        target.dst = small.data();
        ovrin_resize_y_nv21_keep_ratio(src.view.y, src.view.vu, 60, src_h, &target);
        for (size_t row = 0; row < 32; ++row) {
            ASSERT_TRUE(same_bytes(&small[row * 32], &large[row * 64], 32)) << "row " << row;
        }
        for (size_t row = 0; row < 16; ++row) {
            ASSERT_TRUE(same_bytes(&small[1024 + row * 32], &large[4096 + row * 64], 32));
        }
    }
}

// Luma at column 1, row 1; chroma at pair 1 of chroma row 1.
TEST(Nv21KeepRatio, OddPositionsRoundChromaUp) {
    const auto canvas = white_on_canvas(letterbox(12, 10, 4, 4, 1, 1));
    for (size_t i = 0; i < canvas.size(); ++i) {
        const size_t row = i < 120 ? i / 12 : (i - 120) / 12;
        const size_t column = i % 12;
        const bool inside = i < 120 ? column >= 1 && column < 5 && row >= 1 && row < 5
                                    : column >= 2 && column < 6 && row >= 1 && row < 3;
        EXPECT_EQ(canvas[i], inside ? 252 : i < 120 ? 0 : 128) << i;
    }
}

// A chroma block rounded up runs over the right edge of its plane into the next row; only what
// would fall past the canvas is dropped.
TEST(Nv21KeepRatio, ChromaRunningOverItsPlaneStaysInTheCanvas) {
    // Canvas 4 x 6, picture 3 x 5 at (1, 1): 2 pairs in 3 rows from pair 1 of row 1 of 3 rows.
    GuardedBuffer<uint8_t> canvas(36, Flush::kEnd, 0xEE);
    std::vector<uint8_t> vu;
    for (int i = 0; i < 16; ++i) vu.insert(vu.end(), {40, 80});
    const std::vector<uint8_t> y(64, 255);
    ovrin_resize_target target = letterbox(4, 6, 3, 5, 1, 1);
    target.src_stride = 8;
    target.dst = canvas.data();
    ovrin_resize_y_nv21_keep_ratio(y.data(), vu.data(), 8, 8, &target);
    const std::vector<uint8_t> expected = {0,   0,   0,   0,    //
                                           0,   252, 252, 252,  //
                                           0,   252, 252, 252,  //
                                           0,   252, 252, 252,  //
                                           0,   252, 252, 252,  //
                                           0,   252, 252, 252,  //
                                           128, 128, 128, 128,  //
                                           128, 128, 40,  80,   //
                                           40,  80,  40,  80};
    EXPECT_TRUE(same(canvas, expected));
}

TEST(Nv21KeepRatio, EveryOddPlacementStaysInTheCanvas) {
    Random random(95);
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

TEST(Nv21KeepRatio, RejectedPlacementsTouchNothing) {
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
                way.resize(src.data(), src.data(), nullptr, 4, src_h, 0, 0, &target);
                EXPECT_EQ(canvas, std::vector<uint8_t>(canvas.size(), 0xEE));
            }
        }
    }
}

// The single-threaded function compares the canvas height with dst_y, the threaded one with dst_x.
TEST(Nv21KeepRatio, TheSecondRejectionTestDependsOnTheWay) {
    const std::vector<uint8_t> src(4 * 2000, 255);
    const auto run = [&](Planes* resize, int32_t src_h, ovrin_resize_target target) {
        std::vector<uint8_t> canvas(canvas_bytes(target), 0xEE);
        target.src_stride = 4;
        target.dst = canvas.data();
        resize(src.data(), src.data(), nullptr, 4, src_h, 0, 0, &target);
        return canvas;
    };
    const auto below = letterbox(8, 8, 4, 4, 2, 9);
    const auto right = letterbox(16, 8, 4, 4, 9, 2);
    const std::vector<uint8_t> untouched(96, 0xEE), untouched_wide(192, 0xEE);
    std::vector<uint8_t> black(64, 0);
    black.resize(96, 128);

    EXPECT_EQ(run(ovrin_resize_y_nv_sg, 2000, below), untouched);
    EXPECT_EQ(run(ovrin_resize_y_nv_tps, 2000, below), black);  // no row of it is visible
    EXPECT_NE(run(ovrin_resize_y_nv_sg, 2000, right), untouched_wide);
    EXPECT_EQ(run(ovrin_resize_y_nv_tps, 2000, right), untouched_wide);

    // Too low a source, or a single band: both tests must pass.
    EXPECT_EQ(run(ovrin_resize_y_nv_tps, 1023, below), untouched);
    EXPECT_EQ(run(ovrin_resize_y_nv_tps, 1023, right), untouched_wide);
    auto one_row = below;
    one_row.dst_height = 1;  // bands of 2000 rows
    EXPECT_EQ(run(ovrin_resize_y_nv_tps, 2000, one_row), untouched);
    EXPECT_EQ(run(ovrin_resize_y_nv_tps, 2000, letterbox(8, 8, 4, 1, 2, 7)),
              run(ovrin_resize_y_nv_sg, 2000, letterbox(8, 8, 4, 1, 2, 7)));
}

TEST(Nv21KeepRatio, TheWrapperTurnsToBandsAt1024Rows) {
    const std::vector<uint8_t> src(4 * 2000, 255);
    ovrin_resize_target target = letterbox(8, 8, 4, 4, 2, 9);  // only bands accept it
    target.src_stride = 4;
    for (const int32_t src_h : {-5, 0, 1, 1023, 1024, 1025}) {
        std::vector<uint8_t> canvas(96, 0xEE);
        target.dst = canvas.data();
        ovrin_resize_y_nv21_keep_ratio(src.data(), src.data(), 4, src_h, &target);
        EXPECT_EQ(canvas[0], src_h < 1024 ? 0xEE : 0) << src_h;
    }
}

TEST(Nv21KeepRatio, PicturesAtTheFarEdgesLeaveABlackCanvas) {
    std::vector<uint8_t> black(64, 0);
    black.resize(96, 128);
    EXPECT_EQ(white_on_canvas(letterbox(8, 8, 4, 4, 8, 0)), black);
    EXPECT_EQ(white_on_canvas(letterbox(8, 8, 4, 4, 0, 8)), black);
    EXPECT_EQ(white_on_canvas(letterbox(8, 8, 4, 4, 8, 8)), black);
    EXPECT_EQ(white_on_canvas(letterbox(8, 8, 0, 4, 2, 2)), black);  // no width
}

TEST(Nv21KeepRatio, EmptySourceGivesZerosInsideTheBlackBorder) {
    for (const Way& way : kBoth) {
        for (const int32_t empty : {0, -1, -2000}) {
            for (const int32_t other : {4, 2000}) {
                for (const bool by_height : {true, false}) {
                    GuardedBuffer<uint8_t> canvas(bytes_of_nv21(12, 10), Flush::kEnd, 0xEE);
                    ovrin_resize_target target = letterbox(12, 10, 4, 4, 4, 2);
                    target.src_stride = 4;
                    target.dst = canvas.data();
                    const int32_t src_w = by_height ? other : empty;
                    const int32_t src_h = by_height ? empty : other;
                    way.resize(nullptr, nullptr, nullptr, src_w, src_h, 0, 0, &target);
                    for (size_t i = 0; i < canvas.size(); ++i) {
                        const size_t row = (i - 120) / 12;
                        const bool inside = i % 12 >= 4 && i % 12 < 8 && row >= 1 && row < 3;
                        ASSERT_EQ(canvas[i], i < 120 || inside ? 0 : 128) << i;
                    }
                }
            }
        }
    }
}

TEST(Nv21KeepRatio, RowLengthsWiderThanThePicture) {
    Random random(96);
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

TEST(Nv21KeepRatio, RowLengthsOfZeroOrLessAreTakenAsTheyStandOnTheCallingThread) {
    Random random(97);
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

TEST(Nv21KeepRatio, RowLengthsOfZeroOrLessAreTheWidthInBands) {
    Random random(98);
    SCOPED_TRACE(random.trace());
    for (const int32_t stride : {0, -1, -17, INT32_MIN}) {
        const SemiPlanarPicture src(random, 17, 1100, 17);
        ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
        GuardedBuffer<uint8_t> canvas(canvas_bytes(target), Flush::kEnd, 0xEE);
        target.src_stride = stride;
        target.dst = canvas.data();
        std::vector<uint8_t> expected = canvas.copy();
        reference::draw_nv21(src.view, target, expected);
        ovrin_resize_y_nv_tps(src.view.y, src.view.vu, nullptr, 17, 1100, 0, 0, &target);
        EXPECT_TRUE(same(canvas, expected));
    }
}

// Destination pointer and sizes among the arguments are ignored when there is a target.
TEST(Nv21KeepRatio, TheTargetOverridesTheDestinationArguments) {
    Random random(99);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {40, 1100}) {
        const SemiPlanarPicture src(random, 17, src_h, 17);
        ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
        target.src_stride = 17;
        std::vector<uint8_t> through_wrapper(canvas_bytes(target)), direct(canvas_bytes(target), 1);
        target.dst = through_wrapper.data();
        ovrin_resize_y_nv21_keep_ratio(src.view.y, src.view.vu, 17, src_h, &target);
        target.dst = direct.data();
        for (Planes* resize : kPlanes) {
            uint8_t other = 0xEE;
            resize(src.view.y, src.view.vu, &other, 17, src_h, 1000, 1000, &target);
            EXPECT_EQ(other, 0xEE);
            EXPECT_EQ(direct, through_wrapper);
        }
    }
}
