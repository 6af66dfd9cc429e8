// SPDX-License-Identifier: Apache-2.0
// Large reductions in several passes.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <utility>

#include "support/bilinear_call.h"

using namespace ovrin_test;

namespace {

constexpr int32_t kFormats[] = {2, 7, 8, 18, 19};

using Sizes = std::vector<std::pair<int32_t, int32_t>>;

// Draws by one call of ov_bilinear for each size in turn; the last is that of the result.
std::vector<uint8_t> passes(const std::vector<uint8_t>& src, int32_t src_w, int32_t src_h,
                            const Sizes& sizes, int32_t format,
                            const ovrin_resize_target* target = nullptr) {
    // Long enough for any picture here; a pass may read beyond the one that was made last.
    auto bytes = static_cast<size_t>(src_w * src_h) + 64;
    for (const auto& [w, h] : sizes) bytes = std::max(bytes, static_cast<size_t>(w * h * 4) + 64);
    std::vector<uint8_t> scratch[2] = {std::vector<uint8_t>(bytes), std::vector<uint8_t>(bytes)};
    const uint8_t* from = src.data();
    int32_t from_w = src_w;
    int32_t from_h = src_h;
    size_t next = 0;
    for (const auto& [w, h] : sizes) {
        ov_bilinear(from, scratch[next].data(), from_w, from_h, w, h, format, target);
        from = scratch[next].data();
        from_w = w;
        from_h = h;
        next = 1 - next;
    }
    return std::move(scratch[1 - next]);
}

std::vector<uint8_t> source(int32_t format, int32_t w, int32_t h, Random& random) {
    const BilinearCall call = call_without_target(format, w, h, w, h);
    return random.bytes(canvas_bytes(call.g) + static_cast<size_t>(3 * w + 8));
}

// The result of ov_bilinear_ex is that of these passes.
void check(int32_t format, int32_t src_w, int32_t src_h, const Sizes& sizes, Random& random) {
    const auto [dst_w, dst_h] = sizes.back();
    SCOPED_TRACE(describe(call_without_target(format, src_w, src_h, dst_w, dst_h)));
    const auto src = source(format, src_w, src_h, random);
    GuardedBuffer<uint8_t> dst(canvas_bytes(call_without_target(format, 1, 1, dst_w, dst_h).g));
    ov_bilinear_ex(src.data(), dst.data(), src_w, src_h, dst_w, dst_h, format, nullptr);
    const auto expected = passes(src, src_w, src_h, sizes, format);
    ASSERT_TRUE(same_bytes(dst.data(), expected.data(), dst.size()));
}

void definition(const reference::BilinearGeometry& g, int32_t src_w, int32_t src_h, int32_t dst_w,
                int32_t dst_h, reference::BilinearSource& src, std::vector<uint8_t>& dst) {
    reference::bilinear_ex(src_w, src_h, dst_w, dst_h, g.format, src, dst);
}

}  // namespace

TEST(BilinearEx, ThePassesFollowFromTheSmallerRatio) {
    Random random(71);
    SCOPED_TRACE(random.trace());
    constexpr int32_t kDst = 12;
    for (int32_t ratio = 1; ratio <= 35; ++ratio) {
        const int expected = ratio < 4    ? 0
                             : ratio < 6  ? 1
                             : ratio < 10 ? 2
                             : ratio < 18 ? 3
                             : ratio < 34 ? 4
                                          : 5;
        const int32_t src_w = ratio * kDst + 5;
        const int32_t src_h = ratio * kDst + 11;
        Sizes sizes;
        for (int i = 1; i <= expected; ++i) sizes.emplace_back(src_w >> i, src_h >> i);
        sizes.emplace_back(kDst, kDst);
        for (const int32_t format : {7, 18}) check(format, src_w, src_h, sizes, random);
    }
}

TEST(BilinearEx, EightTimesSmallerTakesThreePasses) {
    Random random(72);
    SCOPED_TRACE(random.trace());
    check(18, 4000, 3000, {{2000, 1500}, {1000, 750}, {500, 375}}, random);
    check(7, 800, 600, {{400, 300}, {200, 150}, {100, 75}}, random);
}

TEST(BilinearEx, ReductionsBelowFourInEitherDirectionAreOnePass) {
    Random random(73);
    SCOPED_TRACE(random.trace());
    check(18, 4000, 3000, {{1000, 1000}}, random);
    for (const int32_t format : kFormats) {
        check(format, 80, 60, {{20, 20}}, random);
        check(format, 80, 60, {{21, 3}}, random);
        check(format, 80, 60, {{3, 16}}, random);
        check(format, 80, 60, {{80, 60}}, random);
        check(format, 80, 60, {{1, 100}}, random);
    }
}

TEST(BilinearEx, EnlargementsAreOnePass) {
    Random random(74);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        check(format, 10, 8, {{33, 21}}, random);
        check(format, 10, 8, {{9, 9}}, random);
        check(format, 100, 2, {{1, 300}}, random);
        check(format, 10, 30, {{11, 1100}}, random);
    }
}

TEST(BilinearEx, RandomReductionsEqualTheDefinition) {
    Random random(75);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(250) && !HasFatalFailure(); ++i) {
        const int32_t dst_w = random.between(1, 20);
        const int32_t dst_h = random.between(1, 20);
        const int32_t src_w = dst_w * random.between(1, 12) + random.between(0, dst_w);
        const int32_t src_h = dst_h * random.between(1, 12) + random.between(0, dst_h);
        check_bilinear(
            ov_bilinear_ex, definition,
            call_without_target(random.pick({2, 7, 8, 18, 19}), src_w, src_h, dst_w, dst_h), random,
            random.pick({Flush::kEnd, Flush::kStart}));
    }
}

// A pass may have 1024 rows or more; then it is point-sampled.
TEST(BilinearEx, TallPassesAreBanded) {
    Random random(76);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        check(format, 24, 4100, {{12, 2050}, {6, 1025}, {3, 512}}, random);
        check_bilinear(ov_bilinear_ex, definition, call_without_target(format, 24, 4100, 3, 512),
                       random);
    }
}

// Every pass reads, places and clears as the target says, which is not adjusted between them.
TEST(BilinearEx, ATargetHoldsForEveryPass) {
    Random random(77);
    SCOPED_TRACE(random.trace());
    for (const int32_t format : kFormats) {
        const auto src = random.bytes(64 * 64 * 4);
        const auto chroma = random.bytes(64 * 64);
        ovrin_resize_target target = {};
        target.src_vu_plane = target.src_u_plane = target.src_v_plane = chroma.data();
        target.src_width = 9;
        target.src_height = 8;
        target.src_stride = 10;
        target.src_buffer_height = 12;
        target.format = format;
        target.canvas_width = 17;
        target.canvas_height = 20;
        target.dst_x = 2;
        target.dst_y = 3;
        for (const auto& [dst, sizes] :
             {std::pair<int32_t, Sizes>{8, {{32, 32}, {16, 16}, {8, 8}}}, {20, {{20, 20}}}}) {
            const size_t bytes = canvas_bytes(call_without_target(format, 1, 1, 17, 20).g);
            GuardedBuffer<uint8_t> canvas(bytes);
            ov_bilinear_ex(src.data(), canvas.data(), 64, 64, dst, dst, -1, &target);
            const auto expected = passes(src, 64, 64, sizes, -1, &target);
            EXPECT_TRUE(same_bytes(canvas.data(), expected.data(), bytes)) << format;
        }
    }
}

// Their ratios are those of a reduction all the same.
TEST(BilinearEx, PicturesOfNegativeHeightAreNone) {
    const std::vector<uint8_t> src(64 * 64 * 4, 1);
    const std::vector<uint8_t> before(64, 0xAB);
    for (const int32_t format : kFormats) {
        for (const auto& [width, height] : {std::pair{64, -64}, {-64, 64}, {-64, -64}}) {
            GuardedBuffer<uint8_t> dst(before);
            ov_bilinear_ex(src.data(), dst.data(), width, height, width / 16, height / 16, format,
                           nullptr);
            EXPECT_TRUE(same_bytes(dst.data(), before.data(), before.size())) << format;
        }
    }
}
