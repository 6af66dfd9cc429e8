// SPDX-License-Identifier: Apache-2.0
// Binary PPM: "P6", width, height, largest value, one white space, then samples of one byte, or of
// two (big end first) where the largest value exceeds 255.
#include <cerrno>
#include <cstring>
#include <string>

#include "codecs.h"
#include "convert.h"
#include "error.h"

namespace tool {

namespace {

bool is_space(uint8_t byte) {
    return byte == ' ' || (byte >= '\t' && byte <= '\r');
}

class HeaderReader {
public:
    HeaderReader(const uint8_t* data, size_t size) : at_(data), end_(data + size) {}

    int64_t number() {
        skip_space_and_comments();
        if (at_ == end_ || *at_ < '0' || *at_ > '9') throw Error("damaged PPM: bad header");
        int64_t value = 0;
        for (; at_ != end_ && *at_ >= '0' && *at_ <= '9'; ++at_) {
            value = value * 10 + (*at_ - '0');
            if (value > INT32_MAX) throw Error("damaged PPM: bad header");
        }
        return value;
    }

    // The single white space that ends the header.
    const uint8_t* samples() {
        if (at_ == end_ || !is_space(*at_)) throw Error("damaged PPM: bad header");
        return at_ + 1;
    }

private:
    void skip_space_and_comments() {
        while (at_ != end_ && (is_space(*at_) || *at_ == '#')) {
            if (*at_ == '#') {
                while (at_ != end_ && *at_ != '\n') ++at_;
            } else {
                ++at_;
            }
        }
    }

    const uint8_t* at_;
    const uint8_t* end_;
};

}  // namespace

bool is_ppm(const uint8_t* data, size_t size) {
    return size >= 3 && data[0] == 'P' && data[1] == '6' && (is_space(data[2]) || data[2] == '#');
}

Picture decode_ppm(const uint8_t* data, size_t size, Metadata* /*metadata*/) {
    HeaderReader header(data + 2, size - 2);
    const int64_t width = header.number();
    const int64_t height = header.number();
    const int64_t largest = header.number();
    const uint8_t* from = header.samples();
    if (largest < 1 || largest > 65535) throw Error("damaged PPM: bad largest value");

    const Size dimensions = checked_size(width, height);
    const size_t sample_bytes = largest > 255 ? 2 : 1;
    const size_t needed = dimensions.pixels() * 3 * sample_bytes;
    if (static_cast<size_t>(data + size - from) < needed) throw Error("damaged PPM: too short");

    Picture picture(dimensions);
    uint8_t* to = picture.bytes();
    for (size_t i = 0; i < dimensions.pixels(); ++i) {
        for (int channel = 0; channel < 3; ++channel) {
            int64_t value = *from++;
            if (sample_bytes == 2) value = value * 256 + *from++;
            if (value > largest) value = largest;
            *to++ = static_cast<uint8_t>((value * 255 + largest / 2) / largest);
        }
        *to++ = 255;
    }
    return picture;
}

void encode_ppm(const Picture& picture, FILE* out) {
    const std::string header = "P6\n" + std::to_string(picture.size.width) + " " +
                               std::to_string(picture.size.height) + "\n255\n";
    const Picture rgb = converted(picture, PixelFormat::kRgb);
    if (fwrite(header.data(), 1, header.size(), out) != header.size() ||
        fwrite(rgb.bytes(), 1, rgb.byte_count(), out) != rgb.byte_count()) {
        throw Error(std::string("cannot write PPM: ") + strerror(errno));
    }
}

}  // namespace tool
