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

// Frames whose U and V take turns, whatever the order, need memory of the result's size at most.
TEST(CppFaults, RowsApartNeedNoCopyOfTheSource) {
    const std::vector<uint8_t> luma(448 * 400, 90);
    const std::vector<uint8_t> pairs(448 * 200, 128);
    std::vector<uint8_t> dst(ovrin::picture_bytes(ovrin::Format::kI420, 101, 99));
    const ovrin::ConstPlane y(luma.data(), luma.size(), 448);
    for (const int32_t row : {448, 402}) {
        for (const int u_first : {0, 1}) {
            const ovrin::ConstPlane u(pairs.data() + 1 - u_first, pairs.size() - 1, row, 2);
            const ovrin::ConstPlane v(pairs.data() + u_first, pairs.size() - 1, row, 2);
            faults::reset();
            ASSERT_TRUE(resize(ovrin::i420_view(y, u, v, 400, 400),
                               ovrin::i420_view(dst.data(), dst.size(), 101, 99))
                            .ok());
            EXPECT_LE(faults::largest_block(), size_t{2} * 104 * 100);
        }
    }
    EXPECT_EQ(faults::live_blocks(), 0);
}

// The first block is that of the chroma, the second that of the result.
TEST(CppFaults, NoMemoryForRowsApart) {
    const std::vector<uint8_t> src(16 * 8, 200);
    std::vector<uint8_t> dst(ovrin::picture_bytes(ovrin::Format::kI420, 3, 3), 7);
    const ovrin::ConstPlane y(src.data(), src.size(), 9);
    const ovrin::ConstPlane u(src.data(), src.size(), 16, 2);
    const auto refused = [&](int nth) {
        faults::fail(faults::Kind::kMalloc, nth);
        const ovrin::Status status =
            resize(ovrin::i420_view(y, u, u, 8, 8), ovrin::i420_view(dst.data(), dst.size(), 3, 3));
        EXPECT_TRUE(faults::has_failed());
        faults::reset();
        EXPECT_EQ(dst, std::vector<uint8_t>(dst.size(), 7));
        return status;
    };
    EXPECT_STREQ(refused(1).text, "src: no memory for 32 bytes");
    EXPECT_STREQ(refused(2).text, "dst: no memory for 24 bytes");
    EXPECT_EQ(faults::live_blocks(), 0);
}

// What the library itself is refused: one request after the other, alone and with all that follow.
// Either the picture is whole, or the status says that nothing was written.
template <class Make>
void refuse_each(Make make, size_t bytes, bool must_fail) {
    std::vector<uint8_t> expected(bytes, 7);
    ASSERT_TRUE(make(expected.data()).ok());
    int refusals = 0;
    for (const faults::Kind kind : faults::kAllKinds) {
        for (const bool and_all_later : {false, true}) {
            for (int nth = 1;; ++nth) {
                std::vector<uint8_t> dst(bytes, 7);
                faults::fail(kind, nth, and_all_later);
                const ovrin::Status status = make(dst.data());
                const bool failed = faults::has_failed();
                faults::reset();
                if (!failed) break;
                refusals += status.ok() ? 0 : 1;
                EXPECT_TRUE(status.ok() || status.code == ErrorCode::kNoMemory);
                EXPECT_EQ(dst, status.ok() ? expected : std::vector<uint8_t>(bytes, 7))
                    << faults::name(kind) << " " << nth;
            }
        }
    }
    EXPECT_EQ(refusals > 0, must_fail);
    EXPECT_EQ(faults::live_blocks(), 0);
}

TEST(CppFaults, LibraryWithoutMemory) {
    const std::vector<uint8_t> src(90 * 1100 * 4, 100);
    const auto yuv = [&](uint8_t* dst) {
        return resize(ovrin::i420_view(src.data(), src.size(), 33, 40),
                      ovrin::i420_view(dst, 10 * 10 * 3 / 2, 10, 10));
    };
    refuse_each(yuv, 150, true);
    const auto nv21_in_threads = [&](uint8_t* dst) {
        return resize(ovrin::nv21_view(src.data(), src.size(), 90, 1100),
                      ovrin::nv21_view(dst, 21 * 100 + 22 * 50, 21, 100));
    };
    refuse_each(nv21_in_threads, 21 * 100 + 22 * 50, true);
    const auto rgba = [&](uint8_t* dst) {
        return resize(ovrin::rgba_view(src.data(), src.size(), 90, 1100),
                      ovrin::rgba_view(dst, 21 * 100 * 4, 21, 100));
    };
    refuse_each(rgba, 21 * 100 * 4, false);
    const auto bilinear = [&](uint8_t* dst) {
        return resize(ovrin::rgba_view(src.data(), src.size(), 40, 40),
                      ovrin::rgba_view(dst, 400, 10, 10), Filter::kBilinear);
    };
    refuse_each(bilinear, 400, true);
    const auto canvas = [&](uint8_t* dst) {
        return draw(fit(ovrin::i420_view(src.data(), src.size(), 32, 16),
                        ovrin::i420_view(dst, 96, 8, 8), ovrin::Fit::kContain));
    };
    refuse_each(canvas, 96, true);
    const auto camera = [&](uint8_t* dst) {
        const ovrin::ConstPlane y(src.data(), src.size(), 40);
        const ovrin::ConstPlane u(src.data(), src.size(), 40, 2);
        const ovrin::ConstPlane v(src.data() + 1, src.size() - 1, 40, 2);
        return resize(ovrin::i420_view(y, u, v, 32, 16), ovrin::nv21_as_i420_view(dst, 96, 8, 8));
    };
    refuse_each(camera, 96, true);
}

// A picture that begins like the mark is a picture.
TEST(CppFaults, PicturesMayBeginLikeTheMark) {
    for (const int seed : {0x5A, 0xA5}) {
        std::vector<uint8_t> src(64);
        for (size_t i = 0; i < src.size(); ++i)
            src[i] = static_cast<uint8_t>(seed + 29 * int(i % 4));
        uint8_t dst[4] = {};
        const ovrin::Status status = resize(ovrin::rgba_view(src.data(), src.size(), 4, 4),
                                            ovrin::rgba_view(dst, 4, 1, 1), Filter::kLanczos);
        EXPECT_TRUE(status.ok());
        EXPECT_EQ(std::vector<uint8_t>(dst, dst + 4),
                  std::vector<uint8_t>(src.data(), src.data() + 4));
    }
}

}  // namespace
