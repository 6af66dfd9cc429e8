// SPDX-License-Identifier: Apache-2.0
// The two engines when task slots are refused, and memory and threads in calls that draw nothing or
// make one band. What every other call does without them is every_entry_point_test.cpp's business.
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
// what a refusal left. The last call of each kind, with none refused, gives `whole`.
void refuse_everything(size_t size, const Picture& whole, const std::function<void(uint8_t*)>& draw,
                       const std::function<void(const Picture&)>& verify) {
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
            verify(dst);
        }
    }
}

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

TEST(BilinearFaults, RejectedFormatsLeakNothing) {
    const Picture src(9 * 1200 * 4);
    for (const int32_t format : {0, 3, 20}) {
        const Picture untouched(7 * 1100 * 4, 0xEE);
        for (auto* resize : {ov_bilinear_sg, ov_bilinear, ov_bilinear_ex}) {
            refuse_everything(
                untouched.size(), untouched,
                [&](uint8_t* dst) { resize(src.data(), dst, 9, 1100, 7, 1100, format, nullptr); },
                [&](const Picture& dst) { EXPECT_TRUE(dst == untouched); });
        }
    }
}

TEST(BilinearFaults, TheCallerDoesWithoutRefusedTasks) {
    const Picture src = Random(121).bytes(9 * 1200 * 4);
    const auto g = reference::packed_geometry(9, 1100, 7, 1100, 7);
    auto source = reference::contiguous_source(src.data(), 9, 1100);
    Picture sampled(7 * 1100 * 4);
    reference::bilinear(g, 9, 1100, 7, 1100, source, sampled);
    for (const int every : {1, 2, 3}) {
        Picture dst(sampled.size(), 0xEE);
        faults::reset();
        tasks_offered = 0;
        refused_every = every;
        ov_bilinear(src.data(), dst.data(), 9, 1100, 7, 1100, 7, nullptr);
        refused_every = 0;
        EXPECT_EQ(tasks_offered, 4);
        EXPECT_TRUE(dst == sampled) << every;
        EXPECT_EQ(faults::live_blocks(), 0);
    }
}

TEST(LanczosFaults, InvalidDescriptorsLeakNothing) {
    const Picture src(64);
    const Picture untouched(64, 0xEE);
    const auto nothing = [&](const Picture& dst) { EXPECT_TRUE(dst == untouched); };
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

TEST(LanczosFaults, OneBandFallsBackAndLeaksNothing) {
    const Picture src = Random(125).bytes(9 * 40 * 4);
    const Picture whole = reference::lanczos(src.data(), 9, 40, 6, 40, 4);
    const Picture untouched(whole.size(), 0xEE);
    refuse_everything(
        whole.size(), whole,
        [&](uint8_t* dst) { ovrin_resize_lanczos(src.data(), dst, 9, 40, 6, 40, 4); },
        [&](const Picture& dst) { EXPECT_TRUE(dst == whole || dst == untouched); });
}

TEST(LanczosFaults, TheCallerDoesWithoutRefusedTasks) {
    const Picture src = Random(126).bytes(9 * 300 * 4);
    const Picture whole = reference::lanczos(src.data(), 9, 300, 6, 300, 4);
    for (const int every : {1, 2, 3}) {
        Picture dst(whole.size(), 0xEE);
        faults::reset();
        tasks_offered = 0;
        refused_every = every;
        ovrin_resize_lanczos(src.data(), dst.data(), 9, 300, 6, 300, 4);
        refused_every = 0;
        EXPECT_EQ(tasks_offered, 4);
        EXPECT_TRUE(dst == whole) << every;
        EXPECT_EQ(faults::live_blocks(), 0);
    }
}
