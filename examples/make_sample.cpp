// SPDX-License-Identifier: Apache-2.0
// Renders the project's sample picture: a landscape of noise above panels of fine detail, text,
// gradients and hard edges, which show at a glance what a resampler does to each.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <exception>
#include <iostream>
#include <vector>

#include "codecs.h"
#include "output_file.h"
#include "picture.h"
#include "stroke_font.h"

namespace {

constexpr double kPi = 3.14159265358979323846;
constexpr int kWidth = 1600;
constexpr int kHeight = 1200;
constexpr int kLandscapeHeight = 800;

// ---- Colours and the canvas ----

struct Color {
    double r, g, b;  // 0 to 1
};

Color operator*(Color c, double k) {
    return {c.r * k, c.g * k, c.b * k};
}

Color operator+(Color a, Color b) {
    return {a.r + b.r, a.g + b.g, a.b + b.b};
}

Color mix(Color a, Color b, double t) {
    return a * (1 - t) + b * t;
}

Color gray(double v) {
    return {v, v, v};
}

double clamp01(double v) {
    return std::min(std::max(v, 0.0), 1.0);
}

double smoothstep(double from, double to, double v) {
    const double t = clamp01((v - from) / (to - from));
    return t * t * (3 - 2 * t);
}

// hue: 0 to 1 around the colour circle.
Color from_hue(double hue) {
    const auto channel = [hue](double shift) {
        const double h = std::fmod(hue + shift, 1.0) * 6;
        return clamp01(std::abs(h - 3) - 1);
    };
    return {channel(0), channel(2.0 / 3), channel(1.0 / 3)};
}

struct Rect {
    int x, y, w, h;
};

class Canvas {
public:
    Canvas() : pixels_(static_cast<size_t>(kWidth) * kHeight) {}

    Color& at(int x, int y) {
        return pixels_[static_cast<size_t>(y) * kWidth + static_cast<size_t>(x)];
    }

    void blend(int x, int y, Color color, double cover) {
        if (x < 0 || y < 0 || x >= kWidth || y >= kHeight || cover <= 0) return;
        at(x, y) = mix(at(x, y), color, std::min(cover, 1.0));
    }

    // shade(x, y) with coordinates from the rectangle's corner.
    template <class Shade>
    void paint(const Rect& rect, Shade shade) {
        for (int y = 0; y < rect.h; ++y) {
            for (int x = 0; x < rect.w; ++x) at(rect.x + x, rect.y + y) = shade(x, y);
        }
    }

    // As paint(), averaging 8 x 8 points per pixel; shade takes real coordinates.
    template <class Shade>
    void paint_smooth(const Rect& rect, Shade shade) {
        constexpr int kGrid = 8;
        paint(rect, [&](int x, int y) {
            Color sum = gray(0);
            for (int i = 0; i < kGrid * kGrid; ++i) {
                const int column = i % kGrid;
                const int row = i / kGrid;
                sum = sum + shade(x + (column + 0.5) / kGrid, y + (row + 0.5) / kGrid);
            }
            return sum * (1.0 / (kGrid * kGrid));
        });
    }

    tool::Picture picture() {
        tool::Picture result({kWidth, kHeight});
        uint8_t* to = result.bytes();
        for (const Color& c : pixels_) {
            for (const double v : {c.r, c.g, c.b, 1.0}) {
                *to++ = static_cast<uint8_t>(std::lround(clamp01(v) * 255));
            }
        }
        return result;
    }

private:
    std::vector<Color> pixels_;
};

// ---- Noise ----

uint32_t hash(uint32_t v) {
    v = (v ^ (v >> 16)) * 0x7FEB352D;
    v = (v ^ (v >> 15)) * 0x846CA68B;
    return v ^ (v >> 16);
}

// A value in [0, 1) that looks random, fixed for each lattice point.
double lattice(int x, int y, uint32_t layer) {
    const uint32_t mixed =
        hash(static_cast<uint32_t>(x) + hash(static_cast<uint32_t>(y) + hash(layer)));
    return mixed / 4294967296.0;
}

double noise(double x, double y, uint32_t layer) {
    const int ix = static_cast<int>(std::floor(x));
    const int iy = static_cast<int>(std::floor(y));
    const double tx = smoothstep(0, 1, x - ix);
    const double ty = smoothstep(0, 1, y - iy);
    const double top = lattice(ix, iy, layer) * (1 - tx) + lattice(ix + 1, iy, layer) * tx;
    const double bottom =
        lattice(ix, iy + 1, layer) * (1 - tx) + lattice(ix + 1, iy + 1, layer) * tx;
    return top * (1 - ty) + bottom * ty;
}

// Octaves of noise, 0 to 1.
double fractal(double x, double y, int octaves, uint32_t layer) {
    double sum = 0;
    double weight = 0.5;
    for (int i = 0; i < octaves; ++i) {
        sum += weight * noise(x, y, layer + static_cast<uint32_t>(i));
        // Turned and scaled, so that the lattices of the octaves do not line up.
        const double turned = 1.6 * x - 1.2 * y;
        y = 1.2 * x + 1.6 * y;
        x = turned;
        weight *= 0.5;
    }
    return sum;
}

// Sharp crests, 0 to 1.
double ridged(double x, double y, int octaves, uint32_t layer) {
    double sum = 0;
    double weight = 0.5;
    for (int i = 0; i < octaves; ++i) {
        const double crest = 1 - std::abs(2 * noise(x, y, layer + static_cast<uint32_t>(i)) - 1);
        sum += weight * crest * crest;
        const double turned = 1.6 * x - 1.2 * y;
        y = 1.2 * x + 1.6 * y;
        x = turned;
        weight *= 0.5;
    }
    return sum;
}

// ---- Landscape ----

constexpr double kWaterLine = 590;
constexpr Point kSun = {1180, 350};
constexpr Color kHaze = {0.86, 0.80, 0.78};

Color sky(double x, double y) {
    const double down = clamp01(y / 560);
    Color color = mix({0.16, 0.34, 0.62}, {0.55, 0.72, 0.88}, smoothstep(0, 0.62, down));
    color = mix(color, {0.99, 0.84, 0.66}, smoothstep(0.45, 1, down));

    const double distance = std::hypot(x - kSun.x, (y - kSun.y) * 1.1);
    color = color + Color{0.55, 0.42, 0.24} * std::exp(-distance / 170);
    color = color + gray(1.2) * smoothstep(36, 22, distance);

    // Clouds lie on a plane overhead: they shrink towards the horizon.
    const double depth = 260 / (700 - y);
    const double u = (x - 800) / 200 * depth * 1.6 + 7;
    const double v = depth * 9;
    const double density = fractal(u * 1.3, v * 1.5, 7, 11);
    const double lit = fractal(u * 1.3 + 0.12, v * 1.5 - 0.16, 5, 11);
    const double cover = smoothstep(0.50, 0.70, density) * smoothstep(1, 0.35, down);
    const Color shaded =
        mix({0.62, 0.64, 0.72}, {1, 0.97, 0.93}, clamp01(0.62 + 4 * (density - lit)));
    return mix(color, shaded, cover * 0.93);
}

// One range of mountains. Heights are rows of the picture, so smaller is higher.
struct Range {
    double base, height, scale;
    uint32_t layer;
    Color low, high;
    double snow_row;
    double haze;
};

double crest_row(const Range& range, double x) {
    const double shape = ridged(x / range.scale, 0.5, 8, range.layer);
    const double swell = noise(x / (range.scale * 2.4), 3.5, range.layer + 40);
    return range.base - range.height * (0.35 + 0.65 * swell) * shape * 1.25;
}

Color mountain(const Range& range, double x, double y, double below_crest) {
    const auto relief = [&](double px, double py) {
        return ridged(px / (range.scale * 0.33), py / (range.scale * 0.21), 7, range.layer + 80);
    };
    // Light comes from the upper right.
    const double slope = relief(x + 2, y - 1.5) - relief(x - 2, y + 1.5);
    const double light = clamp01(0.52 - 3.4 * slope);
    const double patch = fractal(x / 34, y / 22, 5, range.layer + 120);
    Color color = mix(range.low, range.high, smoothstep(0.3, 0.7, patch)) * (0.45 + 0.85 * light);
    const double snow_edge = range.snow_row + 110 * (patch - 0.5);
    const double snow =
        smoothstep(snow_edge + 12, snow_edge - 12, y) * smoothstep(0.15, 0.4, light);
    color = mix(color, mix({0.60, 0.68, 0.82}, {1, 0.98, 0.96}, light), snow);
    const double mist = range.haze + 0.35 * smoothstep(60, 260, below_crest);
    return mix(color, kHaze, clamp01(mist));
}

// The dark edge of a wood of conifers: the row where the trees above column x begin.
double tree_row(double x, double ground, double height, double spacing, uint32_t layer) {
    double top = ground;
    const int cell = static_cast<int>(std::floor(x / spacing));
    for (int i = cell - 3; i <= cell + 3; ++i) {
        const double middle = (i + lattice(i, 0, layer)) * spacing;
        const double tall = height * (0.45 + 0.55 * lattice(i, 1, layer));
        const double side = std::abs(x - middle);
        // Branches: the outline steps in and out on the way up.
        const double sway = 1 + 0.35 * (lattice(static_cast<int>(x * 1.7), i, layer + 5) - 0.5);
        top = std::min(top, ground - tall + side * 3.6 * sway);
    }
    return top;
}

Color wood(double x, double y, uint32_t layer, double haze) {
    const double leaf = fractal(x / 5, y / 7, 4, layer);
    const double lump = fractal(x / 40, y / 30, 3, layer + 9);
    const Color dark = {0.05, 0.11, 0.09};
    const Color bright = {0.25, 0.36, 0.17};
    return mix(mix(dark, bright, clamp01(1.9 * leaf * lump)), kHaze, haze);
}

// Everything above the water line.
Color shore(double x, double y) {
    static constexpr Range kRanges[] = {
        {560, 330, 520, 200, {0.42, 0.42, 0.50}, {0.56, 0.53, 0.56}, 385, 0.34},
        {590, 210, 380, 320, {0.27, 0.33, 0.33}, {0.43, 0.44, 0.38}, 250, 0.18},
    };
    const double hill = 560 - 46 * fractal(x / 310, 0.5, 4, 400);
    if (y > tree_row(x, hill + 34, 42, 7, 410)) return wood(x, y, 420, 0.05);
    if (y > tree_row(x, hill + 4, 26, 5, 430)) return wood(x, y, 440, 0.20);
    for (int i = 1; i >= 0; --i) {
        const double crest = crest_row(kRanges[i], x);
        if (y > crest) return mountain(kRanges[i], x, y, y - crest);
    }
    return sky(x, y);
}

Color lake(double x, double y) {
    const double depth = y - kWaterLine;
    const double wave = fractal(x / (20 + depth * 0.9), depth / (2 + depth * 0.035), 4, 500) - 0.47;
    const double mirrored = kWaterLine - depth * 1.35 + wave * (10 + depth * 0.55);
    Color color = shore(x + wave * 14, std::max(mirrored, 0.0));
    color = mix(color * 0.80, {0.10, 0.22, 0.30}, 0.16 + 0.24 * smoothstep(0, 170, depth));
    const double glitter = smoothstep(0.10, 0.24, wave) * std::exp(-std::abs(x - kSun.x) / 120);
    return color + Color{0.8, 0.65, 0.42} * glitter * 0.7;
}

double bank_row(double x) {
    return 792 - 150 * smoothstep(760, 0, x) - 70 * smoothstep(1050, 1600, x) -
           34 * fractal(x / 150, 0.5, 4, 600);
}

Color bank(double x, double y) {
    const double soil = fractal(x / 18, y / 10, 6, 610);
    return mix({0.09, 0.13, 0.05}, {0.30, 0.36, 0.12}, soil);
}

void draw_segment(Canvas* canvas, Point a, Point b, double radius, Color color, double strength,
                  int bottom) {
    const double dx = b.x - a.x;
    const double dy = b.y - a.y;
    const double length2 = std::max(dx * dx + dy * dy, 1e-9);
    const int y_end =
        std::min(bottom, static_cast<int>(std::ceil(std::max(a.y, b.y) + radius + 1)));
    for (int y = static_cast<int>(std::min(a.y, b.y) - radius - 1); y < y_end; ++y) {
        const int x_end = static_cast<int>(std::ceil(std::max(a.x, b.x) + radius + 1));
        for (int x = static_cast<int>(std::min(a.x, b.x) - radius - 1); x < x_end; ++x) {
            const double px = x + 0.5 - a.x;
            const double py = y + 0.5 - a.y;
            const double t = clamp01((px * dx + py * dy) / length2);
            const double distance = std::hypot(px - t * dx, py - t * dy);
            canvas->blend(x, y, color, strength * clamp01(radius + 0.5 - distance));
        }
    }
}

// Blades of grass and a few flowers, from the back of the bank to the front.
void draw_meadow(Canvas* canvas) {
    constexpr int kBlades = 26000;
    for (int i = 0; i < kBlades; ++i) {
        const auto random = [i](int which) { return lattice(i, which, 700); };
        const double back = static_cast<double>(i) / kBlades;
        const double x = random(0) * (kWidth + 20) - 10;
        const double y = bank_row(x) + back * 210;
        if (y > kLandscapeHeight + 40) continue;
        const double near = (y - 600) / 200;
        const double tall = (7 + 24 * random(1)) * (0.5 + near);
        const double lean = (random(2) - 0.42) * tall * 0.8;
        const double tone = fractal(x / 90, y / 50, 3, 710) + 0.5 * (random(3) - 0.5);
        Color color = mix({0.10, 0.20, 0.05}, {0.62, 0.68, 0.22}, clamp01(tone));
        if (random(4) > 0.93) color = mix(color, {0.86, 0.76, 0.42}, 0.7);
        const Point root = {x, y};
        const Point bend = {x + lean * 0.35, y - tall * 0.6};
        const Point tip = {x + lean, y - tall};
        draw_segment(canvas, root, bend, 0.5 + 0.35 * near, color, 0.9, kLandscapeHeight);
        draw_segment(canvas, bend, tip, 0.3 + 0.2 * near, color * 1.15, 0.9, kLandscapeHeight);
        if (random(5) > 0.988) {
            const Color petals[] = {{0.95, 0.92, 0.90}, {0.93, 0.72, 0.15}, {0.80, 0.22, 0.30}};
            draw_segment(canvas, tip, tip, 1.3 + 1.5 * near, petals[i % 3], 1, kLandscapeHeight);
        }
    }
}

void draw_landscape(Canvas* canvas) {
    canvas->paint({0, 0, kWidth, kLandscapeHeight}, [](int x, int y) {
        if (y > bank_row(x)) return bank(x, y);
        return y < kWaterLine ? shore(x, y) : lake(x, y);
    });
    draw_meadow(canvas);
}

// ---- Panels ----

// Writes text with capitals `size` pixels high.
void draw_text(Canvas* canvas, const char* text, Point start, double size, double pen,
               Color color) {
    for (const auto& stroke : text_strokes(text)) {
        for (size_t i = 0; i + 1 < stroke.size(); ++i) {
            const Point a = {start.x + stroke[i].x * size, start.y + stroke[i].y * size};
            const Point b = {start.x + stroke[i + 1].x * size, start.y + stroke[i + 1].y * size};
            draw_segment(canvas, a, b, pen / 2, color, 1, kHeight);
        }
    }
}

// Rings ever closer together, down to one pixel at the sides.
void draw_zone_plate(Canvas* canvas, const Rect& rect) {
    canvas->paint(rect, [&](int x, int y) {
        const double dx = x + 0.5 - rect.w / 2.0;
        const double dy = y + 0.5 - rect.h / 2.0;
        return gray(0.5 + 0.5 * std::cos(kPi * (dx * dx + dy * dy) / rect.w));
    });
}

// Groups of upright and level lines 1, 2, 3, 4 and 6 pixels wide.
void draw_line_pairs(Canvas* canvas, const Rect& rect) {
    canvas->paint(rect, [](int, int) { return gray(1); });
    const int widths[] = {1, 2, 3, 4, 6};
    int left = 8;
    for (const int width : widths) {
        const int group = width * 11;
        const int half = rect.h / 2;
        canvas->paint({rect.x + left, rect.y + 8, group, half - 12},
                      [width](int x, int) { return gray(x / width % 2); });
        canvas->paint({rect.x + left, rect.y + half + 4, group, half - 12},
                      [width](int, int y) { return gray(y / width % 2); });
        left += group + 12;
    }
}

void draw_star(Canvas* canvas, const Rect& rect) {
    canvas->paint_smooth(rect, [&](double x, double y) {
        const double dx = x - rect.w / 2.0;
        const double dy = y - rect.h / 2.0;
        if (std::hypot(dx, dy) > rect.h / 2.0 - 4) return gray(1);
        return std::sin(36 * std::atan2(dy, dx)) > 0 ? gray(0) : gray(1);
    });
}

void draw_text_panel(Canvas* canvas, const Rect& rect) {
    const Color paper = {0.98, 0.97, 0.93};
    const Color ink = {0.08, 0.08, 0.12};
    canvas->paint(rect, [&](int, int) { return paper; });
    const char* const kPangram = "The quick brown fox jumps over the lazy dog 0123456789";
    struct Line {
        const char* text;
        double size, pen, row;
    };
    const Line lines[] = {
        {"Aa Gg Rr 258", 40, 5.0, 62},
        {"Sharp text survives", 22, 2.8, 112},
        {"Quarter points: 64, 96, 128", 16, 2.0, 148},
        {"The quick brown fox jumps over", 13, 1.7, 178},
        {"the lazy dog, 0123456789.", 13, 1.7, 203},
        {"Pack my box with five dozen jugs", 11, 1.4, 229},
        {kPangram, 8, 1.1, 250},
        {kPangram, 7, 1.0, 268},
        {kPangram, 6, 1.0, 284},
    };
    for (const Line& line : lines) {
        draw_text(canvas, line.text, {rect.x + 14.0, rect.y + line.row}, line.size, line.pen, ink);
    }
    const Rect night = {rect.x, rect.y + 298, rect.w, rect.h - 298};
    canvas->paint(night, [](int, int) { return Color{0.10, 0.12, 0.20}; });
    draw_text(canvas, "Light on dark", {night.x + 14.0, night.y + 34.0}, 18, 2.2,
              {0.98, 0.86, 0.45});
    draw_text(canvas, "WAVE mnw ilj 8B 0O", {night.x + 210.0, night.y + 32.0}, 12, 1.5,
              {0.65, 0.85, 1});
}

// Disks of plain colour over each other, and a black and a white field with a tilted edge.
Color edges(double x, double y) {
    struct Disk {
        double x, y, radius;
        Color color;
    };
    static constexpr Disk kDisks[] = {
        {120, 88, 42, {0.90, 0.15, 0.15}},
        {84, 66, 42, {0.10, 0.62, 0.30}},
        {56, 100, 42, {0.12, 0.32, 0.86}},
    };
    if (x > 190) return gray(x - 270 > (y - 85) * 0.18 ? 1 : 0);
    for (const Disk& disk : kDisks) {
        if (std::hypot(x - disk.x, y - disk.y) < disk.radius) return disk.color;
    }
    return {0.98, 0.90, 0.30};
}

void draw_gradients_and_edges(Canvas* canvas, const Rect& rect) {
    const auto part = [&](int y, int h) { return Rect{rect.x, rect.y + y, rect.w, h}; };
    const double right = rect.w - 1;
    canvas->paint(part(0, 44), [&](int x, int) { return gray(x / right); });
    canvas->paint(part(44, 22),
                  [&](int x, int) { return gray(std::floor(x / right * 15.99) / 15); });
    canvas->paint(part(66, 66), [&](int x, int y) {
        const double down = y / 65.0;
        const Color hue = from_hue(x / right * 0.999);
        return down < 0.5 ? mix(gray(1), hue, down * 2) : hue * (2 - 2 * down);
    });
    canvas->paint(part(132, 58), [&](int x, int y) {
        const int squares[] = {1, 2, 4, 8};
        const int square = squares[std::min(3, x * 4 / rect.w)];
        return gray((x / square + y / square) % 2);
    });
    canvas->paint_smooth(part(190, rect.h - 190), edges);
}

void draw_panels(Canvas* canvas) {
    canvas->paint({0, kLandscapeHeight, kWidth, kHeight - kLandscapeHeight}, [](int, int y) {
        return y < 4 ? gray(1) : Color{0.16, 0.18, 0.22};
    });
    draw_zone_plate(canvas, {20, 822, 360, 360});
    draw_line_pairs(canvas, {400, 822, 250, 150});
    draw_star(canvas, {400, 972, 250, 210});
    draw_text_panel(canvas, {670, 822, 500, 360});
    draw_gradients_and_edges(canvas, {1190, 822, 390, 360});
}

void draw_title(Canvas* canvas) {
    const char* const kTitle = "libovrinresize";
    draw_text(canvas, kTitle, {62, 132}, 58, 7.5, Color{0.05, 0.12, 0.25});
    draw_text(canvas, kTitle, {60, 130}, 58, 7.5, gray(1));
    draw_text(canvas, "sample picture, 1600 x 1200", {62, 178}, 20, 2.6, gray(1));
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 2) {
        std::cerr << "Usage: make_sample OUT.png\n";
        return 2;
    }
    try {
        Canvas canvas;
        draw_landscape(&canvas);
        draw_title(&canvas);
        draw_panels(&canvas);
        tool::OutputFile file(argv[1]);
        tool::Metadata metadata;
        metadata.srgb_intent = 0;
        tool::encode_png(canvas.picture(), metadata, file.stream());
        file.commit();
    } catch (const std::exception& error) {
        std::cerr << "make_sample: " << error.what() << "\n";
        return 1;
    }
    return 0;
}
