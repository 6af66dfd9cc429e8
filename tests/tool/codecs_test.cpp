// SPDX-License-Identifier: Apache-2.0
// The tool's file types: what is kept, and that damaged files end in an Error and nothing worse.
#include <gtest/gtest.h>
#include <png.h>

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <optional>
#include <string>
#include <vector>
// jpeglib.h needs size_t and FILE from the headers above.
#include <jpeglib.h>

#include "codecs.h"
#include "convert.h"
#include "error.h"
#include "exif.h"
#include "support/random.h"

using ovrin_test::Random;
using ovrin_test::rounds;
using tool::Picture;

namespace {

using Bytes = std::vector<uint8_t>;

// What `write` writes to a stream.
Bytes written(const std::function<void(FILE*)>& write) {
    char* data = nullptr;
    size_t size = 0;
    FILE* const stream = open_memstream(&data, &size);
    write(stream);
    static_cast<void>(fclose(stream));
    Bytes bytes(data, data + size);
    free(data);
    return bytes;
}

Picture random_picture(Random* random, tool::Size size, bool has_alpha) {
    Picture picture(size);
    picture.has_alpha = has_alpha;
    for (uint32_t& pixel : picture.words) {
        pixel = static_cast<uint32_t>(random->between(0, INT32_MAX)) * 2;
    }
    return picture;
}

// Smooth enough for JPEG to come close to it.
Picture gradient(tool::Size size) {
    Picture picture(size);
    uint8_t* to = picture.bytes();
    for (int32_t y = 0; y < size.height; ++y) {
        for (int32_t x = 0; x < size.width; ++x) {
            *to++ = static_cast<uint8_t>(x * 255 / size.width);
            *to++ = static_cast<uint8_t>(y * 255 / size.height);
            *to++ = 100;
            *to++ = 255;
        }
    }
    return picture;
}

Picture decode_png(const uint8_t* data, size_t size) {
    tool::Metadata ignored;
    return tool::decode_png(data, size, &ignored);
}

// Damage that is only told of counts like one that is refused.
Picture decode_jpeg(const uint8_t* data, size_t size) {
    tool::Metadata metadata;
    Picture picture = tool::decode_jpeg(data, size, &metadata);
    if (!metadata.damage.empty()) throw tool::Error(metadata.damage);
    return picture;
}

Picture decode_pnm(const uint8_t* data, size_t size) {
    tool::Metadata ignored;
    return tool::decode_pnm(data, size, &ignored);
}

struct Codec {
    const char* name;
    bool (*recognise)(const uint8_t*, size_t);
    Picture (*decode)(const uint8_t*, size_t);
    void (*encode)(const Picture&, FILE*);
};

const Codec kCodecs[] = {
    {"PNG", tool::is_png, decode_png,
     [](const Picture& picture, FILE* out) { tool::encode_png(picture, {}, out); }},
    {"JPEG", tool::is_jpeg, decode_jpeg,
     [](const Picture& picture, FILE* out) { tool::encode_jpeg(picture, {}, 90, out); }},
    {"PPM", tool::is_pnm, decode_pnm, tool::encode_ppm},
    {"PAM", tool::is_pnm, decode_pnm, tool::encode_pam},
};

Bytes encoded(const Codec& codec, const Picture& picture) {
    return written([&](FILE* out) { codec.encode(picture, out); });
}

// A file 2 pixels wide and 1 high, of any sample depth, with or without alpha.
Bytes png_of(int depth, int colors, const Bytes& row) {
    return written([&](FILE* out) {
        png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
        png_infop info = png_create_info_struct(png);
        png_init_io(png, out);
        png_set_IHDR(png, info, 2, 1, depth, colors, PNG_INTERLACE_NONE, PNG_COMPRESSION_TYPE_BASE,
                     PNG_FILTER_TYPE_BASE);
        png_write_info(png, info);
        png_write_row(png, row.data());
        png_write_end(png, info);
        png_destroy_write_struct(&png, &info);
    });
}

// change: what is asked of the library besides, once its defaults are set.
Bytes jpeg_of(
    J_COLOR_SPACE colors, int channels,
    const std::function<void(jpeg_compress_struct*)>& change = [](jpeg_compress_struct*) {}) {
    return written([&](FILE* out) {
        jpeg_compress_struct codec = {};
        jpeg_error_mgr errors = {};
        codec.err = jpeg_std_error(&errors);
        jpeg_create_compress(&codec);
        jpeg_stdio_dest(&codec, out);
        codec.image_width = 8;
        codec.image_height = 1;
        codec.input_components = channels;
        codec.in_color_space = colors;
        jpeg_set_defaults(&codec);
        change(&codec);
        jpeg_start_compress(&codec, TRUE);
        Bytes samples(static_cast<size_t>(8 * channels), 200);
        JSAMPROW row = samples.data();
        while (codec.next_scanline < codec.image_height) jpeg_write_scanlines(&codec, &row, 1);
        jpeg_finish_compress(&codec);
        jpeg_destroy_compress(&codec);
    });
}

Bytes rgb_bytes(const Picture& picture) {
    const Picture rgb = tool::converted(picture, tool::PixelFormat::kRgb);
    return Bytes(rgb.bytes(), rgb.bytes() + rgb.byte_count());
}

Bytes pixels_of(const Picture& picture) {
    return Bytes(picture.bytes(), picture.bytes() + picture.size.pixels() * 4);
}

Picture decode_pnm(const std::string& file) {
    return decode_pnm(reinterpret_cast<const uint8_t*>(file.data()), file.size());
}

}  // namespace

// A listener that wants to hear more each time, but not more than 1.
class Ear {
public:
    tool::Listener listener() {
        return [this](double part) {
            EXPECT_GE(part, heard_);
            EXPECT_LE(part, 1);
            heard_ = part;
            ++times_;
        };
    }
    void expect_nearly_all() const {
        EXPECT_GE(times_, 10);
        EXPECT_GT(heard_, 0.9);
    }

private:
    double heard_ = 0;
    int times_ = 0;
};

TEST(Codecs, ListenersHearHowFarTheyHaveCome) {
    Random random(2);
    SCOPED_TRACE(random.trace());
    const Picture picture = random_picture(&random, {64, 200}, false);
    Ear png_writing, png_reading, jpeg_writing, jpeg_reading, planes_reading;
    const Bytes png =
        written([&](FILE* out) { tool::encode_png(picture, {}, out, png_writing.listener()); });
    tool::Metadata ignored;
    tool::decode_png(png.data(), png.size(), &ignored, png_reading.listener());
    const Bytes jpeg = written(
        [&](FILE* out) { tool::encode_jpeg(picture, {}, 90, out, jpeg_writing.listener()); });
    tool::JpegReader(jpeg).read({}, jpeg_reading.listener());
    tool::JpegReader(jpeg).read({true, 1}, planes_reading.listener());
    for (const Ear* ear :
         {&png_writing, &png_reading, &jpeg_writing, &jpeg_reading, &planes_reading}) {
        ear->expect_nearly_all();
    }
}

TEST(Codecs, LosslessTypesKeepEveryPixel) {
    Random random(1);
    SCOPED_TRACE(random.trace());
    for (const tool::Size size : {tool::Size{1, 1}, tool::Size{37, 5}, tool::Size{256, 64}}) {
        for (const bool has_alpha : {false, true}) {
            const Picture picture = random_picture(&random, size, has_alpha);
            const Bytes png = encoded(kCodecs[0], picture);
            const Picture from_png = decode_png(png.data(), png.size());
            EXPECT_EQ(from_png.has_alpha, has_alpha);
            EXPECT_EQ(rgb_bytes(from_png), rgb_bytes(picture));
            if (has_alpha) {
                EXPECT_EQ(from_png.words, picture.words);
                const Bytes pam = encoded(kCodecs[3], picture);
                EXPECT_EQ(decode_pnm(pam.data(), pam.size()).words, picture.words);
            }
            const Bytes ppm = encoded(kCodecs[2], picture);
            const Picture from_ppm = decode_pnm(ppm.data(), ppm.size());
            EXPECT_FALSE(from_ppm.has_alpha);
            EXPECT_EQ(rgb_bytes(from_ppm), rgb_bytes(picture));
        }
    }
}

TEST(Codecs, JpegComesClose) {
    const Picture picture = gradient({80, 60});
    const Bytes file = encoded(kCodecs[1], picture);
    const Picture decoded = decode_jpeg(file.data(), file.size());
    ASSERT_EQ(decoded.size.width, 80);
    ASSERT_EQ(decoded.size.height, 60);
    for (size_t i = 0; i < picture.size.pixels() * 4; ++i) {
        ASSERT_NEAR(decoded.bytes()[i], picture.bytes()[i], 12) << "byte " << i;
    }
}

TEST(Codecs, PngOfOtherDepthsBecomesEightBitRgba) {
    const Bytes deep = png_of(16, PNG_COLOR_TYPE_RGB,
                              {0xFF, 0xFF, 0x80, 0x80, 0, 0, 0x12, 0x12, 0x34, 0x34, 0x56, 0x56});
    EXPECT_EQ(pixels_of(decode_png(deep.data(), deep.size())),
              (Bytes{0xFF, 0x80, 0, 255, 0x12, 0x34, 0x56, 255}));
    const Bytes gray = png_of(8, PNG_COLOR_TYPE_GRAY, {7, 250});
    EXPECT_EQ(pixels_of(decode_png(gray.data(), gray.size())),
              (Bytes{7, 7, 7, 255, 250, 250, 250, 255}));
    const Bytes gray_alpha = png_of(8, PNG_COLOR_TYPE_GRAY_ALPHA, {7, 90, 250, 0});
    const Picture with_alpha = decode_png(gray_alpha.data(), gray_alpha.size());
    EXPECT_TRUE(with_alpha.has_alpha);
    EXPECT_EQ(pixels_of(with_alpha), (Bytes{7, 7, 7, 90, 250, 250, 250, 0}));
    const Bytes bits = png_of(1, PNG_COLOR_TYPE_GRAY, {0x40});
    EXPECT_EQ(pixels_of(decode_png(bits.data(), bits.size())),
              (Bytes{0, 0, 0, 255, 255, 255, 255, 255}));
}

TEST(Codecs, GrayAndCmykJpegAreRead) {
    const Bytes gray = jpeg_of(JCS_GRAYSCALE, 1);
    EXPECT_EQ(pixels_of(decode_jpeg(gray.data(), gray.size()))[0], 200);
    const auto first_of = [](const Bytes& file) {
        const Bytes pixels = pixels_of(decode_jpeg(file.data(), file.size()));
        return Bytes(pixels.begin(), pixels.begin() + 4);
    };
    // All inks 200. The library writes Adobe's marker, with which 255 is paper.
    const Bytes inverted = {157, 157, 157, 255};
    EXPECT_EQ(first_of(jpeg_of(JCS_CMYK, 4)), inverted);
    EXPECT_EQ(first_of(jpeg_of(
                  JCS_CMYK, 4,
                  [](jpeg_compress_struct* codec) { jpeg_set_colorspace(codec, JCS_YCCK); })),
              inverted);
    EXPECT_EQ(
        first_of(jpeg_of(JCS_CMYK, 4,
                         [](jpeg_compress_struct* codec) { codec->write_Adobe_marker = FALSE; })),
        (Bytes{12, 12, 12, 255}));
}

TEST(Codecs, JpegInPlanesIsThePictureReduced) {
    const tool::Size size = {83, 61};
    const Bytes file = encoded(kCodecs[1], gradient(size));
    for (const int32_t reduction : {1, 2, 4, 8}) {
        tool::JpegReader reader(file);
        const tool::PixelFormat format = reader.planes(reduction).value();
        EXPECT_EQ(format, reduction == 1 ? tool::PixelFormat::kI420 : tool::PixelFormat::kI444);
        const Picture planes = reader.read({true, reduction});
        EXPECT_EQ(planes.format, format);
        EXPECT_EQ(tool::to_string(planes.size), tool::to_string({83 / reduction, 61 / reduction}));
        const Picture rgb = tool::converted(planes, tool::PixelFormat::kRgba);
        const Picture direct = tool::JpegReader(file).read({false, reduction});
        ASSERT_EQ(tool::to_string(direct.size), tool::to_string(planes.size));
        for (size_t i = 0; i < direct.byte_count(); ++i) {
            ASSERT_NEAR(direct.bytes()[i], rgb.bytes()[i], 6)
                << "byte " << i << " of " << reduction;
        }
        // And what it should be: the gradient in the middle of each sample.
        const auto at = [&](int32_t x, int32_t y) {
            return direct.bytes() + 4 * (y * direct.size.width + x);
        };
        for (int32_t y = 0; y < direct.size.height; ++y) {
            for (int32_t x = 0; x < direct.size.width; ++x) {
                const double middle = (x + 0.5) * reduction - 0.5;
                ASSERT_NEAR(at(x, y)[0], middle * 255 / size.width, 12) << x << "," << y;
            }
        }
    }
}

// Fewer rows than the codec makes of the same width.
TEST(Codecs, ReducedJpegLosesItsLastRow) {
    const Bytes file = encoded(kCodecs[1], gradient({80, 61}));
    const Picture whole = tool::JpegReader(file).read({false, 1});
    const Picture reduced = tool::JpegReader(file).read({false, 8});
    ASSERT_EQ(tool::to_string(reduced.size), "10x7");
    for (size_t i = 0; i < 10; ++i) {
        const size_t middle = (size_t{6 * 8 + 4} * 80 + i * 8 + 4) * 4;
        EXPECT_NEAR(reduced.bytes()[(6 * 10 + i) * 4], whole.bytes()[middle], 12) << i;
    }
}

namespace {

// The samples of a plane across and down a block of the whole.
struct Sampling {
    int across, down;
};
using Samplings = std::array<Sampling, 3>;

std::optional<tool::PixelFormat> planes_of(const Samplings& samplings, J_COLOR_SPACE stored) {
    return tool::JpegReader(jpeg_of(JCS_RGB, 3,
                                    [&](jpeg_compress_struct* codec) {
                                        jpeg_set_colorspace(codec, stored);
                                        for (size_t i = 0; i < 3; ++i) {
                                            codec->comp_info[i].h_samp_factor = samplings[i].across;
                                            codec->comp_info[i].v_samp_factor = samplings[i].down;
                                        }
                                    }))
        .planes(1);
}

}  // namespace

TEST(Codecs, JpegInOtherPlanesIsReadAsPixels) {
    using tool::PixelFormat;
    const Sampling one = {1, 1};
    EXPECT_EQ(planes_of({one, one, one}, JCS_YCbCr), PixelFormat::kI444);
    EXPECT_EQ(planes_of({{{2, 1}, one, one}}, JCS_YCbCr), PixelFormat::kI422);
    EXPECT_EQ(planes_of({{{2, 2}, one, one}}, JCS_YCbCr), PixelFormat::kI420);
    EXPECT_FALSE(planes_of({one, one, one}, JCS_RGB));
    const Samplings others[] = {{{{1, 2}, one, one}},    {{{4, 1}, one, one}},
                                {{{2, 2}, {2, 1}, one}}, {{{2, 2}, one, {1, 2}}},
                                {{{2, 1}, {2, 1}, one}}, {{{2, 2}, {1, 2}, {1, 2}}}};
    for (const Samplings& s : others) {
        EXPECT_FALSE(planes_of(s, JCS_YCbCr)) << s[0].across << s[0].down << s[1].across;
    }
}

TEST(Codecs, JpegDensitiesThatAreNone) {
    const auto stored = [](void (*change)(jpeg_compress_struct*)) {
        const Bytes file = jpeg_of(JCS_RGB, 3, change);
        tool::Metadata metadata;
        tool::decode_jpeg(file.data(), file.size(), &metadata);
        return metadata.density;
    };
    EXPECT_TRUE(stored([](jpeg_compress_struct* codec) { codec->X_density = 2; }));
    EXPECT_FALSE(stored([](jpeg_compress_struct* codec) { codec->X_density = 0; }));
    EXPECT_FALSE(stored([](jpeg_compress_struct* codec) { codec->Y_density = 0; }));
    EXPECT_FALSE(stored([](jpeg_compress_struct* codec) {
        codec->X_density = 2;
        codec->write_JFIF_header = FALSE;
    }));
    const auto written_as = [](const tool::Density& density) {
        tool::Metadata metadata;
        metadata.density = density;
        const Bytes file = written([&](FILE* out) {
            tool::encode_jpeg(gradient({8, 8}), metadata, 90, out);
        });
        tool::Metadata again;
        tool::decode_jpeg(file.data(), file.size(), &again);
        return again.density;
    };
    EXPECT_TRUE(written_as({false, 65535, 1}));
    for (const tool::Density& density :
         {tool::Density{false, 0, 3}, {false, 3, 0}, {false, 65536, 3}, {false, 3, 65536}}) {
        EXPECT_FALSE(written_as(density)) << density.x << ":" << density.y;
    }
}

// Markers that share EXIF's number, and EXIF that is too long for its marker.
TEST(Codecs, WhatIsNoExifIsLeftOut) {
    const Bytes file = encoded(kCodecs[1], gradient({8, 8}));
    for (const std::string content : {"", "Exif", "http://ns.adobe.com/xap/1.0/"}) {
        Bytes other = file;
        const std::string marker =
            std::string("\xFF\xE1\0", 3) + static_cast<char>(content.size() + 2) + content;
        other.insert(other.begin() + 2, marker.begin(), marker.end());
        tool::Metadata metadata;
        tool::decode_jpeg(other.data(), other.size(), &metadata);
        EXPECT_TRUE(metadata.exif.empty()) << content;
        EXPECT_TRUE(metadata.damage.empty()) << metadata.damage;
    }
    tool::Metadata metadata;
    metadata.exif = Bytes(65534, 1);
    EXPECT_EQ(written([&](FILE* out) {
                  tool::encode_jpeg(gradient({8, 8}), metadata, 90, out);
              }),
              file);
}

// A chunk that nobody needs, with a wrong sum.
TEST(Codecs, PngWithADamagedCommentIsRead) {
    Bytes file = png_of(8, PNG_COLOR_TYPE_GRAY, {7, 250});
    const std::string chunk("\0\0\0\3tEXta\0b\1\2\3\4", 15);
    constexpr ptrdiff_t kHeader = 8 + 25;
    file.insert(file.begin() + kHeader, chunk.begin(), chunk.end());
    EXPECT_EQ(pixels_of(decode_png(file.data(), file.size())),
              (Bytes{7, 7, 7, 255, 250, 250, 250, 255}));
}

// What stands behind the pixels is missing altogether: nothing of the picture is.
TEST(Codecs, PngWithoutAnEndIsRead) {
    Bytes file = png_of(8, PNG_COLOR_TYPE_GRAY, {7, 250});
    file.resize(file.size() - 12);
    EXPECT_EQ(pixels_of(decode_png(file.data(), file.size())),
              (Bytes{7, 7, 7, 255, 250, 250, 250, 255}));
}

TEST(Codecs, PngDensitiesThatAreNone) {
    const auto density_of = [](uint8_t x, uint8_t y) {
        // A pHYs chunk, the two numbers in the unit of the shape, with a sum that libpng works out.
        const Bytes file = written([&](FILE* out) {
            png_structp png =
                png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
            png_infop info = png_create_info_struct(png);
            png_init_io(png, out);
            png_set_IHDR(png, info, 1, 1, 8, PNG_COLOR_TYPE_GRAY, PNG_INTERLACE_NONE,
                         PNG_COMPRESSION_TYPE_BASE, PNG_FILTER_TYPE_BASE);
            png_set_pHYs(png, info, x, y, PNG_RESOLUTION_UNKNOWN);
            png_write_info(png, info);
            png_write_row(png, Bytes{1}.data());
            png_write_end(png, info);
            png_destroy_write_struct(&png, &info);
        });
        tool::Metadata metadata;
        tool::decode_png(file.data(), file.size(), &metadata);
        return metadata.density;
    };
    EXPECT_TRUE(density_of(3, 2));
    EXPECT_FALSE(density_of(0, 2));
    EXPECT_FALSE(density_of(3, 0));
}

// Restart markers in another order, and pixels of a table that is not there.
TEST(Codecs, JpegWithoutItsMarkersIsDamaged) {
    const auto failure_of = [](const Bytes& file) -> std::string {
        try {
            tool::JpegReader(file).read({});
        } catch (const tool::Error& error) {
            return error.what();
        }
        return "";
    };
    const auto find_marker = [](const Bytes& file, uint8_t marker) {
        const Bytes bytes = {0xFF, marker};
        return std::search(file.begin(), file.end(), bytes.begin(), bytes.end());
    };
    const auto restarts = [](jpeg_compress_struct* codec) {
        codec->restart_interval = 1;
        codec->image_height = 200;
    };
    Bytes file = jpeg_of(JCS_GRAYSCALE, 1, restarts);
    ASSERT_EQ(failure_of(file), "");
    const auto restart = find_marker(file, 0xD1) - file.begin();
    ASSERT_LT(restart, static_cast<ptrdiff_t>(file.size()));
    file[static_cast<size_t>(restart) + 1] = 0xD5;
    EXPECT_EQ(failure_of(file).substr(0, 14), "damaged JPEG: ");

    file = jpeg_of(JCS_GRAYSCALE, 1);
    const auto table = find_marker(file, 0xDB);
    ASSERT_NE(table, file.end());
    file.erase(table, table + 2 + 67);
    EXPECT_EQ(failure_of(file), "damaged JPEG: Quantization table 0x00 was not defined");
}

// A second beginning in place of the end, which the codec meets when all pixels are there.
TEST(Codecs, JpegThatBeginsAgainIsDamaged) {
    Bytes file = encoded(kCodecs[1], gradient({40, 40}));
    file.back() = 0xD8;
    EXPECT_THROW(tool::JpegReader(file).read({false, 1}), tool::Error);
    EXPECT_THROW(tool::JpegReader(file).read({true, 1}), tool::Error);
}

// EXIF whose numbers take two bytes or four, or are none at all.
TEST(Codecs, ExifNumbersAreThoseOfTheirTypes) {
    struct Entry {
        uint16_t tag;
        uint16_t type;
        uint32_t count;
        uint32_t value;
    };
    constexpr uint16_t kOrientation = 0x0112;
    constexpr uint16_t kWidth = 0x0100;
    constexpr uint16_t kByte = 1;
    constexpr uint16_t kShort = 3;
    constexpr uint16_t kLong = 4;
    const auto exif_of = [](const std::vector<Entry>& entries) {
        Bytes bytes(tool::kExifHead, tool::kExifHead + tool::kExifHeadBytes);
        const auto put = [&](uint32_t number, int count) {
            for (int i = 0; i < count; ++i) bytes.push_back(static_cast<uint8_t>(number >> 8 * i));
        };
        put(0x002A4949, 4);  // little end first
        put(8, 4);
        put(static_cast<uint32_t>(entries.size()), 2);
        for (const Entry& entry : entries) {
            put(entry.tag, 2);
            put(entry.type, 2);
            put(entry.count, 4);
            put(entry.value, 4);
        }
        put(0, 4);
        return bytes;
    };
    EXPECT_EQ(tool::exif_orientation(exif_of({{kOrientation, kShort, 1, 6}})), 6);
    EXPECT_EQ(tool::exif_orientation(exif_of({{kOrientation, kLong, 1, 6}})), 6);
    EXPECT_EQ(tool::exif_orientation(exif_of({{kOrientation, kByte, 1, 6}})), 0);
    EXPECT_EQ(tool::exif_orientation(exif_of({{kOrientation, kShort, 2, 0x00070006}})), 0);
    EXPECT_EQ(tool::exif_orientation(exif_of({{kWidth, kShort, 1, 6}})), 0);

    const auto resized = [&](const Entry& width) {
        const Bytes exif =
            tool::resized_exif(exif_of({width, {kOrientation, kShort, 1, 6}}), {77, 55}, true);
        EXPECT_EQ(tool::exif_orientation(exif), 1);
        // The first entry's value.
        const size_t at = tool::kExifHeadBytes + 8 + 2 + 8;
        return exif.at(at) | exif.at(at + 1) << 8;
    };
    EXPECT_EQ(resized({kWidth, kShort, 1, 400}), 77);
    EXPECT_EQ(resized({kWidth, kLong, 1, 400}), 77);
    EXPECT_EQ(resized({kWidth, kByte, 1, 40}), 40);
    EXPECT_EQ(resized({kWidth, kShort, 2, 0x00070028}), 40);
}

// Too short to say what it is for.
TEST(Codecs, AStumpOfAProfileIsNotOneForGreys) {
    tool::Metadata metadata;
    EXPECT_TRUE(tool::fits_gray(metadata));
    metadata.icc = Bytes(128, 0);
    memcpy(metadata.icc.data() + 16, "GRAY", 4);
    EXPECT_TRUE(tool::fits_gray(metadata));
    metadata.icc.resize(19);
    EXPECT_FALSE(tool::fits_gray(metadata));
}

TEST(Codecs, FirstBytesTellTypes) {
    const auto is = [](bool (*recognise)(const uint8_t*, size_t), const char* bytes) {
        return recognise(reinterpret_cast<const uint8_t*>(bytes), strlen(bytes));
    };
    EXPECT_TRUE(is(tool::is_jpeg, "\xFF\xD8\xFF"));
    for (const char* other : {"\xFF\xD8", "\xFE\xD8\xFF", "\xFF\xD9\xFF", "\xFF\xD8\xFE"}) {
        EXPECT_FALSE(is(tool::is_jpeg, other)) << other;
    }
    for (const char* file : {"P1 ", "P7\n", "P4#"}) EXPECT_TRUE(is(tool::is_pnm, file)) << file;
    for (const char* other : {"P1", "Q1 ", "P0 ", "P8 ", "P1x"}) {
        EXPECT_FALSE(is(tool::is_pnm, other)) << other;
    }
}

TEST(Codecs, JpegFromPlanesHoldsThem) {
    // Sides that are no multiples of a block, nor even.
    for (const tool::Size size : {tool::Size{1, 1}, tool::Size{16, 16}, tool::Size{37, 19}}) {
        for (const auto format : {tool::PixelFormat::kI420, tool::PixelFormat::kGray}) {
            const Picture planes = tool::converted(gradient(size), format);
            const Bytes file = written([&](FILE* out) { tool::encode_jpeg(planes, {}, 100, out); });
            tool::JpegReader reader(file);
            EXPECT_EQ(reader.planes(1), format);
            const Picture again = reader.read({true, 1});
            ASSERT_EQ(again.byte_count(), planes.byte_count());
            for (size_t i = 0; i < planes.byte_count(); ++i) {
                ASSERT_NEAR(again.bytes()[i], planes.bytes()[i], 3) << "byte " << i;
            }
        }
    }
}

TEST(Codecs, PnmHeadersAndDepths) {
    EXPECT_EQ(pixels_of(decode_pnm("P6#c\n1# 9\n\t1\r\n15\n\x0F\x05\x08")),
              (Bytes{255, 85, 136, 255}));
    EXPECT_EQ(pixels_of(decode_pnm(std::string("P6 1 1 65535 \xFF\xFF\x80\x80\0\0", 19))),
              (Bytes{255, 128, 0, 255}));
    // Samples above the stated largest value count as that value.
    EXPECT_EQ(pixels_of(decode_pnm("P6 1 1 10 \x0A\x7F\x05")), (Bytes{255, 255, 128, 255}));
    // Every type, and what tells their samples apart.
    EXPECT_EQ(pixels_of(decode_pnm("P1 3 1 1 0#c\n1")),
              (Bytes{0, 0, 0, 255, 255, 255, 255, 255, 0, 0, 0, 255}));
    EXPECT_EQ(pixels_of(decode_pnm("P1 2 1 01")), (Bytes{255, 255, 255, 255, 0, 0, 0, 255}));
    EXPECT_EQ(pixels_of(decode_pnm("P2 2 1 3 1 3")), (Bytes{85, 85, 85, 255, 255, 255, 255, 255}));
    EXPECT_EQ(pixels_of(decode_pnm("P3\n1 1\n1000\n0 500\t1000")), (Bytes{0, 128, 255, 255}));
    // Rows of bits start at whole bytes.
    EXPECT_EQ(pixels_of(decode_pnm("P4 1 2 \x80\x7F")), (Bytes{0, 0, 0, 255, 255, 255, 255, 255}));
    EXPECT_EQ(pixels_of(decode_pnm("P5 1 1 255 \x09")), (Bytes{9, 9, 9, 255}));
    EXPECT_EQ(pixels_of(decode_pnm("P5 1 1 1023 \x03\xFF")), (Bytes{255, 255, 255, 255}));
    EXPECT_EQ(
        pixels_of(decode_pnm("P7\n#c\nHEIGHT 1\nWIDTH 1\nMAXVAL 255\nDEPTH 2\nENDHDR\n\x09\x20")),
        (Bytes{9, 9, 9, 32}));
    EXPECT_EQ(pixels_of(decode_pnm("P7\nWIDTH 1\nHEIGHT 1\nDEPTH 1\nMAXVAL 1\n"
                                   "TUPLTYPE BLACKANDWHITE\nENDHDR\n\x01")),
              (Bytes{255, 255, 255, 255}));
    EXPECT_EQ(pixels_of(decode_pnm("P7\nWIDTH 1\nHEIGHT 1\nDEPTH 2\nMAXVAL 255\n"
                                   "TUPLTYPE GRAYSCALE_ALPHA\nENDHDR\n\x09\x20")),
              (Bytes{9, 9, 9, 32}));
    EXPECT_EQ(pixels_of(decode_pnm(std::string("P7\nWIDTH 1\nHEIGHT 1\nDEPTH 2\nMAXVAL 1\n"
                                               "TUPLTYPE BLACKANDWHITE_ALPHA\nENDHDR\n\1\0",
                                               75))),
              (Bytes{255, 255, 255, 0}));
    EXPECT_TRUE(decode_pnm("P2 1 1 3 1").is_gray);
    EXPECT_FALSE(decode_pnm("P3 1 1 3 1 1 1").is_gray);
    for (const char* file : {"P1 2 1 0",
                             "P1 2 1 02",
                             "P1 2",
                             "P2 1 1 255",
                             "P2 1 1 255 x",
                             "P2 2 1 255 1",
                             "P2 1 1 0 1",
                             "P2 65535 4096 255 1",
                             "P3 1 1 255 1 2",
                             "P4 9 1 a",
                             "P5 1 1 255",
                             "P5 1 1 256 a",
                             "P7\nWIDTH 1",
                             "P7\nENDHDR\na",
                             "P7\nWIDTH\nENDHDR\n",
                             "P7\nWIDTH 1\nHEIGHT 1\nDEPTH 1\nMAXVAL 255\nENDHDR",
                             "P7\nWIDTH 1\nHEIGHT 1\nDEPTH 5\nMAXVAL 255\nENDHDR\nabcde",
                             "P7\nWIDTH 1\nHEIGHT 1\nDEPTH 1\nMAXVAL 255\nTUPLTYPE RGB\nENDHDR\na",
                             "P7\nWIDTH 1\nHEIGHT 1\nDEPTH 1\nMAXVAL 255\nTUPLTYPE CMYK\nENDHDR\na",
                             "P7\nWIDTH 1\nHEIGHT 1\nDEPTH 1\nMAXVAL 255\nCOLOUR 1\nENDHDR\na",
                             "P7\nWIDTH 1\nHEIGHT 1\nDEPTH 1\nMAXVAL 70000\nENDHDR\nab"}) {
        EXPECT_THROW(decode_pnm(file), tool::Error) << file;
    }
    for (const char* file : {"P6 1 1 255", "P6 1 1 0 abc", "P6 1 1 65536 abcdef", "P6 1 -1 255 abc",
                             "P6 1 x 255 abc", "P6 1 1 255 ab", "P6 # 1 1 255 abc"}) {
        EXPECT_THROW(decode_pnm(file), tool::Error) << file;
    }
}

TEST(Codecs, EachTypeIsToldApart) {
    for (const Codec& codec : kCodecs) {
        const Bytes file = encoded(codec, gradient({9, 7}));
        for (const Codec& other : kCodecs) {
            EXPECT_EQ(other.recognise(file.data(), file.size()), codec.decode == other.decode)
                << codec.name << " as " << other.name;
        }
        for (size_t size = 0; size < 3; ++size) {
            EXPECT_FALSE(codec.recognise(file.data(), size)) << codec.name;
        }
    }
}

TEST(Codecs, EveryTruncationIsToldOf) {
    for (const Codec& codec : kCodecs) {
        const Bytes file = encoded(codec, gradient({40, 30}));
        // The last bytes of a PNG, its closing chunk, hold nothing of the picture.
        const size_t needed = file.size() - (codec.decode == decode_png ? 16 : 0);
        for (size_t size = 0; size < needed; ++size) {
            const Bytes part(file.begin(), file.begin() + static_cast<ptrdiff_t>(size));
            if (!codec.recognise(part.data(), size)) continue;
            EXPECT_THROW(codec.decode(part.data(), size), tool::Error)
                << codec.name << " cut to " << size << " of " << file.size() << " bytes";
        }
    }
}

TEST(Codecs, DamageEndsInAnErrorAtWorst) {
    Random random(2);
    SCOPED_TRACE(random.trace());
    int refused = 0;
    for (const Codec& codec : kCodecs) {
        const Bytes file = encoded(codec, random_picture(&random, {33, 21}, true));
        for (int i = 0; i < rounds(2000); ++i) {
            Bytes damaged = file;
            for (int hits = random.between(1, 4); hits > 0; --hits) {
                const int last = std::min<int>(static_cast<int>(file.size()) - 1, 700);
                damaged[static_cast<size_t>(random.between(3, last))] =
                    static_cast<uint8_t>(random.between(0, 255));
            }
            try {
                codec.decode(damaged.data(), damaged.size());
            } catch (const tool::Error&) {
                ++refused;
            } catch (const std::bad_alloc&) {
                ++refused;
            }
        }
    }
    EXPECT_GT(refused, 0);
}

TEST(Codecs, UnwritableStreamsAreReported) {
    Random random(3);
    SCOPED_TRACE(random.trace());
    // More than a buffer of it.
    const Picture noise = random_picture(&random, {300, 300}, true);
    for (const Codec& codec : kCodecs) {
        for (const int buffering : {_IOFBF, _IONBF}) {
            FILE* const full = fopen("/dev/full", "wb");
            ASSERT_NE(full, nullptr);
            setvbuf(full, nullptr, buffering, BUFSIZ);
            EXPECT_THROW(codec.encode(noise, full), tool::Error) << codec.name << buffering;
            static_cast<void>(fclose(full));
        }
    }
}
