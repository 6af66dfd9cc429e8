// SPDX-License-Identifier: Apache-2.0
// The functions that draw one band.
#include "reference/band_tasks.h"

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include "reference/bands.h"
#include "reference/keep_ratio_rgba.h"
#include "support/band_walk.h"
#include "support/bands.h"
#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/letterbox.h"
#include "support/pictures.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

using Task = decltype(_resize_rgba8888_tp);

// What a target holds before: four samples of at most 63 still fit each byte.
std::vector<uint8_t> small_bytes(Random& random, size_t count) {
    std::vector<uint8_t> bytes = random.bytes(count);
    for (uint8_t& byte : bytes) byte &= 3;
    return bytes;
}

std::vector<uint32_t> small_words(Random& random, size_t count) {
    std::vector<uint32_t> words(count);
    const auto bytes = small_bytes(random, count * 4);
    memcpy(words.data(), bytes.data(), bytes.size());
    return words;
}

// Heights that make a few bands; small ratios and enlargements included.
Sizes random_sizes(Random& random) {
    return {random.awkward_size(), random.pick({random.awkward_size(), random.between(64, 300)}),
            random.awkward_size(), random.pick({random.awkward_size(), random.between(1, 200)})};
}

int32_t random_band_rows(Random& random, const Sizes& s) {
    const auto rows = static_cast<int32_t>(reference::band_height(s.src_h, s.dst_h));
    return random.pick({rows, random.between(1, 50), s.src_h});
}

// ---- RGBA8888 ----

struct RgbaBand {
    GuardedPlane src;
    GuardedBuffer<uint32_t> dst;
    ovrin_rgba_band band;

    // Band `index` of the picture; with a canvas, `x` and `skip` words lie beside the picture.
    RgbaBand(Random& random, const Sizes& s, int32_t band_rows, int32_t index, int32_t stride,
             int32_t x, int32_t skip, Flush flush)
        : src(random, int64_t{s.src_w} * 4, s.src_h, int64_t{stride} * 4, flush),
          dst(small_words(random,
                          static_cast<size_t>((s.dst_h - 1) * (x + s.dst_w + skip) + x + s.dst_w)),
              flush),
          band(walk_to(marked_record<ovrin_rgba_band>(), s, band_rows, stride, x, skip, index)) {
        band.src = src.first();
        band.dst = dst.data();
    }
};

template <class Replay>
void check_rgba(Task* task, RgbaBand& made, Replay replay) {
    std::vector<uint32_t> expected = made.dst.copy();
    replay(made.band, expected.data());
    ovrin_rgba_band expected_band = made.band;
    expected_band.done = 1;
    task(&made.band);
    ASSERT_TRUE(same_record(made.band, expected_band));
    ASSERT_EQ(made.dst.copy(), expected);
    ASSERT_TRUE(made.dst.intact());
}

// ---- Planes ----

size_t grid_bytes(const Sizes& s) {
    const int32_t w = reference::grid_side(s.dst_w);
    const int32_t h = reference::grid_side(s.dst_h);
    return static_cast<size_t>(w * h + w * h / 2);
}

bool fits_grid(const Sizes& s) {
    return s.dst_w % 4 == 0 && s.dst_h % 4 == 0;
}

// The record of band `index` of a picture in planes, with marks where a task should not look.
template <class Band>
Band marked_band(const Sizes& s, int32_t band_rows, int32_t stride, int32_t index) {
    return walk_to(marked_record<Band>(), s, band_rows, stride, index);
}

// Runs the task; `target` is the buffer that it must add into, `expected` what that must hold.
template <class Band>
void run_task(Task* task, Band band, const GuardedBuffer<uint8_t>& target,
              const std::vector<uint8_t>& expected) {
    Band expected_band = band;
    expected_band.done = 1;
    task(&band);
    ASSERT_TRUE(same_record(band, expected_band));
    ASSERT_TRUE(same_bytes(target.data(), expected.data(), expected.size()));
    ASSERT_TRUE(target.intact());
}

// One band of each task over the same sizes, into the work buffer or the destination as is due.
void check_planes(Random& random, const Sizes& s, int32_t band_rows, int32_t index, int32_t stride,
                  Flush flush) {
    SCOPED_TRACE(describe(s, flush));
    SCOPED_TRACE(::testing::Message()
                 << "band " << index << " of " << band_rows << " rows, stride " << stride);
    GuardedBuffer<uint8_t> target(small_bytes(random, grid_bytes(s)), flush);
    const std::vector<uint8_t> before = target.copy();
    const auto aim = [&](auto& band) {
        (fits_grid(s) ? band.dst : band.work) = target.data();
        memcpy(target.data(), before.data(), before.size());
    };
    {
        SCOPED_TRACE("three planes");
        const Yuv420Picture src(reference::kI420, random, s.src_w, s.src_h, stride, flush);
        auto band = marked_band<ovrin_yuv_band>(s, band_rows, stride, index);
        band.src = src.view.y;
        band.src_u = src.view.chroma[0];
        band.src_v = src.view.chroma[1];
        aim(band);
        std::vector<uint8_t> expected = before;
        reference::resize_y_u_v_tp(band, expected.data());
        run_task(_resize_y_u_v_tp, band, target, expected);
        // A work buffer is preferred even where the destination would do.
        memcpy(target.data(), before.data(), before.size());
        band.dst = nullptr;
        band.work = target.data();
        run_task(_resize_y_u_v_tp, band, target, expected);
    }
    {
        SCOPED_TRACE("I420");
        const GuardedBuffer<uint8_t> src(random.bytes(bytes_of_i420(s.src_w, s.src_h)), flush);
        auto band = marked_band<ovrin_yuv_band>(s, band_rows, s.src_w, index);
        band.src = src.data();
        band.src_row_bytes = -5;  // the picture is packed
        aim(band);
        uint8_t unused[1];
        if (fits_grid(s)) band.work = unused;  // ... and its own destination is preferred
        std::vector<uint8_t> expected = before;
        reference::resize_yuv420_tp(band, expected.data());
        run_task(_resize_yuv420_tp, band, target, expected);
    }
    {
        SCOPED_TRACE("Y and VU");
        const Yuv420Picture src(reference::kNv21, random, s.src_w, s.src_h, stride, flush);
        // The stretch to the end of the plane is walked in packed rows, so that a band after it
        // starts beyond the plane and reads no chroma.
        auto band = marked_band<ovrin_nv21_band>(s, band_rows, stride, index);
        band.src = src.view.y;
        band.src_vu = src.view.chroma[0];
        aim(band);
        std::vector<uint8_t> expected = before;
        reference::resize_y_nv21_tp(band, expected.data());
        run_task(_resize_y_nv21_tp, band, target, expected);
        memcpy(target.data(), before.data(), before.size());
        band.dst = nullptr;
        band.work = target.data();
        run_task(_resize_y_nv21_tp, band, target, expected);
    }
    {
        SCOPED_TRACE("NV21");
        const GuardedBuffer<uint8_t> src(random.bytes(bytes_of_nv21(s.src_w, s.src_h)), flush);
        auto band = marked_band<ovrin_nv21_band>(s, band_rows, s.src_w, index);
        band.src = src.data();
        band.src_row_bytes = -5;
        aim(band);
        uint8_t unused[1];
        if (fits_grid(s)) band.work = unused;
        std::vector<uint8_t> expected = before;
        reference::resize_nv21_tp(band, expected.data());
        run_task(_resize_nv21_tp, band, target, expected);
    }
}

template <class Band>
Band whole_picture(const Sizes& s) {
    return marked_band<Band>(s, s.src_h, s.src_w, 0);
}

}  // namespace

TEST(BandTasks, RgbaAddsIntoWhatTheTargetHolds) {
    Random random(110);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(2000) && !HasFatalFailure(); ++i) {
        const Sizes s = random_sizes(random);
        const int32_t rows = random_band_rows(random, s);
        const int32_t index = random.between(0, (s.src_h - 1) / rows);
        const Flush flush = random.pick({Flush::kEnd, Flush::kStart});
        SCOPED_TRACE(describe(s, flush));
        SCOPED_TRACE(::testing::Message() << "band " << index << " of " << rows << " rows");
        RgbaBand packed(random, s, rows, index, s.src_w, 0, 0, flush);
        packed.band.src_stride = -5;  // the picture is packed and has no canvas
        packed.band.dst_x = packed.band.dst_skip = -5;
        check_rgba(_resize_rgba8888_tp, packed, reference::resize_rgba8888_tp);
        RgbaBand in_canvas(random, s, rows, index, random_stride(random, s.src_w),
                           random.between(0, 20), random.between(0, 20), flush);
        check_rgba(_resize_rgba8888_keep_ratio_tp, in_canvas,
                   reference::resize_rgba8888_keep_ratio_tp);
    }
}

TEST(BandTasks, PlanesAddIntoWhatTheTargetHolds) {
    Random random(111);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(2000) && !HasFatalFailure(); ++i) {
        Sizes s = random_sizes(random);
        if (i % 3 == 0) {
            s.dst_w = reference::grid_side(s.dst_w);
            s.dst_h = reference::grid_side(s.dst_h);
        }
        const int32_t rows = random_band_rows(random, s);
        check_planes(random, s, rows, random.between(0, (s.src_h - 1) / rows),
                     random_stride(random, s.src_w), random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST(BandTasks, EverySmallBandOfEveryRemainder) {
    Random random(112);
    SCOPED_TRACE(random.trace());
    const int32_t limit = rounds(10) < 10 ? 5 : 8;
    for (int32_t src_h = 1; src_h <= limit; ++src_h) {
        for (int32_t dst_h = 1; dst_h <= limit; ++dst_h) {
            for (int32_t rows = 1; rows <= src_h; ++rows) {
                for (int32_t index = 0; index <= (src_h - 1) / rows && !HasFatalFailure();
                     ++index) {
                    check_planes(random, {5, src_h, 1 + (src_h + dst_h) % 8, dst_h}, rows, index, 6,
                                 Flush::kEnd);
                }
            }
        }
    }
}

// A chain of bands from a cleared target gives the picture, whatever the band height.
TEST(BandTasks, AllBandsTogetherGiveTheWholePicture) {
    Random random(113);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(300) && !HasFatalFailure(); ++i) {
        const Sizes s = {random.awkward_size(), random.between(2, 200),
                         reference::grid_side(random.awkward_size()),
                         reference::grid_side(random.awkward_size())};
        const int32_t rows = random.between(1, s.src_h);
        SCOPED_TRACE(describe(s));
        SCOPED_TRACE(::testing::Message() << "bands of " << rows << " rows");
        const auto i420 = random.bytes(bytes_of_i420(s.src_w, s.src_h));
        const auto nv21 = random.bytes(bytes_of_nv21(s.src_w, s.src_h));
        const auto rgba =
            random.bytes(static_cast<size_t>(s.src_w) * static_cast<size_t>(s.src_h) * 4);
        std::vector<uint8_t> i420_out(grid_bytes(s)), nv21_out(grid_bytes(s));
        std::vector<uint32_t> rgba_out(static_cast<size_t>(s.dst_w * s.dst_h));
        for (int32_t index = 0; index * rows < s.src_h; ++index) {
            auto yuv_band = marked_band<ovrin_yuv_band>(s, rows, s.src_w, index);
            yuv_band.src = i420.data();
            yuv_band.dst = i420_out.data();
            _resize_yuv420_tp(&yuv_band);
            auto nv21_band = marked_band<ovrin_nv21_band>(s, rows, s.src_w, index);
            nv21_band.src = nv21.data();
            nv21_band.dst = nv21_out.data();
            _resize_nv21_tp(&nv21_band);
            RgbaBand made(random, s, rows, index, s.src_w, 0, 0, Flush::kEnd);
            made.band.src = rgba.data();
            made.band.dst = rgba_out.data();
            _resize_rgba8888_tp(&made.band);
        }
        ASSERT_EQ(i420_out,
                  reference::resize_yuv420(
                      reference::contiguous(reference::kI420, i420.data(), s.src_w, s.src_h),
                      s.dst_w, s.dst_h));
        ASSERT_EQ(nv21_out,
                  reference::resize_yuv420(
                      reference::contiguous(reference::kNv21, nv21.data(), s.src_w, s.src_h),
                      s.dst_w, s.dst_h));
        const auto packed =
            reference::quarter_packed(rgba.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, 4);
        ASSERT_TRUE(same_bytes(reinterpret_cast<const uint8_t*>(rgba_out.data()), packed.data(),
                               packed.size()));
    }
}

// Indices in the record say where samples go: all moved on by three rows, the band lands there.
TEST(BandTasks, SamplesGoWhereTheIndicesSay) {
    Random random(114);
    SCOPED_TRACE(random.trace());
    const Sizes s = {30, 20, 16, 12};
    const Yuv420Picture src(reference::kI420, random, s.src_w, s.src_h, s.src_w);
    for (const int32_t index : {0, 1}) {
        auto band = marked_band<ovrin_yuv_band>(s, 10, s.src_w, index);
        band.src = src.view.y;
        band.src_u = src.view.chroma[0];
        band.src_v = src.view.chroma[1];
        band.uv_rows = 0;
        for (int32_t ovrin_yuv_band::*to :
             {&ovrin_yuv_band::y_top_left, &ovrin_yuv_band::y_top_right,
              &ovrin_yuv_band::y_bottom_left, &ovrin_yuv_band::y_bottom_right}) {
            band.*to += 3 * 16;
        }
        GuardedBuffer<uint8_t> target(small_bytes(random, 16 * 15));
        std::vector<uint8_t> expected = target.copy();
        reference::resize_y_u_v_tp(band, expected.data());
        band.dst = target.data();
        run_task(_resize_y_u_v_tp, band, target, expected);
    }
}

TEST(BandTasks, WithoutRowsOnlyDoneIsSet) {
    for (const int32_t none : {0, -1, INT32_MIN}) {
        for (Task* task : {_resize_rgba8888_tp, _resize_rgba8888_keep_ratio_tp}) {
            auto band = marked_record<ovrin_rgba_band>();
            band.src_w = band.src_h = band.dst_w = band.dst_h = 8;
            band.rows_to_do = none;
            auto expected = band;
            expected.done = 1;
            task(&band);
            EXPECT_TRUE(same_record(band, expected));
        }
        uint8_t target[1];
        for (Task* task : {_resize_y_u_v_tp, _resize_yuv420_tp}) {
            auto band = whole_picture<ovrin_yuv_band>({8, 8, 8, 8});
            band.dst = target;
            band.y_rows = none;
            band.uv_rows = 0;
            auto expected = band;
            expected.done = 1;
            task(&band);
            EXPECT_TRUE(same_record(band, expected));
        }
        for (Task* task : {_resize_nv21_tp, _resize_y_nv21_tp}) {
            auto band = whole_picture<ovrin_nv21_band>({8, 8, 8, 8});
            band.dst = target;
            band.y_rows = none;
            band.vu_rows = 0;
            auto expected = band;
            expected.done = 1;
            task(&band);
            EXPECT_TRUE(same_record(band, expected));
        }
    }
}

namespace {

// There are rows to do, but the picture has no size on one side, or one that no grid can hold.
template <class Band>
void check_without_size(Task* task, Band band, int32_t Band::*size, int32_t none) {
    band.*size = none;
    Band expected = band;
    expected.done = 1;
    task(&band);
    EXPECT_TRUE(same_record(band, expected)) << none;
}

}  // namespace

TEST(BandTasks, OfPicturesWithoutASizeOnlyDoneIsSet) {
    uint8_t source[1] = {};
    uint32_t pixel[1] = {5};
    auto* target = reinterpret_cast<uint8_t*>(pixel);
    for (const int32_t none : {0, -1, INT32_MIN, INT32_MAX - 2, INT32_MAX}) {
        using Rgba = ovrin_rgba_band;
        Rgba rgba = {};
        rgba.src = source;
        rgba.dst = pixel;
        rgba.src_w = rgba.src_h = rgba.dst_w = rgba.dst_h = rgba.src_rows = rgba.rows_to_do = 8;
        for (Task* task : {_resize_rgba8888_tp, _resize_rgba8888_keep_ratio_tp}) {
            if (none > 0) break;
            for (int32_t Rgba::*size : {&Rgba::src_w, &Rgba::src_h, &Rgba::dst_w, &Rgba::dst_h}) {
                check_without_size(task, rgba, size, none);
            }
        }
        using Yuv = ovrin_yuv_band;
        auto yuv = whole_picture<Yuv>({8, 8, 8, 8});
        yuv.src = yuv.src_u = yuv.src_v = source;
        yuv.dst = target;
        for (Task* task : {_resize_y_u_v_tp, _resize_yuv420_tp}) {
            check_without_size(task, yuv, &Yuv::dst_width, none);
            check_without_size(task, yuv, &Yuv::dst_height, none);
            if (none > 0) continue;
            check_without_size(task, yuv, &Yuv::src_width, none);
            check_without_size(task, yuv, &Yuv::src_height, none);
        }
    }
    EXPECT_EQ(pixel[0], 5U);
}

TEST(BandTasks, ChromaThatStartsBeyondThePlaneIsSkipped) {
    Random random(115);
    SCOPED_TRACE(random.trace());
    const Sizes s = {9, 21, 8, 8};  // 11 chroma rows
    for (const int32_t start : {11, 12, 500}) {
        GuardedBuffer<uint8_t> target(small_bytes(random, 96));
        const std::vector<uint8_t> before = target.copy();
        auto yuv = whole_picture<ovrin_yuv_band>(s);
        yuv.y_rows = 0;
        yuv.uv_start_row = start;
        yuv.uv_top_point = yuv.uv_bottom_point = 0;  // the very next row would hold samples
        yuv.uv_rows = 3;
        yuv.dst = target.data();
        run_task(_resize_y_u_v_tp, yuv, target, before);
        run_task(_resize_yuv420_tp, yuv, target, before);
        auto nv21 = whole_picture<ovrin_nv21_band>(s);
        nv21.y_rows = 0;
        nv21.vu_start_row = start;
        nv21.vu_top_point = nv21.vu_bottom_point = 0;
        nv21.vu_rows = 3;
        nv21.dst = target.data();
        run_task(_resize_nv21_tp, nv21, target, before);
        run_task(_resize_y_nv21_tp, nv21, target, before);
    }
}

// Sizes that are not a grid need a work buffer; the destination must not be used in its place.
TEST(BandTasks, WithoutTheWorkBufferTheyNeedOnlyDoneIsSet) {
    Random random(116);
    SCOPED_TRACE(random.trace());
    for (const Sizes& s : {Sizes{9, 21, 7, 8}, Sizes{9, 21, 8, 7}, Sizes{9, 21, 6, 5}}) {
        GuardedBuffer<uint8_t> dst(small_bytes(random, 96));
        const std::vector<uint8_t> before = dst.copy();
        const auto i420 = random.bytes(bytes_of_i420(9, 21));
        const auto planes = reference::contiguous(reference::kI420, i420.data(), 9, 21);
        auto yuv = whole_picture<ovrin_yuv_band>(s);
        yuv.src = i420.data();
        yuv.src_u = planes.chroma[0];
        yuv.src_v = planes.chroma[1];
        yuv.dst = dst.data();
        run_task(_resize_y_u_v_tp, yuv, dst, before);
        run_task(_resize_yuv420_tp, yuv, dst, before);
        const auto nv21_bytes = random.bytes(bytes_of_nv21(9, 21));
        auto nv21 = whole_picture<ovrin_nv21_band>(s);
        nv21.src = nv21_bytes.data();
        nv21.src_vu = nv21_bytes.data() + 9 * 21;
        nv21.dst = dst.data();
        run_task(_resize_nv21_tp, nv21, dst, before);
        run_task(_resize_y_nv21_tp, nv21, dst, before);
    }
}

// Chroma rows of a task are its own matter: luma without chroma, chroma without luma.
TEST(BandTasks, LumaAndChromaRowsAreIndependent) {
    Random random(117);
    SCOPED_TRACE(random.trace());
    const Sizes s = {21, 40, 12, 16};
    const Yuv420Picture src(reference::kI420, random, s.src_w, s.src_h, s.src_w);
    const Yuv420Picture pairs(reference::kNv21, random, s.src_w, s.src_h, s.src_w);
    for (const auto& [y_rows, chroma] : {std::pair{0, 20}, {40, 0}, {13, 20}, {40, 7}}) {
        GuardedBuffer<uint8_t> target(small_bytes(random, grid_bytes(s)));
        auto yuv = whole_picture<ovrin_yuv_band>(s);
        yuv.src = src.view.y;
        yuv.src_u = src.view.chroma[0];
        yuv.src_v = src.view.chroma[1];
        yuv.dst = target.data();
        yuv.y_rows = y_rows;
        yuv.uv_rows = chroma;
        std::vector<uint8_t> expected = target.copy();
        reference::resize_y_u_v_tp(yuv, expected.data());
        run_task(_resize_y_u_v_tp, yuv, target, expected);
        auto nv21 = whole_picture<ovrin_nv21_band>(s);
        nv21.src = pairs.view.y;
        nv21.src_vu = pairs.view.chroma[0];
        nv21.dst = target.data();
        nv21.y_rows = y_rows;
        nv21.vu_rows = chroma;
        memcpy(target.data(), small_bytes(random, grid_bytes(s)).data(), grid_bytes(s));
        expected = target.copy();
        reference::resize_y_nv21_tp(nv21, expected.data());
        run_task(_resize_y_nv21_tp, nv21, target, expected);
    }
}
