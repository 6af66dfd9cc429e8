// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "size.h"

namespace tool {

// RGBA and RGB: bytes in that order. I420 and NV21: a plane of luma, then chroma at half the size,
// rounded up; I420 has a plane of U and one of V, NV21 a plane of pairs, V before U.
enum class PixelFormat { kRgba, kRgb, kI420, kNv21 };

const char* name_of(PixelFormat format);

// 4:2:0, that is I420 or NV21.
bool has_chroma_planes(PixelFormat format);

size_t picture_bytes(PixelFormat format, Size size);

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
