// SPDX-License-Identifier: Apache-2.0
// Nearest neighbour by whole-number steps.
#include <math.h>
#include <ovrinresize.h>
#include <stddef.h>

#include "kernels/kernels.h"

namespace ovrin {

namespace {

constexpr int32_t kStripColumns = 1024;

// Above this, single precision no longer holds every whole number.
constexpr int64_t kExact = int64_t{1} << 24;

// Where one axis is sampled. Positions pass through single precision, which rounds those above
// 2^24; they never decrease.
struct NearestAxis {
    int32_t src_size;
    int32_t step;
    float offset;

    NearestAxis(int32_t src, int32_t dst)
        : src_size(src),
          step(static_cast<int32_t>(static_cast<double>(src) / dst + 0.5)),
          offset(ceilf(static_cast<float>(step) * 0.5F)) {}

    // Source index of destination index k; at or beyond src_size for a sample that is dropped.
    int64_t at(int32_t k) const {
        const float position = static_cast<float>(static_cast<double>(step) * k) + offset;
        return static_cast<int64_t>(position);
    }

    // Positions rise from 0 or more, so the samples that are kept are the first ones.
    int32_t kept(int32_t dst_size) const {
        int32_t count = 0;
        while (count < dst_size && at(count) < src_size) ++count;
        return count;
    }

    // The first `count` samples lie exactly a step apart.
    bool is_even(int32_t count) const {
        return count < 2 || at(0) + (count - 1) * int64_t{step} <= kExact;
    }
};

struct NearestPicture {
    const uint32_t* src;
    ptrdiff_t src_pitch;  // in pixels, like the other lengths
    uint32_t* dst;
    ptrdiff_t dst_pitch;
    int32_t width;  // of the samples that are kept
    int32_t height;
    NearestAxis columns;
    NearestAxis rows;

    const uint32_t* row(int32_t j) const { return src + src_pitch * rows.at(j); }
};

void copy_even(const NearestPicture& p) {
    const auto copy = kernels().copy_every;
    const ptrdiff_t first = p.columns.at(0);
    for (int32_t j = 0; j < p.height; ++j) {
        const uint32_t* next = p.row(j + 1 < p.height ? j + 1 : j);
        copy(p.dst + p.dst_pitch * j, p.row(j) + first, p.columns.step, p.width, next + first);
    }
}

// Positions that single precision has rounded, in strips.
void copy_rounded(const NearestPicture& p) {
    int32_t taps[kStripColumns];
    int32_t count;
    for (int32_t x = 0; x < p.width; x += count) {
        count = p.width - x < kStripColumns ? p.width - x : kStripColumns;
        for (int32_t i = 0; i < count; ++i) taps[i] = static_cast<int32_t>(p.columns.at(x + i));
        for (int32_t j = 0; j < p.height; ++j) {
            const uint32_t* row = p.row(j);
            uint32_t* dst = p.dst + p.dst_pitch * j + x;
            for (int32_t i = 0; i < count; ++i) dst[i] = row[taps[i]];
        }
    }
}

}  // namespace

}  // namespace ovrin

using namespace ovrin;

void ovrin_resize_nearest_rgba8888(const uint32_t* src, uint32_t* dst, int32_t src_w, int32_t src_h,
                                   int32_t dst_w, int32_t dst_h) {
    if (src == nullptr || dst == nullptr) return;
    if (src_w < 1 || src_h < 1 || dst_w < 1 || dst_h < 1) return;
    const NearestAxis columns(src_w, dst_w);
    const NearestAxis rows(src_h, dst_h);
    const NearestPicture picture = {
        src, src_w, dst, dst_w, columns.kept(dst_w), rows.kept(dst_h), columns, rows,
    };
    if (columns.is_even(picture.width)) {
        copy_even(picture);
    } else {
        copy_rounded(picture);
    }
}
