// SPDX-License-Identifier: Apache-2.0
#include "geometry.h"

#include <charconv>

#include "error.h"

namespace tool {

namespace {

bool take(std::string* text, char last) {
    if (text->empty() || text->back() != last) return false;
    text->pop_back();
    return true;
}

// The whole text as a number above 0; nothing where it is none.
std::optional<double> number(const std::string& text) {
    double value = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, status] = std::from_chars(text.data(), end, value, std::chars_format::fixed);
    // Not a number is none above 0 either.
    if (status != std::errc() || stop != end || !(value > 0)) return std::nullopt;
    return value;
}

void take_suffixes(std::string* text, Geometry* geometry) {
    for (;;) {
        if (take(text, '!')) {
            geometry->fit = Fit::kExact;
        } else if (take(text, '^')) {
            geometry->fit = Fit::kCover;
        } else if (take(text, '>')) {
            geometry->limit = Limit::kOnlyShrinks;
        } else if (take(text, '<')) {
            geometry->limit = Limit::kOnlyEnlarges;
        } else {
            return;
        }
    }
}

// "640x480" and its parts. False when the text is none of them.
bool parse_sides(const std::string& text, Geometry* geometry) {
    const size_t cross = text.find_first_of("xX");
    const std::string width = text.substr(0, cross);
    const std::string height = cross == std::string::npos ? "" : text.substr(cross + 1);
    if (width.empty() && height.empty()) return false;
    // A side that is left out is one that is right, so far.
    const std::string whole = (width.empty() ? "1" : width) + "x" + (height.empty() ? "1" : height);
    const std::optional<Size> size = parse_size(whole);
    if (!size) return false;
    if (!width.empty()) geometry->width = size->width;
    if (!height.empty()) geometry->height = size->height;
    return true;
}

}  // namespace

Geometry parse_geometry(const std::string& text) {
    Geometry geometry;
    std::string rest = text;
    take_suffixes(&rest, &geometry);
    bool is_right = true;
    if (take(&rest, '%')) {
        geometry.factor = number(rest).value_or(0) / 100;
        is_right = geometry.factor > 0;
    } else if (take(&rest, '@')) {
        geometry.pixels = number(rest).value_or(0);
        is_right = geometry.pixels > 0;
    } else {
        is_right = parse_sides(rest, &geometry);
    }
    if (!is_right) {
        throw Error("'" + text +
                    "' is not a size; write it like 640x480, 640x, x480, 640x480!, 50% or "
                    "100000@");
    }
    const bool has_both_sides = geometry.width && geometry.height;
    if (geometry.fit != Fit::kContain && !has_both_sides) {
        throw Error("'" + text + "': ! and ^ need a width and a height");
    }
    return geometry;
}

}  // namespace tool
