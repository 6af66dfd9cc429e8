// SPDX-License-Identifier: Apache-2.0
#include "soak/calls.h"

#include <ovrinresize.h>

#include <cstdlib>

#include "reference/yuv420.h"
#include "support/letterbox.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

// 1079 rows to 20: bands of 53 rows, the lower of which share rows with their neighbours.
constexpr int32_t kRows = 1079;
constexpr int32_t kW = 3, kH = 20;

const uint8_t* src() {
    static const std::vector<uint8_t> bytes = Random(161).bytes(3000000);
    return bytes.data();
}

const uint8_t* plane(int index) {
    return src() + 100000 * index;
}

Bytes drawn(int64_t size, const std::function<void(uint8_t*)>& draw) {
    std::vector<uint32_t> words(static_cast<size_t>(size + 3) / 4);
    auto* bytes = reinterpret_cast<uint8_t*>(words.data());
    draw(bytes);
    return Bytes(bytes, bytes + size);
}

ovrin_resize_target canvas(uint8_t* dst) {
    ovrin_resize_target target = letterbox(kW + 2, kH + 2, kW, kH, 1, 1);
    target.src_width = target.src_stride = 4;
    target.src_height = kRows;
    target.dst = dst;
    return target;
}

template <class Function>
Call rgba(const char* name, Function* resize) {
    return {name, [=] {
                return drawn(kW * kH * 4, [=](uint8_t* dst) {
                    resize(src(), reinterpret_cast<uint32_t*>(dst), 4, kRows, kW, kH);
                });
            }};
}

template <class Function>
Call rgba_on_canvas(const char* name, Function* resize) {
    return {name, [=] {
                return drawn((kW + 2) * (kH + 2) * 4, [=](uint8_t* dst) {
                    ovrin_resize_target target = canvas(dst);
                    resize(src(), 4, kRows, &target);
                });
            }};
}

template <class Function>
Call contiguous(const char* name, Function* resize) {
    return {name, [=] {
                return drawn(reference::i420_size(kW, kH),
                             [=](uint8_t* dst) { resize(src(), dst, 4, kRows, kW, kH); });
            }};
}

// On a canvas of either 4:2:0 layout.
Call on_canvas(const char* name, void (*resize)(const ovrin_resize_target*)) {
    return {name, [=] {
                return drawn(reference::nv21_size(kW + 2, kH + 2), [=](uint8_t* dst) {
                    const ovrin_resize_target target = canvas(dst);
                    resize(&target);
                });
            }};
}

Call into_picture(const char* name, void (*resize)(uint8_t*)) {
    return {name, [=] { return drawn(reference::nv21_size(kW, kH), resize); }};
}

// Bands of 256 destination rows: a long strip of a source.
Bytes bilinear_strip() {
    return drawn(2 * kRows * 4, [](uint8_t* dst) {
        ov_bilinear(src(), dst, 2, 256 * kRows, 2, kRows, 7, nullptr);
    });
}

// Two passes in bands.
Bytes bilinear_halved() {
    return drawn(kRows * 4, [](uint8_t* dst) {
        ov_bilinear_ex(src(), dst, 4, 4 * kRows, 1, kRows, 7, nullptr);
    });
}

Bytes bilinear_alone() {
    return drawn(30 * 40 * 4,
                 [](uint8_t* dst) { ov_bilinear_sg(src(), dst, 100, 70, 30, 40, 7, nullptr); });
}

Bytes lanczos_bands() {
    return drawn(2 * 160 * 4,
                 [](uint8_t* dst) { ovrin_resize_lanczos(src(), dst, 3, 100, 2, 160, 4); });
}

Bytes lanczos_alone() {
    return drawn(2 * 160 * 4, [](uint8_t* dst) { ov_lanczos(src(), 3, 100, dst, 2, 160, 4); });
}

}  // namespace

namespace ovrin_test {

std::vector<Call> threaded_calls() {
    return {
        rgba("ovrin_resize_rgba8888", ovrin_resize_rgba8888),
        rgba("ovrin_resize_rgba8888_tps", ovrin_resize_rgba8888_tps),
        rgba_on_canvas("ovrin_resize_rgba8888_keep_ratio", ovrin_resize_rgba8888_keep_ratio),
        rgba_on_canvas("ovrin_resize_rgba_keep_ratio_tps", ovrin_resize_rgba_keep_ratio_tps),
        contiguous("ovrin_resize_yuv420", ovrin_resize_yuv420),
        contiguous("ovrin_resize_yuv420_tps", ovrin_resize_yuv420_tps),
        into_picture("ovrin_resize_y_u_v",
                     [](uint8_t* dst) {
                         ovrin_resize_y_u_v(plane(0), plane(1), plane(2), dst, 4, kRows, kW, kH);
                     }),
        on_canvas("ovrin_resize_y_u_v_keep_ratio",
                  [](const ovrin_resize_target* target) {
                      ovrin_resize_y_u_v_keep_ratio(plane(0), plane(1), plane(2), 4, kRows, target);
                  }),
        on_canvas("ovrin_resize_y_u_v_tps",
                  [](const ovrin_resize_target* target) {
                      ovrin_resize_y_u_v_tps(plane(0), plane(1), plane(2), nullptr, 4, kRows, 0, 0,
                                             target);
                  }),
        contiguous("ovrin_resize_nv21", ovrin_resize_nv21),
        contiguous("ovrin_resize_nv21_tps", ovrin_resize_nv21_tps),
        into_picture(
            "ovrin_resize_y_nv21",
            [](uint8_t* dst) { ovrin_resize_y_nv21(plane(0), plane(1), dst, 4, kRows, kW, kH); }),
        on_canvas("ovrin_resize_y_nv21_keep_ratio",
                  [](const ovrin_resize_target* target) {
                      ovrin_resize_y_nv21_keep_ratio(plane(0), plane(1), 4, kRows, target);
                  }),
        on_canvas("ovrin_resize_y_nv_tps",
                  [](const ovrin_resize_target* target) {
                      ovrin_resize_y_nv_tps(plane(0), plane(1), nullptr, 4, kRows, 0, 0, target);
                  }),
        {"ov_bilinear", bilinear_strip, 1},
        {"ov_bilinear_ex", bilinear_halved, 2},
        {"ovrin_resize_lanczos", lanczos_bands},
    };
}

std::vector<Call> calling_thread_calls() {
    return {
        rgba("ovrin_resize_rgba8888_sg", ovrin_resize_rgba8888_sg),
        rgba_on_canvas("ovrin_resize_rgba_keep_ratio_sg", ovrin_resize_rgba_keep_ratio_sg),
        contiguous("ovrin_resize_yuv420_sg", ovrin_resize_yuv420_sg),
        contiguous("ovrin_resize_nv21_sg", ovrin_resize_nv21_sg),
        {"ov_bilinear_sg", bilinear_alone},
        {"ov_lanczos", lanczos_alone},
    };
}

int repetitions(int usual, int large) {
    return getenv("OVRIN_SOAK_LARGE") == nullptr ? usual : large;
}

}  // namespace ovrin_test
