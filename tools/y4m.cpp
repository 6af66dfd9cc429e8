// SPDX-License-Identifier: Apache-2.0
#include "y4m.h"

#include <charconv>
#include <cstring>
#include <numeric>
#include <sstream>

#include "error.h"

namespace tool {

namespace {

int64_t parse_number(const std::string& text) {
    int64_t value = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, status] = std::from_chars(text.data(), end, value);
    if (status != std::errc() || stop != end || value > INT32_MAX || value < 0) {
        throw Error("damaged Y4M: bad header");
    }
    return value;
}

void parse_aspect(const std::string& value, Y4mHeader* header) {
    const size_t colon = value.find(':');
    if (colon == std::string::npos) throw Error("damaged Y4M: bad header");
    header->aspect_width = parse_number(value.substr(0, colon));
    header->aspect_height = parse_number(value.substr(colon + 1));
}

struct ChromaName {
    const char* name;
    PixelFormat format;
};

constexpr ChromaName kChromaNames[] = {
    {"420", PixelFormat::kI420},      {"420jpeg", PixelFormat::kI420},
    {"420mpeg2", PixelFormat::kI420}, {"420paldv", PixelFormat::kI420},
    {"422", PixelFormat::kI422},      {"444", PixelFormat::kI444},
    {"mono", PixelFormat::kGray},
};

// What stands behind the name: nothing, or for deeper samples their bits, as in "420p10" and
// "mono10". 0 where it is anything else.
int bits_of(const std::string& text, PixelFormat format) {
    if (text.empty()) return 8;
    const size_t start = format == PixelFormat::kGray ? 0 : 1;
    if (start == 1 && text[0] != 'p') return 0;
    int bits = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, status] = std::from_chars(text.data() + start, end, bits);
    return status == std::errc() && stop == end && bits > 8 && bits <= 16 ? bits : 0;
}

void parse_chroma(const std::string& value, Y4mHeader* header) {
    for (const auto& [name, format] : kChromaNames) {
        const size_t length = strlen(name);
        const int bits =
            value.compare(0, length, name) == 0 ? bits_of(value.substr(length), format) : 0;
        if (bits == 0) continue;
        header->format = format;
        header->bits = bits;
        header->other_tags += std::string(" C") + name;
        return;
    }
    throw Error("Y4M of type C" + value + " is not handled, only 4:2:0, 4:2:2, 4:4:4 and mono");
}

void check_interlacing(const std::string& value) {
    if (value == "p" || value == "?") return;
    throw Error("interlaced Y4M (I" + value + ") is not handled; deinterlace it first");
}

}  // namespace

Y4mHeader parse_y4m_header(const std::string& line) {
    Y4mHeader header = {};
    int64_t width = 0;
    int64_t height = 0;
    std::istringstream words(line);
    std::string word;
    words >> word;
    if (word != "YUV4MPEG2") throw Error("damaged Y4M: bad header");
    while (words >> word) {
        const std::string value = word.substr(1);
        switch (word[0]) {
            case 'W':
                width = parse_number(value);
                continue;
            case 'H':
                height = parse_number(value);
                continue;
            case 'A':
                parse_aspect(value, &header);
                continue;
            case 'C':
                parse_chroma(value, &header);
                continue;
            case 'X':
                // Another name of the same, for some readers.
                if (value.compare(0, 6, "YSCSS=") == 0) continue;
                break;
            case 'I':
                check_interlacing(value);
                break;
            default:
                break;
        }
        header.other_tags += " " + word;
    }
    header.size = checked_size(width, height);
    return header;
}

std::string y4m_header_line(const Y4mHeader& header) {
    return "YUV4MPEG2 W" + std::to_string(header.size.width) + " H" +
           std::to_string(header.size.height) + " A" + std::to_string(header.aspect_width) + ":" +
           std::to_string(header.aspect_height) + header.other_tags + "\n";
}

Y4mHeader resized_y4m_header(const Y4mHeader& header, Size picture, Size result, bool keep_aspect) {
    Y4mHeader resized = header;
    resized.size = result;
    if (keep_aspect || header.aspect_width == 0 || header.aspect_height == 0) return resized;

    // Reduced step by step: no product passes 63 bits.
    int64_t stretched_width = int64_t{header.size.width} * picture.height;
    int64_t stretched_height = int64_t{header.size.height} * picture.width;
    const int64_t common = std::gcd(stretched_width, stretched_height);
    stretched_width /= common;
    stretched_height /= common;
    const int64_t across = std::gcd(header.aspect_width, stretched_height);
    const int64_t down = std::gcd(header.aspect_height, stretched_width);
    resized.aspect_width = header.aspect_width / across * (stretched_width / down);
    resized.aspect_height = header.aspect_height / down * (stretched_height / across);
    if (resized.aspect_width > INT32_MAX || resized.aspect_height > INT32_MAX) {
        resized.aspect_width = resized.aspect_height = 0;  // not a number that readers expect
    }
    return resized;
}

}  // namespace tool
