// SPDX-License-Identifier: Apache-2.0
// All resamplers side by side, on one sheet: contact_sheet SAMPLE.png OUT.png
//
// Upper row: the sample picture's middle, shrunk to a third. Lower row: a small piece of it,
// enlarged four times and a half.
#include <algorithm>
#include <cmath>
#include <iostream>

#include "codecs.h"
#include "engine.h"
#include "output_file.h"
#include "source.h"
#include "stroke_font.h"

namespace {

using tool::Picture;
using tool::Size;

constexpr int32_t kTile = 360;
constexpr int32_t kGap = 12;
constexpr int32_t kLabel = 34;

struct Resampler {
    const char* label;
    tool::Engine engine;
};

constexpr Resampler kResamplers[] = {{"quarter-point", tool::Engine::kQuarter},
                                     {"bilinear", tool::Engine::kBilinear},
                                     {"Lanczos", tool::Engine::kLanczos},
                                     {"nearest neighbour", tool::Engine::kNearest}};

Picture cropped(const Picture& source, int32_t x, int32_t y, Size size) {
    Picture result(size);
    for (int32_t row = 0; row < size.height; ++row) {
        const auto from =
            source.words.begin() + (static_cast<ptrdiff_t>(y) + row) * source.size.width + x;
        std::copy(from, from + size.width,
                  result.words.begin() + static_cast<ptrdiff_t>(row) * size.width);
    }
    return result;
}

void paste(Picture* sheet, const Picture& tile, int32_t x, int32_t y) {
    for (int32_t row = 0; row < tile.size.height; ++row) {
        const auto from = tile.words.begin() + static_cast<ptrdiff_t>(row) * tile.size.width;
        std::copy(from, from + tile.size.width,
                  sheet->words.begin() + (static_cast<ptrdiff_t>(y) + row) * sheet->size.width + x);
    }
}

// Distance of a point from a stroke's piece.
double distance(Point p, Point a, Point b) {
    const double dx = b.x - a.x;
    const double dy = b.y - a.y;
    const double length = dx * dx + dy * dy;
    const double t =
        length == 0 ? 0 : std::clamp(((p.x - a.x) * dx + (p.y - a.y) * dy) / length, 0.0, 1.0);
    return std::hypot(p.x - a.x - t * dx, p.y - a.y - t * dy);
}

// Dark text on the white sheet, capitals `size` pixels high.
void write(Picture* sheet, const char* text, Point start, double size) {
    constexpr double kPen = 1.1;
    for (const auto& stroke : text_strokes(text)) {
        for (size_t i = 0; i + 1 < stroke.size(); ++i) {
            const Point a = {start.x + stroke[i].x * size, start.y + stroke[i].y * size};
            const Point b = {start.x + stroke[i + 1].x * size, start.y + stroke[i + 1].y * size};
            const auto low = [](double u, double v) {
                return static_cast<int>(std::min(u, v)) - 3;
            };
            const auto high = [](double u, double v) {
                return static_cast<int>(std::max(u, v)) + 3;
            };
            for (int y = low(a.y, b.y); y <= high(a.y, b.y); ++y) {
                for (int x = low(a.x, b.x); x <= high(a.x, b.x); ++x) {
                    const double ink =
                        std::clamp(kPen + 0.5 - distance({x + 0.5, y + 0.5}, a, b), 0.0, 1.0);
                    uint8_t* pixel =
                        sheet->bytes() + 4 * (static_cast<ptrdiff_t>(y) * sheet->size.width + x);
                    const auto shade = static_cast<uint8_t>(255 - 225 * ink);
                    for (int c = 0; c < 3; ++c) pixel[c] = std::min(pixel[c], shade);
                }
            }
        }
    }
}

Picture draw_sheet(const Picture& sample) {
    constexpr int32_t kColumns = 4;
    Picture sheet({kColumns * (kTile + kGap) + kGap, 2 * (kTile + kLabel) + kGap});
    std::fill(sheet.words.begin(), sheet.words.end(), 0xFFFFFFFF);
    // Text, line pairs and landscape; and the edge of a letter with its surroundings.
    Picture large = cropped(sample, 300, 110, {3 * kTile, 3 * kTile});
    Picture small = cropped(sample, 676, 822, {80, 80});
    int32_t x = kGap;
    for (const Resampler& resampler : kResamplers) {
        int32_t y = kLabel;
        const char* const suffixes[] = {", to a third", ", 4.5 times as large"};
        for (Picture* source : {&large, &small}) {
            Picture tile({kTile, kTile});
            tool::resize(resampler.engine, source, &tile);
            write(&sheet, (std::string(resampler.label) + suffixes[source == &small]).c_str(),
                  {x + 2.0, y - 9.0}, 14);
            paste(&sheet, tile, x, y);
            y += kTile + kLabel;
        }
        x += kTile + kGap;
    }
    // Results of the quarter-point sampler are at most 252, alpha included.
    for (size_t i = 3; i < sheet.byte_count(); i += 4) sheet.bytes()[i] = 255;
    return sheet;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 3) {
        std::cerr << "Usage: contact_sheet SAMPLE.png OUT.png\n";
        return 2;
    }
    try {
        Picture sample;
        tool::open_source(argv[1], std::nullopt)->next(&sample);
        tool::OutputFile file(argv[2]);
        tool::encode_png(draw_sheet(sample), {}, file.stream());
        file.commit();
    } catch (const std::exception& error) {
        std::cerr << "contact_sheet: " << error.what() << "\n";
        return 1;
    }
    return 0;
}
