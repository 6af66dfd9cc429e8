// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "size.h"

namespace tool {

// RGBA and RGB: bytes in that order. The others: a plane of luma, then chroma, at half the size,
// rounded up, in 4:2:0 (I420 and NV21), at half the width in 4:2:2 (I422). NV21 has a plane of
// pairs, V before U, the others have a plane of U and one of V; gray has none.
enum class PixelFormat { kRgba, kRgb, kGray, kI420, kNv21, kI422, kI444 };

const char* name_of(PixelFormat format);

bool is_420(PixelFormat format);

// Neither RGBA nor RGB.
bool is_yuv(PixelFormat format);

size_t picture_bytes(PixelFormat format, Size size);

// Part of a picture whose samples lie side by side: all of a packed one, or one plane.
struct Plane {
    size_t offset;     // bytes from the picture's start
    Size size;         // in samples
    int32_t channels;  // bytes of a sample
    int32_t across;    // pixels that a sample covers
    int32_t down;

    size_t bytes() const { return size.pixels() * static_cast<size_t>(channels); }
};

std::vector<Plane> planes_of(PixelFormat format, Size size);

// A picture in memory, rows packed.
struct Picture {
    Picture() = default;  // empty
    explicit Picture(Size the_size, PixelFormat the_format = PixelFormat::kRgba);

    uint8_t* bytes() { return reinterpret_cast<uint8_t*>(words.data()); }
    const uint8_t* bytes() const { return reinterpret_cast<const uint8_t*>(words.data()); }
    size_t byte_count() const { return picture_bytes(format, size); }

    PixelFormat format = PixelFormat::kRgba;
    Size size = {};
    // Words because the library writes RGBA as words. There is room for a row and a sample more.
    std::vector<uint32_t> words;
    bool has_alpha = false;  // of RGBA; false: A means nothing and image files leave it out
    bool is_gray = false;    // of RGBA: R, G and B are equal everywhere
};

}  // namespace tool
