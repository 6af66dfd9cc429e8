// SPDX-License-Identifier: Apache-2.0
// Pictures whose bytes lie more than 2 or 4 GiB apart. They are mapped without memory behind them:
// reading a page that nobody has written gives zeros and costs nothing, and only pages with planted
// bytes, or those written, are real.
#include <gtest/gtest.h>
#include <ovrinresize.h>
#include <sys/mman.h>

#include <cstdint>
#include <vector>

#include "support/instrumented.h"

namespace {

constexpr int64_t kGiB = int64_t{1} << 30;

// Zeros, or nothing where the system refuses so much address space.
class Sparse {
public:
    explicit Sparse(int64_t bytes) : bytes_(static_cast<size_t>(bytes)) {
        map_ = mmap(nullptr, bytes_, PROT_READ | PROT_WRITE,
                    MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE, -1, 0);
        // Large pages would make each planted byte cost 2 MiB.
        if (map_ != MAP_FAILED) madvise(map_, bytes_, MADV_NOHUGEPAGE);
    }
    ~Sparse() {
        if (map_ != MAP_FAILED) munmap(map_, bytes_);
    }
    Sparse(const Sparse&) = delete;
    Sparse& operator=(const Sparse&) = delete;

    bool is_mapped() const { return map_ != MAP_FAILED; }
    uint8_t* data() { return static_cast<uint8_t*>(map_); }
    uint8_t& operator[](int64_t i) { return data()[i]; }
    uint32_t* words() { return static_cast<uint32_t*>(map_); }

private:
    size_t bytes_;
    void* map_;
};

// Rows so long that few of them are enough: 60000 pixels, which no destination row reads all of.
constexpr int32_t kW = 60000;

class BigPictures : public ::testing::Test {
protected:
    void SetUp() override {
        if (ovrin_test::kInstrumented)
            GTEST_SKIP() << "skipped: a sanitizer shadows every byte of a picture";
        if (sizeof(void*) < 8) GTEST_SKIP() << "skipped: no address space";
    }
};

#define SKIP_UNLESS_MAPPED(picture) \
    if (!(picture).is_mapped()) GTEST_SKIP() << "skipped: the system refuses the mapping"

// Source cell of target k's point, as the header states it.
int64_t near_cell(int64_t k, int64_t source, int64_t target) {
    return (k * source + (source >> 2)) / target;
}
int64_t far_cell(int64_t k, int64_t source, int64_t target) {
    return (k * source + ((3 * source) >> 2)) / target;
}

}  // namespace

// 4.5 GB of pixels on one thread and in bands: the last destination pixel, the one whose source
// lies just behind 2 GiB, and one just behind 4 GiB.
TEST_F(BigPictures, Rgba8888) {
    constexpr int32_t kH = 20000, kDstW = 5, kDstH = 40;
    static_assert(int64_t{kW} * kH * 4 > 4 * kGiB);
    Sparse src(int64_t{kW} * kH * 4);
    SKIP_UNLESS_MAPPED(src);
    std::vector<int64_t> rows = {kDstH - 1, 2 * kGiB * kDstH / (int64_t{kW} * kH * 4) + 1,
                                 4 * kGiB * kDstH / (int64_t{kW} * kH * 4) + 1};
    for (const int64_t j : rows) {
        const int64_t row = far_cell(j, kH, kDstH);
        src[(row * kW + near_cell(3, kW, kDstW)) * 4 + 1] = 200;
    }
    EXPECT_GT((far_cell(rows[1], kH, kDstH) * kW) * 4, 2 * kGiB);
    EXPECT_GT((far_cell(rows[2], kH, kDstH) * kW) * 4, 4 * kGiB);
    std::vector<uint32_t> expected(size_t{kDstW} * kDstH);
    for (const int64_t j : rows) expected[static_cast<size_t>(j * kDstW + 3)] = 50 << 8;
    for (auto* resize :
         {ovrin_resize_rgba8888_sg, ovrin_resize_rgba8888_tps, ovrin_resize_rgba8888}) {
        std::vector<uint32_t> dst(expected.size(), 0xEEEEEEEE);
        resize(src.data(), dst.data(), kW, kH, kDstW, kDstH);
        EXPECT_EQ(dst, expected);
    }
}

// A destination beyond 4 GiB: a row that is written far behind the others, at an offset that a
// canvas gives. Clearing the canvas would touch all of it; the band task does not clear.
TEST_F(BigPictures, Rgba8888BandIntoAFarDestination) {
    constexpr int32_t kRow = 1 << 20, kRows = 1100, kSize = 8;  // 4.4 GB
    Sparse dst(int64_t{kRow} * kRows * 4);
    SKIP_UNLESS_MAPPED(dst);
    const std::vector<uint8_t> src(kSize * kSize * 4, 255);
    ovrin_rgba_band band = {};
    band.src_w = band.src_h = band.src_stride = band.src_rows = kSize;
    band.dst_w = band.dst_h = 4;
    band.dst_x = 16;
    band.dst_skip = kRow - 16 - 4;
    band.di_11 = band.di_13 = band.di_31 = band.di_33 = (kRows - 4) * kRow;
    band.src = src.data();
    band.dst = dst.words();
    band.rows_to_do = kSize;
    _resize_rgba8888_keep_ratio_tp(&band);
    EXPECT_EQ(band.done, 1);
    for (int64_t row = kRows - 4; row < kRows; ++row) {
        for (int64_t column = 16; column < 20; ++column) {
            EXPECT_EQ(dst.words()[row * kRow + column], 0xFCFCFCFCU);
        }
        EXPECT_EQ(dst.words()[row * kRow + 15], 0U);
        EXPECT_EQ(dst.words()[row * kRow + 20], 0U);
    }
}

TEST_F(BigPictures, Rgb888) {
    constexpr int32_t kH = 13000, kDstW = 7, kDstH = 30;
    static_assert(int64_t{kW} * kH * 3 > 2 * kGiB);
    Sparse src(int64_t{kW} * kH * 3);
    SKIP_UNLESS_MAPPED(src);
    src[(far_cell(kDstH - 1, kH, kDstH) * kW + far_cell(kDstW - 1, kW, kDstW)) * 3 + 2] = 200;
    std::vector<uint8_t> dst(size_t{kDstW} * kDstH * 3, 0xEE);
    ovrin_resize_rgb888(src.data(), dst.data(), kW, kH, kDstW, kDstH);
    std::vector<uint8_t> expected(dst.size());
    expected.back() = 50;
    EXPECT_EQ(dst, expected);
}

// Luma of 4.2 GB: both chroma planes lie behind it, the second one behind 5 GB.
TEST_F(BigPictures, I420) {
    constexpr int32_t kH = 70000, kDstW = 8, kDstH = 40;
    constexpr int64_t kLuma = int64_t{kW} * kH, kChroma = kLuma / 4;
    static_assert(kLuma > 3 * kGiB);
    Sparse src(kLuma + 2 * kChroma);
    SKIP_UNLESS_MAPPED(src);
    const int64_t row = far_cell(kDstH / 2 - 1, kH / 2, kDstH / 2);
    const int64_t column = near_cell(1, kW / 2, kDstW / 2);
    src[far_cell(kDstH - 1, kH, kDstH) * kW + near_cell(5, kW, kDstW)] = 200;
    src[kLuma + row * (kW / 2) + column] = 100;
    src[kLuma + kChroma + row * (kW / 2) + column] = 240;
    std::vector<uint8_t> expected(kDstW * kDstH * 3 / 2);
    expected[(kDstH - 1) * kDstW + 5] = 50;
    const size_t in_chroma = (kDstH / 2 - 1) * (kDstW / 2) + 1;
    expected[kDstW * kDstH + in_chroma] = 25;
    expected[kDstW * kDstH * 5 / 4 + in_chroma] = 60;
    for (auto* resize : {ovrin_resize_yuv420_sg, ovrin_resize_yuv420_tps}) {
        std::vector<uint8_t> dst(expected.size(), 0xEE);
        resize(src.data(), dst.data(), kW, kH, kDstW, kDstH);
        EXPECT_EQ(dst, expected);
    }
}

TEST_F(BigPictures, Nv21) {
    constexpr int32_t kH = 70000, kDstW = 8, kDstH = 40;
    constexpr int64_t kLuma = int64_t{kW} * kH;
    Sparse src(kLuma * 3 / 2);
    SKIP_UNLESS_MAPPED(src);
    const int64_t row = far_cell(kDstH / 2 - 1, kH / 2, kDstH / 2);
    // Pairs are counted by extents in bytes.
    const int64_t pair = near_cell(1, kW, kDstW);
    src[far_cell(kDstH - 1, kH, kDstH) * kW + near_cell(5, kW, kDstW)] = 200;
    src[kLuma + row * kW + 2 * pair] = 100;
    src[kLuma + row * kW + 2 * pair + 1] = 240;
    std::vector<uint8_t> expected(kDstW * kDstH * 3 / 2);
    expected[(kDstH - 1) * kDstW + 5] = 50;
    const size_t in_chroma = kDstW * kDstH + (kDstH / 2 - 1) * kDstW + 2;
    expected[in_chroma] = 25;
    expected[in_chroma + 1] = 60;
    for (auto* resize : {ovrin_resize_nv21_sg, ovrin_resize_nv21_tps}) {
        std::vector<uint8_t> dst(expected.size(), 0xEE);
        resize(src.data(), dst.data(), kW, kH, kDstW, kDstH);
        EXPECT_EQ(dst, expected);
    }
}

// Source row y of target row j is (int)(step * j) + half a step.
TEST_F(BigPictures, Nearest) {
    constexpr int32_t kH = 20000, kDstW = 6, kDstH = 40;
    Sparse src(int64_t{kW} * kH * 4);
    SKIP_UNLESS_MAPPED(src);
    const int64_t row = int64_t{kH / kDstH} * (kDstH - 1) + kH / kDstH / 2;
    const int64_t column = int64_t{kW / kDstW} * 4 + kW / kDstW / 2;
    EXPECT_GT((row * kW + column) * 4, 4 * kGiB);
    src.words()[row * kW + column] = 0x12345678;
    std::vector<uint32_t> dst(size_t{kDstW} * kDstH, 0xEEEEEEEE);
    ovrin_resize_nearest_rgba8888(src.words(), dst.data(), kW, kH, kDstW, kDstH);
    std::vector<uint32_t> expected(dst.size());
    expected[(kDstH - 1) * kDstW + 4] = 0x12345678;
    EXPECT_EQ(dst, expected);
}

// Blended, and, from 1024 destination rows on, point-sampled in bands.
TEST_F(BigPictures, Bilinear) {
    constexpr int32_t kH = 20000, kDstW = 6;
    Sparse src(int64_t{kW} * kH * 4 + (kW + 1) * 4);
    SKIP_UNLESS_MAPPED(src);
    for (const int32_t dst_h : {40, 2000}) {
        const int64_t row = int64_t{kH / dst_h} * (dst_h - 1);
        const int64_t column = int64_t{kW / kDstW} * 4;
        EXPECT_GT((row * kW + column) * 4, 4 * kGiB);
        src[(row * kW + column) * 4 + 2] = 160;
        std::vector<uint8_t> dst(static_cast<size_t>(kDstW * dst_h * 4), 0xEE);
        ov_bilinear(src.data(), dst.data(), kW, kH, kDstW, dst_h, 7, nullptr);
        std::vector<uint8_t> expected(dst.size());
        // On a sample the weight of its neighbours is a quarter in either direction.
        expected[static_cast<size_t>(((dst_h - 1) * kDstW + 4) * 4 + 2)] =
            dst_h < 1024 ? 160 * 9 / 16 : 160;
        EXPECT_EQ(dst, expected) << dst_h;
        src[(row * kW + column) * 4 + 2] = 0;
    }
}

// Band records hold the bytes between two rows in 32 bits; such pictures stay on one thread.
TEST_F(BigPictures, BilinearRowsFurtherApartThanABandCanSay) {
    constexpr int32_t kStride = INT32_MAX / 4 + 1, kWidth = 8, kHeight = 2;
    constexpr int32_t kDstWidth = 6, kDstHeight = 1100;
    Sparse src(int64_t{kStride} * kHeight * 4 + kWidth * 4);
    SKIP_UNLESS_MAPPED(src);
    for (int64_t i = 0; i < kWidth * 4; ++i) src.data()[i] = static_cast<uint8_t>(7 * i + 1);
    ovrin_resize_target target = {};
    target.src_width = kWidth;
    target.src_height = target.src_buffer_height = kHeight;
    target.src_stride = kStride;
    target.format = 7;
    target.canvas_width = kDstWidth;
    target.canvas_height = kDstHeight;
    std::vector<uint8_t> single(size_t{kDstWidth} * kDstHeight * 4);
    std::vector<uint8_t> chosen(single.size(), 0xEE);
    ov_bilinear_sg(src.data(), single.data(), kWidth, kHeight, kDstWidth, kDstHeight, 7, &target);
    ov_bilinear(src.data(), chosen.data(), kWidth, kHeight, kDstWidth, kDstHeight, 7, &target);
    EXPECT_EQ(chosen, single);
}

// Rows 700 MB apart: only the five rows themselves are read, but beyond 2 GiB.
TEST_F(BigPictures, LanczosRowsFarApart) {
    constexpr int32_t kStride = 700 << 20, kSize = 5;
    Sparse src(int64_t{kStride} * (kSize - 1) + kSize);
    SKIP_UNLESS_MAPPED(src);
    for (int64_t row = 0; row < kSize; ++row) {
        for (int64_t column = 0; column < kSize; ++column) {
            src[row * kStride + column] = static_cast<uint8_t>(10 * row + column);
        }
    }
    std::vector<uint8_t> dst(kSize * kSize);
    const lanczos_image from = {kSize, kSize, kStride, 1, src.data()};
    const lanczos_image to = {kSize, kSize, kSize, 1, dst.data()};
    OvTransformLanczos(&from, &to);
    for (size_t i = 0; i < dst.size(); ++i) EXPECT_EQ(dst[i], 10 * (i / kSize) + i % kSize);
}
