// SPDX-License-Identifier: Apache-2.0
// The engines with every instruction set's kernels against the engines with the scalar ones, which
// other tests compare with the definition.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <vector>

#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/vector_sets.h"

using namespace ovrin;
using namespace ovrin_test;

namespace {

using Bytes = std::vector<uint8_t>;

class EngineKernels : public VectorSets {
protected:
    void TearDown() override { force_kernels(*best_); }

    // Calls resize(dst) with scalar kernels and with each other set.
    template <class Resize>
    void expect_alike(size_t dst_bytes, const Resize& resize) {
        Bytes expected(dst_bytes);
        force_kernels(scalar_kernels);
        resize(expected.data());
        for (const NamedKernels& set : vector_sets_) {
            GuardedBuffer<uint8_t> actual(dst_bytes);
            force_kernels(*set.kernels);
            resize(actual.data());
            EXPECT_TRUE(same_bytes(actual.data(), expected.data(), dst_bytes)) << set.name;
            EXPECT_TRUE(actual.intact()) << set.name;
        }
    }

    void lanczos_alike(const Bytes& src, int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h,
                       int32_t n) {
        SCOPED_TRACE(::testing::Message() << src_w << "x" << src_h << " to " << dst_w << "x"
                                          << dst_h << ", " << n << " components");
        const GuardedBuffer<uint8_t> guarded(src);
        expect_alike(
            static_cast<size_t>(dst_w) * static_cast<size_t>(dst_h * n),
            [&](uint8_t* dst) { ov_lanczos(guarded.data(), src_w, src_h, dst, dst_w, dst_h, n); });
    }

    const Kernels* best_ = &kernels();
};

Bytes constant(size_t count, int value) {
    return Bytes(count, static_cast<uint8_t>(value));
}

// Squares of black and white: every output lies beside a hard edge, many half way between bytes.
Bytes checkerboard(int32_t w, int32_t h) {
    Bytes result;
    for (int32_t i = 0; i < w * h; ++i) {
        const bool white = (i % w + i / w) % 2 == 0;
        for (int c = 0; c < 4; ++c) result.push_back(white ? 255 : 0);
    }
    return result;
}

}  // namespace

TEST_F(EngineKernels, BilinearOfRandomSizes) {
    Random random(41);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(600) && !HasFailure(); ++i) {
        const int32_t src_w = random.awkward_size();
        const int32_t src_h = random.awkward_size();
        const int32_t dst_w = random.awkward_size();
        const int32_t dst_h = random.awkward_size();
        const int32_t format = random.pick({2, 7, 18});
        const size_t pixels = static_cast<size_t>(src_w) * static_cast<size_t>(src_h);
        // Behind the planes the engine may read up to a row and a sample.
        const Bytes src = random.bytes((pixels + static_cast<size_t>(src_w) + 1) * 4);
        SCOPED_TRACE(::testing::Message() << "format " << format << ", " << src_w << "x" << src_h
                                          << " to " << dst_w << "x" << dst_h);
        expect_alike(
            static_cast<size_t>(dst_w + 1) * static_cast<size_t>(dst_h + 1) * 4, [&](uint8_t* dst) {
                ov_bilinear_sg(src.data(), dst, src_w, src_h, dst_w, dst_h, format, nullptr);
            });
    }
}

TEST_F(EngineKernels, BilinearRowsOfSeveralStrips) {
    Random random(42);
    for (const int32_t format : {2, 7, 18}) {
        for (const int32_t src_w : {90, 700, 3000}) {
            const Bytes src = random.bytes(static_cast<size_t>(src_w) * 7 * 4);
            expect_alike(1700 * 9 * 4, [&](uint8_t* dst) {
                ov_bilinear_sg(src.data(), dst, src_w, 5, 1700, 9, format, nullptr);
            });
        }
    }
}

// Rows that are reused, once or often, and strips that end with or beside a vector, for reductions
// that fit into windows of all sizes, and more.
TEST_F(EngineKernels, BilinearAroundStripBorders) {
    Random random(46);
    for (const int32_t format : {2, 7, 18}) {
        for (const int32_t dst_w : {511, 512, 513, 1023, 1024, 1041}) {
            const int32_t src_w = random.pick({dst_w / 3, dst_w, dst_w * 3 / 2, dst_w * 3, 4000});
            const int32_t src_h = random.between(3, 12);
            const int32_t dst_h = random.pick({5, 13, 40});
            const Bytes src = random.bytes(static_cast<size_t>(src_w) * 16 * 4);
            SCOPED_TRACE(::testing::Message() << "format " << format << ", " << src_w << "x"
                                              << src_h << " to " << dst_w << "x" << dst_h);
            expect_alike(static_cast<size_t>(dst_w + 1) * static_cast<size_t>(dst_h + 1) * 4,
                         [&](uint8_t* dst) {
                             ov_bilinear_sg(src.data(), dst, src_w, src_h, dst_w, dst_h, format,
                                            nullptr);
                         });
        }
    }
}

// A band copies samples from where its tables say, in whatever order.
TEST_F(EngineKernels, BilinearCopiesInAnyOrder) {
    Random random(47);
    constexpr int32_t kSrcW = 600, kSrcH = 12, kDstW = 531, kDstH = 10;
    const GuardedBuffer<uint8_t> src(random.bytes(kSrcW * kSrcH * 4));
    const std::vector<int32_t> weights(kDstW);
    for (const int32_t format : {2, 7, 18}) {
        for (const int order : {0, 1, 2, 3}) {
            std::vector<int32_t> columns;
            std::vector<int32_t> rows;
            for (int32_t i = 0; i < kDstW; ++i) {
                const int32_t orders[] = {i, kDstW - i, i ^ 1, random.between(0, kDstW)};
                columns.push_back(orders[order]);
                rows.push_back(random.between(0, kSrcH - 1));
            }
            ovrin_resize_target target = {};
            target.src_vu_plane = target.src_u_plane = target.src_v_plane = src.data();
            target.src_width = target.src_stride = kSrcW;
            target.src_height = kSrcH;
            target.format = format;
            target.canvas_width = kDstW;
            target.canvas_height = kDstH;
            ovrin_bilinear_band band = {};
            band.target = &target;
            band.dst_w = kDstW;
            band.dst_h = band.end_row = kDstH;
            band.src = src.data();
            band.format = format;
            band.col_weight = band.row_weight = const_cast<int32_t*>(weights.data());
            band.col_index = columns.data();
            band.row_index = rows.data();
            SCOPED_TRACE(::testing::Message() << "format " << format << ", order " << order);
            expect_alike(kDstW * kDstH * 4, [&](uint8_t* dst) {
                band.dst = dst;
                _ov_bilinear_tp(&band);
            });
        }
    }
}

TEST_F(EngineKernels, LanczosOfRandomSizes) {
    Random random(43);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(150) && !HasFailure(); ++i) {
        const int32_t src_w = random.between(1, 70);
        const int32_t src_h = random.between(1, 40);
        const int32_t n = random.pick({4, 4, 4, 1, 2, 3});
        const Bytes src = random.bytes(static_cast<size_t>(src_w) * static_cast<size_t>(src_h * n));
        lanczos_alike(src, src_w, src_h, random.between(1, 70), random.between(1, 40), n);
    }
}

// Where the shortcut leaves the byte open: constant pictures, edges, exact halves.
TEST_F(EngineKernels, LanczosOnTheBoundariesOfRounding) {
    for (const int value : {0, 1, 127, 128, 254, 255}) {
        lanczos_alike(constant(20 * 10 * 4, value), 20, 10, 33, 17, 4);
        lanczos_alike(constant(20 * 10 * 4, value), 20, 10, 7, 5, 4);
    }
    const Bytes board = checkerboard(24, 12);
    for (const int n : {1, 2, 3}) lanczos_alike(board, 24, 12, 48, 24, n);
    lanczos_alike(board, 24, 12, 48, 24, 4);
    lanczos_alike(board, 24, 12, 72, 36, 4);
    lanczos_alike(board, 24, 12, 12, 6, 4);
    lanczos_alike(board, 24, 12, 31, 29, 4);
    Bytes steps;
    for (int i = 0; i < 256 * 4 * 4; ++i) steps.push_back(static_cast<uint8_t>(i / 4 % 256));
    lanczos_alike(steps, 256, 4, 512, 8, 4);
    lanczos_alike(steps, 256, 4, 128, 2, 4);
}

// Strips that end with or beside a block, and source rows that serve several result rows.
TEST_F(EngineKernels, LanczosAroundStripBorders) {
    Random random(48);
    for (const int32_t n : {1, 2, 3, 4}) {
        for (const int32_t dst_w : {15, 16, 17, 255, 256, 257, 272, 513}) {
            const int32_t src_w = random.pick({dst_w / 3, dst_w / 2, dst_w * 2, dst_w * 5});
            const int32_t src_h = random.between(2, 20);
            const Bytes src =
                random.bytes(static_cast<size_t>(src_w) * static_cast<size_t>(src_h * n));
            lanczos_alike(src, src_w, src_h, dst_w, random.pick({5, 9, 30}), n);
        }
    }
}

TEST_F(EngineKernels, LanczosRowsWiderThanASpan) {
    Random random(44);
    lanczos_alike(random.bytes(5000 * 3 * 4), 5000, 3, 2600, 2, 4);
    lanczos_alike(random.bytes(5000 * 3 * 4), 5000, 3, 3, 2, 4);
    lanczos_alike(random.bytes(60 * 3 * 4), 60, 3, 2600, 2, 4);
}

// A band record's weights may be anything. Large ones leave no room for the shortcut, and those of
// rows may be too large for single precision.
TEST_F(EngineKernels, LanczosWithACallersOwnWeights) {
    Random random(45);
    const Bytes src = random.bytes(16 * 8 * 4);
    std::vector<double> columns(16 * 7);
    std::vector<double> rows(8 * 7);
    float table = 0;
    const double scales[][2] = {{0.3, 0.3}, {3.0, 3.0}, {1e6, 1e6},
                                {0.3, 1e6}, {1e6, 0.3}, {0.3, 1e39}};
    for (const auto& [across, down] : scales) {
        SCOPED_TRACE(::testing::Message() << across << " across, " << down << " down");
        for (double& weight : columns) weight = across * random.between(-100, 100) / 100.0;
        for (double& weight : rows) weight = down * random.between(-100, 100) / 100.0;
        expect_alike(16 * 8 * 4, [&](uint8_t* dst) {
            ovrin_lanczos_band band = {16, 8, 16, 8,      src.data(),     dst,
                                       4,  0, 8,  &table, columns.data(), rows.data()};
            _resize_lanczos_tp(&band);
        });
    }
}
