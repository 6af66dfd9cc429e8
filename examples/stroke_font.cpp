// SPDX-License-Identifier: Apache-2.0
#include "stroke_font.h"

#include <algorithm>
#include <cstddef>

namespace {

// Coordinates are single digits in base 36, x then y, on a grid where capitals reach from y = 0
// down to the baseline at y = 16, small letters start at y = 6 and descenders end at y = 21.
// '/' starts a chain of straight lines, '~' a smooth curve through its points, '@' a closed one.
struct Glyph {
    char letter;
    int width;
    const char* strokes;
};

constexpr Glyph kGlyphs[] = {
    {'A', 10, "/0g50ag/2a8a"},
    {'B', 9, "/5g0g0050/0858~50828658~589a9e5g"},
    {'C', 10, "~a36022082e6gad"},
    {'D', 10, "/4g0g0040~4083a88d4g"},
    {'E', 8, "/80000g8g/0868"},
    {'F', 8, "/80000g/0868"},
    {'G', 10, "~a36022082e6gad/ada969"},
    {'H', 10, "/000g/a0ag/08a8"},
    {'I', 0, "/000g"},
    {'J', 6, "/606c~6c5f3g1f0d"},
    {'K', 9, "/000g/900a/379g"},
    {'L', 8, "/000g8g"},
    {'M', 12, "/0g006cc0cg"},
    {'N', 10, "/0g00aga0"},
    {'O', 12, "@60a2c8ae6g2e0822"},
    {'P', 9, "/000g/0050/5909~50828759"},
    {'Q', 12, "@60a2c8ae6g2e0822/8ccg"},
    {'R', 9, "/000g/0050/5909/599g~50828759"},
    {'S', 9, "~825013278a9d5g0e"},
    {'T', 10, "/00a0/505g"},
    {'U', 10, "/000b/aba0~0b1e5g9eab"},
    {'V', 10, "/005ga0"},
    {'W', 14, "/003g71bge0"},
    {'X', 9, "/009g/900g"},
    {'Y', 10, "/0058a0/585g"},
    {'Z', 9, "/00900g9g"},
    {'a', 8, "@46778b7f4g1f0b17/868g"},
    {'b', 8, "@46778b7f4g1f0b17/000g"},
    {'c', 7, "~7846170b1f4g7e"},
    {'d', 8, "@46778b7f4g1f0b17/808g"},
    {'e', 8, "/0b8b~8b7746170b1f4g7e"},
    {'f', 5, "~503123/232g/0656"},
    {'g', 8, "@46778b7f4g1f0b17/868i~8i6l3l0k"},
    {'h', 8, "/000g~0b2746778b/8b8g"},
    {'i', 0, "/060g/0202"},
    {'j', 2, "/262i~2i1l0l/2222"},
    {'k', 7, "/000g/760c/3a7g"},
    {'l', 0, "/000g"},
    {'m', 12, "/060g~0b17365769/696g~6b7796b7c9/c9cg"},
    {'n', 8, "/060g~0b2746778b/8b8g"},
    {'o', 8, "@46778b7f4g1f0b17"},
    {'p', 8, "@46778b7f4g1f0b17/060l"},
    {'q', 8, "@46778b7f4g1f0b17/868l"},
    {'r', 5, "/060g~0b173656"},
    {'s', 7, "~6736083a7d4g0f"},
    {'t', 5, "/202c~2c3f5g/0656"},
    {'u', 8, "/060b~0b1f4g6f8b/868g"},
    {'v', 8, "/064g86"},
    {'w', 12, "/063g679gc6"},
    {'x', 7, "/067g/760g"},
    {'y', 8, "/064g/862l"},
    {'z', 7, "/06760g7g"},
    {'0', 8, "@4072887e4g1e0812"},
    {'1', 4, "/03404g"},
    {'2', 8, "~0411407184690g/0g8g"},
    {'3', 8, "~02408348~488c4g0e"},
    {'4', 8, "/6g600b8b"},
    {'5', 8, "/701007~07468b4g0e"},
    {'6', 8, "@46778b7f4g1f0b17~70230b"},
    {'7', 8, "/00803g"},
    {'8', 8, "@40744814@488c4g0c"},
    {'9', 8,
     "@40718579"
     "4a190511~858b4g0f"},
    {'.', 0, "/0g0g"},
    {',', 1, "/1g0j"},
    {':', 0, "/0808/0g0g"},
    {'-', 5, "/0a5a"},
    {' ', 3, ""},
};

constexpr double kGrid = 16;  // grid units in the capital height
constexpr int kGap = 5;       // between letters, grid units

const Glyph* find_glyph(char letter) {
    for (const Glyph& glyph : kGlyphs) {
        if (glyph.letter == letter) return &glyph;
    }
    return nullptr;
}

int digit(char c) {
    return c <= '9' ? c - '0' : c - 'a' + 10;
}

// The point at t in [0, 1] between b and c of a Catmull-Rom curve.
Point on_curve(Point a, Point b, Point c, Point d, double t) {
    const auto blend = [t](double p, double q, double r, double s) {
        return q + 0.5 * t * (r - p + t * (2 * p - 5 * q + 4 * r - s + t * (3 * (q - r) + s - p)));
    };
    return {blend(a.x, b.x, c.x, d.x), blend(a.y, b.y, c.y, d.y)};
}

std::vector<Point> smooth(const std::vector<Point>& points, bool closed) {
    const size_t n = points.size();
    // The point after `skip` steps from the one before point i; an open curve repeats its ends.
    const auto neighbour = [&](size_t i, size_t skip) {
        if (closed) return points[(i + n - 1 + skip) % n];
        return points[std::min(std::max(i + skip, size_t{1}), n) - 1];
    };
    constexpr int kPieces = 8;
    std::vector<Point> curve;
    for (size_t i = 0; i + (closed ? 0 : 1) < n; ++i) {
        for (int piece = 0; piece < kPieces; ++piece) {
            curve.push_back(on_curve(neighbour(i, 0), neighbour(i, 1), neighbour(i, 2),
                                     neighbour(i, 3), static_cast<double>(piece) / kPieces));
        }
    }
    curve.push_back(closed ? points.front() : points.back());
    return curve;
}

// Reads one chain; *at stands behind its mark and is moved to the next mark.
std::vector<Point> read_points(const char** at, double left) {
    std::vector<Point> points;
    const char* p = *at;
    for (; *p != '\0' && *p != '/' && *p != '~' && *p != '@'; p += 2) {
        points.push_back({(left + digit(p[0])) / kGrid, digit(p[1]) / kGrid - 1});
    }
    *at = p;
    return points;
}

}  // namespace

std::vector<std::vector<Point>> text_strokes(const std::string& text) {
    std::vector<std::vector<Point>> strokes;
    double left = 0;
    for (const char letter : text) {
        const Glyph* const glyph = find_glyph(letter);
        if (glyph == nullptr) continue;
        for (const char* at = glyph->strokes; *at != '\0';) {
            const char mark = *at++;
            std::vector<Point> points = read_points(&at, left);
            strokes.push_back(mark == '/' ? points : smooth(points, mark == '@'));
        }
        left += glyph->width + kGap;
    }
    return strokes;
}
