// SPDX-License-Identifier: Apache-2.0
// Every check of the C++ layer: the code and the sentence, and that nothing is written.
#include <gtest/gtest.h>
#include <ovrinresize.hpp>

#include <algorithm>
#include <cstdint>
#include <string>
#include <vector>

#include "support/guarded_buffer.h"

namespace {

using ovrin::ConstPlane;
using ovrin::ConstView;
using ovrin::ErrorCode;
using ovrin::Filter;
using ovrin::Fit;
using ovrin::Format;
using ovrin::Gravity;
using ovrin::Plane;
using ovrin::Status;
using ovrin::Threads;
using ovrin::View;
using ovrin_test::GuardedBuffer;
using Bytes = GuardedBuffer<uint8_t>;

constexpr Format kFormats[] = {Format::kRgba8888, Format::kRgb888, Format::kI420, Format::kNv21};

void expect_error(const Status& status, ErrorCode code, const std::string& text) {
    EXPECT_EQ(status.code, code) << status.text;
    EXPECT_EQ(status.text, text);
    EXPECT_FALSE(status.ok());
}

template <class Byte>
ovrin::BasicView<Byte> packed_view(Format format, Byte* data, size_t bytes, int32_t w, int32_t h) {
    switch (format) {
        case Format::kRgba8888:
            return ovrin::rgba_view(data, bytes, w, h);
        case Format::kRgb888:
            return ovrin::rgb_view(data, bytes, w, h);
        case Format::kI420:
            return ovrin::i420_view(data, bytes, w, h);
        default:
            return ovrin::nv21_view(data, bytes, w, h);
    }
}

// Pictures of 8x6 in every format, in buffers that hold no byte more.
struct Pair {
    Format format;
    size_t bytes;
    Bytes src;
    Bytes dst;

    explicit Pair(Format f)
        : format(f),
          bytes(ovrin::picture_bytes(f, 8, 6)),
          src(bytes),
          dst(bytes, ovrin_test::Flush::kEnd, 0x77) {}

    ConstView source() const { return packed_view(format, src.data(), bytes, 8, 6); }
    View destination() { return packed_view(format, dst.data(), bytes, 8, 6); }

    bool untouched() const {
        return std::all_of(dst.data(), dst.data() + bytes, [](uint8_t b) { return b == 0x77; });
    }
};

TEST(CppChecks, SizesOfPictures) {
    EXPECT_EQ(ovrin::picture_bytes(Format::kRgba8888, 3, 5), 60u);
    EXPECT_EQ(ovrin::picture_bytes(Format::kRgb888, 3, 5), 45u);
    EXPECT_EQ(ovrin::picture_bytes(Format::kI420, 3, 5), 15u + 2 * 2 * 3);
    EXPECT_EQ(ovrin::picture_bytes(Format::kNv21, 4000, 3000), 18000000u);
    EXPECT_EQ(ovrin::picture_bytes(Format::kRgba8888, 32767, 32767), 4u * 32767 * 32767);
    EXPECT_EQ(ovrin::picture_bytes(Format::kRgba8888, 32768, 1), 0u);
    EXPECT_EQ(ovrin::picture_bytes(Format::kRgba8888, 0, 1), 0u);
    EXPECT_EQ(ovrin::picture_bytes(static_cast<Format>(4), 1, 1), 0u);
    EXPECT_EQ(ovrin::chroma_side(5), 3);
}

TEST(CppChecks, Version) {
    EXPECT_STREQ(ovrin::version(), OVRINRESIZE_PROJECT_VERSION);
    EXPECT_EQ(std::to_string(OVRINRESIZE_VERSION_MAJOR) + "." +
                  std::to_string(OVRINRESIZE_VERSION_MINOR) + "." +
                  std::to_string(OVRINRESIZE_VERSION_PATCH),
              OVRINRESIZE_PROJECT_VERSION);
}

TEST(CppChecks, NullPointers) {
    for (const Format format : kFormats) {
        Pair pair(format);
        ConstView src = pair.source();
        src.planes[0].data = nullptr;
        const Status status = resize(src, pair.destination());
        EXPECT_EQ(status.code, ErrorCode::kNull) << status.text;
        EXPECT_TRUE(pair.untouched());
        View dst = pair.destination();
        dst.planes[0].data = nullptr;
        EXPECT_EQ(resize(pair.source(), dst).code, ErrorCode::kNull);
    }
    Pair rgba(Format::kRgba8888);
    View none = rgba.destination();
    none.planes[0].data = nullptr;
    expect_error(resize(rgba.source(), none), ErrorCode::kNull, "dst: RGBA8888 8x6 is at null");
}

TEST(CppChecks, EveryPlaneApart) {
    Pair pair(Format::kI420);
    const ConstPlane y = {pair.src.data(), 48};
    const ConstPlane u = {y.data + 48, 12};
    const ConstPlane v = {u.data + 12, 12};
    EXPECT_TRUE(check(ovrin::i420_view(y, u, v, 8, 6)).ok());
    expect_error(check(ovrin::i420_view(y, ConstPlane(), v, 8, 6), "src"), ErrorCode::kNull,
                 "src: U plane of I420 8x6 is at null");
    expect_error(check(ovrin::i420_view(y, u, ConstPlane(v.data, 11), 8, 6), "src"),
                 ErrorCode::kBufferTooSmall, "src: V plane of I420 8x6 needs 12 bytes, has 11");
    expect_error(check(ovrin::i420_view(ConstPlane(y.data, 47), u, v, 8, 6), "src"),
                 ErrorCode::kBufferTooSmall, "src: Y plane of I420 8x6 needs 48 bytes, has 47");
    expect_error(check(ovrin::nv21_view(y, ConstPlane(u.data, 23), 8, 6), "src"),
                 ErrorCode::kBufferTooSmall, "src: VU plane of NV21 8x6 needs 24 bytes, has 23");
    EXPECT_TRUE(check(ovrin::nv21_view(y, ConstPlane(u.data, 24), 8, 6)).ok());
}

TEST(CppChecks, EmptySizes) {
    for (const Format format : kFormats) {
        for (const int32_t bad : {0, -1, INT32_MIN}) {
            Pair pair(format);
            ConstView src = pair.source();
            src.width = bad;
            EXPECT_EQ(resize(src, pair.destination()).code, ErrorCode::kEmpty);
            View dst = pair.destination();
            dst.height = bad;
            EXPECT_EQ(resize(pair.source(), dst).code, ErrorCode::kEmpty);
            EXPECT_TRUE(pair.untouched());
        }
    }
    expect_error(check(ovrin::rgb_view(Pair(Format::kRgb888).src.data(), 9, 0, -7)),
                 ErrorCode::kEmpty, "picture: RGB888 0x-7 is empty");
}

TEST(CppChecks, SizesWhoseProductsDoNotFit) {
    for (const Format format : kFormats) {
        for (const int32_t bad : {32768, 65536, INT32_MAX}) {
            Pair pair(format);
            ConstView src = pair.source();
            src.height = bad;
            EXPECT_EQ(resize(src, pair.destination()).code, ErrorCode::kTooLarge);
            View dst = pair.destination();
            dst.width = bad;
            EXPECT_EQ(resize(pair.source(), dst).code, ErrorCode::kTooLarge);
            EXPECT_TRUE(pair.untouched());
        }
    }
    uint8_t byte = 0;
    expect_error(check(ovrin::nv21_view(&byte, 1, 32768, 2)), ErrorCode::kTooLarge,
                 "picture: NV21 32768x2 is too large, sides go up to 32767");
    expect_error(check(ovrin::nv21_view(&byte, 1, 32767, 32767)), ErrorCode::kBufferTooSmall,
                 "picture: NV21 32767x32767 needs 1610547201 bytes, has 1");
    // One row of samples too far apart for a row length.
    const View far = ovrin::i420_view(Plane(&byte, SIZE_MAX, 0, INT32_MAX), Plane(&byte, SIZE_MAX),
                                      Plane(&byte, SIZE_MAX), 2, 1);
    expect_error(check(far, "dst"), ErrorCode::kTooLarge,
                 "dst: Y plane of I420 2x1 has rows of 4294967294 bytes, limit 2147483647");
}

TEST(CppChecks, BuffersOneByteShort) {
    for (const Format format : kFormats) {
        Pair pair(format);
        ConstView src = pair.source();
        src.planes[0].bytes -= 1;
        EXPECT_EQ(resize(src, pair.destination()).code, ErrorCode::kBufferTooSmall);
        View dst = pair.destination();
        dst.planes[0].bytes -= 1;
        EXPECT_EQ(resize(pair.source(), dst).code, ErrorCode::kBufferTooSmall);
        EXPECT_TRUE(pair.untouched());
        EXPECT_TRUE(resize(pair.source(), pair.destination()).ok());
    }
    std::vector<uint8_t> frame(17999998);
    Pair nv21(Format::kNv21);
    expect_error(resize(nv21.source(), ovrin::nv21_view(frame.data(), frame.size(), 4000, 3000)),
                 ErrorCode::kBufferTooSmall,
                 "dst: NV21 4000x3000 needs 18000000 bytes, has 17999998");
}

TEST(CppChecks, RowsThatEndWithTheirPixels) {
    // The last of three rows, 40 bytes apart, needs its pixels only.
    const Bytes src(2 * 40 + 32);
    EXPECT_TRUE(check(ovrin::rgba_view(src.data(), src.size(), 8, 3, 40)).ok());
    expect_error(check(ovrin::rgba_view(src.data(), src.size() - 1, 8, 3, 40)),
                 ErrorCode::kBufferTooSmall, "picture: RGBA8888 8x3 needs 112 bytes, has 111");
}

TEST(CppChecks, Strides) {
    const Bytes src(1000);
    expect_error(check(ovrin::rgba_view(src.data(), 1000, 8, 6, 31)), ErrorCode::kStrideTooSmall,
                 "picture: RGBA8888 8x6 needs a row stride of 32 bytes, has 31");
    expect_error(check(ovrin::rgb_view(src.data(), 1000, 8, 6, -24)), ErrorCode::kStrideTooSmall,
                 "picture: RGB888 8x6 needs a row stride of 24 bytes, has -24");
    const ConstPlane y(src.data(), 48);
    expect_error(check(ovrin::nv21_view(y, ConstPlane(src.data(), 900, 7), 8, 6), "src"),
                 ErrorCode::kStrideTooSmall,
                 "src: VU plane of NV21 8x6 needs a row stride of 8 bytes, has 7");
    expect_error(check(ovrin::nv21_view(y, ConstPlane(src.data(), 900, 8, 1), 8, 6), "src"),
                 ErrorCode::kStrideTooSmall,
                 "src: VU plane of NV21 8x6 needs a pixel stride of 2 bytes, has 1");
    expect_error(check(ovrin::nv21_view(y, ConstPlane(src.data(), 900, 8, 3), 8, 6), "src"),
                 ErrorCode::kStrideTooSmall,
                 "src: VU plane of NV21 8x6 needs a row stride of 11 bytes, has 8");
    expect_error(check(ovrin::nv21_view(ConstPlane(y.data, 48, 8, -1), y, 8, 6), "src"),
                 ErrorCode::kStrideTooSmall,
                 "src: Y plane of NV21 8x6 needs a pixel stride of 1 bytes, has -1");
}

TEST(CppChecks, Overlap) {
    for (const Format format : kFormats) {
        const size_t bytes = ovrin::picture_bytes(format, 8, 6);
        Bytes both(2 * bytes, ovrin_test::Flush::kEnd, 0x77);
        const ConstView src = packed_view<const uint8_t>(format, both.data(), bytes, 8, 6);
        const View after = packed_view(format, both.data() + bytes, bytes, 8, 6);
        const View touching = packed_view(format, both.data() + bytes - 1, bytes, 8, 6);
        EXPECT_EQ(resize(src, touching).code, ErrorCode::kOverlap);
        EXPECT_EQ(resize(touching, packed_view(format, both.data(), bytes, 8, 6)).code,
                  ErrorCode::kOverlap);
        EXPECT_EQ(both[2 * bytes - 2], 0x77);
        EXPECT_TRUE(resize(src, after).ok());
    }
    Bytes same(8 * 6 * 4);
    const View view = ovrin::rgba_view(same.data(), same.size(), 8, 6);
    expect_error(resize(view, view), ErrorCode::kOverlap,
                 "src and dst: RGBA and RGBA overlap in 192 bytes");
}

TEST(CppChecks, PlanesOfOneDestination) {
    Pair pair(Format::kI420);
    Bytes chroma(2 * 12);
    const Plane y(pair.dst.data(), 48);
    const Plane u(chroma.data(), 12);
    expect_error(resize(pair.source(), ovrin::i420_view(y, u, u, 8, 6)), ErrorCode::kOverlap,
                 "dst: U and V plane of I420 8x6 overlap");
    // As cameras give them: every other byte.
    const Plane even(chroma.data(), 23, 8, 2);
    const Plane odd(chroma.data() + 1, 23, 8, 2);
    EXPECT_TRUE(resize(pair.source(), ovrin::i420_view(y, odd, even, 8, 6)).ok());
    EXPECT_EQ(resize(pair.source(), ovrin::i420_view(y, even, even, 8, 6)).code,
              ErrorCode::kOverlap);
    // Not taking turns: other steps from sample to sample, from row to row, or steps that do not
    // fit the rows, so that one plane's row ends on the next one's first sample.
    Bytes more(60);
    const auto code = [&](const Plane& first, const Plane& second) {
        return resize(pair.source(), ovrin::i420_view(y, first, second, 8, 6)).code;
    };
    uint8_t* const at = more.data();
    EXPECT_EQ(code({at, 50, 12, 2}, {at + 1, 50, 12, 3}), ErrorCode::kOverlap);
    EXPECT_EQ(code({at, 50, 12, 2}, {at + 1, 50, 14, 2}), ErrorCode::kOverlap);
    EXPECT_EQ(code({at, 50, 7, 2}, {at + 1, 50, 7, 2}), ErrorCode::kOverlap);
    EXPECT_EQ(code({at, 50, 12, 2}, {at + 2, 50, 12, 2}), ErrorCode::kOverlap);
    EXPECT_EQ(code({at, 50, 12, 3}, {at + 2, 50, 12, 3}), ErrorCode::kOk);
}

TEST(CppChecks, UnknownFormats) {
    for (const int code : {-1, 4, 18, INT32_MAX}) {
        Pair pair(Format::kRgba8888);
        ConstView src = pair.source();
        src.format = static_cast<Format>(code);
        expect_error(resize(src, pair.destination()), ErrorCode::kUnknownFormat,
                     "src: format " + std::to_string(code) + " is unknown");
        View dst = pair.destination();
        dst.format = static_cast<Format>(code);
        EXPECT_EQ(resize(pair.source(), dst).code, ErrorCode::kUnknownFormat);
        EXPECT_TRUE(pair.untouched());
        ovrin::Picture picture;
        EXPECT_EQ(picture.allocate(static_cast<Format>(code), 8, 6).code,
                  ErrorCode::kUnknownFormat);
    }
}

TEST(CppChecks, DifferentFormats) {
    Pair rgba(Format::kRgba8888);
    Pair nv21(Format::kNv21);
    expect_error(resize(rgba.source(), nv21.destination()), ErrorCode::kDifferentFormats,
                 "src is RGBA8888, dst is NV21");
    EXPECT_TRUE(nv21.untouched());
}

TEST(CppChecks, Filters) {
    Pair rgb(Format::kRgb888);
    Pair i420(Format::kI420);
    expect_error(resize(i420.source(), i420.destination(), Filter::kNearest),
                 ErrorCode::kUnsupported, "the nearest filter takes RGBA8888, not I420");
    for (const Filter filter :
         {Filter::kBilinear, Filter::kBilinearBands, Filter::kBilinearHalving}) {
        expect_error(resize(rgb.source(), rgb.destination(), filter), ErrorCode::kUnsupported,
                     "the bilinear filter does not take RGB888");
    }
    for (const int code : {-1, 6}) {
        expect_error(resize(rgb.source(), rgb.destination(), static_cast<Filter>(code)),
                     ErrorCode::kUnsupported, "filter " + std::to_string(code) + " is unknown");
    }
    for (const int code : {-1, 3}) {
        expect_error(
            resize(rgb.source(), rgb.destination(), Filter::kQuarter, static_cast<Threads>(code)),
            ErrorCode::kUnsupported, "threads " + std::to_string(code) + " is unknown");
    }
    EXPECT_TRUE(rgb.untouched());
    EXPECT_TRUE(i420.untouched());
}

TEST(CppChecks, Rectangles) {
    Pair pair(Format::kNv21);
    const auto placed = [&](ovrin::Rect part, ovrin::Rect rect) {
        return place(pair.source(), pair.destination(), {part, rect}).status;
    };
    EXPECT_TRUE(placed({0, 0, 8, 6}, {2, 2, 3, 4}).ok());
    expect_error(placed({0, 0, 8, 6}, {1, 2, 3, 4}), ErrorCode::kOddOffset,
                 "canvas: (1, 2) is odd, chroma needs even offsets");
    expect_error(placed({2, 3, 4, 2}, {0, 0, 8, 6}), ErrorCode::kOddOffset,
                 "src: (2, 3) is odd, chroma needs even offsets");
    expect_error(placed({0, 0, 8, 6}, {2, 0, 7, 4}), ErrorCode::kOutside,
                 "canvas: 7x4 at (2, 0) is not inside 8x6");
    expect_error(placed({0, 0, 8, 7}, {0, 0, 8, 6}), ErrorCode::kOutside,
                 "src: 8x7 at (0, 0) is not inside 8x6");
    EXPECT_EQ(placed({0, 0, 8, 6}, {-2, 0, 4, 4}).code, ErrorCode::kOutside);
    EXPECT_EQ(placed({0, 0, 8, 6}, {INT32_MAX - 1, 0, 4, 4}).code, ErrorCode::kOutside);
    expect_error(placed({0, 0, 8, 6}, {0, 0, 0, 4}), ErrorCode::kEmpty,
                 "canvas: a rectangle of 0x4 is empty");
    EXPECT_EQ(placed({0, 0, 8, -6}, {0, 0, 8, 6}).code, ErrorCode::kEmpty);
    EXPECT_TRUE(pair.untouched());
    // Pixels have no chroma.
    Pair rgba(Format::kRgba8888);
    EXPECT_TRUE(place(rgba.source(), rgba.destination(), {{1, 1, 3, 3}, {3, 1, 5, 5}}).status.ok());
}

TEST(CppChecks, Canvases) {
    Pair rgb(Format::kRgb888);
    expect_error(fit(rgb.source(), rgb.destination(), Fit::kFill).status, ErrorCode::kUnsupported,
                 "a canvas takes RGBA8888, I420 or NV21, not RGB888");
    Pair rgba(Format::kRgba8888);
    const auto fitted = [&](View canvas) { return fit(rgba.source(), canvas, Fit::kFill).status; };
    Bytes wide(40 * 6);
    expect_error(fitted(ovrin::rgba_view(wide.data(), wide.size(), 8, 6, 36)),
                 ErrorCode::kStrideUnsuitable, "canvas: RGBA8888 8x6 must be packed in one buffer");
    expect_error(fitted(ovrin::rgba_view(wide.data() + 1, 192, 8, 6)), ErrorCode::kMisaligned,
                 "canvas: RGBA8888 must lie at a multiple of 4 bytes");
    expect_error(fitted(ovrin::rgba_view(wide.data(), 191, 8, 6)), ErrorCode::kBufferTooSmall,
                 "canvas: RGBA8888 8x6 needs 192 bytes, has 191");
    Pair nv21(Format::kNv21);
    const Plane y(nv21.dst.data(), 48);
    const View apart = ovrin::nv21_view(y, Plane(y.data + 48, 24), 8, 6);
    EXPECT_EQ(fit(nv21.source(), apart, Fit::kFill).status.code, ErrorCode::kStrideUnsuitable);
    expect_error(fit(rgba.destination(), rgba.destination(), Fit::kFill).status,
                 ErrorCode::kOverlap, "src and canvas: RGBA and RGBA overlap in 192 bytes");
    expect_error(fit(rgba.source(), rgba.destination(), static_cast<Fit>(3)).status,
                 ErrorCode::kUnsupported, "fit 3 is unknown");
    expect_error(fit(rgba.source(), rgba.destination(), Fit::kFill, static_cast<Gravity>(9)).status,
                 ErrorCode::kUnsupported, "gravity 9 is unknown");
    const ovrin::Fitted good = fit(rgba.source(), rgba.destination(), Fit::kFill);
    EXPECT_EQ(draw(good, static_cast<Threads>(3)).code, ErrorCode::kUnsupported);
    EXPECT_EQ(draw(fit(rgb.source(), rgb.destination(), Fit::kFill)).code, ErrorCode::kUnsupported);
    EXPECT_TRUE(rgba.untouched());
}

TEST(CppChecks, RowsThatARecordCannotDescribe) {
    const Bytes src(200);
    Bytes dst(ovrin::picture_bytes(Format::kI420, 8, 6));
    const View canvas = ovrin::i420_view(dst.data(), dst.size(), 8, 6);
    const ConstPlane y(src.data(), 58, 10);
    const ConstPlane chroma(src.data() + 80, 14, 5);
    EXPECT_TRUE(fit(ovrin::i420_view(y, chroma, chroma, 8, 6), canvas, Fit::kFill).status.ok());
    expect_error(
        fit(ovrin::i420_view(y, chroma, ConstPlane(chroma.data, 20, 6), 8, 6), canvas, Fit::kFill)
            .status,
        ErrorCode::kStrideUnsuitable,
        "src: rows and samples of V lie 6 and 1 bytes apart, a target record needs 5 and "
        "1");
    Bytes pixels(8 * 6 * 4);
    expect_error(fit(ovrin::rgba_view(src.data(), 200, 4, 5, 18),
                     ovrin::rgba_view(pixels.data(), pixels.size(), 8, 6), Fit::kFill)
                     .status,
                 ErrorCode::kStrideUnsuitable,
                 "src: rows and samples of RGBA lie 18 and 4 bytes apart, a target record needs 16 "
                 "and 4");
}

TEST(CppChecks, Alpha) {
    Pair rgb(Format::kRgb888);
    expect_error(premultiply(rgb.destination()), ErrorCode::kUnsupported,
                 "picture: RGB888 has no alpha");
    Pair rgba(Format::kRgba8888);
    for (const int opaque : {0, -1, 256}) {
        expect_error(unpremultiply(rgba.destination(), opaque), ErrorCode::kOutside,
                     "opaque is " + std::to_string(opaque) + ", not 1 to 255");
    }
    View small = rgba.destination();
    small.planes[0].bytes -= 1;
    EXPECT_EQ(premultiply(small).code, ErrorCode::kBufferTooSmall);
    EXPECT_EQ(unpremultiply(small).code, ErrorCode::kBufferTooSmall);
    EXPECT_TRUE(rgba.untouched());
}

TEST(CppChecks, Allocation) {
    ovrin::Picture picture;
    EXPECT_EQ(check(picture.view()).code, ErrorCode::kEmpty);
    expect_error(picture.allocate(Format::kI420, 32768, 1), ErrorCode::kTooLarge,
                 "picture: I420 32768x1 is too large, sides go up to 32767");
    ASSERT_TRUE(picture.allocate(Format::kI420, 5, 3).ok());
    EXPECT_EQ(picture.bytes(), 15u + 2 * 3 * 2);
    const std::vector<uint8_t> content(picture.data(), picture.data() + picture.bytes());
    EXPECT_EQ(content, std::vector<uint8_t>(27, 0));
    EXPECT_TRUE(check(picture.view()).ok());
    EXPECT_EQ(picture.allocate(Format::kI420, 0, 1).code, ErrorCode::kEmpty);
    EXPECT_EQ(picture.data(), nullptr);
    EXPECT_EQ(picture.bytes(), 0u);
}

// A sentence that does not fit is cut, and ends.
TEST(CppChecks, LongNames) {
    const std::string name(500, 'n');
    uint8_t byte = 0;
    const Status status = check(ovrin::nv21_view(&byte, 1, 2, 2), name.c_str());
    EXPECT_EQ(status.text, std::string(sizeof status.text - 1, 'n'));
}

#if defined(__cpp_exceptions)

TEST(CppExceptions, CarryCodeAndSentence) {
    Pair nv21(Format::kNv21);
    ConstView src = nv21.source();
    src.planes[0].bytes = 71;
    try {
        resize_or_throw(src, nv21.destination());
        FAIL() << "nothing thrown";
    } catch (const ovrin::Failure& failure) {
        EXPECT_EQ(failure.code(), ErrorCode::kBufferTooSmall);
        EXPECT_STREQ(failure.what(), "src: NV21 8x6 needs 72 bytes, has 71");
    }
    EXPECT_THROW(fit_or_throw(src, nv21.destination(), Fit::kFill), ovrin::Failure);
    EXPECT_THROW(ovrin::picture_or_throw(Format::kNv21, 0, 1), ovrin::Failure);
    EXPECT_TRUE(nv21.untouched());
}

TEST(CppExceptions, NoneWhenAllIsWell) {
    Pair nv21(Format::kNv21);
    resize_or_throw(nv21.source(), nv21.destination());
    EXPECT_FALSE(nv21.untouched());
    EXPECT_EQ(fit_or_throw(nv21.source(), nv21.destination(), Fit::kFill).rect.width, 8);
    EXPECT_EQ(ovrin::picture_or_throw(Format::kNv21, 4, 2).bytes(), 12u);
}

#endif

}  // namespace
