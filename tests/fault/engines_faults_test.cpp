// SPDX-License-Identifier: Apache-2.0
// The two engines when memory, threads or task slots are refused, one refusal after another until a
// call gets through.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <atomic>
#include <functional>
#include <vector>

#include "reference/bilinear.h"
#include "reference/lanczos.h"
#include "support/faults.h"
#include "support/random.h"

using faults::Kind;
using namespace ovrin_test;

namespace {

using Picture = std::vector<uint8_t>;

// Tasks that the pool refuses: every one whose number, from 1, divides by this. 0: none.
std::atomic<int> refused_every{0};
std::atomic<int> tasks_offered{0};

// Runs `draw` on a destination of `size` bytes with each request refused in turn; `verify` judges
// what a refusal of that kind left. The last call of each kind, with none refused, gives `whole`.
void refuse_everything(size_t size, const Picture& whole, const std::function<void(uint8_t*)>& draw,
                       const std::function<void(Kind, int, const Picture&)>& verify) {
    for (const Kind kind : faults::kAllKinds) {
        for (int nth = 1;; ++nth) {
            SCOPED_TRACE(::testing::Message() << faults::name(kind) << " call " << nth);
            Picture dst(size, 0xEE);
            faults::fail(kind, nth);
            draw(dst.data());
            const bool failed = faults::has_failed();
            faults::reset();
            EXPECT_EQ(faults::live_blocks(), 0);
            if (!failed) {
                EXPECT_TRUE(dst == whole);
                break;
            }
            verify(kind, nth, dst);
        }
    }
}

bool needs_memory(Kind kind) {
    return kind == Kind::kMalloc || kind == Kind::kCalloc;
}

struct BilinearPictures {
    BilinearPictures(int32_t format, int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h)
        : src(Random(121).bytes(static_cast<size_t>((src_w + 2) * (src_h + 4) * 4))) {
        const auto g = reference::packed_geometry(src_w, src_h, dst_w, dst_h, format);
        cleared.resize(static_cast<size_t>(reference::luma_bytes(dst_w, dst_h, format) +
                                           reference::chroma_bytes(dst_w, dst_h, format)));
        untouched = Picture(cleared.size(), 0xEE);
        reference::clear_canvas(g, cleared);
        blended = sampled = cleared;
        auto source = reference::contiguous_source(src.data(), src_w, src_h);
        reference::bilinear_single(g, src_w, src_h, dst_w, dst_h, source, blended);
        reference::bilinear(g, src_w, src_h, dst_w, dst_h, source, sampled);
    }

    Picture src, untouched, cleared, blended, sampled;
};

}  // namespace

extern "C" {
int32_t __real_ovrin_threadpool_add_task(ovrin_threadpool* pool, void (*function)(void*),
                                         void* argument, int32_t wait);
int32_t __wrap_ovrin_threadpool_add_task(ovrin_threadpool* pool, void (*function)(void*),
                                         void* argument, int32_t wait);

int32_t __wrap_ovrin_threadpool_add_task(ovrin_threadpool* pool, void (*function)(void*),
                                         void* argument, int32_t wait) {
    const int offered = ++tasks_offered;
    if (refused_every != 0 && offered % refused_every == 0) return offered % 2 == 0 ? -1 : -2;
    return __real_ovrin_threadpool_add_task(pool, function, argument, wait);
}
}

TEST(BilinearFaults, WithoutMemoryTheSingleThreadedWayWritesNothing) {
    for (const int32_t format : {2, 7, 18}) {
        const BilinearPictures p(format, 9, 50, 7, 60);
        refuse_everything(
            p.untouched.size(), p.blended,
            [&](uint8_t* dst) { ov_bilinear_sg(p.src.data(), dst, 9, 50, 7, 60, format, nullptr); },
            [&](Kind, int, const Picture& dst) { EXPECT_TRUE(dst == p.untouched); });
    }
}

// Without a pool the picture is made by blending; without tables nothing is written; without a band
// record either the picture is made by blending or the canvas stays black.
TEST(BilinearFaults, InBandsEveryRefusalHasAStatedOutcome) {
    for (const int32_t format : {2, 7, 18}) {
        const BilinearPictures p(format, 9, 1100, 7, 1100);
        ASSERT_NE(p.blended, p.sampled);
        int untouched = 0;
        refuse_everything(
            p.untouched.size(), p.sampled,
            [&](uint8_t* dst) {
                ov_bilinear(p.src.data(), dst, 9, 1100, 7, 1100, format, nullptr);
            },
            [&](Kind kind, int, const Picture& dst) {
                if (!needs_memory(kind)) {
                    EXPECT_TRUE(dst == p.blended);
                    return;
                }
                untouched += dst == p.untouched;
                EXPECT_TRUE(dst == p.blended || dst == p.untouched || dst == p.cleared);
            });
        EXPECT_GT(untouched, 0);
    }
}

TEST(BilinearFaults, RejectedFormatsLeakNothing) {
    const Picture src(9 * 1200 * 4);
    for (const int32_t format : {0, 3, 20}) {
        const Picture untouched(7 * 1100 * 4, 0xEE);
        for (auto* resize : {ov_bilinear_sg, ov_bilinear, ov_bilinear_ex}) {
            refuse_everything(
                untouched.size(), untouched,
                [&](uint8_t* dst) { resize(src.data(), dst, 9, 1100, 7, 1100, format, nullptr); },
                [&](Kind, int, const Picture& dst) { EXPECT_TRUE(dst == untouched); });
        }
    }
}

// Without scratch buffers the reduction is one pass; a pass without tables writes nothing, which
// may leave the destination as it was or as the last pass makes it from a black picture.
// The second pass of the planar picture reads beyond what the first one wrote: zeros.
TEST(BilinearFaults, LargeReductionsFallBackToOnePass) {
    for (const int32_t format : {2, 7, 18}) {
        const BilinearPictures p(format, 44, 48, 5, 6);
        Picture whole = p.cleared;
        auto source = reference::contiguous_source(p.src.data(), 44, 48);
        reference::bilinear_ex(44, 48, 5, 6, format, source, whole);
        ASSERT_NE(whole, p.blended);
        int one_pass = 0;
        refuse_everything(
            p.untouched.size(), whole,
            [&](uint8_t* dst) { ov_bilinear_ex(p.src.data(), dst, 44, 48, 5, 6, format, nullptr); },
            [&](Kind kind, int, const Picture& dst) {
                EXPECT_TRUE(needs_memory(kind));
                one_pass += dst == p.blended;
            });
        EXPECT_EQ(one_pass, 2);
    }
}

TEST(BilinearFaults, RefusedTasksAreRunByTheCaller) {
    const BilinearPictures p(7, 9, 1100, 7, 1100);
    for (const int every : {1, 2, 3, 34}) {
        Picture dst = p.untouched;
        faults::reset();
        tasks_offered = 0;
        refused_every = every;
        ov_bilinear(p.src.data(), dst.data(), 9, 1100, 7, 1100, 7, nullptr);
        refused_every = 0;
        EXPECT_GE(tasks_offered, 34);
        EXPECT_TRUE(dst == p.sampled) << every;
        EXPECT_EQ(faults::live_blocks(), 0);
    }
}

TEST(LanczosFaults, WithoutMemoryThereIsNoTable) {
    for (const Kind kind : {Kind::kMalloc, Kind::kCalloc}) {
        faults::fail(kind, 1);
        float* table = create_lanczos_lookup();
        EXPECT_EQ(table == nullptr, faults::has_failed());
        faults::reset();
        free(table);
        EXPECT_EQ(faults::live_blocks(), 0);
    }
}

TEST(LanczosFaults, TheTransformWritesNothing) {
    const Picture src = Random(122).bytes(19 * 13 * 3);
    const Picture untouched(11 * 17 * 3, 0xEE);
    const Picture whole = reference::lanczos(src.data(), 19, 13, 11, 17, 3);
    int refusals = 0;
    refuse_everything(
        whole.size(), whole, [&](uint8_t* dst) { ov_lanczos(src.data(), 19, 13, dst, 11, 17, 3); },
        [&](Kind, int, const Picture& dst) {
            ++refusals;
            EXPECT_TRUE(dst == untouched);
        });
    EXPECT_GE(refusals, 1);
}

TEST(LanczosFaults, InvalidDescriptorsLeakNothing) {
    const Picture src(64);
    const Picture untouched(64, 0xEE);
    const auto nothing = [&](Kind, int, const Picture& dst) { EXPECT_TRUE(dst == untouched); };
    refuse_everything(
        64, untouched, [&](uint8_t* dst) { ov_lanczos(nullptr, 4, 4, dst, 4, 4, 4); }, nothing);
    refuse_everything(
        64, untouched, [&](uint8_t* dst) { ov_lanczos(src.data(), 4, 0, dst, 4, 4, 4); }, nothing);
    refuse_everything(
        64, untouched,
        [&](uint8_t* dst) {
            lanczos_image to = {4, 4, 16, 4, dst};
            OvTransformLanczos(nullptr, &to);
        },
        nothing);
}

// Two transforms, each of which is whole or writes nothing.
TEST(LanczosFaults, EitherPlaneOfAnNvPictureMayBeMissing) {
    constexpr size_t kLuma = 11 * 17;
    const Picture src = Random(123).bytes(19 * 13 * 3);
    const Picture whole = reference::lanczos_nv(src.data(), 19, 13, 11, 17);
    refuse_everything(
        whole.size(), whole, [&](uint8_t* dst) { ov_lanczos_nv(src.data(), 19, 13, dst, 11, 17); },
        [&](Kind, int, const Picture& dst) {
            Picture expected = whole;
            const bool has_luma = dst.front() != 0xEE || dst[1] != 0xEE;
            if (has_luma) {
                std::fill(expected.begin() + kLuma, expected.end(), uint8_t{0xEE});
            } else {
                std::fill(expected.begin(), expected.begin() + kLuma, uint8_t{0xEE});
            }
            EXPECT_TRUE(dst == expected);
        });
}

// Without a pool the picture is made on the calling thread. Without memory nothing is written, or a
// band that cannot have its working storage stays black.
TEST(LanczosFaults, InBandsEveryRefusalHasAStatedOutcome) {
    constexpr int32_t kW = 6, kH = 100;
    const Picture src = Random(124).bytes(9 * kH * 4);
    const Picture whole = reference::lanczos(src.data(), 9, kH, kW, kH, 4);
    const Picture untouched(whole.size(), 0xEE);
    refuse_everything(
        whole.size(), whole,
        [&](uint8_t* dst) { ovrin_resize_lanczos(src.data(), dst, 9, kH, kW, kH, 4); },
        [&](Kind kind, int, const Picture& dst) {
            if (!needs_memory(kind)) {
                EXPECT_TRUE(dst == whole);
                return;
            }
            if (dst == untouched) return;
            // Three bands: rows 0 to 31, 32 to 63 and 64 to 99.
            int black = 0;
            for (const auto& [first, end] : {std::pair<int, int>{0, 32}, {32, 64}, {64, kH}}) {
                const Picture band(dst.begin() + first * kW * 4, dst.begin() + end * kW * 4);
                const Picture drawn(whole.begin() + first * kW * 4, whole.begin() + end * kW * 4);
                const bool is_black = band == Picture(band.size(), 0);
                black += is_black;
                EXPECT_TRUE(is_black || band == drawn) << first;
            }
            EXPECT_TRUE(black == 0 || black == 1 || black == 3);
        });
}

TEST(LanczosFaults, OneBandFallsBackAndLeaksNothing) {
    const Picture src = Random(125).bytes(9 * 40 * 4);
    const Picture whole = reference::lanczos(src.data(), 9, 40, 6, 40, 4);
    const Picture untouched(whole.size(), 0xEE);
    refuse_everything(
        whole.size(), whole,
        [&](uint8_t* dst) { ovrin_resize_lanczos(src.data(), dst, 9, 40, 6, 40, 4); },
        [&](Kind, int, const Picture& dst) { EXPECT_TRUE(dst == whole || dst == untouched); });
}

TEST(LanczosFaults, RefusedTasksAreRunByTheCaller) {
    const Picture src = Random(126).bytes(9 * 300 * 4);
    const Picture whole = reference::lanczos(src.data(), 9, 300, 6, 300, 4);
    for (const int every : {1, 2, 3, 9}) {
        Picture dst(whole.size(), 0xEE);
        faults::reset();
        tasks_offered = 0;
        refused_every = every;
        ovrin_resize_lanczos(src.data(), dst.data(), 9, 300, 6, 300, 4);
        refused_every = 0;
        EXPECT_GE(tasks_offered, 9);
        EXPECT_TRUE(dst == whole) << every;
        EXPECT_EQ(faults::live_blocks(), 0);
    }
}
