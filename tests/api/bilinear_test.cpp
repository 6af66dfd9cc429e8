// SPDX-License-Identifier: Apache-2.0
// The bilinear engine on the calling thread.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <cmath>

#include "support/bilinear_call.h"

using namespace ovrin_test;

namespace {

constexpr int32_t kFormats[] = {2, 7, 8, 18, 19};
constexpr int32_t kRejectedFormats[] = {INT32_MIN, -18, -7, -1, 0,  1,       3,
                                        4,         5,   6,  9,  10, 11,      15,
                                        16,        17,  20, 21, 34, 1 << 16, INT32_MAX};

void check(const BilinearCall& call, Random& random, Flush flush = Flush::kEnd) {
    check_bilinear(ov_bilinear_sg, reference::bilinear_single, call, random, flush);
}

// A rectangle somewhere in a canvas, often hanging over its right and lower edges.
BilinearCall random_call(Random& random) {
    const int32_t src_w = random.awkward_size();
    const int32_t src_h = random.between(1, 70);
    BilinearCall call = call_without_target(random.pick({2, 7, 8, 18, 19}), src_w, src_h,
                                            random.awkward_size(), random.between(1, 70));
    call.with_target = random.between(0, 2) != 0;
    if (!call.with_target) return call;
    call.g.src_stride = src_w + random.pick({0, 0, 1, 2, 7, 16});
    call.g.dst_x = random.between(0, 9);
    call.g.dst_y = random.between(0, 9);
    const int32_t wanted_w = call.dst_w + call.g.dst_x;
    const int32_t wanted_h = call.dst_h + call.g.dst_y;
    call.g.canvas_width = std::max(0, wanted_w + random.pick({0, -1, -2, -20, -60, 1, 5}));
    call.g.canvas_height = std::max(0, wanted_h + random.pick({0, -1, -2, -20, -60, 1, 5}));
    call.src_w = random.pick({1, -1, 7, 100000});
    call.src_h = random.pick({1, -1, 7, 100000});
    return call;
}

// Draws a source without a target.
std::vector<uint8_t> draw(int32_t format, const std::vector<uint8_t>& src, int32_t src_w,
                          int32_t src_h, int32_t dst_w, int32_t dst_h) {
    std::vector<uint8_t> dst(
        canvas_bytes(reference::packed_geometry(src_w, src_h, dst_w, dst_h, format)), 0xEE);
    ov_bilinear_sg(src.data(), dst.data(), src_w, src_h, dst_w, dst_h, format, nullptr);
    return dst;
}

// A semi-planar picture whose rows, `rows` of them, all hold `row`; the chroma is 0.
std::vector<uint8_t> luma_of_equal_rows(const std::vector<uint8_t>& row, int32_t rows) {
    std::vector<uint8_t> src;
    for (int32_t i = 0; i < rows; ++i) src.insert(src.end(), row.begin(), row.end());
    src.resize(src.size() + (row.size() + 1) * static_cast<size_t>(rows + 1) / 2 + row.size());
    return src;
}

ovrin_resize_target packed_target(const uint8_t* chroma, int32_t format, int32_t src_w,
                                  int32_t src_h, int32_t canvas_w, int32_t canvas_h) {
    ovrin_resize_target t = {};
    t.src_vu_plane = t.src_u_plane = t.src_v_plane = chroma;
    t.src_width = t.src_stride = src_w;
    t.src_height = t.src_buffer_height = src_h;
    t.format = format;
    t.canvas_width = canvas_w;
    t.canvas_height = canvas_h;
    return t;
}

}  // namespace

TEST(Bilinear, RandomCallsEqualTheDefinition) {
    Random random(21);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(2500) && !HasFatalFailure(); ++i) {
        check(random_call(random), random, random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST(Bilinear, EverySmallSizeEqualsTheDefinition) {
    Random random(22);
    SCOPED_TRACE(random.trace());
    const int32_t limit = rounds(6) < 6 ? 3 : 6;
    for (const int32_t format : kFormats) {
        for (int32_t src_w = 1; src_w <= limit; ++src_w) {
            for (int32_t src_h = 1; src_h <= limit; ++src_h) {
                for (int32_t dst_w = 1; dst_w <= limit; ++dst_w) {
                    for (int32_t dst_h = 1; dst_h <= limit && !HasFatalFailure(); ++dst_h) {
                        check(call_without_target(format, src_w, src_h, dst_w, dst_h), random,
                              random.pick({Flush::kEnd, Flush::kStart}));
                    }
                }
            }
        }
    }
}

TEST(Bilinear, LongRowsAndColumnsEqualTheDefinition) {
    Random random(23);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        for (const auto& [src, dst] : {std::pair<int32_t, int32_t>{4095, 4096},
                                       {4097, 1023},
                                       {1000, 2049},
                                       {5000, 4999},
                                       {1, 3000},
                                       {3001, 1}}) {
            check(call_without_target(format, src, 5, dst, 4), random);
            check(call_without_target(format, 5, src, 4, dst), random);
        }
    }
}

TEST(Bilinear, CallsUnder1024RowsInterpolateWhicheverEntryIsUsed) {
    Random random(24);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(300) && !HasFatalFailure(); ++i) {
        check_bilinear(ov_bilinear, reference::bilinear_single, random_call(random), random);
    }
    for (const int32_t format : kFormats) {
        check_bilinear(ov_bilinear, reference::bilinear_single,
                       call_without_target(format, 5, 2000, 6, 1023), random);
    }
}

TEST(Bilinear, EqualSizesAreNotACopy) {
    constexpr int32_t kW = 6, kH = 5;
    Random random(25);
    // One pixel more than the picture: the last sample of all is blended with its right neighbour.
    const auto src = random.bytes((kW * kH + 1) * 4);
    const auto dst = draw(7, src, kW, kH, kW, kH);
    for (size_t y = 0; y < kH; ++y) {
        for (size_t x = 0; x < kW; ++x) {
            for (size_t n = 0; n < 4; ++n) {
                SCOPED_TRACE(::testing::Message() << x << ", " << y << ": " << n);
                const size_t at = (y * kW + x) * 4 + n;
                int expected;
                if (y >= kH - 2) {
                    expected = (3 * src[at] + src[at + 4]) / 4;
                } else if (x >= kW - 2) {
                    expected = (3 * src[at] + src[at + kW * 4]) / 4;
                } else {
                    expected = (9 * src[at] + 3 * src[at + 4] + 3 * src[at + kW * 4] +
                                src[at + kW * 4 + 4]) /
                               16;
                }
                EXPECT_EQ(dst[at], expected);
            }
        }
    }
}

TEST(Bilinear, EnlargingTwiceBlendsTheLastFourColumnsVerticallyOnly) {
    Random random(26);
    const auto src = random.bytes(11 * 10 * 2);
    const auto dst = draw(18, src, 10, 10, 20, 20);
    for (size_t y = 0; y < 16; ++y) {
        for (size_t x = 16; x < 20; ++x) {
            const size_t at = y / 2 * 10 + x / 2;
            const int below = y % 2 == 0 ? 1 : 3;  // quarters
            EXPECT_EQ(dst[y * 20 + x], ((4 - below) * src[at] + below * src[at + 10]) / 4)
                << x << ", " << y;
        }
    }
}

TEST(Bilinear, ReductionThatStepsOverTheLastPairHasNoEdge) {
    Random random(27);
    const auto row = random.bytes(100);
    const auto dst = draw(18, luma_of_equal_rows(row, 3), 100, 3, 30, 1);
    // Column 29 lies at 96.6667: weight (0.6667 + 0.25) * 4096.
    EXPECT_EQ(dst[29], (row[96] * (4096 - 3754) + row[97] * 3754) / 4096);
}

TEST(Bilinear, FirstWeightIsAQuarterAndThreeQuartersTakeTheRightNeighbour) {
    Random random(28);
    const auto row = random.bytes(3);
    const auto dst = draw(18, luma_of_equal_rows(row, 3), 3, 3, 4, 1);
    EXPECT_EQ(dst[0], (3 * row[0] + row[1]) / 4);
    // Columns 0 and 1 lie at 0 and 0.75; column 2, at 1.5, is the first of the edge.
    EXPECT_EQ(dst[1], row[1]);
    EXPECT_EQ(dst[2], row[1]);
    EXPECT_EQ(dst[3], row[2]);
}

// Column 1 of 4096 lies at 0.99976 of 4095: weight 5119, 1023 beyond its right neighbour.
TEST(Bilinear, SumsThatLeaveTheByteWrap) {
    std::vector<uint8_t> row(4095);
    row[0] = 255;
    EXPECT_EQ(draw(18, luma_of_equal_rows(row, 3), 4095, 3, 4096, 1)[1], 192);  // -64
    row[0] = 0;
    row[1] = 255;
    EXPECT_EQ(draw(18, luma_of_equal_rows(row, 3), 4095, 3, 4096, 1)[1], 62);  // 318
    row[0] = 255;
    EXPECT_EQ(draw(18, luma_of_equal_rows(row, 3), 4095, 3, 4096, 1)[1], 255);
}

TEST(Bilinear, RowsWrapAsColumnsDo) {
    Random random(29);
    SCOPED_TRACE(random.trace());
    const auto wide = random.bytes(4095 * 3 + 4095 * 4);
    std::vector<uint8_t> tall(wide.size());
    for (size_t y = 0; y < 3; ++y) {
        for (size_t x = 0; x < 4095; ++x) tall[x * 3 + y] = wide[y * 4095 + x];
    }
    const auto across = draw(18, wide, 4095, 3, 4096, 1);
    const auto down = draw(18, tall, 3, 4095, 1, 4096);
    // The last rows and columns are blended in one direction only.
    for (size_t i = 0; i < 4000; ++i) ASSERT_EQ(across[i], down[i]) << i;
}

// How far the definition reads. The other tests hand over buffers of that size between guard pages.
TEST(Bilinear, ReadsBeyondThePictureAreThoseThatTheKernelsMake) {
    const auto end = [](int32_t format, int32_t src_w, int32_t src_h, int32_t dst_w,
                        int32_t dst_h) {
        const BilinearCall call = call_without_target(format, src_w, src_h, dst_w, dst_h);
        reference::BilinearSource read;
        std::vector<uint8_t> dst(canvas_bytes(call.g));
        reference::bilinear_single(call.g, src_w, src_h, dst_w, dst_h, read, dst);
        return reference::contiguous_end(read, src_w, src_h);
    };
    EXPECT_EQ(end(7, 1, 1, 1, 1), 3 * 4);                  // a row below and a column to the right
    EXPECT_EQ(end(7, 1, 5, 3, 2), (3 + 1 + 1) * 4 - 0);    // rows 0, 2 and the row below, one right
    EXPECT_EQ(end(7, 10, 10, 20, 20), (10 * 10 + 1) * 4);  // right of the last row
    EXPECT_EQ(end(7, 9, 9, 3, 3), (7 * 9 + 8) * 4);        // reduction: inside
    // The last edge column's second tap: column 6 of row 5 at the luma row length, from V's last
    // rows but one.
    EXPECT_EQ(end(2, 8, 8, 8, 8), 8 * 8 + 16 + 2 * 4 + 3 + 8 + 1);
    EXPECT_EQ(end(18, 8, 8, 8, 8), 8 * 8 + 3 * 8 + 6 + 2 + 2);
    Random random(30);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        for (const Flush flush : {Flush::kEnd, Flush::kStart}) {
            for (const int32_t length : {1, 2, 3, 8, 40}) {
                check(call_without_target(format, 1, length, 7, 9), random, flush);
                check(call_without_target(format, length, 1, 9, 7), random, flush);
                check(call_without_target(format, length, length, length, length), random, flush);
                check(call_without_target(format, length, length, 3 * length, 3 * length), random,
                      flush);
            }
        }
    }
}

TEST(Bilinear, ClippingOnTheRightBlendsTheEdgeColumnsToo) {
    constexpr int32_t kW = 6, kH = 5;
    Random random(31);
    const auto src = random.bytes(kW * kH * 4 + 4);
    std::vector<uint8_t> dst(5 * kH * 4);
    const ovrin_resize_target target = packed_target(nullptr, 7, kW, kH, 5, kH);
    ov_bilinear_sg(src.data(), dst.data(), kW, kH, kW, kH, 7, &target);
    const size_t at = 4 * 4;
    EXPECT_EQ(dst[at], (9 * src[at] + 3 * src[at + 4] + 3 * src[at + 24] + src[at + 28]) / 16);
}

TEST(Bilinear, ClippingBelowBlendsTheEdgeColumnsAndKeepsTheNumberOfEdgeRows) {
    constexpr int32_t kW = 6, kH = 6;
    Random random(32);
    const auto src = random.bytes(kW * kH * 4 + 4);
    std::vector<uint8_t> dst(kW * 5 * 4);
    const ovrin_resize_target target = packed_target(nullptr, 8, kW, kH, kW, 5);
    ov_bilinear_sg(src.data(), dst.data(), kW, kH, kW, kH, 8, &target);
    // Columns 4 and 5 of row 2, the last row that is blended downwards: also to the right.
    for (size_t x : {4U, 5U}) {
        const size_t at = (2 * kW + x) * 4;
        EXPECT_EQ(dst[at], (9 * src[at] + 3 * src[at + 4] + 3 * src[at + 24] + src[at + 28]) / 16);
    }
    // Rows 3 and 4 are the last two that are left.
    for (size_t y : {3U, 4U}) {
        const size_t at = (y * kW + 1) * 4;
        EXPECT_EQ(dst[at], (3 * src[at] + src[at + 4]) / 4);
    }
}

// Half of 64 rows are edge rows; ten rows are left of the picture, and all are edge rows.
TEST(Bilinear, MoreEdgeRowsThanRowsBlendEveryRowHorizontally) {
    Random random(33);
    const auto src = random.bytes(5 * 4);
    const std::vector<uint8_t> chroma(64);
    std::vector<uint8_t> dst(5 * 10 + 6 * 5);
    const ovrin_resize_target target = packed_target(chroma.data(), 19, 5, 4, 5, 10);
    ov_bilinear_sg(src.data(), dst.data(), 5, 4, 5, 64, 19, &target);
    for (size_t y = 0; y < 10; ++y) {
        for (size_t x = 0; x < 5; ++x) {
            EXPECT_EQ(dst[y * 5 + x], (3 * src[x] + src[x + 1]) / 4) << x << ", " << y;
        }
    }
    for (size_t i = 50; i < dst.size(); ++i) EXPECT_EQ(dst[i], 0);
}

TEST(Bilinear, ARectangleBesideTheCanvasLeavesItBlack) {
    Random random(34);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        for (const int32_t offset : {10, 11, 25}) {
            BilinearCall call = call_without_target(format, 6, 6, 9, 9);
            call.with_target = true;
            call.g.canvas_width = call.g.canvas_height = 10;
            call.g.dst_x = offset;
            check(call, random);
            call.g.dst_x = 0;
            call.g.dst_y = offset;
            check(call, random);
        }
    }
}

TEST(Bilinear, TheCanvasOutsideTheRectangleIsBlack) {
    constexpr int32_t kCanvasW = 11, kCanvasH = 9;
    const std::vector<uint8_t> white(200, 255);
    for (const int32_t format : kFormats) {
        ovrin_resize_target target = packed_target(white.data(), format, 4, 4, kCanvasW, kCanvasH);
        target.dst_x = 3;
        target.dst_y = 2;
        std::vector<uint8_t> dst(
            canvas_bytes(reference::packed_geometry(0, 0, kCanvasW, kCanvasH, format)), 0xEE);
        ov_bilinear_sg(white.data(), dst.data(), 4, 4, 5, 4, format, &target);
        const size_t bpp = reference::is_four_channel(format) ? 4 : 1;
        for (size_t y = 0; y < kCanvasH; ++y) {
            for (size_t x = 0; x < kCanvasW; ++x) {
                const bool inside = x >= 3 && x < 8 && y >= 2 && y < 6;
                for (size_t n = 0; n < bpp; ++n) {
                    EXPECT_EQ(dst[(y * kCanvasW + x) * bpp + n], inside ? 255 : 0)
                        << format << ": " << x << ", " << y;
                }
            }
        }
        // Chroma starts at column 1 and row 1 of its plane, 3 wide and 2 high.
        for (size_t i = kCanvasW * kCanvasH * bpp; i < dst.size(); ++i) {
            const size_t at = i - kCanvasW * kCanvasH * bpp;
            const size_t row = reference::is_planar(format) ? at / 6 % 5 : at / 12;
            const size_t column = reference::is_planar(format) ? at % 6 : at % 12 / 2;
            const bool inside = column >= 1 && column < 4 && row >= 1 && row < 3;
            EXPECT_EQ(dst[i], inside ? 255 : 128) << format << ": " << column << ", " << row;
        }
    }
}

// Pictures in the corner that reach only one of the far edges, or none, or both.
TEST(Bilinear, FarEdgesThatAreNotReachedAreBlack) {
    Random random(48);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        for (const int32_t wider : {0, 1, 2, 9}) {
            for (const int32_t higher : {0, 1, 2, 9}) {
                BilinearCall call = call_without_target(format, 9, 7, 12, 10);
                call.with_target = true;
                call.g.canvas_width = 12 + wider;
                call.g.canvas_height = 10 + higher;
                check(call, random);
            }
        }
    }
}

TEST(Bilinear, PlanarChromaColumnsRoundUp) {
    std::vector<uint8_t> src(12 * 12 + 36 + 36 + 64);
    for (size_t i = 0; i < 72; ++i) src[144 + i] = static_cast<uint8_t>(i % 6 * 16);
    const auto dst = draw(2, src, 12, 12, 8, 8);
    // Luma column 2 lies at source column 3: chroma column 2, with a weight of a quarter.
    EXPECT_EQ(dst[64 + 1], (3 * 32 + 48) / 4);
    EXPECT_EQ(dst[64 + 16 + 1], (3 * 32 + 48) / 4);
}

TEST(Bilinear, SemiPlanarChromaColumnsRoundDown) {
    std::vector<uint8_t> src(12 * 12 + 72 + 64);
    for (size_t i = 0; i < 72; ++i) src[144 + i] = static_cast<uint8_t>(i % 12 * 16);
    const auto dst = draw(18, src, 12, 12, 8, 8);
    EXPECT_EQ(dst[64 + 2], (3 * 32 + 64) / 4);
    EXPECT_EQ(dst[64 + 3], (3 * 48 + 80) / 4);
}

TEST(Bilinear, PlanarEdgeColumnsReadTheirSecondTapALumaRowFurther) {
    Random random(35);
    const auto src = random.bytes(64 + 16 + 16 + 16);
    const auto dst = draw(2, src, 8, 8, 8, 8);
    for (const size_t plane : {64U, 80U}) {
        EXPECT_EQ(dst[plane + 3], (3 * src[plane + 3] + src[plane + 3 + 8]) / 4);
        EXPECT_EQ(
            dst[plane + 2],
            (9 * src[plane + 2] + 3 * src[plane + 3] + 3 * src[plane + 6] + src[plane + 7]) / 16);
        EXPECT_EQ(dst[plane + 15], (3 * src[plane + 15] + src[plane + 16]) / 4);
    }
}

TEST(Bilinear, SemiPlanarEdgesBlendPairs) {
    Random random(36);
    const auto src = random.bytes(64 + 32 + 16);
    const auto dst = draw(19, src, 8, 8, 8, 8);
    for (const size_t n : {64U, 65U}) {
        EXPECT_EQ(dst[n + 6], (3 * src[n + 6] + src[n + 14]) / 4);
        EXPECT_EQ(dst[n + 4],
                  (9 * src[n + 4] + 3 * src[n + 6] + 3 * src[n + 12] + src[n + 14]) / 16);
        EXPECT_EQ(dst[n + 24], (3 * src[n + 24] + src[n + 26]) / 4);
    }
}

TEST(Bilinear, PairedFormatCodesGiveTheSameBytes) {
    Random random(37);
    const auto src = random.bytes(4000);
    EXPECT_EQ(draw(7, src, 23, 17, 31, 9), draw(8, src, 23, 17, 31, 9));
    EXPECT_EQ(draw(18, src, 23, 17, 31, 9), draw(19, src, 23, 17, 31, 9));
}

TEST(Bilinear, RejectedFormatsWriteNothing) {
    const std::vector<uint8_t> src(64 * 1100 * 4);
    for (BilinearResize* resize : {ov_bilinear_sg, ov_bilinear, ov_bilinear_ex}) {
        for (const int32_t format : kRejectedFormats) {
            for (const int32_t dst_h : {5, 1100}) {
                std::vector<uint8_t> dst(8 * 1100 * 4, 0xEE);
                const std::vector<uint8_t> before = dst;
                resize(src.data(), dst.data(), 64, 1100, 8, dst_h, format, nullptr);
                EXPECT_EQ(dst, before) << format;
                // The target's format counts, not the argument.
                const ovrin_resize_target target =
                    packed_target(src.data(), format, 64, 1100, 8, dst_h);
                resize(src.data(), dst.data(), 64, 1100, 8, dst_h, 7, &target);
                EXPECT_EQ(dst, before) << format;
            }
        }
    }
}

TEST(Bilinear, ZeroSizesWriteNothing) {
    const ovrin_resize_target* const none = nullptr;
    for (BilinearResize* resize : {ov_bilinear_sg, ov_bilinear, ov_bilinear_ex}) {
        for (const int32_t format : kFormats) {
            for (int empty = 1; empty < 16; ++empty) {
                for (const int32_t size : {3, 1100}) {
                    GuardedBuffer<uint8_t> dst(0);
                    const GuardedBuffer<uint8_t> src(0);
                    const ovrin_resize_target target =
                        packed_target(src.data(), format, size, size, size, size);
                    for (const ovrin_resize_target* given : {&target, none}) {
                        resize(src.data(), dst.data(), empty & 1 ? 0 : size, empty & 2 ? 0 : size,
                               empty & 4 ? 0 : size, empty & 8 ? 0 : size, format, given);
                    }
                }
            }
        }
    }
}

// A table of that many entries cannot be had.
TEST(Bilinear, NegativeDestinationSizesWriteNothing) {
    for (BilinearResize* resize : {ov_bilinear_sg, ov_bilinear}) {
        for (const int32_t format : kFormats) {
            for (const int32_t negative : {-1, -7, -70000}) {
                GuardedBuffer<uint8_t> dst(0);
                const GuardedBuffer<uint8_t> src(0);
                resize(src.data(), dst.data(), 5, 5, negative, 5, format, nullptr);
                resize(src.data(), dst.data(), 5, 5, 5, negative, format, nullptr);
                resize(src.data(), dst.data(), 5, 5, negative, 1100, format, nullptr);
            }
        }
    }
}

// With a scale of 5/96 a multiply-add that rounds once instead of twice moves a quarter of the
// weights by one. Every blend of two bytes is tried at every column, so that this shows.
TEST(Bilinear, PositionsRoundTwice) {
    constexpr int32_t kSrc = 5, kDst = 96;
    const float scale = static_cast<float>(kSrc) / static_cast<float>(kDst);
    const reference::BilinearTable table = reference::bilinear_table(kSrc, kDst);
    int moved = 0;
    for (int32_t i = 0; i < kDst; ++i) {
        const auto k = static_cast<size_t>(i);
        const float f = std::fma(static_cast<float>(i), scale, -static_cast<float>(table.index[k]));
        moved += static_cast<int32_t>((static_cast<double>(f) + 0.25) * 4096.0) != table.weight[k];
    }
    EXPECT_GE(moved, 20);

    std::vector<uint8_t> src;
    for (int left = 0; left < 256; ++left) {
        for (int x = 0; x < kSrc; ++x) src.push_back(static_cast<uint8_t>(x % 2 == 0 ? left : 255));
    }
    src.resize(src.size() + 6 * 128 + 16);
    std::vector<uint8_t> expected(kDst * 256 + kDst * 128);
    reference::BilinearSource source = reference::contiguous_source(src.data(), kSrc, 256);
    reference::bilinear_single(reference::packed_geometry(kSrc, 256, kDst, 256, 18), kSrc, 256,
                               kDst, 256, source, expected);
    EXPECT_EQ(draw(18, src, kSrc, 256, kDst, 256), expected);
}
