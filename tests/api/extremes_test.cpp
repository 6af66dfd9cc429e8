// SPDX-License-Identifier: Apache-2.0
// Numbers that no picture has: nothing outside the buffers is touched, and every call returns.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include "support/guarded_buffer.h"
#include "support/letterbox.h"
#include "support/pictures.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

constexpr int32_t kEmpty[] = {INT32_MIN, INT32_MIN + 1, -2000, -1, 0};

// Calls every function on an 8 x src_h source and an 8 x 8 canvas.
void letterbox_all_ways(ovrin_resize_target target, int32_t src_h, Random& random) {
    SCOPED_TRACE(describe(target, 8, src_h));
    const GuardedPlane rgba(random, 8 * 4, src_h, 8 * 4);
    const Yuv420Picture planes(reference::kI420, random, 8, src_h, 8);
    const Yuv420Picture pairs(reference::kNv21, random, 8, src_h, 8);
    target.src_stride = target.src_width = 8;
    target.src_height = src_h;
    GuardedBuffer<uint32_t> words(64);
    GuardedBuffer<uint8_t> bytes(96), words_at_start(64 * 4, Flush::kStart),
        bytes_at_start(96, Flush::kStart);
    for (void* canvas :
         {static_cast<void*>(words.data()), static_cast<void*>(words_at_start.data())}) {
        for (auto* resize : {ovrin_resize_rgba_keep_ratio_sg, ovrin_resize_rgba_keep_ratio_tps}) {
            ovrin_resize_target rewritten = target;
            rewritten.dst = canvas;
            resize(rgba.first(), 8, src_h, &rewritten);
        }
    }
    for (uint8_t* canvas : {bytes.data(), bytes_at_start.data()}) {
        target.dst = canvas;
        for (auto* resize : {ovrin_resize_y_u_v_sg, ovrin_resize_y_u_v_tps}) {
            resize(planes.view.y, planes.view.chroma[0], planes.view.chroma[1], nullptr, 8, src_h,
                   0, 0, &target);
        }
        for (auto* resize : {ovrin_resize_y_nv_sg, ovrin_resize_y_nv_tps}) {
            resize(pairs.view.y, pairs.view.chroma[0], nullptr, 8, src_h, 0, 0, &target);
        }
    }
    EXPECT_TRUE(words.intact() && bytes.intact());
    EXPECT_TRUE(words_at_start.intact() && bytes_at_start.intact());
}

}  // namespace

TEST(Extremes, EmptyByEmptyReturns) {
    for (const int32_t src_w : kEmpty) {
        for (const int32_t src_h : kEmpty) {
            for (const int32_t dst_w : kEmpty) {
                for (const int32_t dst_h : kEmpty) {
                    SCOPED_TRACE(describe(Sizes{src_w, src_h, dst_w, dst_h}));
                    for (auto* resize : {ovrin_resize_rgba8888, ovrin_resize_rgba8888_sg,
                                         ovrin_resize_rgba8888_tps}) {
                        resize(nullptr, nullptr, src_w, src_h, dst_w, dst_h);
                    }
                    for (auto* resize :
                         {ovrin_resize_rgb888, ovrin_resize_yuv420, ovrin_resize_yuv420_sg,
                          ovrin_resize_yuv420_tps, ovrin_resize_nv21, ovrin_resize_nv21_sg,
                          ovrin_resize_nv21_tps}) {
                        resize(nullptr, nullptr, src_w, src_h, dst_w, dst_h);
                    }
                    for (auto* resize : {ovrin_resize_y_u_v_sg, ovrin_resize_y_u_v_tps}) {
                        resize(nullptr, nullptr, nullptr, nullptr, src_w, src_h, dst_w, dst_h,
                               nullptr);
                    }
                    for (auto* resize : {ovrin_resize_y_nv_sg, ovrin_resize_y_nv_tps}) {
                        resize(nullptr, nullptr, nullptr, src_w, src_h, dst_w, dst_h, nullptr);
                    }
                    uint32_t pixel = 0;
                    ovrin_resize_nearest_rgba8888(&pixel, &pixel, src_w, src_h, dst_w, dst_h);
                }
            }
        }
    }
}

// Heights whose ratio is not representable: the smallest number by -1.
TEST(Extremes, TheSmallestHeightByMinusOne) {
    uint8_t byte = 0xEE;
    uint32_t word = 0xEEEEEEEE;
    ovrin_resize_rgba8888_tps(&byte, &word, 1, INT32_MIN, 1, -1);
    ovrin_resize_yuv420_tps(&byte, &byte, 1, INT32_MIN, 1, -1);
    ovrin_resize_y_u_v_tps(&byte, &byte, &byte, &byte, 1, INT32_MIN, 1, -1, nullptr);
    ovrin_resize_nv21_tps(&byte, &byte, 1, INT32_MIN, 1, -1);
    ovrin_resize_y_nv_tps(&byte, &byte, &byte, 1, INT32_MIN, 1, -1, nullptr);
    EXPECT_EQ(byte, 0xEE);
    EXPECT_EQ(word, 0xEEEEEEEE);
}

TEST(Extremes, NegativePositionsStayInTheCanvas) {
    Random random(140);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {8, 1100}) {
        for (const int32_t x : {INT32_MIN, -9, -3, -1, 0, 3}) {
            for (const int32_t y : {INT32_MIN, -9, -3, -1, 0, 3}) {
                letterbox_all_ways(letterbox(8, 8, 5, 6, x, y), src_h, random);
                letterbox_all_ways(letterbox(8, 8, 40, 8, x, y), src_h, random);
            }
        }
    }
}

TEST(Extremes, NegativeSizesStayInTheCanvas) {
    Random random(141);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {8, 1100}) {
        for (const int32_t w : {INT32_MIN, -9, -8, -1, 0, 5}) {
            for (const int32_t h : {INT32_MIN, -9, -8, -1, 0, 5}) {
                for (const int32_t x : {-3, 0, 3, 8}) {
                    for (const int32_t y : {-3, 0, 3, 8, 9, INT32_MAX}) {
                        letterbox_all_ways(letterbox(8, 8, w, h, x, y), src_h, random);
                    }
                }
            }
        }
    }
}

TEST(Extremes, PicturesBeyondAllMemoryStayInTheCanvas) {
    Random random(142);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {8, 1100}) {
        for (const int32_t x : {0, 3, 8, INT32_MAX}) {
            for (const int32_t y : {0, 3, 8, INT32_MAX}) {
                letterbox_all_ways(letterbox(8, 8, INT32_MAX, INT32_MAX, x, y), src_h, random);
            }
        }
    }
}

TEST(Extremes, EmptyCanvasesAreNotWritten) {
    Random random(143);
    SCOPED_TRACE(random.trace());
    for (const int32_t src_h : {8, 1100}) {
        for (const int32_t w : kEmpty) {
            for (const int32_t x : {0, -3, INT32_MIN}) {
                letterbox_all_ways(letterbox(w, 8, 5, 6, x, 0), src_h, random);
                letterbox_all_ways(letterbox(8, w, 5, 6, 0, x), src_h, random);
                letterbox_all_ways(letterbox(w, w, 5, 6, x, x), src_h, random);
                letterbox_all_ways(letterbox(w, w, w, w, x, x), src_h, random);
            }
        }
    }
}
