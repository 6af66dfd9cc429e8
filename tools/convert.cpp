// SPDX-License-Identifier: Apache-2.0
#include "convert.h"

#include <algorithm>
#include <cstring>
#include <utility>

namespace tool {

namespace {

// Where the chroma samples of an I420 or NV21 picture lie.
template <class Byte>
struct Chroma {
    Byte* u;
    Byte* v;
    size_t step;       // bytes from one sample of a row to the next
    size_t row_bytes;  // bytes from one row to the next
    size_t width;      // samples
    size_t height;

    size_t at(size_t x, size_t y) const { return y * row_bytes + x * step; }
};

template <class Byte>
Chroma<Byte> chroma_of(Byte* picture, PixelFormat format, Size size) {
    const size_t width = static_cast<size_t>(size.width + 1) / 2;
    const size_t height = static_cast<size_t>(size.height + 1) / 2;
    Byte* const start = picture + size.pixels();
    if (format == PixelFormat::kNv21) return {start + 1, start, 2, 2 * width, width, height};
    return {start, start + width * height, 1, width, width, height};
}

uint8_t to_byte(int fixed_point) {
    return static_cast<uint8_t>(std::clamp((fixed_point + (1 << 15)) >> 16, 0, 255));
}

uint8_t luma(int r, int g, int b) {
    return to_byte(19595 * r + 38470 * g + 7471 * b);
}

uint8_t chroma_u(int r, int g, int b) {
    return to_byte((128 << 16) - 11059 * r - 21709 * g + 32768 * b);
}

uint8_t chroma_v(int r, int g, int b) {
    return to_byte((128 << 16) + 32768 * r - 27439 * g - 5329 * b);
}

Picture chroma_rearranged(const Picture& from, PixelFormat format) {
    Picture to(from.size, format);
    memcpy(to.bytes(), from.bytes(), from.size.pixels());
    const auto source = chroma_of(from.bytes(), from.format, from.size);
    const auto target = chroma_of(to.bytes(), format, from.size);
    for (size_t y = 0; y < source.height; ++y) {
        for (size_t x = 0; x < source.width; ++x) {
            target.u[target.at(x, y)] = source.u[source.at(x, y)];
            target.v[target.at(x, y)] = source.v[source.at(x, y)];
        }
    }
    return to;
}

struct Mean {
    int r, g, b;
};

// The mean colour of the 2 x 2 pixels of a chroma sample. The last column and row stand in for
// those that a picture of odd size lacks.
Mean mean_color(const Picture& rgba, size_t x, size_t y) {
    const size_t width = static_cast<size_t>(rgba.size.width);
    const size_t height = static_cast<size_t>(rgba.size.height);
    const uint8_t* const top = rgba.bytes() + 2 * y * width * 4;
    const uint8_t* const bottom = rgba.bytes() + std::min(2 * y + 1, height - 1) * width * 4;
    const size_t left = 2 * x * 4;
    const size_t right = std::min(2 * x + 1, width - 1) * 4;
    const auto mean = [&](size_t channel) {
        return (top[left + channel] + top[right + channel] + bottom[left + channel] +
                bottom[right + channel] + 2) >>
               2;
    };
    return {mean(0), mean(1), mean(2)};
}

Picture rgba_to_yuv(const Picture& rgba, PixelFormat format) {
    Picture to(rgba.size, format);
    for (size_t i = 0; i < rgba.size.pixels(); ++i) {
        const uint8_t* const pixel = rgba.bytes() + i * 4;
        to.bytes()[i] = luma(pixel[0], pixel[1], pixel[2]);
    }
    const auto chroma = chroma_of(to.bytes(), format, rgba.size);
    for (size_t y = 0; y < chroma.height; ++y) {
        for (size_t x = 0; x < chroma.width; ++x) {
            const Mean mean = mean_color(rgba, x, y);
            chroma.u[chroma.at(x, y)] = chroma_u(mean.r, mean.g, mean.b);
            chroma.v[chroma.at(x, y)] = chroma_v(mean.r, mean.g, mean.b);
        }
    }
    return to;
}

Picture yuv_to_rgba(const Picture& yuv) {
    Picture rgba(yuv.size);
    const size_t width = static_cast<size_t>(yuv.size.width);
    const auto chroma = chroma_of(yuv.bytes(), yuv.format, yuv.size);
    uint8_t* to = rgba.bytes();
    for (size_t i = 0; i < yuv.size.pixels(); ++i) {
        const size_t sample = chroma.at(i % width / 2, i / width / 2);
        const int y = yuv.bytes()[i] << 16;
        const int u = chroma.u[sample] - 128;
        const int v = chroma.v[sample] - 128;
        *to++ = to_byte(y + 91881 * v);
        *to++ = to_byte(y - 22554 * u - 46802 * v);
        *to++ = to_byte(y + 116130 * u);
        *to++ = 255;
    }
    return rgba;
}

Picture rgb_to_rgba(const Picture& rgb) {
    Picture rgba(rgb.size);
    const uint8_t* from = rgb.bytes();
    uint8_t* to = rgba.bytes();
    for (size_t i = 0; i < rgb.size.pixels(); ++i, from += 3, to += 4) {
        to[0] = from[0];
        to[1] = from[1];
        to[2] = from[2];
        to[3] = 255;
    }
    return rgba;
}

Picture rgba_to_rgb(const Picture& rgba) {
    Picture rgb(rgba.size, PixelFormat::kRgb);
    const uint8_t* from = rgba.bytes();
    uint8_t* to = rgb.bytes();
    for (size_t i = 0; i < rgba.size.pixels(); ++i, from += 4, to += 3) {
        to[0] = from[0];
        to[1] = from[1];
        to[2] = from[2];
    }
    return rgb;
}

Picture to_rgba(const Picture& picture) {
    if (has_chroma_planes(picture.format)) return yuv_to_rgba(picture);
    return picture.format == PixelFormat::kRgb ? rgb_to_rgba(picture) : picture;
}

Picture from_rgba(Picture rgba, PixelFormat format) {
    if (has_chroma_planes(format)) return rgba_to_yuv(rgba, format);
    return format == PixelFormat::kRgb ? rgba_to_rgb(rgba) : std::move(rgba);
}

}  // namespace

Picture converted(const Picture& picture, PixelFormat format) {
    if (picture.format == format) return picture;
    if (has_chroma_planes(picture.format) && has_chroma_planes(format)) {
        return chroma_rearranged(picture, format);
    }
    return from_rgba(to_rgba(picture), format);
}

}  // namespace tool
