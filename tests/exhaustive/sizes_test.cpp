// SPDX-License-Identifier: Apache-2.0
// Every function on every picture of up to 12 x 12 pixels, resized to each of these sizes.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <algorithm>

#include "exhaustive/every.h"
#include "reference/bilinear.h"
#include "reference/keep_ratio_rgba.h"
#include "reference/lanczos.h"
#include "reference/nearest.h"
#include "reference/yuv420.h"
#include "support/bilinear_call.h"
#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/letterbox.h"
#include "support/pictures.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

constexpr int32_t kLimit = 12;

// check(sizes, which end of the buffers lies against an inaccessible page); half each way, and each
// function sees either with every size on one side.
template <class Check>
void every_size(Check check) {
    const int32_t step = one_in();
    int32_t number = 0;
    for (int32_t src_w = 1; src_w <= kLimit; ++src_w) {
        for (int32_t src_h = 1; src_h <= kLimit; ++src_h) {
            for (int32_t dst_w = 1; dst_w <= kLimit; ++dst_w) {
                for (int32_t dst_h = 1; dst_h <= kLimit; ++dst_h) {
                    if (++number % step != 0) continue;
                    const Flush flush = (dst_w + dst_h) % 2 == 0 ? Flush::kEnd : Flush::kStart;
                    check(Sizes{src_w, src_h, dst_w, dst_h}, flush);
                    if (::testing::Test::HasFatalFailure()) return;
                }
            }
        }
    }
}

// draw(dst) must turn an exact buffer into `expected`.
template <class Draw>
void check_drawing(const std::vector<uint8_t>& expected, const Sizes& s, Flush flush, Draw draw) {
    GuardedBuffer<uint8_t> dst(expected.size(), flush, 0xEE);
    draw(dst.data());
    ASSERT_TRUE(same_bytes(dst.data(), expected.data(), expected.size())) << describe(s, flush);
    ASSERT_TRUE(dst.intact()) << describe(s, flush);
}

size_t pixels(int32_t w, int32_t h) {
    return static_cast<size_t>(w) * static_cast<size_t>(h);
}

std::vector<uint8_t> bytes_of(const std::vector<uint32_t>& words) {
    std::vector<uint8_t> bytes(words.size() * sizeof(uint32_t));
    memcpy(bytes.data(), words.data(), bytes.size());
    return bytes;
}

// A canvas a little larger than the picture, or one that cuts it or does not take it at all.
ovrin_resize_target around(const Sizes& s) {
    const bool cuts = (s.src_w + s.src_h) % 2 == 0;
    ovrin_resize_target target = letterbox(s.dst_w + (cuts ? 0 : 3), s.dst_h + 3, s.dst_w, s.dst_h,
                                           1 + s.src_w % 2, cuts ? 3 + s.dst_h / 2 : 2);
    target.src_width = s.src_w;
    target.src_height = s.src_h;
    target.src_stride = s.src_w + s.src_h % 3;
    return target;
}

}  // namespace

TEST(ExhaustiveSizes, Rgba8888) {
    Random random(900);
    every_size([&](const Sizes& s, Flush flush) {
        const GuardedBuffer<uint8_t> src(random.bytes(pixels(s.src_w, s.src_h) * 4), flush);
        const auto expected =
            reference::quarter_packed(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, 4);
        for (auto* resize :
             {ovrin_resize_rgba8888, ovrin_resize_rgba8888_sg, ovrin_resize_rgba8888_tps}) {
            check_drawing(expected, s, flush, [&](uint8_t* dst) {
                resize(src.data(), reinterpret_cast<uint32_t*>(dst), s.src_w, s.src_h, s.dst_w,
                       s.dst_h);
            });
        }
    });
}

TEST(ExhaustiveSizes, Rgb888) {
    Random random(901);
    every_size([&](const Sizes& s, Flush flush) {
        const GuardedBuffer<uint8_t> src(random.bytes(pixels(s.src_w, s.src_h) * 3), flush);
        check_drawing(reference::quarter_packed(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, 3),
                      s, flush, [&](uint8_t* dst) {
                          ovrin_resize_rgb888(src.data(), dst, s.src_w, s.src_h, s.dst_w, s.dst_h);
                      });
    });
}

TEST(ExhaustiveSizes, Rgba8888InACanvas) {
    Random random(902);
    every_size([&](const Sizes& s, Flush flush) {
        const ovrin_resize_target target = around(s);
        const GuardedPlane src(random, s.src_w * 4, s.src_h, target.src_stride * 4, flush);
        std::vector<uint32_t> canvas(pixels(target.canvas_width, target.canvas_height), 0xEEEEEEEE);
        ovrin_resize_target expected = target;
        reference::keep_ratio_rgba_sg(src.first(), s.src_w, s.src_h, expected, canvas);
        for (auto* resize : {ovrin_resize_rgba8888_keep_ratio, ovrin_resize_rgba_keep_ratio_sg,
                             ovrin_resize_rgba_keep_ratio_tps}) {
            check_drawing(bytes_of(canvas), s, flush, [&](uint8_t* dst) {
                ovrin_resize_target passed = target;
                passed.dst = expected.dst = dst;
                resize(src.first(), s.src_w, s.src_h, &passed);
                EXPECT_TRUE(same_target(passed, expected));
            });
        }
    });
}

TEST(ExhaustiveSizes, Nearest) {
    Random random(903);
    every_size([&](const Sizes& s, Flush flush) {
        const GuardedBuffer<uint8_t> src(random.bytes(pixels(s.src_w, s.src_h) * 4), flush);
        const auto* words = reinterpret_cast<const uint32_t*>(src.data());
        std::vector<uint32_t> expected(pixels(s.dst_w, s.dst_h), 0xEEEEEEEE);
        reference::nearest(words, expected, s.src_w, s.src_h, s.dst_w, s.dst_h);
        check_drawing(bytes_of(expected), s, flush, [&](uint8_t* dst) {
            ovrin_resize_nearest_rgba8888(words, reinterpret_cast<uint32_t*>(dst), s.src_w, s.src_h,
                                          s.dst_w, s.dst_h);
        });
    });
}

TEST(ExhaustiveSizes, I420) {
    Random random(904);
    every_size([&](const Sizes& s, Flush flush) {
        const GuardedBuffer<uint8_t> src(random.bytes(bytes_of_i420(s.src_w, s.src_h)), flush);
        const auto expected = reference::resize_yuv420(
            reference::contiguous(reference::kI420, src.data(), s.src_w, s.src_h), s.dst_w,
            s.dst_h);
        for (auto* resize :
             {ovrin_resize_yuv420, ovrin_resize_yuv420_sg, ovrin_resize_yuv420_tps}) {
            check_drawing(expected, s, flush, [&](uint8_t* dst) {
                resize(src.data(), dst, s.src_w, s.src_h, s.dst_w, s.dst_h);
            });
        }
    });
}

TEST(ExhaustiveSizes, ThreePlanes) {
    Random random(905);
    every_size([&](const Sizes& s, Flush flush) {
        const Yuv420Picture src(reference::kI420, random, s.src_w, s.src_h, s.src_w, flush);
        const auto expected = reference::resize_yuv420(src.view, s.dst_w, s.dst_h);
        check_drawing(expected, s, flush, [&](uint8_t* dst) {
            ovrin_resize_y_u_v(src.view.y, src.view.chroma[0], src.view.chroma[1], dst, s.src_w,
                               s.src_h, s.dst_w, s.dst_h);
        });
        for (auto* resize : {ovrin_resize_y_u_v_sg, ovrin_resize_y_u_v_tps}) {
            check_drawing(expected, s, flush, [&](uint8_t* dst) {
                resize(src.view.y, src.view.chroma[0], src.view.chroma[1], dst, s.src_w, s.src_h,
                       s.dst_w, s.dst_h, nullptr);
            });
        }
    });
}

TEST(ExhaustiveSizes, ThreePlanesInACanvas) {
    Random random(906);
    every_size([&](const Sizes& s, Flush flush) {
        ovrin_resize_target target = around(s);
        const Yuv420Picture src(reference::kI420, random, s.src_w, s.src_h, target.src_stride,
                                flush);
        std::vector<uint8_t> expected(bytes_of_i420(target.canvas_width, target.canvas_height),
                                      0xEE);
        reference::keep_ratio_yuv420_sg(src.view, target, expected);
        check_drawing(expected, s, flush, [&](uint8_t* dst) {
            target.dst = dst;
            ovrin_resize_y_u_v_keep_ratio(src.view.y, src.view.chroma[0], src.view.chroma[1],
                                          s.src_w, s.src_h, &target);
        });
    });
}

TEST(ExhaustiveSizes, Nv21) {
    Random random(907);
    every_size([&](const Sizes& s, Flush flush) {
        const GuardedBuffer<uint8_t> src(random.bytes(bytes_of_nv21(s.src_w, s.src_h)), flush);
        const auto expected = reference::resize_yuv420(
            reference::contiguous(reference::kNv21, src.data(), s.src_w, s.src_h), s.dst_w,
            s.dst_h);
        for (auto* resize : {ovrin_resize_nv21, ovrin_resize_nv21_sg, ovrin_resize_nv21_tps}) {
            check_drawing(expected, s, flush, [&](uint8_t* dst) {
                resize(src.data(), dst, s.src_w, s.src_h, s.dst_w, s.dst_h);
            });
        }
    });
}

TEST(ExhaustiveSizes, TwoPlanes) {
    Random random(908);
    every_size([&](const Sizes& s, Flush flush) {
        const Yuv420Picture src(reference::kNv21, random, s.src_w, s.src_h, s.src_w, flush);
        const auto expected = reference::resize_yuv420(src.view, s.dst_w, s.dst_h);
        check_drawing(expected, s, flush, [&](uint8_t* dst) {
            ovrin_resize_y_nv21(src.view.y, src.view.chroma[0], dst, s.src_w, s.src_h, s.dst_w,
                                s.dst_h);
        });
        for (auto* resize : {ovrin_resize_y_nv_sg, ovrin_resize_y_nv_tps}) {
            check_drawing(expected, s, flush, [&](uint8_t* dst) {
                resize(src.view.y, src.view.chroma[0], dst, s.src_w, s.src_h, s.dst_w, s.dst_h,
                       nullptr);
            });
        }
    });
}

TEST(ExhaustiveSizes, TwoPlanesInACanvas) {
    Random random(909);
    every_size([&](const Sizes& s, Flush flush) {
        ovrin_resize_target target = around(s);
        const Yuv420Picture src(reference::kNv21, random, s.src_w, s.src_h, target.src_stride,
                                flush);
        std::vector<uint8_t> expected(bytes_of_nv21(target.canvas_width, target.canvas_height),
                                      0xEE);
        reference::keep_ratio_yuv420_sg(src.view, target, expected);
        check_drawing(expected, s, flush, [&](uint8_t* dst) {
            target.dst = dst;
            ovrin_resize_y_nv21_keep_ratio(src.view.y, src.view.chroma[0], s.src_w, s.src_h,
                                           &target);
        });
    });
}

// Three entries that are one for pictures of these heights, and reductions of 4 and more in passes.
TEST(ExhaustiveSizes, Bilinear) {
    Random random(910);
    for (const int32_t format : {2, 7, 18}) {
        every_size([&](const Sizes& s, Flush flush) {
            const BilinearCall call =
                call_without_target(format, s.src_w, s.src_h, s.dst_w, s.dst_h);
            check_bilinear(s.src_w % 2 == 0 ? ov_bilinear : ov_bilinear_sg,
                           reference::bilinear_single, call, random, flush);
            const bool halves = !reference::halvings(s.src_w, s.src_h, s.dst_w, s.dst_h).empty();
            if (!halves && s.src_w % 3 != 0) return;  // the same call again
            check_bilinear(
                ov_bilinear_ex,
                [](const reference::BilinearGeometry& g, int32_t src_w, int32_t src_h,
                   int32_t dst_w, int32_t dst_h, reference::BilinearSource& src,
                   std::vector<uint8_t>& dst) {
                    reference::bilinear_ex(src_w, src_h, dst_w, dst_h, g.format, src, dst);
                },
                call, random, flush);
        });
    }
}

TEST(ExhaustiveSizes, BilinearInACanvas) {
    Random random(911);
    for (const int32_t format : {2, 8, 19}) {
        every_size([&](const Sizes& s, Flush flush) {
            const ovrin_resize_target target = around(s);
            BilinearCall call = call_without_target(format, s.src_w, s.src_h, s.dst_w, s.dst_h);
            call.with_target = true;
            call.g.src_stride = target.src_stride;
            call.g.canvas_width = target.canvas_width;
            call.g.canvas_height = target.canvas_height;
            call.g.dst_x = target.dst_x;
            call.g.dst_y = target.dst_y;
            check_bilinear(ov_bilinear_sg, reference::bilinear_single, call, random, flush);
        });
    }
}

TEST(ExhaustiveSizes, Lanczos) {
    Random random(912);
    every_size([&](const Sizes& s, Flush flush) {
        const int32_t bpp = 1 + (s.src_w + s.src_h + s.dst_w + s.dst_h) % 4;
        const GuardedBuffer<uint8_t> src(
            random.bytes(pixels(s.src_w, s.src_h) * static_cast<size_t>(bpp)), flush);
        const auto expected =
            reference::lanczos(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h, bpp);
        // The threaded entry makes one band of so few rows, which is the other entry's work.
        check_drawing(expected, s, flush, [&](uint8_t* dst) {
            if (s.src_w % 2 == 0) {
                ov_lanczos(src.data(), s.src_w, s.src_h, dst, s.dst_w, s.dst_h, bpp);
            } else {
                ovrin_resize_lanczos(src.data(), dst, s.src_w, s.src_h, s.dst_w, s.dst_h, bpp);
            }
        });
    });
}

TEST(ExhaustiveSizes, LanczosPairs) {
    Random random(913);
    every_size([&](const Sizes& s, Flush flush) {
        const GuardedBuffer<uint8_t> src(random.bytes(pixels(s.src_w, s.src_h) * 3), flush);
        check_drawing(reference::lanczos_nv(src.data(), s.src_w, s.src_h, s.dst_w, s.dst_h), s,
                      flush, [&](uint8_t* dst) {
                          ov_lanczos_nv(src.data(), s.src_w, s.src_h, dst, s.dst_w, s.dst_h);
                      });
    });
}
