// SPDX-License-Identifier: Apache-2.0
// The Lanczos engine, written down as plainly as possible. Shares nothing with the library.
// Compile with contraction off: only the sum over the taps is fused, and it says so.
#pragma once

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "reference/bands.h"

namespace reference {

constexpr int kLanczosEntries = 16000;

inline double lanczos_kernel(double x) {
    constexpr double kPi = 3.141592653589793;
    if (x >= 3.0) return 0.0;
    const double t = x / 3.0;
    const double a = x < 0.00025 ? 1.0 : std::sin(kPi * x) / (kPi * x);
    const double b = t < 0.00025 ? 1.0 : std::sin(kPi * t) / (kPi * t);
    return a * b;
}

inline std::vector<float> lanczos_table() {
    std::vector<float> table;
    double x = 0.0;
    for (int i = 0; i < kLanczosEntries; ++i) {
        table.push_back(static_cast<float>(lanczos_kernel(x)));
        x += 0.00025;
    }
    return table;
}

using LanczosTaps = std::array<double, 7>;

inline double raw_weight(const std::vector<float>& table, double f, int step, float s) {
    double distance = f + step;
    if (s < 1.0f) distance = distance * s;
    const double t = std::fabs(distance) * 4000;
    const int index = t > 15999.0 ? 15999 : static_cast<int>(t);
    return table[static_cast<size_t>(index)];
}

// Weights of the samples c - 3 ... c + 3 around position p, c being p without its fraction.
inline LanczosTaps lanczos_taps(const std::vector<float>& table, double p, float s) {
    const double f = p - static_cast<int32_t>(p);
    double sum = raw_weight(table, f, -3, s);
    sum = sum + raw_weight(table, f, -2, s);
    sum = sum + raw_weight(table, f, -1, s);
    sum = sum + raw_weight(table, f, 0, s);
    sum = sum + raw_weight(table, f, 1, s);
    sum = sum + raw_weight(table, f, 2, s);
    sum = sum + raw_weight(table, f, 3, s);
    LanczosTaps taps;
    for (int j = 0; j < 7; ++j) {
        taps[static_cast<size_t>(j)] = raw_weight(table, f, 3 - j, s) / sum;
    }
    return taps;
}

// Positions in the source, and the weights there, of each destination row or column.
struct LanczosAxis {
    std::vector<int32_t> at;
    std::vector<LanczosTaps> taps;
};

inline float kernel_scale(int32_t src, int32_t dst) {
    return static_cast<float>(dst) / static_cast<float>(src);
}

inline LanczosAxis lanczos_rows(const std::vector<float>& table, int32_t src, int32_t dst) {
    LanczosAxis axis;
    for (int32_t y = 0; y < dst; ++y) {
        const double p = (static_cast<double>(src) / static_cast<double>(dst)) * y;
        axis.at.push_back(static_cast<int32_t>(std::floor(p)));
        axis.taps.push_back(lanczos_taps(table, p, kernel_scale(src, dst)));
    }
    return axis;
}

inline LanczosAxis lanczos_columns(const std::vector<float>& table, int32_t src, int32_t dst) {
    LanczosAxis axis;
    double p = 0;
    for (int32_t x = 0; x < dst; ++x) {
        axis.at.push_back(static_cast<int32_t>(std::floor(p)));
        axis.taps.push_back(lanczos_taps(table, p, kernel_scale(src, dst)));
        p = p + static_cast<double>(src) / static_cast<double>(dst);
    }
    return axis;
}

// Seven source rows, the clamped neighbours of row cy, with three pixels added on either side.
inline std::vector<uint8_t> row_cache(const uint8_t* src, int32_t src_w, int32_t src_h, int32_t bpp,
                                      int32_t cy) {
    std::vector<uint8_t> cache;
    for (int32_t k = 0; k < 7; ++k) {
        int32_t row = cy - 3 + k;
        if (row < 0) row = 0;
        if (row > src_h - 1) row = src_h - 1;
        for (int32_t column = -3; column < src_w + 3; ++column) {
            const int32_t from = column < 0 ? 0 : column > src_w - 1 ? src_w - 1 : column;
            for (int32_t n = 0; n < bpp; ++n) {
                const int64_t offset = (int64_t{row} * src_w + from) * bpp + n;
                cache.push_back(src[offset]);
            }
        }
    }
    return cache;
}

// One step of the sum over the 49 taps. The engine's is fused; the other exists so that a test can
// show that its pictures tell the two apart.
using LanczosStep = double(double weight, double sample, double sum);

inline double fused_step(double weight, double sample, double sum) {
    return std::fma(weight, sample, sum);
}
inline double rounded_step(double weight, double sample, double sum) {
    const double product = weight * sample;
    return sum + product;
}

inline uint8_t clip_to_byte(double sum) {
    const double value = std::trunc(sum + 0.5);
    if (value < 0) return 0;
    if (value > 255) return 255;
    return static_cast<uint8_t>(value);
}

struct LanczosSizes {
    int32_t src_w;
    int32_t src_h;
    int32_t dst_w;
    int32_t dst_h;
    int32_t src_bpp;  // components per pixel; both are the same except in hand-made descriptors
    int32_t dst_bpp;
};

// A packed picture.
inline std::vector<uint8_t> lanczos(const LanczosSizes& s, const uint8_t* src,
                                    LanczosStep* step = fused_step) {
    static const std::vector<float> table = lanczos_table();
    const LanczosAxis rows = lanczos_rows(table, s.src_h, s.dst_h);
    const LanczosAxis columns = lanczos_columns(table, s.src_w, s.dst_w);
    const int64_t slot_bytes = int64_t{s.src_w + 6} * s.src_bpp;
    std::vector<uint8_t> dst;
    for (int32_t y = 0; y < s.dst_h; ++y) {
        const LanczosTaps& v = rows.taps[static_cast<size_t>(y)];
        const std::vector<uint8_t> cache =
            row_cache(src, s.src_w, s.src_h, s.src_bpp, rows.at[static_cast<size_t>(y)]);
        for (int32_t x = 0; x < s.dst_w; ++x) {
            const LanczosTaps& h = columns.taps[static_cast<size_t>(x)];
            const int64_t start = int64_t{columns.at[static_cast<size_t>(x)]} * s.src_bpp;
            for (int32_t k = 0; k < s.dst_bpp; ++k) {
                double sum = 0.0;
                for (size_t r = 0; r < 7; ++r) {
                    for (size_t i = 0; i < 7; ++i) {
                        const int64_t offset = static_cast<int64_t>(r) * slot_bytes + start +
                                               static_cast<int64_t>(i) * s.dst_bpp + k;
                        const double weight = v[r] * h[i];
                        sum = step(weight, cache.at(static_cast<size_t>(offset)), sum);
                    }
                }
                dst.push_back(clip_to_byte(sum));
            }
        }
    }
    return dst;
}

inline std::vector<uint8_t> lanczos(const uint8_t* src, int32_t src_w, int32_t src_h, int32_t dst_w,
                                    int32_t dst_h, int32_t bpp, LanczosStep* step = fused_step) {
    return lanczos({src_w, src_h, dst_w, dst_h, bpp, bpp}, src, step);
}

// A luma plane and, behind it, pairs at full luma size on both sides.
inline std::vector<uint8_t> lanczos_nv(const uint8_t* src, int32_t src_w, int32_t src_h,
                                       int32_t dst_w, int32_t dst_h) {
    std::vector<uint8_t> dst = lanczos(src, src_w, src_h, dst_w, dst_h, 1);
    const std::vector<uint8_t> chroma =
        lanczos(src + int64_t{src_w} * src_h, src_w, src_h, dst_w, dst_h, 2);
    dst.insert(dst.end(), chroma.begin(), chroma.end());
    return dst;
}

// The threaded entry: the same picture, but with two bands or more the destination is cleared, and
// the bands are placed in it, as if pixels had 4 bytes.
inline std::vector<uint8_t> resize_lanczos(const uint8_t* src, int32_t src_w, int32_t src_h,
                                           int32_t dst_w, int32_t dst_h, int32_t bpp) {
    const std::vector<uint8_t> picture = lanczos(src, src_w, src_h, dst_w, dst_h, bpp);
    const int64_t height = band_height(src_h, dst_h);
    const int64_t count = destination_band_count(src_h, dst_h);
    if (count < 2) return picture;
    std::vector<uint8_t> dst(static_cast<size_t>(int64_t{dst_w} * dst_h * 4));
    for (int64_t band = 0; band < count; ++band) {
        const int64_t first = band * height;
        const int64_t end = band == count - 1 ? dst_h : first + height;
        std::copy(picture.begin() + first * dst_w * bpp, picture.begin() + end * dst_w * bpp,
                  dst.begin() + first * dst_w * 4);
    }
    return dst;
}

}  // namespace reference
