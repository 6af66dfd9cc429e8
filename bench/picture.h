// SPDX-License-Identifier: Apache-2.0
// Raw pictures in memory, as planes that every contender can be handed.
#pragma once

#include <stddef.h>
#include <stdint.h>

#include <array>

namespace bench {

constexpr size_t kSlackBytes = size_t{1} << 17;

enum class Layout { kRgba, kRgb, kI420, kNv21 };

struct Size {
    int32_t width;
    int32_t height;
};

struct Plane {
    uint8_t* data;
    ptrdiff_t pitch;  // bytes from one row to the next
    Size size;        // in samples
    int32_t sample_bytes;

    uint8_t* row(int32_t y) const { return data + y * pitch; }
    uint8_t* sample(int32_t x, int32_t y) const { return row(y) + ptrdiff_t{x} * sample_bytes; }
    size_t row_bytes() const {
        return static_cast<size_t>(size.width) * static_cast<size_t>(sample_bytes);
    }
};

struct Picture {
    Layout layout;
    Size size;
    int32_t plane_count;
    std::array<Plane, 3> planes;

    uint8_t* data() const { return planes[0].data; }
};

// Without the slack that every buffer has: some rules, ours among them, read a row and a sample
// past the picture.
size_t picture_bytes(Layout layout, Size size);

// The picture whose packed planes start at `data`.
Picture picture_at(uint8_t* data, Layout layout, Size size);

// The part of a picture whose upper left pixel lies at (x, y). Chroma takes even positions.
Picture part_of(const Picture& canvas, int32_t x, int32_t y, Size size);

// Zeros, and 128 in planes of chroma.
void paint_black(const Picture& picture);

}  // namespace bench
