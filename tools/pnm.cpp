// SPDX-License-Identifier: Apache-2.0
// The family of Netpbm. PBM, PGM and PPM: "P1" to "P6", width, height and, where samples are more
// than bits, the largest value; then samples as decimals, or after one white space as bits, bytes
// or, where the largest value exceeds 255, pairs of bytes, big end first. PAM: "P7" and lines that
// name each of these.
#include <algorithm>
#include <cerrno>
#include <cstring>
#include <string>

#include "codecs.h"
#include "convert.h"
#include "error.h"

namespace tool {

namespace {

constexpr int64_t kLargest = 65535;

enum class Coding { kDigits, kDecimals, kBits, kBytes };

struct Header {
    Size size;
    size_t channels;  // gray or colours, then alpha where the number is even
    int64_t largest;
    Coding coding;
    bool is_inverted;  // 0 is white

    size_t samples() const { return size.pixels() * channels; }
};

[[noreturn]] void damaged(const char* what) {
    throw Error(std::string("damaged PNM: ") + what);
}

bool is_space(uint8_t byte) {
    return byte == ' ' || (byte >= '\t' && byte <= '\r');
}

bool is_digit(uint8_t byte) {
    return byte >= '0' && byte <= '9';
}

class Reader {
public:
    Reader(const uint8_t* data, size_t size) : at_(data), end_(data + size) {}

    int64_t number() {
        skip_space_and_comments();
        if (at_ == end_ || !is_digit(*at_)) damaged("a number was expected");
        int64_t value = 0;
        for (; at_ != end_ && is_digit(*at_); ++at_) {
            value = value * 10 + (*at_ - '0');
            if (value > INT32_MAX) damaged("too large a number");
        }
        return value;
    }

    // The digits of a plain PBM need no space between them.
    int64_t bit() {
        skip_space_and_comments();
        if (at_ == end_ || (*at_ != '0' && *at_ != '1')) damaged("a 0 or 1 was expected");
        return *at_++ - '0';
    }

    std::string word() {
        skip_space_and_comments();
        const uint8_t* const start = at_;
        while (at_ != end_ && !is_space(*at_)) ++at_;
        return std::string(start, at_);
    }

    // The single white space that ends a header.
    void end_header() {
        if (at_ == end_ || !is_space(*at_)) damaged("bad header");
        ++at_;
    }

    size_t left() const { return static_cast<size_t>(end_ - at_); }
    const uint8_t* rest() const { return at_; }

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

int64_t checked_largest(int64_t largest) {
    if (largest < 1 || largest > kLargest) damaged("bad largest value");
    return largest;
}

Header read_pnm_header(Reader* reader, char type) {
    const bool is_plain = type <= '3';
    const char kind = is_plain ? type : static_cast<char>(type - 3);
    const bool has_bits = kind == '1';
    Header header = {};
    const int64_t width = reader->number();
    const int64_t height = reader->number();
    header.largest = has_bits ? 1 : checked_largest(reader->number());
    header.size = checked_size(width, height);
    header.channels = kind == '3' ? 3 : 1;
    header.is_inverted = has_bits;
    if (is_plain) {
        header.coding = has_bits ? Coding::kDigits : Coding::kDecimals;
    } else {
        header.coding = has_bits ? Coding::kBits : Coding::kBytes;
        reader->end_header();
    }
    return header;
}

size_t channels_of_tuple(const std::string& type) {
    if (type == "BLACKANDWHITE" || type == "GRAYSCALE") return 1;
    if (type == "BLACKANDWHITE_ALPHA" || type == "GRAYSCALE_ALPHA") return 2;
    if (type == "RGB") return 3;
    if (type == "RGB_ALPHA") return 4;
    throw Error("PAM of type " + type + " is not handled");
}

Header read_pam_header(Reader* reader) {
    int64_t width = 0;
    int64_t height = 0;
    int64_t depth = 0;
    int64_t largest = 0;
    std::string type;
    for (std::string word = reader->word(); word != "ENDHDR"; word = reader->word()) {
        if (word == "WIDTH") {
            width = reader->number();
        } else if (word == "HEIGHT") {
            height = reader->number();
        } else if (word == "DEPTH") {
            depth = reader->number();
        } else if (word == "MAXVAL") {
            largest = reader->number();
        } else if (word == "TUPLTYPE") {
            type = reader->word();
        } else {
            damaged("bad header");
        }
    }
    reader->end_header();
    const size_t channels = type.empty() ? static_cast<size_t>(depth) : channels_of_tuple(type);
    if (depth < 1 || depth > 4 || static_cast<size_t>(depth) != channels) damaged("bad depth");
    return {checked_size(width, height), channels, checked_largest(largest), Coding::kBytes, false};
}

Header read_header(Reader* reader, char type) {
    return type == '7' ? read_pam_header(reader) : read_pnm_header(reader, type);
}

size_t bytes_per_sample(const Header& header) {
    return header.largest > 255 ? 2 : 1;
}

// How many bytes the samples take at least, so that no memory is taken for what is not there.
size_t bytes_needed(const Header& header) {
    const auto width = static_cast<size_t>(header.size.width);
    switch (header.coding) {
        case Coding::kDigits:
            return header.samples();
        case Coding::kDecimals:
            return 2 * header.samples() - 1;
        case Coding::kBits:
            return (width + 7) / 8 * static_cast<size_t>(header.size.height);
        case Coding::kBytes:
            break;
    }
    return header.samples() * bytes_per_sample(header);
}

// What each sample becomes, 0 to 255, rounded. Those above the largest value count as that.
Bytes scale_of(const Header& header) {
    Bytes scale(static_cast<size_t>(header.largest) + 1);
    for (int64_t i = 0; i <= header.largest; ++i) {
        const int64_t value = (i * 255 + header.largest / 2) / header.largest;
        scale[static_cast<size_t>(i)] =
            static_cast<uint8_t>(header.is_inverted ? 255 - value : value);
    }
    return scale;
}

// Calls put(sample) for all in their order.
template <class Put>
void for_each_sample(const Header& header, Reader* reader, Put put) {
    const size_t count = header.samples();
    const auto width = static_cast<size_t>(header.size.width);
    const uint8_t* from = reader->rest();
    switch (header.coding) {
        case Coding::kDigits:
            for (size_t i = 0; i < count; ++i) put(reader->bit());
            return;
        case Coding::kDecimals:
            for (size_t i = 0; i < count; ++i) put(reader->number());
            return;
        case Coding::kBits:
            for (size_t y = 0; y < count / width; ++y, from += (width + 7) / 8) {
                for (size_t x = 0; x < width; ++x) put(from[x / 8] >> (7 - x % 8) & 1);
            }
            return;
        case Coding::kBytes:
            if (bytes_per_sample(header) == 1) {
                for (size_t i = 0; i < count; ++i) put(from[i]);
            } else {
                for (size_t i = 0; i < count; ++i) put(from[2 * i] << 8 | from[2 * i + 1]);
            }
            return;
    }
}

// From samples that lie as in the file to RGBA, in place: the last pixel first.
void spread(Picture* picture, size_t channels) {
    uint8_t* const bytes = picture->bytes();
    for (size_t i = picture->size.pixels(); i-- > 0;) {
        const uint8_t* const from = bytes + i * channels;
        const uint8_t first = from[0];
        const uint8_t second = channels < 3 ? first : from[1];
        const uint8_t third = channels < 3 ? first : from[2];
        const uint8_t alpha = channels % 2 == 0 ? from[channels - 1] : 255;
        uint8_t* const to = bytes + i * 4;
        to[0] = first;
        to[1] = second;
        to[2] = third;
        to[3] = alpha;
    }
}

void write(const std::string& header, const uint8_t* bytes, size_t count, FILE* out) {
    if (fwrite(header.data(), 1, header.size(), out) != header.size() ||
        fwrite(bytes, 1, count, out) != count) {
        throw Error(std::string("cannot write PNM: ") + strerror(errno));
    }
}

void write_pnm(const char* type, const Picture& samples, FILE* out) {
    const std::string header = std::string(type) + "\n" + std::to_string(samples.size.width) + " " +
                               std::to_string(samples.size.height) + "\n255\n";
    write(header, samples.bytes(), samples.byte_count(), out);
}

}  // namespace

bool is_pnm(const uint8_t* data, size_t size) {
    return size >= 3 && data[0] == 'P' && data[1] >= '1' && data[1] <= '7' &&
           (is_space(data[2]) || data[2] == '#');
}

Picture decode_pnm(const uint8_t* data, size_t size, Metadata* /*metadata*/) {
    Reader reader(data + 2, size - 2);
    const Header header = read_header(&reader, static_cast<char>(data[1]));
    if (reader.left() < bytes_needed(header)) damaged("too short");

    Picture picture(header.size);
    picture.is_gray = header.channels < 3;
    picture.has_alpha = header.channels % 2 == 0;
    const Bytes scale = scale_of(header);
    uint8_t* to = picture.bytes();
    for_each_sample(header, &reader, [&](int64_t sample) {
        *to++ = scale[static_cast<size_t>(std::min(sample, header.largest))];
    });
    spread(&picture, header.channels);
    return picture;
}

void encode_ppm(const Picture& picture, FILE* out) {
    write_pnm("P6", converted(picture, PixelFormat::kRgb), out);
}

void encode_pgm(const Picture& picture, FILE* out) {
    write_pnm("P5", in_shades(picture), out);
}

void encode_pam(const Picture& picture, FILE* out) {
    const size_t colors = picture.is_gray ? 1 : 3;
    const size_t channels = colors + (picture.has_alpha ? 1 : 0);
    Bytes samples;
    samples.reserve(picture.size.pixels() * channels);
    for (size_t i = 0; i < picture.size.pixels(); ++i) {
        const uint8_t* const pixel = picture.bytes() + 4 * i;
        samples.insert(samples.end(), pixel, pixel + colors);
        if (picture.has_alpha) samples.push_back(pixel[3]);
    }
    const std::string header = "P7\nWIDTH " + std::to_string(picture.size.width) + "\nHEIGHT " +
                               std::to_string(picture.size.height) + "\nDEPTH " +
                               std::to_string(channels) + "\nMAXVAL 255\nTUPLTYPE " +
                               (picture.is_gray ? "GRAYSCALE" : "RGB") +
                               (picture.has_alpha ? "_ALPHA" : "") + "\nENDHDR\n";
    write(header, samples.data(), samples.size(), out);
}

}  // namespace tool
