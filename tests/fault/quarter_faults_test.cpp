// SPDX-License-Identifier: Apache-2.0
// The quarter-point formats when memory or threads are refused, and what they ask for at all.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <functional>

#include "reference/keep_ratio_rgba.h"
#include "reference/nv21.h"
#include "reference/yuv.h"
#include "support/compare.h"
#include "support/faults.h"
#include "support/letterbox.h"
#include "support/random.h"

using faults::Kind;
using namespace ovrin_test;

namespace {

constexpr uint8_t kOld = 0xEE;
constexpr Kind kMemory[] = {Kind::kMalloc, Kind::kCalloc};

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
    reference::YuvSource planes() const { return reference::i420_source(bytes.data(), w, h); }
    reference::Nv21Source pairs() const { return reference::nv21_source(bytes.data(), w, h); }
};

// A way to fill a destination from the source: a single-threaded function or a driver.
struct Call {
    const char* name;
    std::function<std::vector<uint8_t>(bool threaded)> run;
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
    (threaded ? ovrin_resize_y_u_v_tps : ovrin_resize_y_u_v_sg)(src.y, src.u, src.v, dst.data(),
                                                                s.w, s.h, w, h, nullptr);
    return dst;
}

Bytes run_y_u_v_on(const Source& s, ovrin_resize_target target, bool threaded) {
    Bytes canvas(
        static_cast<size_t>(reference::i420_size(target.canvas_width, target.canvas_height)), kOld);
    target.dst = canvas.data();
    const auto src = s.planes();
    const ovrin_resize_target before = target;
    (threaded ? ovrin_resize_y_u_v_tps : ovrin_resize_y_u_v_sg)(src.y, src.u, src.v, nullptr, s.w,
                                                                s.h, 0, 0, &target);
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
    (threaded ? ovrin_resize_y_nv_tps : ovrin_resize_y_nv_sg)(src.y, src.vu, dst.data(), s.w, s.h,
                                                              w, h, nullptr);
    return dst;
}

Bytes run_y_nv_on(const Source& s, ovrin_resize_target target, bool threaded) {
    Bytes canvas(
        static_cast<size_t>(reference::nv21_size(target.canvas_width, target.canvas_height)), kOld);
    target.dst = canvas.data();
    const auto src = s.pairs();
    const ovrin_resize_target before = target;
    (threaded ? ovrin_resize_y_nv_tps : ovrin_resize_y_nv_sg)(src.y, src.vu, nullptr, s.w, s.h, 0,
                                                              0, &target);
    EXPECT_TRUE(same_target(target, before));
    return canvas;
}

ovrin_resize_target on_canvas(int32_t w, int32_t h) {
    ovrin_resize_target target = letterbox(w + 3, h + 5, w, h, 2, 1);
    target.src_stride = 9;
    return target;
}

// Calls that need a work buffer: sizes beside the grid, and every letterbox of planes.
std::vector<Call> calls_with_work_buffer(const Source& s) {
    return {
        {"yuv420", [&](bool threaded) { return run_yuv420(s, 6, 333, threaded); }},
        {"y_u_v", [&](bool threaded) { return run_y_u_v(s, 8, 333, threaded); }},
        {"y_u_v on a canvas",
         [&](bool threaded) { return run_y_u_v_on(s, on_canvas(8, 332), threaded); }},
        {"nv21", [&](bool threaded) { return run_nv21(s, 6, 332, threaded); }},
        {"y_nv", [&](bool threaded) { return run_y_nv(s, 8, 333, threaded); }},
        {"y_nv on a canvas",
         [&](bool threaded) { return run_y_nv_on(s, on_canvas(8, 332), threaded); }},
    };
}

// Calls that draw into the destination itself.
std::vector<Call> calls_in_place(const Source& s) {
    return {
        {"rgba on a canvas",
         [&](bool threaded) { return run_rgba(s, on_canvas(7, 333), threaded); }},
        {"yuv420", [&](bool threaded) { return run_yuv420(s, 8, 332, threaded); }},
        {"y_u_v", [&](bool threaded) { return run_y_u_v(s, 8, 332, threaded); }},
        {"nv21", [&](bool threaded) { return run_nv21(s, 8, 332, threaded); }},
        {"y_nv", [&](bool threaded) { return run_y_nv(s, 8, 332, threaded); }},
    };
}

std::vector<Call> all_calls(const Source& s) {
    std::vector<Call> calls = calls_in_place(s);
    for (const Call& call : calls_with_work_buffer(s)) calls.push_back(call);
    return calls;
}

// Nothing may be written where nothing can be drawn; both are told from the complete picture.
bool untouched(const Bytes& bytes) {
    return bytes == Bytes(bytes.size(), kOld);
}

}  // namespace

TEST(QuarterFaults, AnyOneRefusalStillGivesTheWholePicture) {
    const Source s(9, 1100);
    for (const Call& call : all_calls(s)) {
        const Bytes expected = call.run(false);
        ASSERT_FALSE(untouched(expected));
        for (const Kind kind : faults::kAllKinds) {
            for (int nth = 1;; ++nth) {
                SCOPED_TRACE(::testing::Message()
                             << call.name << ", " << faults::name(kind) << " call " << nth);
                faults::fail(kind, nth);
                const Bytes actual = call.run(true);
                const bool failed = faults::has_failed();
                faults::reset();
                ASSERT_TRUE(same_bytes(actual.data(), expected.data(), expected.size()));
                EXPECT_EQ(faults::live_blocks(), 0);
                if (!failed) break;
            }
        }
    }
}

// From some moment on there is no more memory: with a work buffer to find, the picture is complete
// or the destination untouched; without one it is complete. (Threads are left out: a pool that can
// start neither its workers nor the thread that would end it stays behind on purpose.)
TEST(QuarterFaults, LastingRefusalsLeaveNothingHalfDone) {
    const Source s(9, 1100);
    for (const bool work_buffer : {false, true}) {
        for (const Call& call : work_buffer ? calls_with_work_buffer(s) : calls_in_place(s)) {
            const Bytes expected = call.run(false);
            bool ever_untouched = false;
            for (const Kind kind : {Kind::kMalloc, Kind::kCalloc, Kind::kMutex, Kind::kCondition}) {
                for (int nth = 1;; ++nth) {
                    SCOPED_TRACE(::testing::Message() << call.name << ", " << faults::name(kind)
                                                      << " from call " << nth);
                    faults::fail(kind, nth, true);
                    const Bytes actual = call.run(true);
                    const bool failed = faults::has_failed();
                    faults::reset();
                    if (work_buffer && untouched(actual)) {
                        EXPECT_TRUE(kind == Kind::kMalloc || kind == Kind::kCalloc);
                        ever_untouched = true;
                    } else {
                        ASSERT_TRUE(same_bytes(actual.data(), expected.data(), expected.size()));
                    }
                    EXPECT_EQ(faults::live_blocks(), 0);
                    if (!failed) break;
                }
            }
            EXPECT_EQ(ever_untouched, work_buffer) << call.name;
        }
    }
}

TEST(QuarterFaults, WithoutItsWorkBufferTheCallingThreadTouchesNothing) {
    const Source s(9, 40);
    for (const Call& call : calls_with_work_buffer(s)) {
        SCOPED_TRACE(call.name);
        faults::reset();
        EXPECT_FALSE(untouched(call.run(false)));
        EXPECT_EQ(allocations(), 1);
        EXPECT_EQ(faults::calls(Kind::kThread), 0);
        EXPECT_EQ(faults::live_blocks(), 0);
        const Kind used = faults::calls(Kind::kMalloc) == 1 ? Kind::kMalloc : Kind::kCalloc;
        faults::fail(used, 1);
        const Bytes actual = call.run(false);
        EXPECT_TRUE(faults::has_failed());
        faults::reset();
        EXPECT_TRUE(untouched(actual));
        EXPECT_EQ(faults::live_blocks(), 0);
    }
}

TEST(QuarterFaults, InPlaceTheCallingThreadAsksForNothing) {
    const Source s(9, 40);
    for (const Call& call : calls_in_place(s)) {
        SCOPED_TRACE(call.name);
        faults::reset();
        EXPECT_FALSE(untouched(call.run(false)));
        for (const Kind kind : faults::kAllKinds) EXPECT_EQ(faults::calls(kind), 0);
    }
}

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

// Wide enough that sampling every row takes longer than starting threads, or far from it.
TEST(QuarterFaults, WrappersMakeThreadsFrom1024RowsWhereThatPays) {
    constexpr int32_t kWide = 11200, kNarrow = 9;
    const std::vector<uint8_t> source(static_cast<size_t>(kWide) * 1025 * 4);
    const uint8_t* src = source.data();
    std::vector<uint32_t> words(40 * 1030);
    auto* dst = reinterpret_cast<uint8_t*>(words.data());
    for (const int32_t w : {kNarrow, kWide}) {
        ovrin_resize_target target = letterbox(30, 1030, 8, 1024, 1, 1);
        target.src_stride = w;
        target.dst = words.data();
        for (const int32_t h : {INT32_MIN, -1, 0, 1, 1023, 1024, 1025}) {
            const std::function<void()> wrappers[] = {
                [&] { ovrin_resize_rgba8888(src, words.data(), w, h, 8, 1024); },
                [&] { ovrin_resize_rgba8888_keep_ratio(src, w, h, &target); },
                [&] { ovrin_resize_yuv420(src, dst, w, h, 8, 1024); },
                [&] { ovrin_resize_y_u_v(src, src, src, dst, w, h, 8, 1024); },
                [&] { ovrin_resize_y_u_v_keep_ratio(src, src, src, w, h, &target); },
                [&] { ovrin_resize_nv21(src, dst, w, h, 8, 1024); },
                [&] { ovrin_resize_y_nv21(src, src, dst, w, h, 8, 1024); },
                [&] { ovrin_resize_y_nv21_keep_ratio(src, src, w, h, &target); },
            };
            for (const auto& wrapper : wrappers) {
                faults::reset();
                wrapper();
                EXPECT_EQ(faults::calls(Kind::kThread), w == kNarrow || h < 1024 ? 0 : 4)
                    << "wrapper " << &wrapper - wrappers << ", " << w << " x " << h;
            }
        }
    }
}

// The two ways treat these targets differently: the height decides which one it is.
TEST(QuarterFaults, WrappersDecideByHeightWhereTheWaysDisagree) {
    const Source s(9, 1100);
    const uint8_t* src = s.bytes.data();
    std::vector<uint32_t> words(40 * 60);
    ovrin_resize_target no_stride = letterbox(30, 40, 8, 32, 1, 1);
    no_stride.src_stride = 0;
    ovrin_resize_target below = letterbox(30, 40, 8, 32, 1, 41);
    below.src_stride = 9;
    for (ovrin_resize_target target : {no_stride, below}) {
        target.dst = words.data();
        for (const int32_t h : {1023, 1024}) {
            faults::reset();
            ovrin_resize_y_u_v_keep_ratio(src, src, src, 9, h, &target);
            ovrin_resize_y_nv21_keep_ratio(src, src, 9, h, &target);
            EXPECT_EQ(faults::calls(Kind::kThread), h < 1024 ? 0 : 8);
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

// More bands than the pool has slots, and records that run out on the way.
TEST(QuarterFaults, ManyBandsSurviveAMissingRecord) {
    const Source s(1, 64100);
    const Bytes expected = run_nv21(s, 1, 32100, false);
    for (const Kind kind : kMemory) {
        for (const int nth : {1, 2, 3, 4, 1000, 2003}) {
            faults::fail(kind, nth);
            const Bytes actual = run_nv21(s, 1, 32100, true);
            faults::reset();
            ASSERT_TRUE(same_bytes(actual.data(), expected.data(), expected.size()));
            EXPECT_EQ(faults::live_blocks(), 0);
        }
    }
}

TEST(QuarterFaults, Rgb888AndNearestStayOnTheCallingThread) {
    const Source s(9, 3000);
    std::vector<uint32_t> dst(8 * 3000);
    std::vector<uint32_t> src(s.bytes.size() / 4);
    memcpy(src.data(), s.bytes.data(), src.size() * 4);
    faults::reset();
    for (const int32_t h : {1, 1023, 1024, 3000}) {
        ovrin_resize_rgb888(s.bytes.data(), reinterpret_cast<uint8_t*>(dst.data()), 9, h, 7, 333);
        ovrin_resize_nearest_rgba8888(src.data(), dst.data(), 9, h, 7, 333);
    }
    for (const Kind kind : faults::kAllKinds) EXPECT_EQ(faults::calls(kind), 0);
}
