// SPDX-License-Identifier: Apache-2.0
// How many bytes of a buffer each function of the library reads or writes. Sizes are in pixels, 1
// to kLargestSide each; everything is counted in 64 bits, where no product of them overflows.
#pragma once

#include <stdint.h>

namespace ovrin_jni {

// Products of two sides fit 32 bits up to here. The library counts in 32 bits in places, and single
// precision, in which the bilinear engine computes positions, is then exact enough to keep every
// position inside the picture.
constexpr int32_t kLargestSide = 32767;

struct Size {
    int32_t width;
    int32_t height;

    int64_t pixels() const { return int64_t{width} * height; }
};

constexpr int64_t half_rounded_up(int64_t luma) {
    return (luma + 1) / 2;
}

inline int64_t chroma_samples(Size size) {
    return half_rounded_up(size.width) * half_rounded_up(size.height);
}

// I420 and NV21 alike.
inline int64_t yuv420_bytes(Size size) {
    return size.pixels() + 2 * chroma_samples(size);
}

// Rows of `row` units, `stride` units apart; the last row may end with its own units.
inline int64_t strided(int64_t row, int64_t rows, int64_t stride) {
    return (rows - 1) * stride + row;
}

// A chroma plane whose luma rows lie `stride` bytes apart, in samples: bytes of U or V, pairs of
// VU.
inline int64_t strided_chroma(Size size, int64_t stride) {
    return strided(half_rounded_up(size.width), half_rounded_up(size.height),
                   half_rounded_up(stride));
}

// The bytes from the first sample of U or V in a row to the last, `pixel_stride` bytes apart.
inline int64_t chroma_row(Size size, int64_t pixel_stride) {
    return (half_rounded_up(size.width) - 1) * pixel_stride + 1;
}

// Format codes of the bilinear engine.
enum BilinearFormat : int32_t { kPlanar = 2, kPixels = 7, kSemiPlanar = 18 };

// Bytes of a contiguous source from which ov_bilinear_sg and ov_bilinear make a picture of size
// `dst`. At least the picture; more where the engine reads beyond it, as it does when it enlarges.
int64_t bilinear_source_bytes(Size src, Size dst, BilinearFormat format);

// The same for ov_bilinear_ex, which halves first when the reduction is large.
int64_t bilinear_ex_source_bytes(Size src, Size dst, BilinearFormat format);

}  // namespace ovrin_jni
