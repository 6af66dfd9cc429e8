// SPDX-License-Identifier: Apache-2.0
// What the quarter-point formats ask the system for, by size and placement, and how drivers without
// threads behave. Each single refusal is every_entry_point_test.cpp's business.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <functional>

#include "reference/yuv420.h"
#include "support/faults.h"
#include "support/letterbox.h"
#include "support/random.h"

using faults::Kind;
using namespace ovrin_test;

namespace {

constexpr uint8_t kOld = 0xEE;

int allocations() {
    return faults::calls(Kind::kMalloc) + faults::calls(Kind::kCalloc);
}

// One random source for every format; sizes are checked by other tests.
struct Source {
    std::vector<uint8_t> bytes;
    int32_t w, h;

    Source(int32_t width, int32_t height) : w(width), h(height) {
        Random random(130);
        bytes = random.bytes(static_cast<size_t>(width + 1) * static_cast<size_t>(height + 1) * 4);
    }
    reference::Yuv420Source planes() const {
        return reference::contiguous(reference::kI420, bytes.data(), w, h);
    }
    reference::Yuv420Source pairs() const {
        return reference::contiguous(reference::kNv21, bytes.data(), w, h);
    }
};

using Bytes = std::vector<uint8_t>;

Bytes run_rgba(const Source& s, ovrin_resize_target target, bool threaded) {
    std::vector<uint32_t> canvas(
        static_cast<size_t>(target.canvas_width) * static_cast<size_t>(target.canvas_height),
        0xEEEEEEEE);
    target.src_width = s.w;
    target.src_height = s.h;
    target.src_stride = s.w;
    target.dst = canvas.data();
    (threaded ? ovrin_resize_rgba_keep_ratio_tps : ovrin_resize_rgba_keep_ratio_sg)(
        s.bytes.data(), s.w, s.h, &target);
    Bytes bytes(canvas.size() * 4);
    memcpy(bytes.data(), canvas.data(), bytes.size());
    return bytes;
}

Bytes run_yuv420(const Source& s, int32_t w, int32_t h, bool threaded) {
    Bytes dst(static_cast<size_t>(reference::i420_size(w, h)), kOld);
    (threaded ? ovrin_resize_yuv420_tps : ovrin_resize_yuv420_sg)(s.bytes.data(), dst.data(), s.w,
                                                                  s.h, w, h);
    return dst;
}

Bytes run_y_u_v(const Source& s, int32_t w, int32_t h, bool threaded) {
    Bytes dst(static_cast<size_t>(reference::i420_size(w, h)), kOld);
    const auto src = s.planes();
    (threaded ? ovrin_resize_y_u_v_tps : ovrin_resize_y_u_v_sg)(
        src.y, src.chroma[0], src.chroma[1], dst.data(), s.w, s.h, w, h, nullptr);
    return dst;
}

Bytes run_y_u_v_on(const Source& s, ovrin_resize_target target, bool threaded) {
    Bytes canvas(
        static_cast<size_t>(reference::i420_size(target.canvas_width, target.canvas_height)), kOld);
    target.dst = canvas.data();
    const auto src = s.planes();
    const ovrin_resize_target before = target;
    (threaded ? ovrin_resize_y_u_v_tps : ovrin_resize_y_u_v_sg)(src.y, src.chroma[0], src.chroma[1],
                                                                nullptr, s.w, s.h, 0, 0, &target);
    EXPECT_TRUE(same_target(target, before));
    return canvas;
}

Bytes run_nv21(const Source& s, int32_t w, int32_t h, bool threaded) {
    Bytes dst(static_cast<size_t>(reference::nv21_size(w, h)), kOld);
    (threaded ? ovrin_resize_nv21_tps : ovrin_resize_nv21_sg)(s.bytes.data(), dst.data(), s.w, s.h,
                                                              w, h);
    return dst;
}

Bytes run_y_nv(const Source& s, int32_t w, int32_t h, bool threaded) {
    Bytes dst(static_cast<size_t>(reference::nv21_size(w, h)), kOld);
    const auto src = s.pairs();
    (threaded ? ovrin_resize_y_nv_tps : ovrin_resize_y_nv_sg)(src.y, src.chroma[0], dst.data(), s.w,
                                                              s.h, w, h, nullptr);
    return dst;
}

Bytes run_y_nv_on(const Source& s, ovrin_resize_target target, bool threaded) {
    Bytes canvas(
        static_cast<size_t>(reference::nv21_size(target.canvas_width, target.canvas_height)), kOld);
    target.dst = canvas.data();
    const auto src = s.pairs();
    const ovrin_resize_target before = target;
    (threaded ? ovrin_resize_y_nv_tps : ovrin_resize_y_nv_sg)(src.y, src.chroma[0], nullptr, s.w,
                                                              s.h, 0, 0, &target);
    EXPECT_TRUE(same_target(target, before));
    return canvas;
}

ovrin_resize_target on_canvas(int32_t w, int32_t h) {
    ovrin_resize_target target = letterbox(w + 3, h + 5, w, h, 2, 1);
    target.src_stride = 9;
    return target;
}

bool untouched(const Bytes& bytes) {
    return bytes == Bytes(bytes.size(), kOld);
}

}  // namespace

// Sizes that are multiples of 4 are drawn in place, all others and all letterboxes are not.
TEST(QuarterFaults, OnlySizesBesideTheGridNeedAWorkBuffer) {
    const Source s(9, 40);
    for (int32_t w = 4; w < 8; ++w) {
        for (int32_t h = 4; h < 8; ++h) {
            const auto count = [](const std::function<void()>& run) {
                faults::reset();
                run();
                return allocations();
            };
            const int plain = w == 4 && h == 4 ? 0 : 1;
            EXPECT_EQ(count([&] { run_yuv420(s, w, h, false); }), plain);
            EXPECT_EQ(count([&] { run_y_u_v(s, w, h, false); }), plain);
            EXPECT_EQ(count([&] { run_nv21(s, w, h, false); }), plain);
            EXPECT_EQ(count([&] { run_y_nv(s, w, h, false); }), plain);
            EXPECT_EQ(count([&] { run_y_u_v_on(s, on_canvas(w, h), false); }), 1);
            EXPECT_EQ(count([&] { run_y_nv_on(s, on_canvas(w, h), false); }), 1);
        }
    }
}

TEST(QuarterFaults, TheWorkBufferHasTwiceTheGrid) {
    const Source s(16, 16);
    for (const auto& run : {run_yuv420, run_y_u_v, run_nv21, run_y_nv}) {
        faults::reset();
        run(s, 6, 6, false);
        EXPECT_EQ(faults::largest_block(), 2U * 8 * 8);
    }
}

TEST(QuarterFaults, RefusedPlacementsAskForNothing) {
    const Source s(9, 1100);
    faults::reset();
    for (const bool threaded : {false, true}) {
        EXPECT_TRUE(untouched(run_rgba(s, letterbox(8, 8, 4, 9, 0, 0), threaded)));
        EXPECT_TRUE(untouched(run_y_u_v_on(s, letterbox(8, 8, 4, 4, 9, 0), threaded)));
        EXPECT_TRUE(untouched(run_y_nv_on(s, letterbox(8, 8, 4, 0, 0, 0), threaded)));
    }
    for (const Kind kind : faults::kAllKinds) EXPECT_EQ(faults::calls(kind), 0);
}

// Which way a driver takes shows in the threads it makes.
TEST(QuarterFaults, DriversMakeThreadsForTwoBandsOrMore) {
    const auto threads = [](const std::function<void()>& run) {
        faults::reset();
        run();
        return faults::calls(Kind::kThread);
    };
    const Source two(9, 64), one(9, 47);  // bands of 32 rows, the nearest whole number of them
    const auto target = on_canvas(8, 32);
    uint32_t pixels[8 * 32];
    const auto run_packed = [&](const Source& source) {
        ovrin_resize_rgba8888_tps(source.bytes.data(), pixels, source.w, source.h, 8, 32);
    };
    EXPECT_EQ(threads([&] { run_packed(two); }), 4);
    EXPECT_EQ(threads([&] { run_packed(one); }), 0);
    EXPECT_EQ(threads([&] { run_rgba(two, target, true); }), 4);
    EXPECT_EQ(threads([&] { run_yuv420(two, 8, 32, true); }), 4);
    EXPECT_EQ(threads([&] { run_nv21(two, 8, 32, true); }), 4);
    EXPECT_EQ(threads([&] { run_rgba(one, target, true); }), 0);
    EXPECT_EQ(threads([&] { run_yuv420(one, 8, 32, true); }), 0);
    EXPECT_EQ(threads([&] { run_nv21(one, 8, 32, true); }), 0);
    // Separate planes stay below 1024 rows.
    const Source low(9, 1023), tall(9, 1024);
    EXPECT_EQ(threads([&] { run_y_u_v(low, 8, 32, true); }), 0);
    EXPECT_EQ(threads([&] { run_y_u_v_on(low, target, true); }), 0);
    EXPECT_EQ(threads([&] { run_y_nv(low, 8, 32, true); }), 0);
    EXPECT_EQ(threads([&] { run_y_nv_on(low, target, true); }), 0);
    EXPECT_EQ(threads([&] { run_y_u_v(tall, 8, 32, true); }), 4);
    EXPECT_EQ(threads([&] { run_y_u_v_on(tall, target, true); }), 4);
    EXPECT_EQ(threads([&] { run_y_nv(tall, 8, 32, true); }), 4);
    EXPECT_EQ(threads([&] { run_y_nv_on(tall, target, true); }), 4);
    EXPECT_EQ(threads([&] { run_y_u_v(tall, 8, 1, true); }), 0);  // one band
    EXPECT_EQ(threads([&] { run_y_nv(tall, 8, 1, true); }), 0);
}

// The source height decides, and nothing else.
TEST(QuarterFaults, WrappersMakeThreadsFrom1024RowsOn) {
    constexpr int32_t kW = 9;
    const std::vector<uint8_t> source(static_cast<size_t>(kW) * 1025 * 4);
    const uint8_t* src = source.data();
    std::vector<uint32_t> words(40 * 1030);
    auto* dst = reinterpret_cast<uint8_t*>(words.data());
    ovrin_resize_target target = letterbox(30, 1030, 8, 1024, 1, 1);
    target.src_stride = kW;
    target.dst = words.data();
    for (const int32_t h : {INT32_MIN, -1, 0, 1, 1023, 1024, 1025}) {
        const std::function<void()> wrappers[] = {
            [&] { ovrin_resize_rgba8888(src, words.data(), kW, h, 8, 1024); },
            [&] { ovrin_resize_rgba8888_keep_ratio(src, kW, h, &target); },
            [&] { ovrin_resize_yuv420(src, dst, kW, h, 8, 1024); },
            [&] { ovrin_resize_y_u_v(src, src, src, dst, kW, h, 8, 1024); },
            [&] { ovrin_resize_y_u_v_keep_ratio(src, src, src, kW, h, &target); },
            [&] { ovrin_resize_nv21(src, dst, kW, h, 8, 1024); },
            [&] { ovrin_resize_y_nv21(src, src, dst, kW, h, 8, 1024); },
            [&] { ovrin_resize_y_nv21_keep_ratio(src, src, kW, h, &target); },
        };
        for (const auto& wrapper : wrappers) {
            faults::reset();
            wrapper();
            EXPECT_EQ(faults::calls(Kind::kThread), h < 1024 ? 0 : 4)
                << "wrapper " << &wrapper - wrappers << ", " << h << " rows";
        }
    }
}

// A driver without threads is the single-threaded function, in what that rejects and in how it
// takes the row length as well.
TEST(QuarterFaults, WithoutThreadsTheSingleThreadedRulesHold) {
    const Source s(9, 1100);
    ovrin_resize_target below = letterbox(8, 8, 4, 4, 2, 9);
    below.src_stride = 9;
    ovrin_resize_target no_stride = on_canvas(8, 332);
    no_stride.src_stride = 0;
    for (const auto& run : {run_y_u_v_on, run_y_nv_on}) {
        EXPECT_FALSE(untouched(run(s, below, true)));
        EXPECT_NE(run(s, no_stride, true), run(s, no_stride, false));
        faults::fail(Kind::kThread, 1);
        EXPECT_TRUE(untouched(run(s, below, true)));
        faults::fail(Kind::kThread, 4);
        EXPECT_EQ(run(s, no_stride, true), run(s, no_stride, false));
        faults::reset();
        EXPECT_EQ(faults::live_blocks(), 0);
    }
}
