// SPDX-License-Identifier: Apache-2.0
#include "canvas.h"

#include <algorithm>
#include <cstring>
#include <vector>

#include "convert.h"

namespace tool {

namespace {

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
        for (size_t n = planes[i].size.pixels(); n > 0; --n) {
            to = std::copy_n(sample, planes[i].channels, to);
        }
    }
}

// Where the samples of one row or column go: those from `first` on, `count` of them, to `to` on.
struct Span {
    int32_t first, count, to;
};

// offset: of the picture on the canvas, in samples.
Span visible(int32_t samples, int32_t canvas_samples, int32_t offset) {
    const int32_t first = std::max(-offset, 0);
    const int32_t to = std::max(offset, 0);
    return {first, std::min(samples - first, canvas_samples - to), to};
}

// The sample's byte in the picture.
size_t at(const Plane& plane, int32_t column, int32_t row) {
    const int64_t sample = int64_t{row} * plane.size.width + column;
    return plane.offset + static_cast<size_t>(sample * plane.channels);
}

void paste(const Picture& picture, Picture* canvas, int32_t x, int32_t y) {
    const std::vector<Plane> from = planes_of(picture.format, picture.size);
    const std::vector<Plane> to = planes_of(canvas->format, canvas->size);
    for (size_t i = 0; i < from.size(); ++i) {
        const Span columns = visible(from[i].size.width, to[i].size.width, x / from[i].across);
        const Span rows = visible(from[i].size.height, to[i].size.height, y / from[i].down);
        const auto row_bytes =
            static_cast<size_t>(columns.count) * static_cast<size_t>(from[i].channels);
        for (int32_t row = 0; row < rows.count; ++row) {
            memcpy(canvas->bytes() + at(to[i], columns.to, rows.to + row),
                   picture.bytes() + at(from[i], columns.first, rows.first + row), row_bytes);
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
