// SPDX-License-Identifier: Apache-2.0
// Every pair of a source and a destination length of up to 256, along either axis, by every
// sampling rule: rows and columns of one sample's thickness, through the public functions.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <memory>

#include "exhaustive/every.h"
#include "reference/bilinear.h"
#include "reference/lanczos.h"
#include "reference/nearest.h"
#include "reference/yuv420.h"
#include "support/compare.h"
#include "support/pictures.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

constexpr int32_t kLimit = 256;

// check(source, destination) for rows and for columns of each pair of lengths.
template <class Check>
void every_pair(Check check) {
    const int32_t step = one_in();
    int32_t number = 0;
    for (int32_t from = 1; from <= kLimit; ++from) {
        for (int32_t to = 1; to <= kLimit; ++to) {
            if (++number % step != 0) continue;
            check(Sizes{from, 1, to, 1});
            check(Sizes{1, from, 1, to});
            if (::testing::Test::HasFatalFailure()) return;
        }
    }
}

size_t pixels(int32_t w, int32_t h) {
    return static_cast<size_t>(w) * static_cast<size_t>(h);
}

// Random bytes once: sources are their first ones.
const std::vector<uint8_t>& noise() {
    static const std::vector<uint8_t> bytes = Random(920).bytes(4 * 3 * (kLimit + 4));
    return bytes;
}

void expect_bytes(const std::vector<uint8_t>& actual, const std::vector<uint8_t>& expected,
                  const Sizes& s) {
    ASSERT_EQ(actual.size(), expected.size());
    ASSERT_TRUE(same_bytes(actual.data(), expected.data(), expected.size())) << describe(s);
}

struct Free {
    void operator()(float* table) const { free(table); }
};

}  // namespace

TEST(ExhaustiveAxes, QuarterPointsOfPixels) {
    every_pair([&](const Sizes& s) {
        std::vector<uint32_t> words(pixels(s.dst_w, s.dst_h));
        ovrin_resize_rgba8888_sg(noise().data(), words.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        std::vector<uint8_t> dst(words.size() * 4);
        memcpy(dst.data(), words.data(), dst.size());
        expect_bytes(
            dst, reference::quarter_packed(noise().data(), s.src_w, s.src_h, s.dst_w, s.dst_h, 4),
            s);
        dst.resize(words.size() * 3);
        ovrin_resize_rgb888(noise().data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        expect_bytes(
            dst, reference::quarter_packed(noise().data(), s.src_w, s.src_h, s.dst_w, s.dst_h, 3),
            s);
    });
}

TEST(ExhaustiveAxes, QuarterPointsOfPlanes) {
    every_pair([&](const Sizes& s) {
        std::vector<uint8_t> dst(bytes_of_i420(s.dst_w, s.dst_h));
        ovrin_resize_yuv420_sg(noise().data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        expect_bytes(dst,
                     reference::resize_yuv420(
                         reference::contiguous(reference::kI420, noise().data(), s.src_w, s.src_h),
                         s.dst_w, s.dst_h),
                     s);
    });
}

TEST(ExhaustiveAxes, QuarterPointsOfPairs) {
    every_pair([&](const Sizes& s) {
        std::vector<uint8_t> dst(bytes_of_nv21(s.dst_w, s.dst_h));
        ovrin_resize_nv21_sg(noise().data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        expect_bytes(dst,
                     reference::resize_yuv420(
                         reference::contiguous(reference::kNv21, noise().data(), s.src_w, s.src_h),
                         s.dst_w, s.dst_h),
                     s);
    });
}

TEST(ExhaustiveAxes, Nearest) {
    std::vector<uint32_t> src(noise().size() / 4);
    memcpy(src.data(), noise().data(), src.size() * 4);
    every_pair([&](const Sizes& s) {
        std::vector<uint32_t> dst(pixels(s.dst_w, s.dst_h), 0xEEEEEEEE);
        std::vector<uint32_t> expected = dst;
        ovrin_resize_nearest_rgba8888(src.data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
        reference::nearest(src.data(), expected, s.src_w, s.src_h, s.dst_w, s.dst_h);
        ASSERT_EQ(dst, expected) << describe(s);
    });
}

// Both what is blended and, in the edges, what is not.
TEST(ExhaustiveAxes, Bilinear) {
    for (const int32_t format : {2, 7, 18}) {
        every_pair([&](const Sizes& s) {
            const auto g = reference::packed_geometry(s.src_w, s.src_h, s.dst_w, s.dst_h, format);
            auto src = reference::contiguous_source(noise().data(), s.src_w, s.src_h);
            std::vector<uint8_t> dst(
                static_cast<size_t>(reference::luma_bytes(s.dst_w, s.dst_h, format) +
                                    reference::chroma_bytes(s.dst_w, s.dst_h, format)));
            std::vector<uint8_t> expected = dst;
            ov_bilinear_sg(noise().data(), dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, format,
                           nullptr);
            reference::bilinear_single(g, s.src_w, s.src_h, s.dst_w, s.dst_h, src, expected);
            expect_bytes(dst, expected, s);
        });
    }
}

// As a band with the definition's weights: the positions are the library's. (An entry would make
// the table of weights anew for each pair, which takes most of its time.)
TEST(ExhaustiveAxes, LanczosPositions) {
    const std::unique_ptr<float, Free> given(create_lanczos_lookup());
    ASSERT_NE(given, nullptr);
    const std::vector<float> table = reference::lanczos_table();
    every_pair([&](const Sizes& s) {
        const auto across = reference::lanczos_columns(table, s.src_w, s.dst_w);
        const auto down = reference::lanczos_rows(table, s.src_h, s.dst_h);
        std::vector<uint8_t> dst(pixels(s.dst_w, s.dst_h) * 2);
        ovrin_lanczos_band band = {};
        band.src_w = s.src_w;
        band.src_h = s.src_h;
        band.dst_w = s.dst_w;
        band.dst_h = s.dst_h;
        band.src = noise().data();
        band.dst = dst.data();
        band.bytes_per_pixel = 2;
        band.rows = s.dst_h;
        band.table = given.get();
        band.column_weights = across.taps.front().data();
        band.row_weights = down.taps.front().data();
        _resize_lanczos_tp(&band);
        // One axis at a time: the other has a single sample, at which all of its taps lie.
        std::vector<uint8_t> expected;
        for (size_t i = 0; i < across.at.size() * down.at.size(); ++i) {
            const bool rows = s.dst_w == 1 && s.src_w == 1;
            const auto& axis = rows ? down : across;
            const auto& other = rows ? across : down;
            const int32_t length = rows ? s.src_h : s.src_w;
            const auto sample = [&](size_t tap, int32_t k) {
                int32_t at = axis.at[i] - 3 + static_cast<int32_t>(tap);
                at = at < 0 ? 0 : at > length - 1 ? length - 1 : at;
                return noise()[static_cast<size_t>(at * 2 + k)];
            };
            for (int32_t k = 0; k < 2; ++k) {
                double sum = 0.0;
                for (size_t r = 0; r < 7; ++r) {
                    for (size_t c = 0; c < 7; ++c) {
                        const double weight = rows ? axis.taps[i][r] * other.taps[0][c]
                                                   : other.taps[0][r] * axis.taps[i][c];
                        sum = reference::fused_step(weight, sample(rows ? r : c, k), sum);
                    }
                }
                expected.push_back(reference::clip_to_byte(sum));
            }
        }
        expect_bytes(dst, expected, s);
    });
}
