// SPDX-License-Identifier: Apache-2.0
// The bilinear engine in bands, which takes one sample where the calling thread blends four.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <thread>

#include "support/bilinear_call.h"
#include "support/float_mode.h"

using namespace ovrin_test;

namespace {

constexpr int32_t kFormats[] = {2, 7, 8, 18, 19};

void check(const BilinearCall& call, Random& random, Flush flush = Flush::kEnd) {
    check_bilinear(ov_bilinear, reference::bilinear, call, random, flush);
}

BilinearCall random_call(Random& random) {
    const int32_t src_h = random.pick({1, 2, 37, 700, 1023, 1024, 1500, 3000});
    BilinearCall call =
        call_without_target(random.pick({2, 7, 8, 18, 19}), random.between(1, 40), src_h,
                            random.between(1, 40), random.between(1024, 1300));
    call.with_target = random.between(0, 2) != 0;
    if (!call.with_target) return call;
    call.g.src_stride += random.pick({0, 0, 1, 2, 7, 16});
    call.g.dst_x = random.between(0, 9);
    call.g.dst_y = random.between(0, 9);
    const int32_t wanted_w = call.dst_w + call.g.dst_x;
    const int32_t wanted_h = call.dst_h + call.g.dst_y;
    call.g.canvas_width = std::max(0, wanted_w + random.pick({0, -1, -2, -20, 1, 5}));
    call.g.canvas_height = std::max(0, wanted_h + random.pick({0, -1, -2, -20, -700, 1, 5}));
    call.src_w = random.pick({1, -1, 7, 100000});
    call.src_h = random.pick({1, -1, 7, 3000});
    return call;
}

// Tables for _ov_bilinear_tp, and a record of the whole picture.
class Band {
public:
    Band(const BilinearCall& call, const uint8_t* src, uint8_t* dst,
         const ovrin_resize_target* target)
        : plan_(reference::bilinear_plan(call.g, call.dst_w, call.dst_h)) {
        const int32_t bpp = reference::is_four_channel(call.g.format) ? 4 : 1;
        record.target = target;
        record.src_width = call.g.src_width;
        record.src_height = call.g.src_height;
        record.dst_w = plan_.dst_w;
        record.dst_h = plan_.dst_h;
        record.src = src;
        record.dst = dst;
        record.format = call.g.format;
        record.col_weight = plan_.columns.weight.data();
        record.row_weight = plan_.rows.weight.data();
        record.col_index = plan_.columns.index.data();
        record.row_index = plan_.rows.index.data();
        record.first_row = 0;
        record.end_row = plan_.dst_h;
        record.canvas_width = call.g.canvas_width;
        record.src_pitch = call.g.src_stride * bpp;
        record.bpp = bpp;
        record.edge_cols = plan_.edge_cols;
        record.edge_rows = plan_.edge_rows;
    }

    ovrin_bilinear_band record = {};

private:
    reference::BilinearPlan plan_;
};

// A small picture with and without a target, and its destination with the canvas already cleared.
struct SmallPicture {
    SmallPicture(int32_t format, bool with_target, Random& random)
        : call(call_without_target(format, 9, 7, 12, 10)), src(random.bytes(1000)) {
        if (with_target) {
            call.with_target = true;
            call.g.src_stride = 11;
            call.g.canvas_width = 14;
            call.g.canvas_height = 13;
            call.g.dst_x = 1;
            call.g.dst_y = 2;
            target.src_vu_plane = target.src_u_plane = src.data() + 200;
            target.src_v_plane = src.data() + 300;
            target.src_width = 9;
            target.src_height = 7;
            target.src_stride = 11;
            target.src_buffer_height = 7;
            target.format = format;
            target.canvas_width = 14;
            target.canvas_height = 13;
            target.dst_x = 1;
            target.dst_y = 2;
        }
        dst.resize(canvas_bytes(call.g));
        reference::clear_canvas(call.g, dst);
    }

    const ovrin_resize_target* target_or_null() const {
        return call.with_target ? &target : nullptr;
    }

    std::vector<uint8_t> expected() const {
        reference::BilinearSource source = reference::contiguous_source(src.data(), 9, 7);
        if (call.with_target) {
            source.vu.bytes = source.u.bytes = target.src_u_plane;
            source.v.bytes = target.src_v_plane;
        }
        std::vector<uint8_t> picture(dst.size());
        reference::bilinear_picture(reference::Sampling::kPoint, call.g, 9, 7, 12, 10, source,
                                    picture);
        return picture;
    }

    BilinearCall call;
    std::vector<uint8_t> src;
    ovrin_resize_target target = {};
    std::vector<uint8_t> dst;
};

}  // namespace

TEST(BilinearBands, RandomCallsEqualTheDefinition) {
    Random random(41);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(300) && !HasFatalFailure(); ++i) {
        check(random_call(random), random, random.pick({Flush::kEnd, Flush::kStart}));
    }
}

TEST(BilinearBands, TheThresholdIsTheDestinationsHeight) {
    Random random(42);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        for (const int32_t src_h : {1, 512, 1023, 1024, 3000}) {
            for (const int32_t dst_h : {1023, 1024, 1025, 1056}) {
                check(call_without_target(format, 7, src_h, 9, dst_h), random);
            }
        }
        check(call_without_target(format, 5, 3000, 5, 1500), random);
    }
}

TEST(BilinearBands, TakeTheTopLeftSampleOfEach) {
    Random random(43);
    const auto src = random.bytes(6 * 1024 * 4 + 6 * 4 + 4);
    std::vector<uint8_t> banded(6 * 1024 * 4);
    std::vector<uint8_t> single(banded.size());
    ov_bilinear(src.data(), banded.data(), 6, 1024, 6, 1024, 7, nullptr);
    EXPECT_TRUE(same_bytes(banded.data(), src.data(), banded.size()));
    ov_bilinear_sg(src.data(), single.data(), 6, 1024, 6, 1024, 7, nullptr);
    EXPECT_NE(banded, single);
}

// 700 source rows to one: a band of 700 destination rows, and 1024 make only one such band.
TEST(BilinearBands, ASingleBandIsInterpolated) {
    Random random(44);
    SCOPED_TRACE(random.trace());
    EXPECT_EQ(reference::destination_band_count(1024 * 700, 1024), 1);
    check(call_without_target(18, 2, 1024 * 700, 2, 1024), random);
    EXPECT_EQ(reference::destination_band_count(1024 * 682, 1024), 2);
    check(call_without_target(18, 2, 1024 * 682, 2, 1024), random);
}

// The number of bands follows from the height before the cut.
TEST(BilinearBands, StopAtTheCanvas) {
    Random random(45);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        for (const int32_t canvas_h : {0, 1, 5, 31, 32, 33, 1000, 1023, 1024, 1499, 1500, 1503}) {
            for (const int32_t y : {0, 3}) {
                BilinearCall call = call_without_target(format, 5, 40, 6, 1500);
                call.with_target = true;
                call.g.canvas_height = canvas_h;
                call.g.dst_y = y;
                check(call, random);
            }
        }
        for (const int32_t canvas_w : {0, 1, 2, 5, 8}) {
            BilinearCall call = call_without_target(format, 5, 1100, 6, 1100);
            call.with_target = true;
            call.g.canvas_width = canvas_w;
            call.g.dst_x = 2;
            check(call, random);
        }
    }
}

// Only `src_h`, the argument, counts for the height of the bands.
TEST(BilinearBands, MoreBandsThanThePoolHasSlots) {
    Random random(46);
    SCOPED_TRACE(random.trace());
    EXPECT_GT(reference::destination_band_count(70000, 70000), 2000);
    for (const int32_t format : {2, 7, 18}) {
        check(call_without_target(format, 2, 70000, 1, 70000), random);
    }
}

TEST(BilinearBands, TheProcessorsFlushToZeroModeDoesNotMatter) {
    if (!FlushToZero::kSupported) GTEST_SKIP() << "no such mode here";
    Random random(47);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        const BilinearCall call = call_without_target(format, 33, 900, 47, 1100);
        const auto src = random.bytes(33 * 900 * 4 + 33 * 4 + 4);
        std::vector<uint8_t> expected(canvas_bytes(call.g));
        reference::BilinearSource source = reference::contiguous_source(src.data(), 33, 900);
        reference::bilinear(call.g, 33, 900, 47, 1100, source, expected);
        std::vector<uint8_t> dst(expected.size());
        std::vector<uint8_t> by_task(expected.size());
        reference::clear_canvas(call.g, by_task);
        Band band(call, src.data(), by_task.data(), nullptr);
        {
            const FlushToZero mode;
            ov_bilinear(src.data(), dst.data(), 33, 900, 47, 1100, format, nullptr);
            _ov_bilinear_tp(&band.record);
        }
        EXPECT_TRUE(same_bytes(dst.data(), expected.data(), expected.size())) << format;
        EXPECT_TRUE(same_bytes(by_task.data(), expected.data(), expected.size())) << format;
    }
}

TEST(BilinearBandTask, DrawsTheWholePictureFromOneRecord) {
    Random random(48);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        for (const bool with_target : {false, true}) {
            SmallPicture picture(format, with_target, random);
            Band band(picture.call, picture.src.data(), picture.dst.data(),
                      picture.target_or_null());
            _ov_bilinear_tp(&band.record);
            EXPECT_EQ(picture.dst, picture.expected()) << format << with_target;
        }
    }
}

TEST(BilinearBandTask, DrawsOnlyItsOwnRowsAndDoesNotClear) {
    Random random(49);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        for (const bool with_target : {false, true}) {
            SmallPicture picture(format, with_target, random);
            const auto expected = picture.expected();
            std::fill(picture.dst.begin(), picture.dst.end(), uint8_t{0x77});
            Band band(picture.call, picture.src.data(), picture.dst.data(),
                      picture.target_or_null());
            band.record.first_row = 3;
            band.record.end_row = 6;
            band.record.edge_rows = 0;
            _ov_bilinear_tp(&band.record);

            const auto& g = picture.call.g;
            const size_t bpp = reference::is_four_channel(format) ? 4 : 1;
            for (int32_t y = 0; y < g.canvas_height; ++y) {
                for (int32_t x = 0; x < g.canvas_width; ++x) {
                    const bool inside =
                        y >= g.dst_y + 3 && y < g.dst_y + 6 && x >= g.dst_x && x < g.dst_x + 12;
                    for (size_t n = 0; n < bpp; ++n) {
                        const size_t at = static_cast<size_t>(y * g.canvas_width + x) * bpp + n;
                        EXPECT_EQ(picture.dst[at], inside ? expected[at] : 0x77);
                    }
                }
            }
            // Of its rows only row 4 has chroma: 12 samples in either layout.
            const auto luma =
                static_cast<size_t>(reference::luma_bytes(g.canvas_width, g.canvas_height, format));
            const auto drawn =
                std::count_if(picture.dst.begin() + static_cast<ptrdiff_t>(luma), picture.dst.end(),
                              [](uint8_t b) { return b != 0x77; });
            EXPECT_LE(drawn, 12);
        }
    }
}

TEST(BilinearBandTask, AnotherFormatWritesNothing) {
    Random random(50);
    for (const bool with_target : {false, true}) {
        for (const int32_t format : {-1, 0, 1, 3, 6, 9, 17, 20}) {
            SmallPicture picture(7, with_target, random);
            const auto before = picture.dst;
            picture.target.format = format;
            Band band(picture.call, picture.src.data(), picture.dst.data(),
                      picture.target_or_null());
            if (!with_target) band.record.format = format;
            _ov_bilinear_tp(&band.record);
            EXPECT_EQ(picture.dst, before);
        }
    }
}

// The format, the stride and the placement are those of the target, whatever the record says.
TEST(BilinearBandTask, TheTargetOverridesTheRecord) {
    Random random(51);
    for (const int32_t format : kFormats) {
        SmallPicture picture(format, true, random);
        Band band(picture.call, picture.src.data(), picture.dst.data(), &picture.target);
        band.record.format = -1;
        band.record.canvas_width = 1;
        _ov_bilinear_tp(&band.record);
        EXPECT_EQ(picture.dst, picture.expected()) << format;
    }
}

TEST(BilinearBandTask, AnEmptyBandDrawsNothing) {
    Random random(52);
    SmallPicture picture(7, false, random);
    const auto before = picture.dst;
    Band band(picture.call, picture.src.data(), picture.dst.data(), nullptr);
    band.record.first_row = 5;
    for (const int32_t end : {5, 4, 0, -3}) {
        band.record.end_row = end;
        _ov_bilinear_tp(&band.record);
    }
    EXPECT_EQ(picture.dst, before);
}

TEST(BilinearThreads, EightCallersAtOnceGetTheirOwnBytes) {
    constexpr int kCallers = 8;
    std::vector<std::thread> callers;
    for (int caller = 0; caller < kCallers; ++caller) {
        callers.emplace_back([caller] {
            Random random(60 + static_cast<uint64_t>(caller));
            for (int i = 0; i < rounds(6); ++i) {
                const int32_t format = kFormats[static_cast<size_t>(caller + i) % 5];
                check(call_without_target(format, 20 + caller, 1030 + i, 30 + i, 1024 + caller),
                      random);
                check(call_without_target(format, 40 + caller, 60 + i, 30 + i, 70), random);
            }
        });
    }
    for (std::thread& caller : callers) caller.join();
}
