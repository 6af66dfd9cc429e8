// SPDX-License-Identifier: Apache-2.0
// Where pictures go on a canvas, the target record for it, and what is drawn.
#include <gtest/gtest.h>
#include <ovrinresize.hpp>

#include <cstdint>
#include <cstring>
#include <vector>

#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/random.h"

namespace ovrin {

// GoogleTest prints and compares them.
static bool operator==(Rect a, Rect b) {
    return a.x == b.x && a.y == b.y && a.width == b.width && a.height == b.height;
}
static std::ostream& operator<<(std::ostream& out, Rect r) {
    return out << r.width << "x" << r.height << " at " << r.x << "," << r.y;
}

}  // namespace ovrin

namespace {

using ovrin::ConstView;
using ovrin::Fit;
using ovrin::Fitted;
using ovrin::Format;
using ovrin::Gravity;
using ovrin::Placement;
using ovrin::Rect;
using ovrin::Size;
using ovrin::Threads;
using ovrin::View;
using ovrin_test::GuardedBuffer;
using ovrin_test::Random;
using ovrin_test::rounds;
using ovrin_test::same_bytes;

TEST(CppPlacement, Contain) {
    const Placement wide = ovrin::placement({1600, 900}, {640, 640}, Fit::kContain);
    EXPECT_EQ(wide.part, (Rect{0, 0, 1600, 900}));
    EXPECT_EQ(wide.rect, (Rect{0, 140, 640, 360}));
    const Placement tall = ovrin::placement({900, 1600}, {640, 640}, Fit::kContain);
    EXPECT_EQ(tall.rect, (Rect{140, 0, 360, 640}));
    EXPECT_EQ(ovrin::placement({4, 3}, {640, 480}, Fit::kContain).rect, (Rect{0, 0, 640, 480}));
    // Never empty.
    EXPECT_EQ(ovrin::placement({32767, 1}, {8, 8}, Fit::kContain).rect, (Rect{0, 3, 8, 1}));
}

TEST(CppPlacement, Cover) {
    const Placement wide = ovrin::placement({1600, 900}, {640, 640}, Fit::kCover);
    EXPECT_EQ(wide.part, (Rect{350, 0, 900, 900}));
    EXPECT_EQ(wide.rect, (Rect{0, 0, 640, 640}));
    EXPECT_EQ(ovrin::placement({900, 1600}, {640, 640}, Fit::kCover).part,
              (Rect{0, 350, 900, 900}));
}

TEST(CppPlacement, Fill) {
    const Placement all = ovrin::placement({1600, 900}, {640, 640}, Fit::kFill);
    EXPECT_EQ(all.part, (Rect{0, 0, 1600, 900}));
    EXPECT_EQ(all.rect, (Rect{0, 0, 640, 640}));
}

TEST(CppPlacement, GravityAndGrid) {
    const Gravity all[] = {Gravity::kNorthWest, Gravity::kNorth,  Gravity::kNorthEast,
                           Gravity::kWest,      Gravity::kCenter, Gravity::kEast,
                           Gravity::kSouthWest, Gravity::kSouth,  Gravity::kSouthEast};
    for (int i = 0; i < 9; ++i) {
        const Placement tall = ovrin::placement({10, 20}, {30, 20}, Fit::kContain, all[i]);
        EXPECT_EQ(tall.rect, (Rect{10 * (i % 3), 0, 10, 20}));
        const Placement wide = ovrin::placement({20, 10}, {20, 30}, Fit::kContain, all[i]);
        EXPECT_EQ(wide.rect, (Rect{0, 10 * (i / 3), 20, 10}));
        const Placement cut = ovrin::placement({30, 20}, {10, 20}, Fit::kCover, all[i]);
        EXPECT_EQ(cut.part, (Rect{10 * (i % 3), 0, 10, 20}));
        const Placement even = ovrin::placement({11, 20}, {20, 20}, Fit::kContain, all[i], 2);
        EXPECT_EQ(even.rect, (Rect{4 * (i % 3), 0, 11, 20}));
    }
}

TEST(CppPlacement, StaysInsideAndKeepsTheShape) {
    Random random(11);
    for (int i = 0; i < rounds(20000); ++i) {
        const Size src = {random.between(1, 32767), random.between(1, 32767)};
        const Size canvas = {random.awkward_size(), random.between(1, 32767)};
        const int32_t grid = random.pick({1, 2});
        const auto gravity = static_cast<Gravity>(random.between(0, 8));
        const Rect in = ovrin::placement(src, canvas, Fit::kContain, gravity, grid).rect;
        ASSERT_TRUE(in.x >= 0 && in.y >= 0 && in.width >= 1 && in.height >= 1);
        ASSERT_TRUE(in.x % grid == 0 && in.y % grid == 0);
        ASSERT_TRUE(in.x + in.width <= canvas.width && in.y + in.height <= canvas.height) << in;
        ASSERT_TRUE(in.width == canvas.width || in.height == canvas.height) << in;
        const Rect part = ovrin::placement(canvas, src, Fit::kCover, gravity, grid).part;
        ASSERT_EQ(part, in);
    }
}

constexpr Format kFormats[] = {Format::kRgba8888, Format::kI420, Format::kNv21};

template <class Byte>
ovrin::BasicView<Byte> packed_view(Format format, Byte* data, size_t bytes, Size size) {
    if (format == Format::kRgba8888) return ovrin::rgba_view(data, bytes, size.width, size.height);
    if (format == Format::kI420) return ovrin::i420_view(data, bytes, size.width, size.height);
    return ovrin::nv21_view(data, bytes, size.width, size.height);
}

size_t bytes_of(Format format, Size size) {
    return ovrin::picture_bytes(format, size.width, size.height);
}

// Copies a rectangle of samples between two packed planes.
struct PlaneCopy {
    const uint8_t* from;
    size_t from_row;
    uint8_t* to;
    size_t to_row;

    void rectangle(Rect take, Rect put, size_t sample) const {
        for (int32_t y = 0; y < take.height; ++y) {
            const auto down = static_cast<size_t>(take.y + y);
            const auto put_down = static_cast<size_t>(put.y + y);
            memcpy(to + put_down * to_row + static_cast<size_t>(put.x) * sample,
                   from + down * from_row + static_cast<size_t>(take.x) * sample,
                   static_cast<size_t>(take.width) * sample);
        }
    }
};

Rect halved(Rect r) {
    return {r.x / 2, r.y / 2, (r.width + 1) / 2, (r.height + 1) / 2};
}

size_t side(int32_t size) {
    return static_cast<size_t>(size);
}

// Copies a rectangle of one packed picture into another.
void paste(Format format, const uint8_t* from, Size from_size, Rect take, uint8_t* to, Size to_size,
           Rect put) {
    if (format == Format::kRgba8888) {
        PlaneCopy{from, 4 * side(from_size.width), to, 4 * side(to_size.width)}.rectangle(take, put,
                                                                                          4);
        return;
    }
    PlaneCopy{from, side(from_size.width), to, side(to_size.width)}.rectangle(take, put, 1);
    from += side(from_size.width) * side(from_size.height);
    to += side(to_size.width) * side(to_size.height);
    const size_t sample = format == Format::kNv21 ? 2 : 1;
    const size_t from_row = side((from_size.width + 1) / 2) * sample;
    const size_t to_row = side((to_size.width + 1) / 2) * sample;
    for (size_t plane = 0; plane < 3 - sample; ++plane) {
        PlaneCopy{from, from_row, to, to_row}.rectangle(halved(take), halved(put), sample);
        from += from_row * side((from_size.height + 1) / 2);
        to += to_row * side((to_size.height + 1) / 2);
    }
}

// A black canvas, and on it the part resized on its own.
std::vector<uint8_t> expected_canvas(Format format, const std::vector<uint8_t>& src, Size size,
                                     Size canvas, const Placement& where) {
    const Size part = {where.part.width, where.part.height};
    const Size rect = {where.rect.width, where.rect.height};
    std::vector<uint8_t> cut(bytes_of(format, part));
    paste(format, src.data(), size, where.part, cut.data(), part, {0, 0, part.width, part.height});
    std::vector<uint8_t> small(bytes_of(format, rect));
    EXPECT_TRUE(resize(packed_view<const uint8_t>(format, cut.data(), cut.size(), part),
                       packed_view(format, small.data(), small.size(), rect))
                    .ok());
    std::vector<uint8_t> result(bytes_of(format, canvas), format == Format::kRgba8888 ? 0 : 128);
    if (format != Format::kRgba8888) memset(result.data(), 0, side(canvas.width * canvas.height));
    paste(format, small.data(), rect, {0, 0, rect.width, rect.height}, result.data(), canvas,
          where.rect);
    return result;
}

void check_draw(Format format, Size size, Size canvas_size, Fit how, Gravity gravity,
                Threads threads, Random& random) {
    SCOPED_TRACE(::testing::Message()
                 << static_cast<int>(format) << ": " << size.width << "x" << size.height << " on "
                 << canvas_size.width << "x" << canvas_size.height << ", fit "
                 << static_cast<int>(how) << ", threads " << static_cast<int>(threads));
    const GuardedBuffer<uint8_t> src(random.bytes(bytes_of(format, size)));
    GuardedBuffer<uint32_t> canvas((bytes_of(format, canvas_size) + 3) / 4);
    auto* const bytes = reinterpret_cast<uint8_t*>(canvas.data());
    const View view = packed_view(format, bytes, bytes_of(format, canvas_size), canvas_size);
    const Fitted fitted =
        fit(packed_view(format, src.data(), src.size(), size), view, how, gravity);
    ASSERT_TRUE(fitted.status.ok()) << fitted.status.text;
    ASSERT_TRUE(draw(fitted, threads).ok());
    const std::vector<uint8_t> expected =
        expected_canvas(format, src.copy(), size, canvas_size, {fitted.part, fitted.rect});
    ASSERT_TRUE(same_bytes(bytes, expected.data(), expected.size()));
}

TEST(CppFit, DrawsWhatResizingAndPastingWould) {
    Random random(12);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(2000) && !HasFatalFailure(); ++i) {
        check_draw(random.pick({kFormats[0], kFormats[1], kFormats[2]}),
                   {random.awkward_size(), random.awkward_size()},
                   {random.awkward_size(), random.awkward_size()},
                   static_cast<Fit>(random.between(0, 2)),
                   static_cast<Gravity>(random.between(0, 8)),
                   static_cast<Threads>(random.between(0, 2)), random);
    }
}

// Tall sources take the threaded functions, of which those for planes compare the rectangle's x
// with the canvas's height: a rectangle far to the right would not be drawn.
TEST(CppFit, TallPicturesOnWideCanvases) {
    Random random(13);
    for (const Format format : kFormats) {
        for (const Threads threads : {Threads::kAuto, Threads::kOne, Threads::kMany}) {
            check_draw(format, {30, 1100}, {900, 100}, Fit::kContain, Gravity::kEast, threads,
                       random);
            check_draw(format, {30, 1100}, {20, 100}, Fit::kCover, Gravity::kSouth, threads,
                       random);
            check_draw(format, {31, 1101}, {101, 99}, Fit::kFill, Gravity::kCenter, threads,
                       random);
        }
    }
}

TEST(CppFit, FillsTheTargetRecord) {
    const std::vector<uint8_t> src(bytes_of(Format::kI420, {80, 40}));
    std::vector<uint8_t> canvas(bytes_of(Format::kI420, {20, 20}));
    const ConstView view = ovrin::i420_view(src.data(), src.size(), 80, 40);
    const Fitted fitted = fit(view, ovrin::i420_view(canvas.data(), canvas.size(), 20, 20),
                              Fit::kCover, Gravity::kEast);
    ASSERT_TRUE(fitted.status.ok()) << fitted.status.text;
    EXPECT_EQ(fitted.part, (Rect{40, 0, 40, 40}));
    EXPECT_EQ(fitted.rect, (Rect{0, 0, 20, 20}));
    EXPECT_EQ(fitted.planes[0], src.data() + 40);
    const ovrin_resize_target& target = fitted.target;
    EXPECT_EQ(target.src_u_plane, src.data() + 3200 + 20);
    EXPECT_EQ(target.src_v_plane, src.data() + 3200 + 800 + 20);
    EXPECT_EQ(target.src_vu_plane, nullptr);
    EXPECT_EQ(target.src_width, 40);
    EXPECT_EQ(target.src_height, 40);
    EXPECT_EQ(target.src_stride, 80);
    EXPECT_EQ(target.src_buffer_height, 40);
    EXPECT_EQ(target.format, OVRIN_FORMAT_PLANAR);
    EXPECT_EQ(target.dst, canvas.data());
    EXPECT_EQ(target.dst_width, 20);
    EXPECT_EQ(target.dst_height, 20);
    EXPECT_EQ(target.canvas_width, 20);
    EXPECT_EQ(target.canvas_height, 20);
    EXPECT_EQ(target.dst_x, 0);
    EXPECT_EQ(target.dst_y, 0);
}

// The record is one that the C functions take as it is; rows of pixels are counted in pixels.
TEST(CppFit, RecordServesTheCFunctions) {
    const std::vector<uint8_t> src = Random(14).bytes(48 * 9);
    std::vector<uint32_t> drawn(8 * 8, 1);
    std::vector<uint32_t> called(8 * 8, 2);
    const ConstView view = ovrin::rgba_view(src.data(), src.size(), 10, 9, 48);
    const auto canvas = [](std::vector<uint32_t>& words) {
        return ovrin::rgba_view(reinterpret_cast<uint8_t*>(words.data()), 256, 8, 8);
    };
    ASSERT_TRUE(draw(fit(view, canvas(drawn), Fit::kContain)).ok());
    Fitted fitted = fit(view, canvas(called), Fit::kContain);
    EXPECT_EQ(fitted.target.src_stride, 12);
    EXPECT_EQ(fitted.target.format, OVRIN_FORMAT_PIXELS);
    ovrin_resize_rgba8888_keep_ratio(fitted.planes[0], fitted.part.width, fitted.part.height,
                                     &fitted.target);
    EXPECT_EQ(drawn, called);
}

}  // namespace
