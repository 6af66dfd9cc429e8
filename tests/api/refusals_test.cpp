// SPDX-License-Identifier: Apache-2.0
// Arguments that a function turns down, and records that only a caller would make.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <cstring>
#include <vector>

#include "support/random.h"

using namespace ovrin_test;

namespace {

using Bytes = std::vector<uint8_t>;

constexpr uint8_t kOld = 0xEE;

bool untouched(const Bytes& bytes) {
    return bytes == Bytes(bytes.size(), kOld);
}

ovrin_resize_target target_for(int32_t src_w, int32_t src_h, int32_t canvas_w, int32_t canvas_h) {
    ovrin_resize_target target = {};
    target.src_width = target.src_stride = src_w;
    target.src_height = src_h;
    target.format = 7;
    target.canvas_width = canvas_w;
    target.canvas_height = canvas_h;
    return target;
}

}  // namespace

TEST(Refusals, LanczosInBandsWritesNothingForEmptySizes) {
    const Bytes src(100 * 9 * 4);
    Bytes dst(100 * 6 * 4, kOld);
    const int32_t sizes[][4] = {{0, 9, 6, 4}, {-1, 9, 6, 4}, {9, 0, 6, 4}, {9, -1, 6, 4},
                                {9, 9, 0, 4}, {9, 9, -1, 4}, {9, 9, 6, 0}, {9, 9, 6, -1}};
    for (const auto& [src_w, src_h, dst_w, bytes_per_pixel] : sizes) {
        ovrin_resize_lanczos(src.data(), dst.data(), src_w, src_h, dst_w, 100, bytes_per_pixel);
    }
    ovrin_resize_lanczos(src.data(), dst.data(), 9, 9, 6, 0, 4);
    ovrin_resize_lanczos(src.data(), nullptr, 9, 9, 6, 100, 4);
    EXPECT_TRUE(untouched(dst));
}

TEST(Refusals, LanczosWritesNothingWhenRowsAreShorterThanTheirPixels) {
    Bytes src(64), dst(64, kOld);
    const lanczos_image from = {4, 4, 15, 4, src.data()};
    const lanczos_image to = {4, 4, 16, 4, dst.data()};
    OvTransformLanczos(&from, &to);
    EXPECT_TRUE(untouched(dst));
}

TEST(Refusals, LanczosWritesNothingWhenARowHasMoreBytesThan32BitsCount) {
    const Bytes src(64);
    Bytes dst(64, kOld);
    ov_lanczos(src.data(), INT32_MAX, 1, dst.data(), 4, 4, 2);
    ov_lanczos(src.data(), 4, 4, dst.data(), INT32_MAX, 1, 2);
    EXPECT_TRUE(untouched(dst));
}

TEST(Refusals, LanczosWithoutAPictureOnEitherSideWritesNothing) {
    const Bytes src(64);
    Bytes dst(64, kOld);
    ov_lanczos_nv(nullptr, 4, 4, dst.data(), 4, 4);
    ov_lanczos_nv(src.data(), 4, 4, nullptr, 4, 4);
    EXPECT_TRUE(untouched(dst));
}

// The arguments name a size, the record behind them has none.
TEST(Refusals, BilinearWritesNothingWhenTheTargetsSourceIsEmpty) {
    const Bytes src(64);
    for (const int32_t rows : {4, 1024}) {
        Bytes dst(static_cast<size_t>(rows) * 4 * 4, kOld);
        for (const auto& [w, h] : {std::pair<int32_t, int32_t>{0, 4}, {4, 0}}) {
            const ovrin_resize_target target = target_for(w, h, 4, rows);
            for (auto* resize : {ov_bilinear_sg, ov_bilinear}) {
                resize(src.data(), dst.data(), 4, 4, 4, rows, 7, &target);
            }
        }
        EXPECT_TRUE(untouched(dst));
    }
}

// Each pass fills the target's canvas and reads the target's source from what the last one left, so
// intermediate pictures are as large as the canvas, though the source is smaller.
TEST(Refusals, ACanvasLargerThanTheSourceFitsIntermediatePictures) {
    const Bytes src = Random(171).bytes(18 * 16 * 4);
    const ovrin_resize_target target = target_for(16, 16, 40, 30);
    Bytes half(40 * 30 * 4), expected(40 * 30 * 4, kOld), dst = expected;
    ov_bilinear(src.data(), half.data(), 16, 16, 8, 8, 7, &target);
    ov_bilinear(half.data(), expected.data(), 8, 8, 4, 4, 7, &target);
    ov_bilinear_ex(src.data(), dst.data(), 16, 16, 4, 4, 7, &target);
    EXPECT_TRUE(dst == expected);
    EXPECT_FALSE(untouched(dst));
}

TEST(Refusals, ABilinearBandWithoutPixelBytesHasPackedRows) {
    const Bytes src = Random(172).bytes(5 * 4 * 4);
    const int32_t index[] = {0, 1, 2, 3};
    const int32_t weight[] = {0, 0, 0, 0};
    Bytes packed;
    for (const int32_t bpp : {4, 0}) {
        Bytes dst(4 * 4 * 4, kOld);
        ovrin_bilinear_band band = {};
        band.src_width = band.src_height = 4;
        band.dst_w = band.dst_h = band.end_row = band.canvas_width = 4;
        band.src = src.data();
        band.dst = dst.data();
        band.format = 7;
        band.col_weight = band.row_weight = weight;
        band.col_index = band.row_index = index;
        band.bpp = bpp;
        band.src_pitch = bpp == 0 ? 999 : 16;
        _ov_bilinear_tp(&band);
        if (packed.empty()) packed = dst;
        EXPECT_TRUE(dst == packed);
        EXPECT_FALSE(untouched(dst));
    }
}

// A record may send the samples of left and right columns, and of top and bottom rows, to places of
// their own; no walk makes one, but its four indices are the caller's to set.
TEST(Refusals, ABandAddsEachColumnsSamplesWhereItsIndexSays) {
    const Bytes src = Random(173).bytes(5 * 4 * 4);
    const int32_t places[][2] = {{8, 8}, {0, 8}, {8, 0}};
    for (const auto& [top_right, bottom_right] : places) {
        std::vector<uint32_t> dst(16);
        ovrin_rgba_band band = {};
        band.src_w = band.src_stride = 5;
        band.src_h = band.src_rows = band.rows_to_do = 4;
        band.dst_w = band.dst_h = 2;
        band.di_13 = top_right;
        band.di_33 = bottom_right;
        band.src = src.data();
        band.dst = dst.data();
        _resize_rgba8888_tp(&band);

        constexpr int kColumns[2][2] = {{0, 3}, {1, 4}};  // the left ones, then the right ones
        Bytes bytes(dst.size() * 4), expected(bytes.size());
        memcpy(bytes.data(), dst.data(), bytes.size());
        for (int i = 0; i < 64; ++i) {
            const int byte = i % 4, column = i / 4 % 2, row = i / 8 % 2;
            const int right = i / 16 % 2, bottom = i / 32;
            const int place = right == 0 ? 0 : bottom == 0 ? top_right : bottom_right;
            const int from = ((2 * row + bottom) * 5 + kColumns[right][column]) * 4 + byte;
            uint8_t& sum = expected[static_cast<size_t>((place + 2 * row + column) * 4 + byte)];
            sum = static_cast<uint8_t>(sum + (src[static_cast<size_t>(from)] >> 2));
        }
        EXPECT_EQ(bytes, expected) << top_right << ", " << bottom_right;
    }
}
