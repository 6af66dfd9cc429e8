// SPDX-License-Identifier: Apache-2.0
// Memory that the C++ layer asks for and does not get: an error, and nothing is written.
#include <gtest/gtest.h>
#include <ovrinresize.hpp>

#include <cstdint>
#include <vector>

#include "support/faults.h"

namespace {

using ovrin::ErrorCode;
using ovrin::Filter;

TEST(CppFaults, NoMemoryForAPicture) {
    ovrin::Picture picture;
    faults::fail(faults::Kind::kCalloc, 1);
    const ovrin::Status status = picture.allocate(ovrin::Format::kRgb888, 4, 5);
    faults::reset();
    EXPECT_EQ(status.code, ErrorCode::kNoMemory);
    EXPECT_STREQ(status.text, "picture: no memory for 60 bytes");
    EXPECT_EQ(picture.data(), nullptr);
    EXPECT_EQ(picture.bytes(), 0u);
}

// Rows apart at both ends: the first block is the source's copy, the second the destination's.
TEST(CppFaults, NoMemoryForCopies) {
    const std::vector<uint8_t> src(20 * 8, 200);
    const char* const texts[] = {"src: no memory for 128 bytes", "dst: no memory for 32 bytes"};
    for (int nth = 1; nth <= 2; ++nth) {
        std::vector<uint8_t> dst(10 * 4, 7);
        faults::fail(faults::Kind::kMalloc, nth);
        const ovrin::Status status = resize(ovrin::rgba_view(src.data(), src.size(), 4, 8, 20),
                                            ovrin::rgba_view(dst.data(), dst.size(), 2, 4, 10));
        EXPECT_TRUE(faults::has_failed());
        faults::reset();
        EXPECT_EQ(status.code, ErrorCode::kNoMemory);
        EXPECT_STREQ(status.text, texts[nth - 1]);
        EXPECT_EQ(dst, std::vector<uint8_t>(10 * 4, 7));
    }
    EXPECT_EQ(faults::live_blocks(), 0);
}

// A packed picture that is shrunk is not copied, by the bilinear filter neither.
TEST(CppFaults, PackedPicturesNeedNoCopy) {
    const std::vector<uint8_t> src(ovrin::picture_bytes(ovrin::Format::kRgba8888, 40, 80));
    std::vector<uint8_t> dst(20 * 40 * 4);
    faults::reset();
    ASSERT_TRUE(resize(ovrin::rgba_view(src.data(), src.size(), 40, 80),
                       ovrin::rgba_view(dst.data(), dst.size(), 20, 40), Filter::kBilinear)
                    .ok());
    EXPECT_LT(faults::largest_block(), src.size());
}

}  // namespace
