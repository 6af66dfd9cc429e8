// SPDX-License-Identifier: Apache-2.0
#include "canvas.h"

#include <algorithm>
#include <cstring>
#include <vector>

#include "convert.h"

namespace tool {

namespace {

// Part of a picture whose samples lie side by side: all of a packed one, or one plane.
struct Plane {
    size_t offset;  // bytes from the picture's start
    size_t width;   // samples
    size_t height;  // rows
    size_t sample_bytes;
    size_t pixels;  // that a sample covers in either direction
};

std::vector<Plane> planes_of(PixelFormat format, Size size) {
    const auto width = static_cast<size_t>(size.width);
    const auto height = static_cast<size_t>(size.height);
    const size_t half_width = (width + 1) / 2;
    const size_t half_height = (height + 1) / 2;
    const size_t luma = width * height;
    switch (format) {
        case PixelFormat::kRgba:
            return {{0, width, height, 4, 1}};
        case PixelFormat::kRgb:
            return {{0, width, height, 3, 1}};
        case PixelFormat::kNv21:
            return {{0, width, height, 1, 1}, {luma, half_width, half_height, 2, 2}};
        case PixelFormat::kI420:
            return {{0, width, height, 1, 1},
                    {luma, half_width, half_height, 1, 2},
                    {luma + half_width * half_height, half_width, half_height, 1, 2}};
    }
    return {};
}

Picture one_pixel(PixelFormat format, Color color, uint8_t alpha) {
    Picture pixel({1, 1});
    const uint8_t channels[] = {color.red, color.green, color.blue, alpha};
    memcpy(pixel.bytes(), channels, sizeof(channels));
    return converted(pixel, format);
}

void fill(Picture* picture, const Picture& pixel) {
    const std::vector<Plane> samples = planes_of(pixel.format, pixel.size);
    const std::vector<Plane> planes = planes_of(picture->format, picture->size);
    for (size_t i = 0; i < planes.size(); ++i) {
        const uint8_t* const sample = pixel.bytes() + samples[i].offset;
        uint8_t* to = picture->bytes() + planes[i].offset;
        for (size_t n = planes[i].width * planes[i].height; n > 0; --n) {
            to = std::copy_n(sample, planes[i].sample_bytes, to);
        }
    }
}

// Where the samples of one row or column go: those from `first` on, `count` of them, to `to` on.
struct Span {
    size_t first, count, to;
};

// offset: of the picture on the canvas, in samples.
Span visible(size_t samples, size_t canvas_samples, ptrdiff_t offset) {
    const size_t first = offset < 0 ? static_cast<size_t>(-offset) : 0;
    const size_t to = offset < 0 ? 0 : static_cast<size_t>(offset);
    return {first, std::min(samples - first, canvas_samples - to), to};
}

void paste(const Picture& picture, Picture* canvas, int32_t x, int32_t y) {
    const std::vector<Plane> from = planes_of(picture.format, picture.size);
    const std::vector<Plane> to = planes_of(canvas->format, canvas->size);
    for (size_t i = 0; i < from.size(); ++i) {
        const auto pixels = static_cast<int32_t>(from[i].pixels);
        const Span columns = visible(from[i].width, to[i].width, x / pixels);
        const Span rows = visible(from[i].height, to[i].height, y / pixels);
        const auto at = [](const Plane& plane, size_t column, size_t row) {
            return plane.offset + (row * plane.width + column) * plane.sample_bytes;
        };
        for (size_t row = 0; row < rows.count; ++row) {
            memcpy(canvas->bytes() + at(to[i], columns.to, rows.to + row),
                   picture.bytes() + at(from[i], columns.first, rows.first + row),
                   columns.count * from[i].sample_bytes);
        }
    }
}

}  // namespace

Picture on_canvas(const Picture& picture, const Placement& placement,
                  const std::optional<Color>& color) {
    Picture canvas(placement.result, picture.format);
    canvas.has_alpha = picture.has_alpha;
    canvas.is_gray = picture.is_gray && (!color || color->is_gray());
    const uint8_t alpha = color ? 255 : 0;
    fill(&canvas, one_pixel(picture.format, color.value_or(kBlack), alpha));
    paste(picture, &canvas, placement.x, placement.y);
    return canvas;
}

}  // namespace tool
