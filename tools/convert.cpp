// SPDX-License-Identifier: Apache-2.0
#include "convert.h"

#include <algorithm>
#include <cstring>
#include <utility>
#include <vector>

#include "yuv.h"

namespace tool {

namespace {

// Where the chroma samples of a picture lie that has some.
template <class Byte>
struct Chroma {
    Byte* u;
    Byte* v;
    size_t step;       // bytes from one sample of a row to the next
    size_t row_bytes;  // bytes from one row to the next
    size_t width;      // samples
    size_t height;
    size_t across;  // pixels of a sample
    size_t down;

    size_t at(size_t x, size_t y) const { return y * row_bytes + x * step; }
};

template <class Byte>
Chroma<Byte> chroma_of(Byte* picture, PixelFormat format, Size size) {
    const std::vector<Plane> planes = planes_of(format, size);
    const Plane& first = planes[1];
    const bool has_pairs = first.channels == 2;
    const auto width = static_cast<size_t>(first.size.width);
    const auto step = static_cast<size_t>(first.channels);
    Byte* const u = picture + first.offset;
    return {has_pairs ? u + 1 : u,
            has_pairs ? u : picture + planes[2].offset,
            step,
            step * width,
            width,
            static_cast<size_t>(first.size.height),
            static_cast<size_t>(first.across),
            static_cast<size_t>(first.down)};
}

uint8_t to_byte(int fixed_point) {
    return static_cast<uint8_t>(std::clamp((fixed_point + (1 << 15)) >> 16, 0, 255));
}

uint8_t luma(const YuvFactors& factors, int r, int g, int b) {
    return to_byte((factors.black << 16) + factors.y_of_r * r + factors.y_of_g * g +
                   factors.y_of_b * b);
}

uint8_t chroma_u(const YuvFactors& factors, int r, int g, int b) {
    return to_byte((128 << 16) - factors.u_of_r * r - factors.u_of_g * g + factors.chroma * b);
}

uint8_t chroma_v(const YuvFactors& factors, int r, int g, int b) {
    return to_byte((128 << 16) + factors.chroma * r - factors.v_of_g * g - factors.v_of_b * b);
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

// The mean colour of the pixels of a chroma sample. The last column and row stand in for those that
// a picture of odd size lacks.
Mean mean_color(const Picture& rgba, size_t left, size_t top, size_t across, size_t down) {
    const auto width = static_cast<size_t>(rgba.size.width);
    const auto height = static_cast<size_t>(rgba.size.height);
    const int count = static_cast<int>(across * down);
    Mean sum = {count / 2, count / 2, count / 2};
    for (size_t y = top; y < top + down; ++y) {
        for (size_t x = left; x < left + across; ++x) {
            const size_t at = std::min(y, height - 1) * width + std::min(x, width - 1);
            const uint8_t* const pixel = rgba.bytes() + at * 4;
            sum = {sum.r + pixel[0], sum.g + pixel[1], sum.b + pixel[2]};
        }
    }
    return {sum.r / count, sum.g / count, sum.b / count};
}

Picture with_luma(const Picture& rgba, PixelFormat format, const YuvFactors& factors) {
    Picture to(rgba.size, format);
    for (size_t i = 0; i < rgba.size.pixels(); ++i) {
        const uint8_t* const pixel = rgba.bytes() + i * 4;
        to.bytes()[i] = luma(factors, pixel[0], pixel[1], pixel[2]);
    }
    return to;
}

Picture rgba_to_yuv(const Picture& rgba, PixelFormat format) {
    const YuvFactors factors = yuv_factors(yuv_meaning());
    Picture to = with_luma(rgba, format, factors);
    if (format == PixelFormat::kGray) return to;
    const auto chroma = chroma_of(to.bytes(), format, rgba.size);
    for (size_t y = 0; y < chroma.height; ++y) {
        for (size_t x = 0; x < chroma.width; ++x) {
            const Mean mean =
                mean_color(rgba, x * chroma.across, y * chroma.down, chroma.across, chroma.down);
            chroma.u[chroma.at(x, y)] = chroma_u(factors, mean.r, mean.g, mean.b);
            chroma.v[chroma.at(x, y)] = chroma_v(factors, mean.r, mean.g, mean.b);
        }
    }
    return to;
}

Picture gray_to_rgba(const Picture& gray) {
    const YuvFactors factors = yuv_factors(yuv_meaning());
    Picture rgba(gray.size);
    rgba.is_gray = true;
    uint8_t* to = rgba.bytes();
    for (size_t i = 0; i < gray.size.pixels(); ++i, to += 4) {
        to[0] = to[1] = to[2] = to_byte((gray.bytes()[i] - factors.black) * factors.luma);
        to[3] = 255;
    }
    return rgba;
}

Picture yuv_to_rgba(const Picture& yuv) {
    if (yuv.format == PixelFormat::kGray) return gray_to_rgba(yuv);
    const YuvFactors factors = yuv_factors(yuv_meaning());
    Picture rgba(yuv.size);
    const size_t width = static_cast<size_t>(yuv.size.width);
    const auto chroma = chroma_of(yuv.bytes(), yuv.format, yuv.size);
    uint8_t* to = rgba.bytes();
    for (size_t i = 0; i < yuv.size.pixels(); ++i) {
        const size_t sample = chroma.at(i % width / chroma.across, i / width / chroma.down);
        const int y = (yuv.bytes()[i] - factors.black) * factors.luma;
        const int u = chroma.u[sample] - 128;
        const int v = chroma.v[sample] - 128;
        *to++ = to_byte(y + factors.r_of_v * v);
        *to++ = to_byte(y - factors.g_of_u * u - factors.g_of_v * v);
        *to++ = to_byte(y + factors.b_of_u * u);
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
    if (is_yuv(picture.format)) return yuv_to_rgba(picture);
    return picture.format == PixelFormat::kRgb ? rgb_to_rgba(picture) : picture;
}

Picture from_rgba(Picture rgba, PixelFormat format) {
    if (is_yuv(format)) return rgba_to_yuv(rgba, format);
    return format == PixelFormat::kRgb ? rgba_to_rgb(rgba) : std::move(rgba);
}

}  // namespace

Picture converted(const Picture& picture, PixelFormat format) {
    if (picture.format == format) return picture;
    if (is_420(picture.format) && is_420(format)) {
        return chroma_rearranged(picture, format);
    }
    return from_rgba(to_rgba(picture), format);
}

Picture in_shades(const Picture& picture) {
    const YuvMeaning meaning = {yuv_meaning().matrix, Range::kFull};
    return with_luma(to_rgba(picture), PixelFormat::kGray, yuv_factors(meaning));
}

}  // namespace tool
