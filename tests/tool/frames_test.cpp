// SPDX-License-Identifier: Apache-2.0
// Placement, conversion between pixel formats, and the arithmetic of Y4M headers.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <vector>

#include "convert.h"
#include "error.h"
#include "placement.h"
#include "support/random.h"
#include "y4m.h"
#include "yuv.h"

using ovrin_test::Random;
using namespace tool;

namespace {

Picture filled(Size size, PixelFormat format, Random* random) {
    Picture picture(size, format);
    for (uint32_t& word : picture.words) {
        word = static_cast<uint32_t>(random->between(INT32_MIN, INT32_MAX));
    }
    return picture;
}

std::vector<int> values(const Picture& picture) {
    return std::vector<int>(picture.bytes(), picture.bytes() + picture.byte_count());
}

Picture of_bytes(Size size, PixelFormat format, const std::vector<int>& bytes) {
    Picture picture(size, format);
    for (size_t i = 0; i < bytes.size(); ++i) picture.bytes()[i] = static_cast<uint8_t>(bytes[i]);
    return picture;
}

void expect_place(const Wish& wish, Size source, PixelFormat format, const Placement& expected) {
    const Placement actual = place(wish, source, format);
    EXPECT_EQ(to_string(actual.result), to_string(expected.result));
    EXPECT_EQ(to_string(actual.picture), to_string(expected.picture));
    EXPECT_EQ(actual.on_canvas, expected.on_canvas);
    EXPECT_EQ(actual.keeps_aspect, expected.keeps_aspect);
    EXPECT_EQ(actual.x, expected.x);
    EXPECT_EQ(actual.y, expected.y);
}

}  // namespace

TEST(Placement, OfPicturesWithoutChromaPlanes) {
    const PixelFormat rgba = PixelFormat::kRgba;
    const Size size = {100, 50};
    const Size canvas = {130, 77};
    // Fields: size, canvas, fit; then: on a canvas, proportions kept, result, picture, position.
    expect_place({size, {}, Fit::kExact, {}}, {300, 300}, rgba, {false, false, size, size, 0, 0});
    expect_place({size, {}, Fit::kContain}, {300, 300}, rgba,
                 {false, true, {50, 50}, {50, 50}, 0, 0});
    expect_place({size, {}, Fit::kContain}, {300, 100}, rgba,
                 {false, true, {100, 33}, {100, 33}, 0, 0});
    expect_place({{}, canvas, {}}, {10, 10}, rgba, {true, true, canvas, {77, 77}, 26, 0});
    expect_place({{}, canvas, {}}, {60, 11}, rgba, {true, true, canvas, {130, 24}, 0, 26});
    expect_place({{}, canvas, Fit::kExact}, {60, 11}, rgba, {true, false, canvas, canvas, 0, 0});
    expect_place({size, canvas, {}}, {10, 10}, rgba, {true, true, canvas, {50, 50}, 40, 13});
    expect_place({size, canvas, Fit::kExact}, {10, 10}, rgba, {true, false, canvas, size, 15, 13});
}

TEST(Placement, Of420KeepsChromaUnderLuma) {
    const PixelFormat i420 = PixelFormat::kI420;
    const Size canvas = {130, 77};
    expect_place({{}, canvas, {}}, {10, 10}, i420, {true, true, canvas, {76, 77}, 26, 0});
    expect_place({{}, canvas, {}}, {60, 11}, PixelFormat::kNv21,
                 {true, true, canvas, {130, 24}, 0, 26});
    expect_place({{}, Size{7, 3}, {}}, {10, 10}, i420, {true, true, {7, 3}, {4, 3}, 0, 0});
    expect_place({{}, Size{9, 9}, {}}, {1000, 1}, i420, {true, true, {9, 9}, {9, 4}, 0, 2});
    expect_place({Size{5, 5}, Size{12, 12}, Fit::kExact}, {10, 10}, i420,
                 {true, false, {12, 12}, {5, 5}, 2, 2});
}

TEST(Placement, OfExtremeShapes) {
    const PixelFormat rgba = PixelFormat::kRgba;
    const Size box = {65535, 1};
    expect_place({box, {}, Fit::kContain}, {1, 65535}, rgba, {false, true, {1, 1}, {1, 1}, 0, 0});
    expect_place({box, {}, Fit::kContain}, {65535, 1}, rgba, {false, true, box, box, 0, 0});
    expect_place({{}, Size{2, 2}, {}}, {65535, 1}, rgba, {true, true, {2, 2}, {2, 1}, 0, 0});
}

TEST(Placement, RefusesAPictureThatPassesTheCanvas) {
    for (const Size size : {Size{11, 5}, Size{5, 11}}) {
        EXPECT_THROW(place({size, Size{10, 10}, Fit::kExact}, {4, 4}, PixelFormat::kRgba), Error);
    }
}

TEST(Placement, AlwaysFits) {
    Random random(1);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < 20000; ++i) {
        const Size source = {random.between(1, 300), random.between(1, 300)};
        const Size canvas = {random.between(1, 300), random.between(1, 300)};
        const PixelFormat format = random.pick({PixelFormat::kRgba, PixelFormat::kNv21});
        const Placement p = place({{}, canvas, {}}, source, format);
        ASSERT_GE(std::min({p.picture.width, p.picture.height, p.x + 1, p.y + 1}), 1);
        ASSERT_LE(p.x + p.picture.width, canvas.width);
        ASSERT_LE(p.y + p.picture.height, canvas.height);
        ASSERT_TRUE(p.picture.width == canvas.width || p.picture.height == canvas.height);
    }
}

namespace {

struct Rgb {
    double r, g, b;
};

// By the definition: kr and kb are the shares of red and of blue in luma.
struct Meaning {
    YuvMeaning name;
    double kr, kb;
    double black, luma, chroma;  // luma of black, and how far luma and chroma reach

    std::vector<double> yuv(Rgb c) const {
        const double y = kr * c.r + (1 - kr - kb) * c.g + kb * c.b;
        return {black + luma * y / 255, 128 + chroma * (c.b - y) / (2 * (1 - kb)) / 255,
                128 + chroma * (c.r - y) / (2 * (1 - kr)) / 255};
    }
    Rgb rgb(const std::vector<int>& yuv) const {
        const double y = (yuv[0] - black) * 255 / luma;
        const double r = y + 2 * (1 - kr) * (yuv[2] - 128) * 255 / chroma;
        const double b = y + 2 * (1 - kb) * (yuv[1] - 128) * 255 / chroma;
        return {r, (y - kr * r - kb * b) / (1 - kr - kb), b};
    }
};

const Meaning kMeanings[] = {
    {{Matrix::k601, Range::kFull}, 0.299, 0.114, 0, 255, 255},
    {{Matrix::k601, Range::kLimited}, 0.299, 0.114, 16, 219, 224},
    {{Matrix::k709, Range::kFull}, 0.2126, 0.0722, 0, 255, 255},
    {{Matrix::k709, Range::kLimited}, 0.2126, 0.0722, 16, 219, 224},
};

double to_range(double value) {
    return std::clamp(value, 0.0, 255.0);
}

// Of one pixel.
std::vector<int> yuv_of(const std::vector<int>& rgb) {
    return values(converted(of_bytes({1, 1}, PixelFormat::kRgb, rgb), PixelFormat::kI420));
}

}  // namespace

TEST(Convert, BetweenRgbAndYuvIsAsDefined) {
    Random random(3);
    SCOPED_TRACE(random.trace());
    for (const Meaning& meaning : kMeanings) {
        set_yuv_meaning(meaning.name);
        for (int i = 0; i < 20000; ++i) {
            const std::vector<int> color = {random.between(0, 255), random.between(0, 255),
                                            random.between(0, 255)};
            const std::vector<int> yuv = yuv_of(color);
            const std::vector<double> wanted =
                meaning.yuv({double(color[0]), double(color[1]), double(color[2])});
            for (size_t c = 0; c < 3; ++c) ASSERT_NEAR(yuv[c], to_range(wanted[c]), 0.51);
            const std::vector<int> rgb =
                values(converted(of_bytes({1, 1}, PixelFormat::kI420, color), PixelFormat::kRgb));
            const Rgb right = meaning.rgb(color);
            ASSERT_NEAR(rgb[0], to_range(right.r), 0.52);
            ASSERT_NEAR(rgb[1], to_range(right.g), 0.52);
            ASSERT_NEAR(rgb[2], to_range(right.b), 0.52);
        }
        for (int gray = 0; gray < 256; ++gray) {
            const std::vector<int> yuv = yuv_of({gray, gray, gray});
            ASSERT_EQ(yuv[1], 128);
            ASSERT_EQ(yuv[2], 128);
        }
    }
    set_yuv_meaning({});
}

TEST(Convert, BetweenI420AndNv21MovesChromaOnly) {
    const std::vector<int> i420 = {1, 2, 3, 4, 5, 6, 7, 8, 9, 20, 21, 22, 23, 30, 31, 32, 33};
    const std::vector<int> nv21 = {1, 2, 3, 4, 5, 6, 7, 8, 9, 30, 20, 31, 21, 32, 22, 33, 23};
    const Size size = {3, 3};
    EXPECT_EQ(values(converted(of_bytes(size, PixelFormat::kI420, i420), PixelFormat::kNv21)),
              nv21);
    EXPECT_EQ(values(converted(of_bytes(size, PixelFormat::kNv21, nv21), PixelFormat::kI420)),
              i420);
}

TEST(Convert, BetweenRgbAndRgbaKeepsColours) {
    const Picture rgb = of_bytes({2, 1}, PixelFormat::kRgb, {1, 2, 3, 4, 5, 6});
    const Picture rgba = converted(rgb, PixelFormat::kRgba);
    EXPECT_EQ(values(rgba), (std::vector<int>{1, 2, 3, 255, 4, 5, 6, 255}));
    EXPECT_EQ(values(converted(rgba, PixelFormat::kRgb)), values(rgb));
}

TEST(Convert, KnownColoursOfFullRange) {
    struct Color {
        std::vector<int> rgb, yuv;
    };
    const Color colors[] = {
        {{0, 0, 0}, {0, 128, 128}},    {{255, 255, 255}, {255, 128, 128}},
        {{255, 0, 0}, {76, 85, 255}},  {{0, 255, 0}, {150, 44, 21}},
        {{0, 0, 255}, {29, 255, 107}}, {{128, 128, 128}, {128, 128, 128}},
    };
    for (const Color& color : colors) {
        const Picture rgb = of_bytes({1, 1}, PixelFormat::kRgb, color.rgb);
        EXPECT_EQ(values(converted(rgb, PixelFormat::kI420)), color.yuv);
        const std::vector<int> back =
            values(converted(of_bytes({1, 1}, PixelFormat::kI420, color.yuv), PixelFormat::kRgb));
        for (size_t i = 0; i < 3; ++i) EXPECT_NEAR(back[i], color.rgb[i], 2);
    }
}

TEST(Convert, ChromaIsTheMeanOfItsPixels) {
    // 3 x 1 pixels: the last chroma sample covers one pixel only.
    const Picture rgb = of_bytes({3, 1}, PixelFormat::kRgb, {255, 0, 0, 0, 0, 255, 0, 255, 0});
    EXPECT_EQ(values(converted(rgb, PixelFormat::kNv21)),
              (std::vector<int>{76, 29, 150, 182, 170, 21, 44}));
}

TEST(Convert, ChromaOfEachSubsampling) {
    // 2 x 2 pixels: red above blue.
    const Picture rgb =
        of_bytes({2, 2}, PixelFormat::kRgb, {255, 0, 0, 255, 0, 0, 0, 0, 255, 0, 0, 255});
    const std::vector<int> luma = {76, 76, 29, 29};
    const auto with = [&](const std::vector<int>& chroma) {
        std::vector<int> all = luma;
        all.insert(all.end(), chroma.begin(), chroma.end());
        return all;
    };
    EXPECT_EQ(values(converted(rgb, PixelFormat::kGray)), luma);
    EXPECT_EQ(values(converted(rgb, PixelFormat::kI422)), with({85, 255, 255, 107}));
    EXPECT_EQ(values(converted(rgb, PixelFormat::kI444)),
              with({85, 85, 255, 255, 255, 255, 107, 107}));
    // And back: to what JPEG's formulas make of rounded samples.
    const std::vector<int> back =
        values(converted(converted(rgb, PixelFormat::kI422), PixelFormat::kRgb));
    for (size_t i = 0; i < back.size(); ++i) EXPECT_NEAR(back[i], rgb.bytes()[i], 2) << i;
}

TEST(Convert, EveryPairOfFormatsAndOddSizes) {
    Random random(2);
    SCOPED_TRACE(random.trace());
    const PixelFormat formats[] = {PixelFormat::kRgba, PixelFormat::kRgb,  PixelFormat::kGray,
                                   PixelFormat::kI420, PixelFormat::kNv21, PixelFormat::kI422,
                                   PixelFormat::kI444};
    for (const Size size : {Size{1, 1}, Size{2, 1}, Size{1, 3}, Size{7, 5}, Size{16, 8}}) {
        for (const PixelFormat from : formats) {
            for (const PixelFormat to : formats) {
                const Picture result = converted(filled(size, from, &random), to);
                EXPECT_EQ(result.format, to);
                EXPECT_EQ(to_string(result.size), to_string(size));
                EXPECT_EQ(result.words.size(), (picture_bytes(to, size) + 3) / 4);
            }
        }
    }
}

TEST(Y4mHeaders, AreReadAndWritten) {
    const Y4mHeader header = parse_y4m_header("YUV4MPEG2 W640 H480 F25:1 Ip A10:11 C420mpeg2 XA=B");
    EXPECT_EQ(to_string(header.size), "640x480");
    EXPECT_EQ(y4m_header_line(header), "YUV4MPEG2 W640 H480 A10:11 F25:1 Ip C420mpeg2 XA=B\n");
    EXPECT_EQ(y4m_header_line(parse_y4m_header("YUV4MPEG2 H1 W2")), "YUV4MPEG2 W2 H1 A0:0\n");
}

TEST(Y4mHeaders, OfOtherFilesAreRefused) {
    EXPECT_THROW(tool::parse_y4m_header(""), tool::Error);
    EXPECT_THROW(tool::parse_y4m_header("YUV4MPEG W1 H1"), tool::Error);
    EXPECT_NO_THROW(tool::parse_y4m_header("YUV4MPEG2 W1 H1"));
}

TEST(Y4mHeaders, WithBadNumbersAreRefused) {
    for (const char* tags : {"W", "Wx", "W2x", "W-1", "W2147483648", "W99999999999999999999"}) {
        EXPECT_THROW(parse_y4m_header(std::string("YUV4MPEG2 H2 ") + tags), Error) << tags;
    }
}

TEST(Y4mHeaders, NameTheSamples) {
    struct Case {
        const char* type;
        PixelFormat format;
        int bits;
        const char* written;
    };
    const Case cases[] = {
        {"420", PixelFormat::kI420, 8, "420"},           {"422", PixelFormat::kI422, 8, "422"},
        {"444", PixelFormat::kI444, 8, "444"},           {"mono", PixelFormat::kGray, 8, "mono"},
        {"420p10", PixelFormat::kI420, 10, "420"},       {"422p12", PixelFormat::kI422, 12, "422"},
        {"444p16", PixelFormat::kI444, 16, "444"},       {"mono9", PixelFormat::kGray, 9, "mono"},
        {"420paldv", PixelFormat::kI420, 8, "420paldv"},
    };
    for (const Case& c : cases) {
        const Y4mHeader header =
            parse_y4m_header(std::string("YUV4MPEG2 W2 H2 C") + c.type + " XYSCSS=OLD XA=B");
        EXPECT_EQ(header.format, c.format) << c.type;
        EXPECT_EQ(header.bits, c.bits) << c.type;
        EXPECT_EQ(y4m_header_line(header),
                  std::string("YUV4MPEG2 W2 H2 A0:0 C") + c.written + " XA=B\n");
    }
}

TEST(Y4mHeaders, FollowTheShapeOfThePicture) {
    const auto resized = [](const std::string& line, Size picture, bool keep_aspect) {
        const Y4mHeader result =
            resized_y4m_header(parse_y4m_header(line), picture, {800, 800}, keep_aspect);
        EXPECT_EQ(to_string(result.size), "800x800");
        return std::to_string(result.aspect_width) + ":" + std::to_string(result.aspect_height);
    };
    EXPECT_EQ(resized("YUV4MPEG2 W720 H576 A16:15", {768, 576}, false), "1:1");
    EXPECT_EQ(resized("YUV4MPEG2 W720 H576 A1:1", {360, 576}, false), "2:1");
    EXPECT_EQ(resized("YUV4MPEG2 W720 H576 A1:1", {360, 288}, false), "1:1");
    EXPECT_EQ(resized("YUV4MPEG2 W720 H576 A1:1", {361, 288}, true), "1:1");
    EXPECT_EQ(resized("YUV4MPEG2 W720 H576 A0:0", {360, 576}, false), "0:0");
    EXPECT_EQ(resized("YUV4MPEG2 W720 H576", {360, 576}, false), "0:0");
    EXPECT_EQ(resized("YUV4MPEG2 W720 H576 A1:0", {360, 576}, false), "1:0");
    EXPECT_EQ(resized("YUV4MPEG2 W1 H65521 A1:2147483647", {1, 1}, false), "0:0");
    // Numbers that no reader expects become "not known"; none overflows on the way.
    EXPECT_EQ(resized("YUV4MPEG2 W65521 H1 A2147483647:1", {1, 1}, false), "0:0");
    EXPECT_EQ(resized("YUV4MPEG2 W4095 H65521 A2147483647:2147483629", {4093, 65519}, false),
              "0:0");
}
