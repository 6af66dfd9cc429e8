// SPDX-License-Identifier: Apache-2.0
// YUV 4:2:0, planar (I420) and semi-planar (NV21): in one piece, in planes, and letterboxed.
#include "reference/yuv420.h"

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/letterbox.h"
#include "support/pictures.h"
#include "support/random.h"
#include "support/yuv420_format.h"

using namespace ovrin_test;

namespace ovrin_test {

// What the framework prints for a parameter.
static void PrintTo(const Yuv420Format* format, std::ostream* out) {
    *out << format->name;
}

}  // namespace ovrin_test

namespace {

using Contiguous = Yuv420Format::Contiguous;
using PlanesOrTarget = Yuv420Format::PlanesOrTarget;

struct Way {
    PlanesOrTarget* resize;
    decltype(reference::keep_ratio_yuv420_sg)* model;
};

::testing::AssertionResult same(const GuardedBuffer<uint8_t>& actual,
                                const std::vector<uint8_t>& expected) {
    if (!actual.intact()) return ::testing::AssertionFailure() << "written before the buffer";
    return same_bytes(actual.data(), expected.data(), expected.size());
}

// Where a byte of a packed picture lies: in plane 0, luma, or a chroma plane; which row, sample
// and byte of the sample.
struct Place {
    size_t plane, row, column, byte;

    Place(const reference::ChromaLayout& layout, size_t at, size_t w, size_t h) {
        const size_t bytes = at < w * h ? 1 : static_cast<size_t>(layout.sample_bytes);
        const size_t columns = at < w * h ? w : (w + 1) / 2;
        const size_t rows = at < w * h ? h : (h + 1) / 2;
        const size_t in_chroma = at < w * h ? 0 : at - w * h;
        plane = at < w * h ? 0 : 1 + in_chroma / (columns * rows * bytes);
        const size_t in_plane = at < w * h ? at : in_chroma % (columns * rows * bytes);
        row = in_plane / (columns * bytes);
        column = in_plane / bytes % columns;
        byte = in_plane % bytes;
    }

    // Whether it is one of the samples from (x, y) on, w x h of them.
    bool lies_in(size_t x, size_t y, size_t w, size_t h) const {
        return column >= x && column < x + w && row >= y && row < y + h;
    }
    int black() const { return plane == 0 ? 0 : 128; }
};

// Tests run for both formats.
class Yuv420 : public ::testing::TestWithParam<const Yuv420Format*> {
protected:
    const Yuv420Format& format = *GetParam();
    Contiguous* const contiguous[3] = {format.contiguous, format.contiguous_sg,
                                       format.contiguous_tps};
    PlanesOrTarget* const planes[2] = {format.planes_sg, format.planes_tps};

    size_t bytes(int32_t w, int32_t h) const { return bytes_of(format.layout, w, h); }

    void check_contiguous(Contiguous* resize, const Sizes& s, Random& random, Flush flush) const {
        SCOPED_TRACE(describe(s, flush));
        const GuardedBuffer<uint8_t> src(random.bytes(bytes(s.src_w, s.src_h)), flush);
        GuardedBuffer<uint8_t> dst(bytes(s.dst_w, s.dst_h), flush, 0xEE);
        resize(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        const auto view = reference::contiguous(format.layout, src.data(), s.src_w, s.src_h);
        ASSERT_TRUE(same(dst, reference::resize_yuv420(view, s.dst_w, s.dst_h)));
    }

    void check_planes(PlanesOrTarget* resize, const Sizes& s, Random& random, Flush flush) const {
        SCOPED_TRACE(describe(s, flush));
        const Yuv420Picture src(format.layout, random, s.src_w, s.src_h, s.src_w, flush);
        GuardedBuffer<uint8_t> dst(bytes(s.dst_w, s.dst_h), flush, 0xEE);
        resize(src.view, dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, nullptr);
        ASSERT_TRUE(same(dst, reference::resize_yuv420(src.view, s.dst_w, s.dst_h)));
    }
};

class Yuv420KeepRatio : public Yuv420 {
protected:
    const Way single = {format.planes_sg, reference::keep_ratio_yuv420_sg};
    const Way threaded = {format.planes_tps, reference::keep_ratio_yuv420_tps};
    const Way both[2] = {single, threaded};

    size_t canvas_bytes(const ovrin_resize_target& target) const {
        return bytes(target.canvas_width, target.canvas_height);
    }

    // Planes that are all `src`.
    reference::Yuv420Source all_planes(const std::vector<uint8_t>& src) const {
        return {format.layout, src.data(), {src.data(), src.data()}, 0, 0, 0};
    }

    // Letterboxes random content; compares the canvas with the definition and the target with
    // itself.
    void check_letterbox(const Way& way, ovrin_resize_target target, int32_t src_w, int32_t src_h,
                         Random& random, Flush flush = Flush::kEnd) const {
        SCOPED_TRACE(describe(target, src_w, src_h));
        const Yuv420Picture src(format.layout, random, src_w, src_h, target.src_stride, flush);
        GuardedBuffer<uint8_t> canvas(canvas_bytes(target), flush, 0xEE);
        target.dst = canvas.data();
        std::vector<uint8_t> expected = canvas.copy();
        way.model(src.view, target, expected);

        const ovrin_resize_target before = target;
        way.resize(src.view, nullptr, src_w, src_h, 0, 0, &target);
        ASSERT_TRUE(same_target(target, before));
        ASSERT_TRUE(same(canvas, expected));
    }

    // Letterboxes a white picture of `size` x `size`, giving the canvas.
    std::vector<uint8_t> white_on_canvas(ovrin_resize_target target, int32_t size = 8) const {
        const std::vector<uint8_t> white(static_cast<size_t>(size) * static_cast<size_t>(size),
                                         255);
        std::vector<uint8_t> canvas(canvas_bytes(target), 0xEE);
        target.src_stride = size;
        target.dst = canvas.data();
        format.keep_ratio(all_planes(white), size, size, &target);
        return canvas;
    }

    Place place(size_t at, const ovrin_resize_target& target) const {
        return Place(format.layout, at, static_cast<size_t>(target.canvas_width),
                     static_cast<size_t>(target.canvas_height));
    }

    std::vector<uint8_t> black_canvas(const ovrin_resize_target& target) const {
        std::vector<uint8_t> canvas(canvas_bytes(target));
        for (size_t i = 0; i < canvas.size(); ++i) {
            canvas[i] = static_cast<uint8_t>(place(i, target).black());
        }
        return canvas;
    }
};

const auto kBothFormats = ::testing::Values(&kI420Format, &kNv21Format);
const auto kName = [](const auto& info) { return std::string(info.param->name); };
INSTANTIATE_TEST_SUITE_P(Both, Yuv420, kBothFormats, kName);
INSTANTIATE_TEST_SUITE_P(Both, Yuv420KeepRatio, kBothFormats, kName);

}  // namespace

// ---- Whole destinations ----

TEST_P(Yuv420, RandomSizesEqualTheDefinition) {
    Random random(80);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(3000) && !HasFatalFailure(); ++i) {
        const Sizes s = {random.awkward_size(), random.awkward_size(), random.awkward_size(),
                         random.awkward_size()};
        const Flush flush = random.pick({Flush::kEnd, Flush::kStart});
        if (i % 2 == 0) {
            check_contiguous(contiguous[i / 2 % 3], s, random, flush);
        } else {
            check_planes(planes[i / 2 % 2], s, random, flush);
        }
    }
}

TEST_P(Yuv420, EverySmallSizeEqualsTheDefinition) {
    Random random(81);
    SCOPED_TRACE(random.trace());
    const int32_t limit = rounds(10) < 10 ? 3 : 9;
    for (int32_t src_w = 1; src_w <= limit; ++src_w) {
        for (int32_t src_h = 1; src_h <= limit; ++src_h) {
            for (int32_t dst_w = 1; dst_w <= limit; ++dst_w) {
                for (int32_t dst_h = 1; dst_h <= limit && !HasFatalFailure(); ++dst_h) {
                    check_contiguous(format.contiguous_sg, {src_w, src_h, dst_w, dst_h}, random,
                                     Flush::kEnd);
                }
            }
        }
    }
}

// The chroma grid is rounded up to a multiple of 4 and cropped.
TEST_P(Yuv420, EveryRemainderOfBothSizesIsSampledOntoTheGridAndCropped) {
    Random random(82);
    SCOPED_TRACE(random.trace());
    for (int32_t dst_w = 20; dst_w < 24; ++dst_w) {
        for (int32_t dst_h = 12; dst_h < 16; ++dst_h) {
            for (const int32_t src_w : {11, 20, 40, 41, 63, 64, 200}) {
                for (const int32_t src_h : {7, 12, 24, 25, 63, 64, 100}) {
                    for (Contiguous* resize : contiguous) {
                        check_contiguous(resize, {src_w, src_h, dst_w, dst_h}, random, Flush::kEnd);
                    }
                    for (PlanesOrTarget* resize : planes) {
                        check_planes(resize, {src_w, src_h, dst_w, dst_h}, random, Flush::kStart);
                    }
                    if (HasFatalFailure()) return;
                }
            }
        }
    }
}

TEST_P(Yuv420, WideRowsCrossColumnStrips) {
    Random random(83);
    SCOPED_TRACE(random.trace());
    for (const int32_t dst_w : {1023, 2047, 2048, 2049, 4096, 4097, 5001}) {
        for (const int32_t src_w : {1, 700, 3000, 10001}) {
            check_contiguous(format.contiguous_sg, {src_w, 3, dst_w, 2}, random, Flush::kEnd);
        }
    }
}

TEST_P(Yuv420, EqualSizesDropTheTwoLowBits) {
    Random random(84);
    SCOPED_TRACE(random.trace());
    const auto src = random.bytes(bytes(20, 12));
    std::vector<uint8_t> dst(src.size(), 0xEE);
    format.contiguous(src.data(), dst.data(), 20, 12, 20, 12);
    for (size_t i = 0; i < src.size(); ++i) EXPECT_EQ(dst[i], src[i] & ~3) << i;
}

TEST_P(Yuv420, WrappersGiveTheSamePictureOnEitherSideOfTheThreshold) {
    Random random(89);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {1, 1023, 1024, 1025}) {
        for (const int32_t dst_h : {1, 300, 512, 1023, 1500}) {
            check_contiguous(format.contiguous, {7, src_h, 3, dst_h}, random, Flush::kEnd);
            check_contiguous(format.contiguous, {8, src_h, 4, dst_h}, random, Flush::kEnd);
        }
    }
}

// Products of rows pass 31 bits here; positions must not.
TEST_P(Yuv420, TallPicturesNeedMoreThan31Bits) {
    Random random(90);
    SCOPED_TRACE(random.trace());
    for (Contiguous* resize : {format.contiguous_sg, format.contiguous_tps}) {
        check_contiguous(resize, {1, 60000, 1, 59999}, random, Flush::kEnd);
        check_contiguous(resize, {2, 60000, 4, 40000}, random, Flush::kEnd);
        check_contiguous(resize, {1, 40000, 1, 70000}, random, Flush::kEnd);
        check_contiguous(resize, {60000, 1, 59999, 1}, random, Flush::kEnd);
    }
    for (PlanesOrTarget* resize : planes) {
        check_planes(resize, {2, 60000, 4, 40000}, random, Flush::kEnd);
        check_planes(resize, {1, 60000, 1, 59999}, random, Flush::kEnd);
    }
}

TEST_P(Yuv420, FourToTwoTakesEachPixelOnce) {
    std::vector<uint8_t> src(24, 0);
    for (size_t i = 0; i < 16; ++i) src[i] = static_cast<uint8_t>(4 * i);
    std::vector<uint8_t> dst(6, 0xEE);
    format.contiguous_sg(src.data(), dst.data(), 4, 4, 2, 2);
    EXPECT_EQ(dst[0], 0 + 1 + 4 + 5);
    EXPECT_EQ(dst[1], 2 + 3 + 6 + 7);
    EXPECT_EQ(dst[2], 8 + 9 + 12 + 13);
    EXPECT_EQ(dst[3], 10 + 11 + 14 + 15);
}

TEST_P(Yuv420, SixteenToEightSamplesEveryPlaneInPlace) {
    Random random(64);
    SCOPED_TRACE(random.trace());
    check_contiguous(format.contiguous_sg, {16, 16, 8, 8}, random, Flush::kEnd);
}

TEST_P(Yuv420, SixteenToSixCropsThreeOfFourChromaColumnsAndRows) {
    Random random(65);
    SCOPED_TRACE(random.trace());
    check_contiguous(format.contiguous_sg, {16, 16, 6, 6}, random, Flush::kEnd);
    check_planes(format.planes_sg, {16, 16, 6, 6}, random, Flush::kEnd);
}

// 12 columns to 6: six chroma columns onto a grid of four, of which three are kept. They take
// columns (0, 1), (1, 2) and (3, 4); luma takes (2j, 2j + 1).
TEST_P(Yuv420, TwelveToSixKeepsTheLeftOfTheChroma) {
    // The two components of chroma start at 10 and 20.
    const auto base = [](const Place& at) { return 10 * (at.plane + at.byte); };
    std::vector<uint8_t> src(bytes(12, 4));
    for (size_t i = 0; i < src.size(); ++i) {
        const Place at(format.layout, i, 12, 4);
        src[i] = static_cast<uint8_t>(4 * (at.plane == 0 ? at.column : base(at) + at.column));
    }
    constexpr size_t kFirstOf[] = {0, 1, 3};
    for (Contiguous* resize : contiguous) {
        std::vector<uint8_t> dst(bytes(6, 4), 0xEE);
        resize(src.data(), dst.data(), 12, 4, 6, 4);
        for (size_t i = 0; i < dst.size(); ++i) {
            const Place at(format.layout, i, 6, 4);
            const size_t first = at.plane == 0 ? 2 * at.column : base(at) + kFirstOf[at.column];
            EXPECT_EQ(dst[i], 2 * (first + first + 1)) << i;
        }
    }
}

TEST_P(Yuv420, ConstantSourcesLoseTheirTwoLowBits) {
    for (const auto& [value, result] : {std::pair{255, 252}, {3, 0}, {4, 4}, {131, 128}}) {
        const std::vector<uint8_t> src(bytes(19, 13), static_cast<uint8_t>(value));
        for (const int32_t side : {5, 8, 19, 30}) {
            std::vector<uint8_t> dst(bytes(side, side), 0xEE);
            format.contiguous(src.data(), dst.data(), 19, 13, side, side);
            EXPECT_EQ(dst, std::vector<uint8_t>(dst.size(), static_cast<uint8_t>(result)));
        }
    }
}

TEST_P(Yuv420, OnePixelFillsEachPlane) {
    const uint8_t src[3] = {255, 130, 7};
    std::vector<uint8_t> dst(bytes(9, 6), 0xEE);
    format.contiguous(src, dst.data(), 1, 1, 9, 6);
    for (size_t i = 0; i < dst.size(); ++i) {
        const Place at(format.layout, i, 9, 6);
        EXPECT_EQ(dst[i], src[at.plane + at.byte] & ~3) << i;
    }
}

TEST_P(Yuv420, OddSourcesHaveTheLargerHalfOfChroma) {
    Random random(87);
    SCOPED_TRACE(random.trace());
    EXPECT_EQ(bytes(5, 3), 15U + 2 * 6);
    for (const auto& [w, h] : {std::pair{5, 3}, {1, 1}, {3, 1}, {1, 3}, {17, 9}, {63, 31}}) {
        for (const int32_t side : {1, 2, 3, 4, 5, 8, 9, 32}) {
            for (Contiguous* resize : contiguous) {
                check_contiguous(resize, {w, h, side, side}, random, Flush::kEnd);
            }
            check_planes(format.planes_sg, {w, h, side, side}, random, Flush::kStart);
        }
    }
}

TEST_P(Yuv420, EmptySourceFillsLumaAndChromaWithZero) {
    const auto gives_zeros = [&](int32_t src_w, int32_t src_h, int32_t side) {
        SCOPED_TRACE(describe(Sizes{src_w, src_h, side, side}));
        const std::vector<uint8_t> zeros(bytes(side, side), 0);
        for (Contiguous* resize : contiguous) {
            GuardedBuffer<uint8_t> dst(zeros.size(), Flush::kEnd, 0xEE);
            resize(nullptr, dst.data(), src_w, src_h, side, side);
            EXPECT_TRUE(same(dst, zeros));
        }
        for (PlanesOrTarget* resize : planes) {
            GuardedBuffer<uint8_t> dst(zeros.size(), Flush::kEnd, 0xEE);
            resize({}, dst.data(), src_w, src_h, side, side, nullptr);
            EXPECT_TRUE(same(dst, zeros));
        }
    };
    for (const int32_t empty : {0, -1, -2, INT32_MIN}) {
        for (const int32_t side : {8, 6, 5}) {
            gives_zeros(5, empty, side);
            gives_zeros(empty, 5, side);
            gives_zeros(empty, 2000, side);
        }
    }
}

TEST_P(Yuv420, EmptyDestinationWritesNothing) {
    const std::vector<uint8_t> src(bytes(2, 2000));
    const auto view = reference::contiguous(format.layout, src.data(), 2, 2);
    for (const int32_t empty : {0, -1, -3, -4, INT32_MIN}) {
        for (const int32_t src_h : {2, 2000}) {
            for (const int32_t other : {1, 4, 6}) {
                uint8_t byte = 0xEE;
                for (Contiguous* resize : contiguous) {
                    resize(src.data(), &byte, 2, src_h, empty, other);
                    resize(src.data(), &byte, 2, src_h, other, empty);
                    resize(src.data(), &byte, 2, src_h, empty, empty);
                }
                for (PlanesOrTarget* resize : planes) {
                    resize(view, &byte, 2, src_h, empty, other, nullptr);
                    resize(view, &byte, 2, src_h, other, empty, nullptr);
                }
                EXPECT_EQ(byte, 0xEE) << empty;
            }
        }
    }
}

TEST_P(Yuv420, SeparatePlanesGiveTheContiguousPicture) {
    Random random(88);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(100); ++i) {
        const Sizes s = {random.awkward_size(), random.pick({33, 1023, 1024, 1100}),
                         random.awkward_size(), random.awkward_size()};
        SCOPED_TRACE(describe(s));
        const auto src = random.bytes(bytes(s.src_w, s.src_h));
        const auto view = reference::contiguous(format.layout, src.data(), s.src_w, s.src_h);
        std::vector<uint8_t> whole(bytes(s.dst_w, s.dst_h), 1);
        std::vector<uint8_t> separate(whole.size(), 2);
        format.contiguous(src.data(), whole.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        format.planes(view, separate.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        ASSERT_EQ(whole, separate);
        for (PlanesOrTarget* resize : planes) {
            std::vector<uint8_t> direct(whole.size(), 3);
            resize(view, direct.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, nullptr);
            ASSERT_EQ(direct, whole);
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
            const int64_t row = reference::chroma_row(reference::kNv21, src_w);
            const auto by_bytes = reference::quarter_plane(vu, row, row, 2, dst_w, 2, 2);
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

// ---- Letterboxes ----

TEST_P(Yuv420KeepRatio, RandomPlacementsEqualTheDefinition) {
    Random random(91);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(3000) && !HasFatalFailure(); ++i) {
        const int32_t src_w = random.awkward_size();
        const int32_t src_h = random.awkward_size();
        ovrin_resize_target target = random_letterbox(random);
        target.src_stride = random_stride(random, src_w);
        check_letterbox(i % 4 == 0 ? threaded : single, target, src_w, src_h, random,
                        random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST_P(Yuv420KeepRatio, EveryPlacementOnASmallCanvas) {
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
                        check_letterbox(single, target, 9, 6, random);
                    }
                }
            }
        }
    }
}

TEST_P(Yuv420KeepRatio, TheTargetIsNeverWrittenAndItsSourceSizeNeverRead) {
    Random random(93);
    SCOPED_TRACE(random.trace());
    for (const Way& way : both) {
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

TEST_P(Yuv420KeepRatio, EveryOddPlacementStaysInTheCanvas) {
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
        check_letterbox(src_h > 1023 ? threaded : single, target, 10, src_h, random,
                        random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST_P(Yuv420KeepRatio, RowLengthsWiderThanThePicture) {
    Random random(96);
    SCOPED_TRACE(random.trace());
    for (const Way& way : both) {
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

TEST_P(Yuv420KeepRatio, RowLengthsOfZeroOrLessAreTakenAsTheyStandOnTheCallingThread) {
    Random random(97);
    SCOPED_TRACE(random.trace());
    for (const int32_t stride : {0, -1, -16, -17, -18, -19, -50}) {
        ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
        target.src_stride = stride;
        check_letterbox(single, target, 17, 100, random, Flush::kEnd);
        check_letterbox(single, target, 17, 1100, random, Flush::kStart);
        // Without bands the threaded function hands the target on.
        check_letterbox(threaded, target, 17, 1023, random, Flush::kEnd);
        target.dst_height = 1;
        check_letterbox(threaded, target, 17, 1100, random, Flush::kEnd);
    }
}

TEST_P(Yuv420KeepRatio, TheCanvasAroundThePictureIsBlack) {
    const auto target = letterbox(12, 10, 4, 4, 4, 2);
    const auto canvas = white_on_canvas(target);
    for (size_t i = 0; i < canvas.size(); ++i) {
        const Place at = place(i, target);
        const bool inside = at.plane == 0 ? at.lies_in(4, 2, 4, 4) : at.lies_in(2, 1, 2, 2);
        EXPECT_EQ(canvas[i], inside ? 252 : at.black()) << i;
    }
}

// The part beyond the canvas is dropped, the rest is what it would be on a larger canvas.
TEST_P(Yuv420KeepRatio, PicturesThatDoNotFitAreCroppedNotRescaled) {
    Random random(94);
    SCOPED_TRACE(random.trace());
    const auto planes_of_chroma = static_cast<size_t>(format.layout.planes);
    const auto sample_bytes = static_cast<size_t>(format.layout.sample_bytes);
    for (const int32_t src_h : {50, 1100}) {
        const Yuv420Picture src(format.layout, random, 60, src_h, 60);
        std::vector<uint8_t> large(bytes(64, 64)), small(bytes(32, 32));
        ovrin_resize_target target = letterbox(64, 64, 40, 44, 8, 12);
        target.src_stride = 60;
        target.dst = large.data();
        format.keep_ratio(src.view, 60, src_h, &target);
        target.canvas_width = target.canvas_height = 32;
        target.dst = small.data();
        format.keep_ratio(src.view, 60, src_h, &target);
        for (size_t row = 0; row < 32; ++row) {
            ASSERT_TRUE(same_bytes(&small[row * 32], &large[row * 64], 32)) << "row " << row;
        }
        const size_t kept = 16 * sample_bytes;
        for (size_t plane = 0; plane < planes_of_chroma; ++plane) {
            for (size_t row = 0; row < 16; ++row) {
                ASSERT_TRUE(same_bytes(&small[1024 + (plane * 16 + row) * kept],
                                       &large[4096 + (plane * 32 + row) * 2 * kept], kept));
            }
        }
    }
}

TEST_P(Yuv420KeepRatio, OddPositionsRoundChromaUp) {
    for (const int32_t x : {1, 3}) {
        const auto target = letterbox(12, 10, 4, 4, x, 1);
        const auto canvas = white_on_canvas(target);
        const auto left = static_cast<size_t>(x);
        for (size_t i = 0; i < canvas.size(); ++i) {
            const Place at = place(i, target);
            const bool inside =
                at.plane == 0 ? at.lies_in(left, 1, 4, 4) : at.lies_in((left + 1) / 2, 1, 2, 2);
            EXPECT_EQ(canvas[i], inside ? 252 : at.black()) << i;
        }
    }
}

// A chroma block rounded up runs over the right edge of its plane into the next row, and over the
// bottom edge of U into V; only what would fall past the canvas is dropped.
TEST(I420KeepRatio, ChromaRunningOverItsPlaneStaysInTheCanvas) {
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

// Pairs run into the next row likewise.
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

TEST_P(Yuv420KeepRatio, RejectedPlacementsTouchNothing) {
    const std::vector<uint8_t> src(4 * 2000, 255);
    const ovrin_resize_target rejected[] = {
        letterbox(8, 8, 4, 4, 9, 0),  // left edge beyond the canvas
        letterbox(8, 8, 4, 0, 0, 0),  // no height
        letterbox(8, 8, 4, 0, 4, 4),
        letterbox(8, 8, 4, 4, 9, 9),
    };
    for (const Way& way : both) {
        for (const int32_t src_h : {4, 2000}) {
            for (ovrin_resize_target target : rejected) {
                std::vector<uint8_t> canvas(canvas_bytes(target), 0xEE);
                target.src_stride = 4;
                target.dst = canvas.data();
                SCOPED_TRACE(describe(target, 4, src_h));
                way.resize(all_planes(src), nullptr, 4, src_h, 0, 0, &target);
                EXPECT_EQ(canvas, std::vector<uint8_t>(canvas.size(), 0xEE));
            }
        }
    }
}

// The single-threaded function compares the canvas height with dst_y, the threaded one with dst_x.
TEST_P(Yuv420KeepRatio, TheSecondRejectionTestDependsOnTheWay) {
    const std::vector<uint8_t> src(4 * 2000, 255);
    const auto run = [&](PlanesOrTarget* resize, int32_t src_h, ovrin_resize_target target) {
        std::vector<uint8_t> canvas(canvas_bytes(target), 0xEE);
        target.src_stride = 4;
        target.dst = canvas.data();
        resize(all_planes(src), nullptr, 4, src_h, 0, 0, &target);
        return canvas;
    };
    const auto below = letterbox(8, 8, 4, 4, 2, 9);
    const auto right = letterbox(16, 8, 4, 4, 9, 2);
    const std::vector<uint8_t> untouched(96, 0xEE), untouched_wide(192, 0xEE);

    EXPECT_EQ(run(format.planes_sg, 2000, below), untouched);
    // No row of it is visible.
    EXPECT_EQ(run(format.planes_tps, 2000, below), black_canvas(below));
    EXPECT_NE(run(format.planes_sg, 2000, right), untouched_wide);
    EXPECT_EQ(run(format.planes_tps, 2000, right), untouched_wide);

    // Too low a source, or a single band: both tests must pass.
    EXPECT_EQ(run(format.planes_tps, 1023, below), untouched);
    EXPECT_EQ(run(format.planes_tps, 1023, right), untouched_wide);
    auto one_row = below;
    one_row.dst_height = 1;  // bands of 2000 rows
    EXPECT_EQ(run(format.planes_tps, 2000, one_row), untouched);
    EXPECT_EQ(run(format.planes_tps, 2000, letterbox(8, 8, 4, 1, 2, 7)),
              run(format.planes_sg, 2000, letterbox(8, 8, 4, 1, 2, 7)));
}

TEST_P(Yuv420KeepRatio, TheWrapperTurnsToBandsAt1024Rows) {
    const std::vector<uint8_t> src(4 * 2000, 255);
    ovrin_resize_target target = letterbox(8, 8, 4, 4, 2, 9);  // only bands accept it
    target.src_stride = 4;
    for (const int32_t src_h : {-5, 0, 1, 1023, 1024, 1025}) {
        std::vector<uint8_t> canvas(96, 0xEE);
        target.dst = canvas.data();
        format.keep_ratio(all_planes(src), 4, src_h, &target);
        EXPECT_EQ(canvas[0], src_h < 1024 ? 0xEE : 0) << src_h;
    }
}

TEST_P(Yuv420KeepRatio, PicturesAtTheFarEdgesLeaveABlackCanvas) {
    const auto target = letterbox(8, 8, 0, 4, 2, 2);
    EXPECT_EQ(white_on_canvas(letterbox(8, 8, 4, 4, 8, 0)), black_canvas(target));
    EXPECT_EQ(white_on_canvas(letterbox(8, 8, 4, 4, 0, 8)), black_canvas(target));
    EXPECT_EQ(white_on_canvas(letterbox(8, 8, 4, 4, 8, 8)), black_canvas(target));
    EXPECT_EQ(white_on_canvas(target), black_canvas(target));  // no width
}

TEST_P(Yuv420KeepRatio, EmptySourceGivesZerosInsideTheBlackBorder) {
    const auto gives_zeros = [&](const Way& way, int32_t src_w, int32_t src_h) {
        ovrin_resize_target target = letterbox(12, 10, 4, 4, 4, 2);
        GuardedBuffer<uint8_t> canvas(canvas_bytes(target), Flush::kEnd, 0xEE);
        target.src_stride = 4;
        target.dst = canvas.data();
        way.resize({}, nullptr, src_w, src_h, 0, 0, &target);
        for (size_t i = 0; i < canvas.size(); ++i) {
            const Place at = place(i, target);
            ASSERT_EQ(canvas[i], at.lies_in(2, 1, 2, 2) ? 0 : at.black()) << i;
        }
    };
    for (const Way& way : both) {
        for (const int32_t empty : {0, -1, -2000}) {
            for (const int32_t other : {4, 2000}) {
                gives_zeros(way, other, empty);
                gives_zeros(way, empty, other);
            }
        }
    }
}

TEST_P(Yuv420KeepRatio, RowLengthsOfZeroOrLessAreTheWidthInBands) {
    Random random(98);
    SCOPED_TRACE(random.trace());
    for (const int32_t stride : {0, -1, -17, INT32_MIN}) {
        const Yuv420Picture src(format.layout, random, 17, 1100, 17);
        ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
        GuardedBuffer<uint8_t> canvas(canvas_bytes(target), Flush::kEnd, 0xEE);
        target.src_stride = stride;
        target.dst = canvas.data();
        std::vector<uint8_t> expected = canvas.copy();
        reference::draw_yuv420(src.view, target, expected);
        format.planes_tps(src.view, nullptr, 17, 1100, 0, 0, &target);
        EXPECT_TRUE(same(canvas, expected));
    }
}

// Destination pointer and sizes among the arguments are ignored when there is a target.
TEST_P(Yuv420KeepRatio, TheTargetOverridesTheDestinationArguments) {
    Random random(99);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {40, 1100}) {
        const Yuv420Picture src(format.layout, random, 17, src_h, 17);
        ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
        target.src_stride = 17;
        std::vector<uint8_t> through_wrapper(canvas_bytes(target)), direct(canvas_bytes(target), 1);
        target.dst = through_wrapper.data();
        format.keep_ratio(src.view, 17, src_h, &target);
        target.dst = direct.data();
        for (PlanesOrTarget* resize : planes) {
            uint8_t other = 0xEE;
            resize(src.view, &other, 17, src_h, 1000, 1000, &target);
            EXPECT_EQ(other, 0xEE);
            EXPECT_EQ(direct, through_wrapper);
        }
    }
}
