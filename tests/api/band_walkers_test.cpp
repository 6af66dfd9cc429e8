// SPDX-License-Identifier: Apache-2.0
// The functions that move a band record over one band without touching pixels.
#include "reference/band_walkers.h"

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include "reference/bands.h"
#include "support/bands.h"
#include "support/pictures.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

// A record before its first band. Only what a walker reads is set; the rest, the points and the
// record's own sizes included, hold marks. Offsets move on from any value.
ovrin_rgba_band first_rgba(int32_t band_rows, int32_t stride) {
    auto band = marked_record<ovrin_rgba_band>();
    reference::start_at_the_top(band);
    band.src_offset = -7001;
    band.band_rows = band_rows;
    band.src_stride = stride;
    return band;
}

template <class Band>
Band first_of_planes(int32_t band_rows, int32_t src_row_bytes) {
    auto band = marked_record<Band>();
    reference::start_at_the_top(band);
    band.src_y_offset = -7001;
    band.*reference::kChromaFields<Band>.src_offset = -9001;
    band.band_rows = band_rows;
    band.src_row_bytes = src_row_bytes;
    return band;
}
constexpr auto first_yuv = first_of_planes<ovrin_yuv_band>;
constexpr auto first_nv21 = first_of_planes<ovrin_nv21_band>;

// Walks the library's record and the replayed one side by side, past the end of the picture.
template <class Band, class Walk, class Replay>
void chain(Band band, const Sizes& s, Walk walk, Replay replay) {
    SCOPED_TRACE(describe(s));
    SCOPED_TRACE(::testing::Message() << "bands of " << band.band_rows);
    Band expected = band;
    const int32_t steps = band.band_rows > 0 ? s.src_h / band.band_rows + 3 : 3;
    for (int32_t step = 0; step < steps; ++step) {
        walk(band);
        replay(expected);
        ASSERT_TRUE(same_record(band, expected)) << "after step " << step;
    }
}

void chain_rgba(const Sizes& s, int32_t band_rows, int32_t stride) {
    chain(
        first_rgba(band_rows, stride), s,
        [&](ovrin_rgba_band& band) {
            ovrin_resize_rgba8888_get_pos(s.src_w, s.src_h, s.dst_w, s.dst_h, &band);
        },
        [&](ovrin_rgba_band& band) {
            reference::rgba8888_get_pos(s.src_w, s.src_h, s.dst_w, s.dst_h, band);
        });
}

void chain_keep_ratio(const Sizes& s, int32_t band_rows, int32_t stride, int32_t canvas_w) {
    chain(
        first_rgba(band_rows, stride), s,
        [&](ovrin_rgba_band& band) {
            ovrin_resize_rgba8888_get_pos_keep_ratio(s.src_w, s.src_h, s.dst_w, s.dst_h, canvas_w,
                                                     -77, &band);
        },
        [&](ovrin_rgba_band& band) {
            reference::rgba8888_get_pos_keep_ratio(s.src_h, s.dst_h, canvas_w, band);
        });
}

void chain_yuv(const Sizes& s, const ovrin_yuv_band& first) {
    chain(
        first, s,
        [&](ovrin_yuv_band& band) {
            ovrin_resize_yuv420_get_pos(-77, s.src_h, s.dst_w, s.dst_h, &band);
        },
        [&](ovrin_yuv_band& band) { reference::yuv420_get_pos(s.src_h, s.dst_w, s.dst_h, band); });
}

void chain_nv21(const Sizes& s, const ovrin_nv21_band& first) {
    chain(
        first, s,
        [&](ovrin_nv21_band& band) {
            ovrin_resize_nv21_get_pos(s.src_w, s.src_h, s.dst_w, s.dst_h, &band);
        },
        [&](ovrin_nv21_band& band) {
            reference::nv21_get_pos(s.src_w, s.src_h, s.dst_w, s.dst_h, band);
        });
}

// A picture and bands as a driver cuts them, or of any height.
struct Walked {
    Sizes sizes;
    int32_t band_rows, stride;
};

Walked random_walked(Random& random) {
    const Sizes s = {random.awkward_size(), random.pick({random.awkward_size(), 1024, 1100, 1999}),
                     random.awkward_size(),
                     random.pick({random.awkward_size(), random.between(1, 1200), 512})};
    const auto rows = static_cast<int32_t>(reference::band_height(s.src_h, s.dst_h));
    return {s, random.pick({rows, rows, random.between(1, 100)}),
            s.src_w + random.pick({0, 0, 1, random.between(0, 50)})};
}

}  // namespace

TEST(BandWalkers, ChainsOverRgba) {
    Random random(100);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(2000) && !HasFatalFailure(); ++i) {
        const Walked w = random_walked(random);
        chain_rgba(w.sizes, w.band_rows, w.stride);
    }
}

TEST(BandWalkers, ChainsOverRgbaInACanvas) {
    Random random(101);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(2000) && !HasFatalFailure(); ++i) {
        const Walked w = random_walked(random);
        chain_keep_ratio(w.sizes, w.band_rows, w.stride, w.sizes.dst_w + random.between(0, 40));
    }
}

TEST(BandWalkers, ChainsOverPlanarYuv) {
    Random random(102);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(2000) && !HasFatalFailure(); ++i) {
        const Walked w = random_walked(random);
        chain_yuv(w.sizes, first_yuv(w.band_rows, w.stride));
    }
}

TEST(BandWalkers, ChainsOverNv21) {
    Random random(103);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(2000) && !HasFatalFailure(); ++i) {
        const Walked w = random_walked(random);
        chain_nv21(w.sizes, first_nv21(w.band_rows, w.stride));
    }
}

TEST(BandWalkers, EverySmallHeightAndBand) {
    const int32_t limit = rounds(10) < 10 ? 7 : 14;
    for (int32_t src_h = 1; src_h <= limit; ++src_h) {
        for (int32_t dst_h = 1; dst_h <= limit; ++dst_h) {
            for (int32_t rows = 1; rows <= limit && !HasFatalFailure(); ++rows) {
                const Sizes s = {5, src_h, 6, dst_h};
                chain_rgba(s, rows, 9);
                chain_keep_ratio(s, rows, 9, 11);
                chain_yuv(s, first_yuv(rows, 9));
                chain_nv21(s, first_nv21(rows, 9));
            }
        }
    }
}

// A record's points are not read before its first row, its other running fields are: here the
// indices start elsewhere: together, each for itself, or one, or both right ones, apart from the
// others.
TEST(BandWalkers, IndicesAreTakenFromTheRecord) {
    Random random(104);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(500) && !HasFatalFailure(); ++i) {
        const Walked w = random_walked(random);
        int32_t start = random.between(0, 100000);
        const auto next = [&] { return i % 4 == 0 ? start += random.between(1, 9) : start; };
        auto yuv = first_yuv(w.band_rows, w.stride);
        auto nv21 = first_nv21(w.band_rows, w.stride);
        const auto move_indices = [&](auto& band, const auto& plane) {
            for (const auto index :
                 {plane.top_left, plane.top_right, plane.bottom_left, plane.bottom_right}) {
                band.*index = next();
            }
            if (i % 4 == 1) {
                band.*random.pick({plane.top_left, plane.top_right, plane.bottom_left,
                                   plane.bottom_right}) += 1;
            }
            if (i % 4 == 2) band.*plane.top_right = band.*plane.bottom_right += 5;
        };
        move_indices(yuv, reference::kLumaFields<ovrin_yuv_band>);
        move_indices(yuv, reference::kChromaFields<ovrin_yuv_band>);
        move_indices(nv21, reference::kLumaFields<ovrin_nv21_band>);
        move_indices(nv21, reference::kChromaFields<ovrin_nv21_band>);
        chain_yuv(w.sizes, yuv);
        chain_nv21(w.sizes, nv21);
    }
}

TEST(BandWalkers, NoRowsMoveNothing) {
    for (const int32_t rows : {0, -1, -5, INT32_MIN}) {
        for (const Sizes& s : {Sizes{5, 100, 6, 33}, Sizes{5, 100, 6, 200}}) {
            chain_rgba(s, rows, 9);
            chain_keep_ratio(s, rows, 9, 11);
            chain_yuv(s, first_yuv(rows, 9));
            chain_nv21(s, first_nv21(rows, 9));
        }
    }
}

// Ratios of 2: a band of 32 rows completes 16 destination rows.
TEST(BandWalkers, RgbaFieldsAfterOneBand) {
    auto band = first_rgba(32, 100);
    band.src_offset = 0;
    auto in_canvas = band;
    ovrin_resize_rgba8888_get_pos(80, 1024, 40, 512, &band);
    EXPECT_EQ(band.start_row, 32);
    EXPECT_EQ(band.row_acc, 32 * 512);
    EXPECT_EQ(band.row_q1, 256 + 16 * 1024);
    EXPECT_EQ(band.row_q3, 768 + 16 * 1024);
    for (const int32_t index : {band.di_11, band.di_13, band.di_31, band.di_33}) {
        EXPECT_EQ(index, 16 * 40);
    }
    EXPECT_EQ(band.src_offset, 32 * 80 * 4);
    EXPECT_EQ(band.rows_to_do, 32);

    ovrin_resize_rgba8888_get_pos_keep_ratio(80, 1024, 40, 512, 50, 0, &in_canvas);
    for (const int32_t index :
         {in_canvas.di_11, in_canvas.di_13, in_canvas.di_31, in_canvas.di_33}) {
        EXPECT_EQ(index, 16 * 50);  // canvas rows
    }
    EXPECT_EQ(in_canvas.src_offset, 32 * 100 * 4);  // the record's row length
}

TEST(BandWalkers, ABandBeyondTheSourceHasNoRows) {
    auto rgba = first_rgba(32, 9);
    auto canvas = first_rgba(32, 9);
    auto yuv = first_yuv(32, 9);
    auto nv21 = first_nv21(32, 9);
    for (const int32_t expected : {32, 32, 0, 0}) {  // up to row 32, 64, 96 and 128 of 80
        ovrin_resize_rgba8888_get_pos(5, 80, 6, 33, &rgba);
        ovrin_resize_rgba8888_get_pos_keep_ratio(5, 80, 6, 33, 9, 90, &canvas);
        ovrin_resize_yuv420_get_pos(5, 80, 6, 33, &yuv);
        ovrin_resize_nv21_get_pos(5, 80, 6, 33, &nv21);
        EXPECT_EQ(rgba.rows_to_do, expected);
        EXPECT_EQ(canvas.rows_to_do, expected);
        EXPECT_EQ(yuv.y_rows, expected);
        EXPECT_EQ(nv21.y_rows, expected);
    }
    EXPECT_EQ(yuv.y_start_row, 128);
    // A band that ends with the picture is not beyond it.
    auto exact = first_yuv(40, 9);
    ovrin_resize_yuv420_get_pos(5, 80, 6, 33, &exact);
    ovrin_resize_yuv420_get_pos(5, 80, 6, 33, &exact);
    EXPECT_EQ(exact.y_rows, 40);
}

// 80 rows have 40 rows of chroma. Bands of 100 luma rows walk 25 chroma rows each: the second one
// passes the end and keeps what lies before it, the third one has nothing left.
TEST(BandWalkers, AChromaBandBeyondThePlaneIsCut) {
    auto yuv = first_yuv(100, 9);
    auto nv21 = first_nv21(100, 9);
    for (const int32_t expected : {25, 15, 0}) {
        ovrin_resize_yuv420_get_pos(5, 80, 6, 16, &yuv);  // 8 chroma rows: every 5 rows a clean one
        ovrin_resize_nv21_get_pos(5, 80, 6, 16, &nv21);
        EXPECT_EQ(yuv.uv_rows, expected);
        EXPECT_EQ(nv21.vu_rows, expected);
        EXPECT_EQ(yuv.y_rows, 0);  // luma beyond the picture is not cut but dropped
    }
    EXPECT_EQ(yuv.uv_start_row, 75);
    EXPECT_EQ(nv21.vu_start_row, 75);
}

// A chroma band is a quarter of its luma band's rows, not half of them.
TEST(BandWalkers, AChromaBandIsAQuarterOfItsLumaBand) {
    for (const int32_t rows : {32, 33, 34, 35, 36, 61, 62}) {
        auto yuv = first_yuv(rows, 64);
        auto nv21 = first_nv21(rows, 64);
        ovrin_resize_yuv420_get_pos(64, 1024, 64, 1024, &yuv);  // every row a clean one
        ovrin_resize_nv21_get_pos(64, 1024, 64, 1024, &nv21);
        EXPECT_EQ(yuv.uv_rows, (rows + 3) / 4);
        EXPECT_EQ(nv21.vu_rows, (rows + 3) / 4);
    }
}

// 512 chroma rows onto 160, a ratio of 3.2: after 12 rows one destination row is half done. Planar
// bands go on to the next clean row, NV21 bands to the end of the plane.
TEST(BandWalkers, AChromaBandIsLengthenedDifferently) {
    auto yuv = first_yuv(45, 64);
    auto nv21 = first_nv21(45, 64);
    ovrin_resize_yuv420_get_pos(64, 1024, 64, 320, &yuv);
    ovrin_resize_nv21_get_pos(64, 1024, 64, 320, &nv21);
    const auto clean = [](int32_t rows) {
        ovrin_yuv_band band = first_yuv(0, 64);
        reference::Walk walk =
            reference::start_walk(band, reference::kChromaFields<ovrin_yuv_band>, 512);
        for (int32_t row = 0; row < rows; ++row) reference::pass_row(walk, {512, 160, 32});
        return walk.clean();
    };
    ASSERT_FALSE(clean(12));
    ASSERT_TRUE(clean(13));
    EXPECT_EQ(yuv.uv_rows, 13);
    EXPECT_EQ(nv21.vu_rows, 512);
    EXPECT_EQ(nv21.vu_start_row, 512);
    ovrin_resize_yuv420_get_pos(64, 1024, 64, 320, &yuv);
    ovrin_resize_nv21_get_pos(64, 1024, 64, 320, &nv21);
    EXPECT_GT(yuv.uv_rows, 0);
    EXPECT_EQ(nv21.vu_rows, 0);
}

// Both walk the quarter in rows of src_row_bytes; the stretch after it goes in the same rows for
// planar bands, in rows of the picture's width for NV21 bands.
TEST(BandWalkers, TheChromaOffsetIsSteppedByDifferentLengths) {
    auto yuv = first_yuv(45, 101);
    auto nv21 = first_nv21(45, 101);
    yuv.src_uv_offset = nv21.src_vu_offset = 0;
    yuv.src_y_offset = nv21.src_y_offset = 0;
    ovrin_resize_yuv420_get_pos(63, 1024, 64, 320, &yuv);
    ovrin_resize_nv21_get_pos(63, 1024, 64, 320, &nv21);
    EXPECT_EQ(yuv.src_y_offset, 45 * 101);
    EXPECT_EQ(nv21.src_y_offset, 45 * 101);
    EXPECT_EQ(yuv.src_uv_offset, 13 * 51);
    EXPECT_EQ(nv21.src_vu_offset, 12 * 102 + 500 * 64);
}

// As a driver walks: one band less than there are, the last takes what is left.
TEST(BandWalkers, LumaRowsOfAllBandsButTheLastAddUpToItsStart) {
    for (const auto& [src_h, dst_h] :
         {std::pair{1024, 512}, {1100, 333}, {2000, 1999}, {1500, 4000}}) {
        const auto rows = static_cast<int32_t>(reference::band_height(src_h, dst_h));
        const auto bands = static_cast<int32_t>(reference::band_count(src_h, dst_h));
        auto yuv = first_yuv(rows, 64);
        auto nv21 = first_nv21(rows, 64);
        int32_t yuv_sum = 0, nv21_sum = 0;
        for (int32_t band = 1; band < bands; ++band) {
            ovrin_resize_yuv420_get_pos(64, src_h, 30, dst_h, &yuv);
            ovrin_resize_nv21_get_pos(64, src_h, 30, dst_h, &nv21);
            yuv_sum += yuv.y_rows;
            nv21_sum += nv21.y_rows;
        }
        EXPECT_EQ(yuv_sum, yuv.y_start_row);
        EXPECT_EQ(nv21_sum, nv21.y_start_row);
        EXPECT_EQ(yuv_sum, (bands - 1) * rows);
    }
}

// At the end of the picture every luma index has moved on by all destination rows of the grid.
TEST(BandWalkers, TheIndicesEndOnTheLastRow) {
    for (const int32_t dst_h : {100, 128, 33}) {
        auto rgba = first_rgba(16, 9);
        auto canvas = first_rgba(16, 9);
        auto yuv = first_yuv(16, 9);
        auto nv21 = first_nv21(16, 9);
        for (int32_t row = 0; row < 128; row += 16) {
            ovrin_resize_rgba8888_get_pos(9, 128, 30, dst_h, &rgba);
            ovrin_resize_rgba8888_get_pos_keep_ratio(9, 128, 30, dst_h, 41, 500, &canvas);
            ovrin_resize_yuv420_get_pos(9, 128, 30, dst_h, &yuv);
            ovrin_resize_nv21_get_pos(9, 128, 30, dst_h, &nv21);
        }
        for (const int32_t index : {rgba.di_11, rgba.di_13, rgba.di_31, rgba.di_33}) {
            EXPECT_EQ(index, 30 * dst_h);
        }
        for (const int32_t index : {canvas.di_11, canvas.di_13, canvas.di_31, canvas.di_33}) {
            EXPECT_EQ(index, 41 * dst_h);
        }
        for (const int32_t index : {yuv.y_top_left, yuv.y_top_right, yuv.y_bottom_left,
                                    yuv.y_bottom_right, nv21.y_top_left, nv21.y_bottom_right}) {
            EXPECT_EQ(index, 32 * dst_h);
        }
    }
}
