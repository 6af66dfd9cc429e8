// SPDX-License-Identifier: Apache-2.0
// Whatever the threaded driver is refused, the picture is complete.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include "reference/quarter.h"
#include "support/compare.h"
#include "support/faults.h"
#include "support/random.h"

using faults::Kind;
using namespace ovrin_test;

TEST(Rgba8888Faults, EveryRefusalStillGivesTheWholePicture) {
    constexpr int32_t kSrcW = 9, kSrcH = 1100, kDstW = 5, kDstH = 333;
    Random random(11);
    SCOPED_TRACE(random.trace());
    const auto src = random.bytes(size_t{kSrcW} * kSrcH * 4);
    const auto expected = reference::quarter_packed(src.data(), kSrcW, kSrcH, kDstW, kDstH, 4);
    for (const Kind kind : faults::kAllKinds) {
        for (int nth = 1;; ++nth) {
            SCOPED_TRACE(::testing::Message() << faults::name(kind) << " call " << nth);
            std::vector<uint32_t> dst(size_t{kDstW} * kDstH, 0xEEEEEEEE);
            faults::fail(kind, nth);
            ovrin_resize_rgba8888_tps(src.data(), dst.data(), kSrcW, kSrcH, kDstW, kDstH);
            const bool failed = faults::has_failed();
            faults::reset();
            ASSERT_TRUE(same_bytes(reinterpret_cast<const uint8_t*>(dst.data()), expected.data(),
                                   expected.size()));
            EXPECT_EQ(faults::live_blocks(), 0);
            if (!failed) break;
        }
    }
}

TEST(Rgba8888Faults, TheSingleThreadedWayAsksForNothing) {
    const std::vector<uint8_t> src(64 * 64 * 4);
    std::vector<uint32_t> dst(32 * 32);
    faults::reset();
    ovrin_resize_rgba8888_sg(src.data(), dst.data(), 64, 64, 32, 32);
    for (const Kind kind : faults::kAllKinds) EXPECT_EQ(faults::calls(kind), 0);
}
