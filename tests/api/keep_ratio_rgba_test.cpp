// SPDX-License-Identifier: Apache-2.0
// RGBA8888 letterboxing.
#include "reference/keep_ratio_rgba.h"

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/letterbox.h"
#include "support/pictures.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

using KeepRatio = decltype(ovrin_resize_rgba_keep_ratio_sg);
using Model = decltype(reference::keep_ratio_rgba_sg);

struct Way {
    KeepRatio* resize;
    Model* model;
};
constexpr Way kSingle = {ovrin_resize_rgba_keep_ratio_sg, reference::keep_ratio_rgba_sg};
constexpr Way kThreaded = {ovrin_resize_rgba_keep_ratio_tps, reference::keep_ratio_rgba_tps};
constexpr Way kBoth[] = {kSingle, kThreaded};

size_t words_of(const ovrin_resize_target& target) {
    return static_cast<size_t>(target.canvas_width) * static_cast<size_t>(target.canvas_height);
}

// The row length in memory: the target's, unless the threaded way replaces it.
int32_t memory_stride(const Way& way, const ovrin_resize_target& clipped, int32_t src_w,
                      int32_t src_h) {
    const bool bands = way.resize != ovrin_resize_rgba_keep_ratio_sg &&
                       reference::band_count(src_h, clipped.dst_height) >= 2;
    return bands && clipped.src_stride < 1 ? src_w : clipped.src_stride;
}

// Draws random content between guard pages; compares canvas and target with the definition.
// `source` is the picture that the definition samples, src_w x src_h what the call is told.
void check(const Way& way, ovrin_resize_target target, int32_t src_w, int32_t src_h, Random& random,
           Flush flush = Flush::kEnd) {
    SCOPED_TRACE(describe(target, src_w, src_h));
    ovrin_resize_target clipped = target;
    int32_t used_w = src_w;
    int32_t used_h = src_h;
    reference::clip_rgba(clipped, used_w, used_h);
    const GuardedPlane src(random, int64_t{used_w} * 4, used_h,
                           int64_t{memory_stride(way, clipped, used_w, used_h)} * 4, flush);
    GuardedBuffer<uint32_t> canvas(words_of(target), flush,
                                   static_cast<uint8_t>(random.between(1, 255)));
    target.dst = canvas.data();

    ovrin_resize_target expected_target = target;
    std::vector<uint32_t> expected = canvas.copy();
    way.model(src.first(), src_w, src_h, expected_target, expected);

    way.resize(src.first(), src_w, src_h, &target);
    ASSERT_TRUE(same_target(target, expected_target));
    ASSERT_TRUE(same_bytes(reinterpret_cast<const uint8_t*>(canvas.data()),
                           reinterpret_cast<const uint8_t*>(expected.data()),
                           expected.size() * sizeof(uint32_t)));
    ASSERT_TRUE(canvas.intact());
}

// A picture whose pixel (row, column) has all four bytes 4 * (row + 1), one sample thus row + 1 and
// a destination byte the sum of four row numbers from 1.
std::vector<uint8_t> striped(int32_t w, int32_t h) {
    std::vector<uint8_t> src;
    for (int32_t row = 0; row < h; ++row) {
        src.insert(src.end(), static_cast<size_t>(w) * 4, static_cast<uint8_t>(4 * (row + 1)));
    }
    return src;
}

uint32_t word(uint32_t byte) {
    return byte * 0x01010101U;
}

// A target with source size and row length as the call is told, which is what callers usually do.
ovrin_resize_target with_source(ovrin_resize_target target, int32_t src_w, int32_t src_h) {
    target.src_width = src_w;
    target.src_height = src_h;
    target.src_stride = src_w;
    target.src_buffer_height = src_h;
    return target;
}

}  // namespace

TEST(KeepRatioRgba, RandomPlacementsEqualTheDefinition) {
    Random random(20);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(3000) && !HasFatalFailure(); ++i) {
        const int32_t src_w = random.awkward_size();
        const int32_t src_h = random.awkward_size();
        ovrin_resize_target target = with_source(random_letterbox(random), src_w, src_h);
        target.src_stride = random_stride(random, src_w);
        check(i % 4 == 0 ? kThreaded : kSingle, target, src_w, src_h, random,
              random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST(KeepRatioRgba, EveryPlacementOnASmallCanvas) {
    Random random(21);
    SCOPED_TRACE(random.trace());
    const int32_t limit = rounds(10) < 10 ? 3 : 5;
    for (int32_t w = 1; w <= limit; ++w) {
        for (int32_t h = 1; h <= limit; ++h) {
            for (int32_t x = 0; x <= limit; ++x) {
                for (int32_t y = 0; y <= limit + 1; ++y) {
                    for (const int32_t src : {1, 3, 8}) {
                        check(kSingle, with_source(letterbox(4, 4, w, h, x, y), src, src + 1), src,
                              src + 1, random);
                        if (HasFatalFailure()) return;
                    }
                }
            }
        }
    }
}

TEST(KeepRatioRgba, WordsOutsideThePictureAreZero) {
    const std::vector<uint8_t> src(4 * 4 * 4, 255);
    for (const Way& way : kBoth) {
        GuardedBuffer<uint32_t> canvas(5 * 4, Flush::kEnd, 0xEE);
        ovrin_resize_target target = with_source(letterbox(5, 4, 2, 2, 1, 1), 4, 4);
        target.dst = canvas.data();
        way.resize(src.data(), 4, 4, &target);
        const uint32_t o = 0;
        const uint32_t X = word(252);
        EXPECT_EQ(canvas.copy(), (std::vector<uint32_t>{o, o, o, o, o,  //
                                                        o, X, X, o, o,  //
                                                        o, X, X, o, o,  //
                                                        o, o, o, o, o}));
    }
}

TEST(KeepRatioRgba, WholeCanvasEqualsThePlainDownscale) {
    Random random(22);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(100); ++i) {
        const Sizes s = {random.awkward_size(), random.awkward_size(), random.awkward_size(),
                         random.awkward_size()};
        SCOPED_TRACE(describe(s));
        const GuardedPlane src(random, s.src_w * 4, s.src_h, s.src_w * 4);
        const size_t words = static_cast<size_t>(s.dst_w) * static_cast<size_t>(s.dst_h);
        std::vector<uint32_t> plain(words);
        ovrin_resize_rgba8888_sg(src.first(), plain.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        for (const Way& way : kBoth) {
            GuardedBuffer<uint32_t> canvas(words, Flush::kEnd, 0xEE);
            ovrin_resize_target target =
                with_source(letterbox(s.dst_w, s.dst_h, s.dst_w, s.dst_h, 0, 0), s.src_w, s.src_h);
            target.dst = canvas.data();
            way.resize(src.first(), s.src_w, s.src_h, &target);
            ASSERT_EQ(canvas.copy(), plain);
        }
    }
}

TEST(KeepRatioRgba, ClippingRewritesFourFieldsInPlace) {
    for (const Way& way : kBoth) {
        const std::vector<uint8_t> src(100 * 80 * 4, 255);
        std::vector<uint32_t> canvas(40 * 30);
        ovrin_resize_target target = with_source(letterbox(40, 30, 50, 30, 10, 6), 100, 80);
        target.dst = canvas.data();
        ovrin_resize_target expected = target;
        expected.dst_width = 30;   // 40 - 10
        expected.src_width = 60;   // 100 * 30 / 50
        expected.dst_height = 24;  // 30 - 6
        expected.src_height = 64;  // 80 * 24 / 30
        way.resize(src.data(), 100, 80, &target);
        EXPECT_TRUE(same_target(target, expected));
    }
}

TEST(KeepRatioRgba, ClippingOfOneAxisLeavesTheOtherAlone) {
    for (const Way& way : kBoth) {
        const std::vector<uint8_t> src(100 * 80 * 4, 255);
        std::vector<uint32_t> canvas(40 * 30);
        ovrin_resize_target wide = with_source(letterbox(40, 30, 50, 20, 10, 6), 100, 80);
        wide.dst = canvas.data();
        wide.src_height = -7;  // not read
        ovrin_resize_target expected = wide;
        expected.dst_width = 30;
        expected.src_width = 60;
        way.resize(src.data(), 100, 80, &wide);
        EXPECT_TRUE(same_target(wide, expected));

        ovrin_resize_target tall = with_source(letterbox(40, 30, 20, 30, 10, 6), 100, 80);
        tall.dst = canvas.data();
        tall.src_width = -7;
        expected = tall;
        expected.dst_height = 24;
        expected.src_height = 64;
        way.resize(src.data(), 100, 80, &tall);
        EXPECT_TRUE(same_target(tall, expected));
    }
}

TEST(KeepRatioRgba, WithoutClippingTheTargetIsNotWrittenNorItsSourceSizeRead) {
    Random random(23);
    SCOPED_TRACE(random.trace());
    for (const Way& way : kBoth) {
        for (const int32_t src_h : {20, 200}) {
            ovrin_resize_target target = letterbox(40, 30, 30, 24, 10, 6);
            target.src_stride = 17;
            target.src_width = -1;
            target.src_height = INT32_MAX;
            check(way, target, 17, src_h, random);
        }
    }
}

TEST(KeepRatioRgba, AClippedAxisTakesItsSourceSizeFromTheTarget) {
    Random random(24);
    SCOPED_TRACE(random.trace());
    for (const Way& way : kBoth) {
        // The call is told 9 x 200; the clipped axes use 60 of 100 columns and 144 of 180 rows.
        ovrin_resize_target target = letterbox(40, 30, 50, 30, 10, 6);
        target.src_stride = 64;
        target.src_width = 100;
        target.src_height = 180;
        check(way, target, 9, 200, random);
    }
}

// 49 * (1 / 49) is just below 1 in double precision, 49 * 1 / 49 is not.
TEST(KeepRatioRgba, ClippingMultipliesByTheQuotientInDoublePrecision) {
    for (const Way& way : kBoth) {
        const std::vector<uint8_t> src(49 * 49 * 4, 255);
        std::vector<uint32_t> canvas(49 * 49, 1);
        ovrin_resize_target target = with_source(letterbox(49, 49, 49, 49, 48, 48), 49, 49);
        target.dst = canvas.data();
        way.resize(src.data(), 49, 49, &target);
        EXPECT_EQ(target.dst_width, 1);
        EXPECT_EQ(target.dst_height, 1);
        EXPECT_EQ(target.src_width, 0);
        EXPECT_EQ(target.src_height, 0);
        EXPECT_EQ(canvas, std::vector<uint32_t>(49 * 49, 0));  // no source left: only cleared
    }
    Random random(25);
    SCOPED_TRACE(random.trace());
    for (int32_t length = 1; length < 120; ++length) {
        const int32_t cut = random.between(1, length);
        check(kSingle, with_source(letterbox(length, 1, length, 1, length - cut, 0), length, 1),
              length, 1, random);
    }
}

TEST(KeepRatioRgba, SourceClippedToNothingLeavesAClearedCanvas) {
    for (const Way& way : kBoth) {
        const std::vector<uint8_t> src(2000 * 4, 255);
        // 1 * (2 / 4) is no column at all.
        std::vector<uint32_t> canvas(4 * 700, 7);
        ovrin_resize_target narrow = with_source(letterbox(4, 700, 4, 700, 2, 0), 1, 2000);
        narrow.dst = canvas.data();
        way.resize(src.data(), 1, 2000, &narrow);
        EXPECT_EQ(narrow.src_width, 0);
        EXPECT_EQ(canvas, std::vector<uint32_t>(4 * 700, 0));

        canvas.assign(4 * 700, 7);
        ovrin_resize_target flat = with_source(letterbox(4, 700, 4, 700, 0, 350), 2000, 1);
        flat.dst = canvas.data();
        way.resize(src.data(), 2000, 1, &flat);
        EXPECT_EQ(flat.src_height, 0);
        EXPECT_EQ(canvas, std::vector<uint32_t>(4 * 700, 0));
    }
}

TEST(KeepRatioRgba, ATargetUsedTwiceKeepsItsClippedValues) {
    const std::vector<uint8_t> src(100 * 80 * 4, 255);
    std::vector<uint32_t> canvas(40 * 30);
    ovrin_resize_target target = with_source(letterbox(40, 30, 50, 30, 10, 6), 100, 80);
    target.dst = canvas.data();
    ovrin_resize_rgba8888_keep_ratio(src.data(), 100, 80, &target);
    const ovrin_resize_target clipped = target;
    const std::vector<uint32_t> first = canvas;
    canvas.assign(canvas.size(), 7);
    ovrin_resize_rgba8888_keep_ratio(src.data(), target.src_width, target.src_height, &target);
    EXPECT_TRUE(same_target(target, clipped));
    EXPECT_EQ(canvas, first);
}

TEST(KeepRatioRgba, RejectedPlacementsTouchNothing) {
    const std::vector<uint8_t> src(4 * 2000 * 4, 255);
    const ovrin_resize_target rejected[] = {
        letterbox(8, 8, 4, 4, 9, 0),    // left edge beyond the canvas
        letterbox(8, 8, 4, 9, 0, 0),    // taller than the canvas
        letterbox(8, 8, 4, 9, 0, 100),  // ... wherever it lies
        letterbox(8, 8, 12, 9, 4, 4),   // ... though it is cut at the right edge too
        letterbox(8, 8, 4, 0, 0, 0),    // no height
        letterbox(8, 8, 12, 0, 4, 0),
    };
    for (const Way& way : kBoth) {
        for (const int32_t src_h : {4, 2000}) {
            for (const ovrin_resize_target& placement : rejected) {
                std::vector<uint32_t> canvas(64, 0xEEEEEEEE);
                ovrin_resize_target target = with_source(placement, 4, src_h);
                target.dst = canvas.data();
                SCOPED_TRACE(describe(target, 4, src_h));
                const ovrin_resize_target before = target;
                way.resize(src.data(), 4, src_h, &target);
                EXPECT_TRUE(same_target(target, before));
                EXPECT_EQ(canvas, std::vector<uint32_t>(64, 0xEEEEEEEE));
            }
        }
    }
}

// The vertical test compares heights, the horizontal one compares the position: a picture below the
// canvas is not rejected, it is cut to a height below 0.
TEST(KeepRatioRgba, APictureBelowTheCanvasClearsItAndIsCutBelowZero) {
    const std::vector<uint8_t> src(4 * 2000 * 4, 255);
    for (const Way& way : kBoth) {
        for (const int32_t src_h : {16, 2000}) {
            std::vector<uint32_t> canvas(64, 0xEEEEEEEE);
            ovrin_resize_target target = with_source(letterbox(8, 8, 4, 4, 0, 10), 4, src_h);
            target.dst = canvas.data();
            way.resize(src.data(), 4, src_h, &target);
            EXPECT_EQ(target.dst_height, -2);
            EXPECT_EQ(target.src_height, -src_h / 2);
            EXPECT_EQ(target.dst_width, 4);
            EXPECT_EQ(target.src_width, 4);
            EXPECT_EQ(canvas, std::vector<uint32_t>(64, 0));
        }
    }
}

// Negative positions are not allowed; what they would put before the canvas is not drawn.
TEST(KeepRatioRgba, APictureBeforeTheCanvasClearsIt) {
    const std::vector<uint8_t> src(4 * 2000 * 4, 255);
    for (const Way& way : kBoth) {
        for (const int32_t src_h : {4, 2000}) {
            GuardedBuffer<uint32_t> canvas(64, Flush::kStart, 0xEE);
            ovrin_resize_target target = with_source(letterbox(8, 8, 4, 4, 0, -1), 4, src_h);
            target.dst = canvas.data();
            way.resize(src.data(), 4, src_h, &target);
            EXPECT_EQ(canvas.copy(), std::vector<uint32_t>(64, 0));
        }
    }
}

TEST(KeepRatioRgba, APictureAtTheRightEdgeIsNotRejected) {
    const std::vector<uint8_t> src(4 * 2000 * 4, 255);
    for (const Way& way : kBoth) {
        for (const int32_t src_h : {4, 2000}) {
            std::vector<uint32_t> canvas(64, 0xEEEEEEEE);
            ovrin_resize_target target = with_source(letterbox(8, 8, 4, 4, 8, 0), 4, src_h);
            target.dst = canvas.data();
            way.resize(src.data(), 4, src_h, &target);
            EXPECT_EQ(target.dst_width, 0);
            EXPECT_EQ(target.src_width, 0);
            EXPECT_EQ(canvas, std::vector<uint32_t>(64, 0));
        }
    }
}

// The picture is cut to no rows. The single-threaded function clears the canvas; the threaded one
// hands the clipped target on, whose height of 0 is then a reason to reject it.
TEST(KeepRatioRgba, APictureAtTheBottomEdgeIsClearedOnlyOnTheCallingThread) {
    const std::vector<uint8_t> src(4 * 2000 * 4, 255);
    for (const int32_t src_h : {4, 2000}) {
        for (const Way& way : kBoth) {
            std::vector<uint32_t> canvas(64, 7);
            ovrin_resize_target target = with_source(letterbox(8, 8, 4, 4, 0, 8), 4, src_h);
            target.dst = canvas.data();
            way.resize(src.data(), 4, src_h, &target);
            EXPECT_EQ(target.dst_height, 0);
            EXPECT_EQ(target.src_height, 0);
            const bool single = way.resize == kSingle.resize;
            EXPECT_EQ(canvas, std::vector<uint32_t>(64, single ? 0 : 7));
        }
    }
}

TEST(KeepRatioRgba, NoRowLengthSamplesTheFirstRowForEverOnTheCallingThread) {
    const std::vector<uint8_t> src = striped(3, 1);  // more is not read
    GuardedBuffer<uint8_t> guarded(src);
    std::vector<uint32_t> canvas(2 * 40, 7);
    ovrin_resize_target target = with_source(letterbox(2, 40, 2, 40, 0, 0), 3, 50);
    target.src_stride = 0;
    target.dst = canvas.data();
    ovrin_resize_rgba_keep_ratio_sg(guarded.data(), 3, 50, &target);
    EXPECT_EQ(canvas, std::vector<uint32_t>(2 * 40, word(4)));
}

TEST(KeepRatioRgba, NoRowLengthIsTheWidthInBands) {
    for (const int32_t none : {0, -1, -3, INT32_MIN}) {
        GuardedBuffer<uint8_t> src(striped(3, 50));
        std::vector<uint32_t> canvas(2 * 50);
        ovrin_resize_target target = with_source(letterbox(2, 50, 2, 50, 0, 0), 3, 50);
        target.src_stride = none;
        target.dst = canvas.data();
        ovrin_resize_rgba_keep_ratio_tps(src.data(), 3, 50, &target);
        for (uint32_t row = 0; row < 50; ++row) {
            ASSERT_EQ(canvas[row * 2], word(4 * (row + 1))) << row;
        }
    }
}

// One band is no band: the single-threaded function draws, with its own idea of the row length.
TEST(KeepRatioRgba, NoRowLengthWithASingleBandSamplesTheFirstRow) {
    GuardedBuffer<uint8_t> src(striped(3, 1));
    std::vector<uint32_t> canvas(2 * 40, 7);
    ovrin_resize_target target = with_source(letterbox(2, 40, 2, 40, 0, 0), 3, 40);
    target.src_stride = 0;
    target.dst = canvas.data();
    ovrin_resize_rgba_keep_ratio_tps(src.data(), 3, 40, &target);
    EXPECT_EQ(canvas, std::vector<uint32_t>(2 * 40, word(4)));
}

TEST(KeepRatioRgba, ANegativeRowLengthReadsUpwardsOnTheCallingThread) {
    Random random(26);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(60) && !HasFatalFailure(); ++i) {
        const int32_t src_w = random.awkward_size();
        const int32_t src_h = random.awkward_size();
        ovrin_resize_target target = with_source(random_letterbox(random), src_w, src_h);
        target.src_stride = -random_stride(random, src_w);
        check(kSingle, target, src_w, src_h, random, random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST(KeepRatioRgba, ARowLengthBelowTheWidthOverlapsRows) {
    Random random(27);
    SCOPED_TRACE(random.trace());
    for (const Way& way : kBoth) {
        ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
        target.src_stride = 5;
        check(way, target, 17, 100, random);
    }
}

// Row lengths far wider than the picture: only the picture is read.
TEST(KeepRatioRgba, ARowLengthWiderThanThePicture) {
    Random random(28);
    SCOPED_TRACE(random.trace());
    for (const Way& way : kBoth) {
        for (const Flush flush : {Flush::kEnd, Flush::kStart}) {
            ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
            target.src_stride = 5000;
            check(way, target, 17, 100, random, flush);
        }
    }
}

TEST(KeepRatioRgba, ABufferHeightIsNotNeededToDraw) {
    Random random(29);
    SCOPED_TRACE(random.trace());
    for (const Way& way : kBoth) {
        for (const int32_t rows : {INT32_MIN, -1, 0, 1, 100, INT32_MAX}) {
            ovrin_resize_target target = letterbox(20, 90, 13, 77, 3, 4);
            target.src_stride = 17;
            target.src_buffer_height = rows;
            check(way, target, 17, 100, random);
        }
    }
}

TEST(KeepRatioRgba, EmptySourceClearsTheCanvas) {
    for (const Way& way : kBoth) {
        for (const int32_t empty : {0, -1, -2000}) {
            for (const bool by_height : {true, false}) {
                std::vector<uint32_t> canvas(64, 7);
                ovrin_resize_target target = letterbox(8, 8, 4, 4, 1, 1);
                target.src_stride = by_height ? 4 : 0;
                target.dst = canvas.data();
                way.resize(nullptr, by_height ? 4 : empty, by_height ? empty : 2000, &target);
                EXPECT_EQ(canvas, std::vector<uint32_t>(64, 0));
            }
        }
    }
}

TEST(KeepRatioRgba, EmptyPictureClearsTheCanvas) {
    const std::vector<uint8_t> src(4 * 2000 * 4, 255);
    for (const Way& way : kBoth) {
        for (const int32_t src_h : {4, 2000}) {
            std::vector<uint32_t> canvas(64, 7);
            ovrin_resize_target target = with_source(letterbox(8, 8, 0, 4, 1, 1), 4, src_h);
            target.dst = canvas.data();
            way.resize(src.data(), 4, src_h, &target);
            EXPECT_EQ(canvas, std::vector<uint32_t>(64, 0));

            canvas.assign(64, 7);
            target = with_source(letterbox(8, 8, 4, -3, 1, 1), 4, src_h);
            target.dst = canvas.data();
            way.resize(src.data(), 4, src_h, &target);
            EXPECT_EQ(canvas, std::vector<uint32_t>(64, 0));
        }
    }
}

TEST(KeepRatioRgba, TheThreadedFunctionLetsANullTargetPass) {
    const uint8_t src[4] = {};
    ovrin_resize_rgba_keep_ratio_tps(src, 1, 1, nullptr);
    ovrin_resize_rgba_keep_ratio_tps(src, 1, 5000, nullptr);
    ovrin_resize_rgba8888_keep_ratio(src, 1, 1024, nullptr);
}

// Without a row length the two ways differ, which shows which one the wrapper took.
TEST(KeepRatioRgba, TheWrapperTurnsToBandsAt1024Rows) {
    for (const int32_t src_h : {1, 1023, 1024, 1025}) {
        GuardedBuffer<uint8_t> src(striped(2, 1025));
        ovrin_resize_target target = with_source(letterbox(1, 700, 1, 700, 0, 0), 2, src_h);
        target.src_stride = 0;
        std::vector<uint32_t> single(700, 1), threaded(700, 2), wrapper(700, 3);
        target.dst = single.data();
        ovrin_resize_rgba_keep_ratio_sg(src.data(), 2, src_h, &target);
        target.dst = threaded.data();
        ovrin_resize_rgba_keep_ratio_tps(src.data(), 2, src_h, &target);
        target.dst = wrapper.data();
        ovrin_resize_rgba8888_keep_ratio(src.data(), 2, src_h, &target);
        if (src_h > 1) {
            ASSERT_NE(single, threaded);
        }
        EXPECT_EQ(wrapper, src_h < 1024 ? single : threaded) << src_h;
    }
}

TEST(KeepRatioRgba, SourcesNeedNoAlignment) {
    Random random(30);
    SCOPED_TRACE(random.trace());
    const std::vector<uint8_t> src = random.bytes(33 * 200 * 4);
    for (const Way& way : kBoth) {
        std::vector<uint32_t> canvas(40 * 90), moved(40 * 90);
        ovrin_resize_target target = with_source(letterbox(40, 90, 30, 80, 5, 3), 33, 200);
        target.dst = canvas.data();
        way.resize(src.data(), 33, 200, &target);
        for (size_t offset = 1; offset < 4; ++offset) {
            std::vector<uint8_t> shifted(src.size() + offset);
            memcpy(shifted.data() + offset, src.data(), src.size());
            target.dst = moved.data();
            way.resize(shifted.data() + offset, 33, 200, &target);
            EXPECT_EQ(moved, canvas);
        }
    }
}
