// SPDX-License-Identifier: Apache-2.0
// What the C++ layer gives is what the C functions give, whatever the strides, and buffers are
// exactly as long as the layer asks for.
#include <gtest/gtest.h>
#include <ovrinresize.hpp>

#include <cstdint>
#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "support/compare.h"
#include "support/extents.h"
#include "support/guarded_buffer.h"
#include "support/random.h"

namespace {

using ovrin::ConstPlane;
using ovrin::ConstView;
using ovrin::Filter;
using ovrin::Format;
using ovrin::Plane;
using ovrin::Size;
using ovrin::Threads;
using ovrin::View;
using ovrin_test::GuardedBuffer;
using ovrin_test::PlaneExtent;
using ovrin_test::Random;
using ovrin_test::rounds;
using ovrin_test::same_bytes;

// A picture whose planes lie apart, each in a buffer of its own that holds its samples and not a
// byte more; and the same picture packed.
class Strided {
public:
    Strided(Format format, Size size, Random& random)
        : format_(format), size_(size), packed_(random.bytes(bytes())) {
        size_t at = 0;
        for (int i = 0; i < count(); ++i) add_plane(i, random, &at);
    }

    View view() { return view_of<uint8_t>(); }
    ConstView const_view() { return view_of<const uint8_t>(); }
    const std::vector<uint8_t>& packed() const { return packed_; }
    size_t bytes() const { return ovrin::picture_bytes(format_, size_.width, size_.height); }

    // What the planes hold now.
    std::vector<uint8_t> gathered() const {
        std::vector<uint8_t> all;
        for (int i = 0; i < count(); ++i) {
            for_each_byte(i, [&](size_t at) { all.push_back((*planes_[i])[at]); });
        }
        return all;
    }

    // Whether all bytes between samples and rows hold what they held.
    bool gaps_intact() const {
        for (int i = 0; i < count(); ++i) {
            std::vector<uint8_t> rest = planes_[i]->copy();
            for_each_byte(i, [&](size_t at) { rest[at] = kGap; });
            for (const uint8_t byte : rest) {
                if (byte != kGap) return false;
            }
        }
        return true;
    }

private:
    static constexpr uint8_t kGap = 0x3C;

    int count() const {
        if (format_ == Format::kI420) return 3;
        return format_ == Format::kNv21 ? 2 : 1;
    }

    int32_t sample(int i) const {
        if (format_ == Format::kRgba8888) return 4;
        if (format_ == Format::kRgb888) return 3;
        return format_ == Format::kNv21 && i == 1 ? 2 : 1;
    }

    int32_t side(int i, int32_t luma) const { return i == 0 ? luma : (luma + 1) / 2; }

    template <class Visit>
    void for_each_byte(int i, Visit visit) const {
        for (int32_t y = 0; y < side(i, size_.height); ++y) {
            for (int32_t x = 0; x < side(i, size_.width); ++x) {
                for (int32_t c = 0; c < sample(i); ++c) {
                    visit(static_cast<size_t>(int64_t{y} * row_[i] + x * pixel_[i] + c));
                }
            }
        }
    }

    void add_plane(int i, Random& random, size_t* at) {
        const bool packed_format = count() == 1;
        pixel_[i] = sample(i) + (packed_format ? 0 : random.pick({0, 0, 1, 3}));
        const int32_t row = (side(i, size_.width) - 1) * pixel_[i] + sample(i);
        row_[i] = row + random.pick({0, 1, 2, 4, 30});
        const PlaneExtent extent(row, side(i, size_.height), row_[i]);
        planes_[i] = std::make_unique<GuardedBuffer<uint8_t>>(
            extent.bytes, random.pick({ovrin_test::Flush::kEnd, ovrin_test::Flush::kStart}), kGap);
        for_each_byte(i, [&](size_t to) { (*planes_[i])[to] = packed_[(*at)++]; });
    }

    template <class Byte>
    ovrin::BasicView<Byte> view_of() {
        ovrin::BasicPlane<Byte> p[3];
        for (int i = 0; i < count(); ++i) {
            p[i] = {planes_[i]->data(), planes_[i]->size(), row_[i], pixel_[i]};
        }
        const int32_t w = size_.width;
        const int32_t h = size_.height;
        if (format_ == Format::kI420) return ovrin::i420_view(p[0], p[1], p[2], w, h);
        if (format_ == Format::kNv21) return ovrin::nv21_view(p[0], p[1], w, h);
        if (format_ == Format::kRgb888)
            return ovrin::rgb_view(p[0].data, p[0].bytes, w, h, row_[0]);
        return ovrin::rgba_view(p[0].data, p[0].bytes, w, h, row_[0]);
    }

    Format format_;
    Size size_;
    std::vector<uint8_t> packed_;
    std::unique_ptr<GuardedBuffer<uint8_t>> planes_[3];
    int32_t row_[3] = {};
    int32_t pixel_[3] = {};
};

template <class Byte>
ovrin::BasicView<Byte> packed_view(Format format, Byte* data, size_t bytes, Size size) {
    const int32_t w = size.width;
    const int32_t h = size.height;
    if (format == Format::kRgba8888) return ovrin::rgba_view(data, bytes, w, h);
    if (format == Format::kRgb888) return ovrin::rgb_view(data, bytes, w, h);
    if (format == Format::kI420) return ovrin::i420_view(data, bytes, w, h);
    return ovrin::nv21_view(data, bytes, w, h);
}

// What the C interface does: packed buffers of any length.
using CCall = std::function<void(const uint8_t* src, Size, uint8_t* dst, Size)>;

template <class Function>
CCall direct(Function* function) {
    return [function](const uint8_t* src, Size from, uint8_t* dst, Size to) {
        function(src, dst, from.width, from.height, to.width, to.height);
    };
}

CCall of_words(decltype(ovrin_resize_rgba8888)* function) {
    return [function](const uint8_t* src, Size from, uint8_t* dst, Size to) {
        function(src, static_cast<uint32_t*>(static_cast<void*>(dst)), from.width, from.height,
                 to.width, to.height);
    };
}

CCall bilinear(decltype(ov_bilinear)* function, int32_t code) {
    return [function, code](const uint8_t* src, Size from, uint8_t* dst, Size to) {
        function(src, dst, from.width, from.height, to.width, to.height, code, nullptr);
    };
}

CCall lanczos(int32_t components) {
    return [components](const uint8_t* src, Size from, uint8_t* dst, Size to) {
        ov_lanczos(src, from.width, from.height, dst, to.width, to.height, components);
    };
}

size_t luma_bytes(Size size) {
    return static_cast<size_t>(size.width) * static_cast<size_t>(size.height);
}

// A Y plane, then `planes` of chroma with `components` each.
CCall lanczos_planes(int planes, int32_t components) {
    return [=](const uint8_t* src, Size from, uint8_t* dst, Size to) {
        ov_lanczos(src, from.width, from.height, dst, to.width, to.height, 1);
        const Size half = {(from.width + 1) / 2, (from.height + 1) / 2};
        const Size half_to = {(to.width + 1) / 2, (to.height + 1) / 2};
        const uint8_t* next = src + luma_bytes(from);
        uint8_t* put = dst + luma_bytes(to);
        for (int i = 0; i < planes; ++i) {
            ov_lanczos(next, half.width, half.height, put, half_to.width, half_to.height,
                       components);
            next += luma_bytes(half) * static_cast<size_t>(components);
            put += luma_bytes(half_to) * static_cast<size_t>(components);
        }
    };
}

struct Case {
    const char* name;
    Format format;
    Filter filter;
    Threads threads;
    CCall call;
};

std::vector<Case> cases() {
    const auto nearest = [](const uint8_t* src, Size from, uint8_t* dst, Size to) {
        ovrin_resize_nearest_rgba8888(static_cast<const uint32_t*>(static_cast<const void*>(src)),
                                      static_cast<uint32_t*>(static_cast<void*>(dst)), from.width,
                                      from.height, to.width, to.height);
    };
    const auto threaded_lanczos = [](const uint8_t* src, Size from, uint8_t* dst, Size to) {
        ovrin_resize_lanczos(src, dst, from.width, from.height, to.width, to.height, 4);
    };
    using F = Filter;
    using T = Threads;
    constexpr Format rgba = Format::kRgba8888, rgb = Format::kRgb888, i420 = Format::kI420,
                     nv21 = Format::kNv21;
    return {
        {"rgba", rgba, F::kQuarter, T::kAuto, of_words(ovrin_resize_rgba8888)},
        {"rgba one", rgba, F::kQuarter, T::kOne, of_words(ovrin_resize_rgba8888_sg)},
        {"rgba many", rgba, F::kQuarter, T::kMany, of_words(ovrin_resize_rgba8888_tps)},
        {"rgb", rgb, F::kQuarter, T::kAuto, direct(ovrin_resize_rgb888)},
        {"i420", i420, F::kQuarter, T::kAuto, direct(ovrin_resize_yuv420)},
        {"i420 one", i420, F::kQuarter, T::kOne, direct(ovrin_resize_yuv420_sg)},
        {"i420 many", i420, F::kQuarter, T::kMany, direct(ovrin_resize_yuv420_tps)},
        {"nv21", nv21, F::kQuarter, T::kAuto, direct(ovrin_resize_nv21)},
        {"nv21 one", nv21, F::kQuarter, T::kOne, direct(ovrin_resize_nv21_sg)},
        {"nv21 many", nv21, F::kQuarter, T::kMany, direct(ovrin_resize_nv21_tps)},
        {"nearest", rgba, F::kNearest, T::kAuto, nearest},
        {"bilinear rgba", rgba, F::kBilinear, T::kAuto, bilinear(ov_bilinear_sg, 7)},
        {"bilinear i420", i420, F::kBilinear, T::kMany, bilinear(ov_bilinear_sg, 2)},
        {"bilinear nv21", nv21, F::kBilinear, T::kOne, bilinear(ov_bilinear_sg, 18)},
        {"bands rgba", rgba, F::kBilinearBands, T::kAuto, bilinear(ov_bilinear, 7)},
        {"bands i420", i420, F::kBilinearBands, T::kAuto, bilinear(ov_bilinear, 2)},
        {"bands nv21", nv21, F::kBilinearBands, T::kAuto, bilinear(ov_bilinear, 18)},
        {"halving rgba", rgba, F::kBilinearHalving, T::kAuto, bilinear(ov_bilinear_ex, 7)},
        {"halving i420", i420, F::kBilinearHalving, T::kAuto, bilinear(ov_bilinear_ex, 2)},
        {"halving nv21", nv21, F::kBilinearHalving, T::kAuto, bilinear(ov_bilinear_ex, 18)},
        {"lanczos rgba", rgba, F::kLanczos, T::kAuto, threaded_lanczos},
        {"lanczos rgba one", rgba, F::kLanczos, T::kOne, lanczos(4)},
        {"lanczos rgb", rgb, F::kLanczos, T::kAuto, lanczos(3)},
        {"lanczos i420", i420, F::kLanczos, T::kAuto, lanczos_planes(2, 1)},
        {"lanczos nv21", nv21, F::kLanczos, T::kAuto, lanczos_planes(1, 2)},
    };
}

// The picture, and behind it copies of its last row, as many as anything could read.
std::vector<uint8_t> with_last_row_repeated(const Case& c, Size size, std::vector<uint8_t> bytes) {
    size_t row = static_cast<size_t>(size.width);
    if (c.format == Format::kRgba8888) row *= 4;
    if (c.format == Format::kRgb888) row *= 3;
    if (c.format == Format::kI420) row = (row + 1) / 2;
    if (c.format == Format::kNv21) row = (row + 1) / 2 * 2;
    const size_t picture = bytes.size();
    bytes.resize(picture + 8 * row + 64);
    for (size_t i = picture; i < bytes.size(); ++i) bytes[i] = bytes[i - row];
    return bytes;
}

// What the C function makes of a destination that held `before`, in memory aligned for words.
struct Expected {
    GuardedBuffer<uint32_t> words;
    size_t bytes;

    Expected(const Case& c, const uint8_t* src, Size from, Size to, const uint8_t* before)
        : words((ovrin::picture_bytes(c.format, to.width, to.height) + 3) / 4),
          bytes(ovrin::picture_bytes(c.format, to.width, to.height)) {
        memcpy(words.data(), before, bytes);
        c.call(src, from, data(), to);
    }

    uint8_t* data() { return reinterpret_cast<uint8_t*>(words.data()); }
};

std::string describe(const Case& c, Size from, Size to) {
    return std::string(c.name) + " " + std::to_string(from.width) + "x" +
           std::to_string(from.height) + " to " + std::to_string(to.width) + "x" +
           std::to_string(to.height);
}

// Source and destination packed, each between inaccessible pages.
void check_packed(const Case& c, Size from, Size to, Random& random) {
    SCOPED_TRACE(describe(c, from, to));
    const size_t src_bytes = ovrin::picture_bytes(c.format, from.width, from.height);
    const size_t dst_bytes = ovrin::picture_bytes(c.format, to.width, to.height);
    const std::vector<uint8_t> content = random.bytes(src_bytes);
    const std::vector<uint8_t> longer = with_last_row_repeated(c, from, content);
    const std::vector<uint8_t> before(dst_bytes, 0x55);
    Expected expected(c, longer.data(), from, to, before.data());

    const GuardedBuffer<uint8_t> src(content);
    GuardedBuffer<uint8_t> dst(before);
    const ovrin::Status status =
        resize(packed_view(c.format, src.data(), src.size(), from),
               packed_view(c.format, dst.data(), dst.size(), to), c.filter, c.threads);
    ASSERT_TRUE(status.ok()) << status.text;
    ASSERT_TRUE(same_bytes(dst.data(), expected.data(), dst_bytes));
    ASSERT_TRUE(dst.intact());
}

void check_strided(const Case& c, Size from, Size to, Random& random) {
    SCOPED_TRACE(describe(c, from, to));
    Strided src(c.format, from, random);
    Strided dst(c.format, to, random);
    const std::vector<uint8_t> longer = with_last_row_repeated(c, from, src.packed());
    Expected expected(c, longer.data(), from, to, dst.packed().data());
    const ovrin::Status status = resize(src.const_view(), dst.view(), c.filter, c.threads);
    ASSERT_TRUE(status.ok()) << status.text;
    ASSERT_TRUE(same_bytes(dst.gathered().data(), expected.data(), expected.bytes));
    ASSERT_TRUE(dst.gaps_intact());
    ASSERT_EQ(src.gathered(), src.packed());
}

Size random_size(Random& random) {
    return {random.awkward_size(), random.awkward_size()};
}

TEST(CppResize, PackedPictures) {
    Random random(1);
    SCOPED_TRACE(random.trace());
    for (const Case& c : cases()) {
        for (int i = 0; i < rounds(200) && !HasFatalFailure(); ++i) {
            check_packed(c, random_size(random), random_size(random), random);
        }
    }
}

TEST(CppResize, SmallestPictures) {
    Random random(2);
    for (const Case& c : cases()) {
        for (int32_t code = 0; code < 256 && !HasFatalFailure(); ++code) {
            check_packed(c, {1 + code % 4, 1 + code / 4 % 4}, {1 + code / 16 % 4, 1 + code / 64},
                         random);
        }
    }
}

TEST(CppResize, RowsAndSamplesApart) {
    Random random(3);
    SCOPED_TRACE(random.trace());
    for (const Case& c : cases()) {
        for (int i = 0; i < rounds(200) && !HasFatalFailure(); ++i) {
            check_strided(c, random_size(random), random_size(random), random);
        }
    }
}

// From 1024 rows on there are threads, and bands of the bilinear engine do not interpolate.
TEST(CppResize, TallPictures) {
    Random random(4);
    for (const Case& c : cases()) {
        if (HasFatalFailure()) break;
        check_packed(c, {9, 1100}, {5, 300}, random);
        check_packed(c, {7, 400}, {5, 1050}, random);
        check_strided(c, {9, 1100}, {5, 300}, random);
    }
}

TEST(CppResize, LargestSides) {
    Random random(5);
    for (const Case& c : cases()) {
        if (HasFatalFailure()) break;
        check_packed(c, {32767, 2}, {3, 2}, random);
        check_packed(c, {2, 3}, {32767, 3}, random);
        check_packed(c, {32767, 2}, {32766, 2}, random);
        check_packed(c, {2, 32767}, {2, 32766}, random);
    }
}

// Planes that are packed but apart go to other C functions.
TEST(CppResize, PackedPlanesApart) {
    Random random(6);
    for (const Case& c : cases()) {
        if (c.format != Format::kI420 && c.format != Format::kNv21) continue;
        const Size from = {37, 1025};
        const Size to = {11, 130};
        const std::vector<uint8_t> content =
            random.bytes(ovrin::picture_bytes(c.format, from.width, from.height));
        const std::vector<uint8_t> longer = with_last_row_repeated(c, from, content);
        const std::vector<uint8_t> before(ovrin::picture_bytes(c.format, to.width, to.height));
        Expected expected(c, longer.data(), from, to, before.data());
        const auto part = [&](size_t begin, size_t bytes) {
            const auto first = content.begin() + static_cast<ptrdiff_t>(begin);
            return GuardedBuffer<uint8_t>(
                std::vector<uint8_t>(first, first + static_cast<ptrdiff_t>(bytes)));
        };
        const size_t chroma = size_t{19} * 513;
        const bool planar = c.format == Format::kI420;
        const GuardedBuffer<uint8_t> y = part(0, luma_bytes(from));
        const GuardedBuffer<uint8_t> u = part(luma_bytes(from), planar ? chroma : 2 * chroma);
        const GuardedBuffer<uint8_t> v = part(luma_bytes(from) + chroma, chroma);
        const ConstPlane first(y.data(), y.size());
        const ConstPlane second(u.data(), u.size());
        const ConstView src =
            planar ? ovrin::i420_view(first, second, ConstPlane(v.data(), v.size()), 37, 1025)
                   : ovrin::nv21_view(first, second, 37, 1025);
        GuardedBuffer<uint8_t> dst(before);
        const View view = packed_view(c.format, dst.data(), dst.size(), to);
        ASSERT_TRUE(resize(src, view, c.filter, c.threads).ok()) << c.name;
        ASSERT_TRUE(same_bytes(dst.data(), expected.data(), dst.size())) << c.name;
    }
}

// Spare bytes behind the picture are read as the C functions read them: nothing is copied.
TEST(CppResize, BilinearReadsSpareBytes) {
    Random random(7);
    for (const Case& c : cases()) {
        if (c.filter != Filter::kBilinear) continue;
        const Size size = {6, 5};
        const std::vector<uint8_t> content = random.bytes(500);
        const std::vector<uint8_t> before(ovrin::picture_bytes(c.format, 6, 5));
        Expected expected(c, content.data(), size, size, before.data());
        GuardedBuffer<uint8_t> dst(before);
        ASSERT_TRUE(resize(packed_view(c.format, content.data(), content.size(), size),
                           packed_view(c.format, dst.data(), dst.size(), size), c.filter)
                        .ok());
        EXPECT_TRUE(same_bytes(dst.data(), expected.data(), dst.size())) << c.name;
    }
}

TEST(CppResize, PixelsAtOddAddresses) {
    Random random(8);
    for (const Case& c : cases()) {
        if (c.format != Format::kRgba8888) continue;
        const Size from = {13, 9};
        const Size to = {5, 4};
        const std::vector<uint8_t> content = random.bytes(13 * 9 * 4);
        const std::vector<uint8_t> longer = with_last_row_repeated(c, from, content);
        const std::vector<uint8_t> before(5 * 4 * 4, 9);
        Expected expected(c, longer.data(), from, to, before.data());
        std::vector<uint8_t> odd_src(content.size() + 1);
        memcpy(odd_src.data() + 1, content.data(), content.size());
        std::vector<uint8_t> odd_dst(before.size() + 1, 9);
        ASSERT_TRUE(resize(ovrin::rgba_view(odd_src.data() + 1, content.size(), 13, 9),
                           ovrin::rgba_view(odd_dst.data() + 1, before.size(), 5, 4), c.filter,
                           c.threads)
                        .ok());
        EXPECT_TRUE(same_bytes(odd_dst.data() + 1, expected.data(), before.size())) << c.name;
        EXPECT_EQ(odd_dst[0], 9);
    }
}

TEST(CppAlpha, PremultiplyRoundsAndIsUndone) {
    uint8_t pixels[] = {255, 100, 1, 128, 10, 20, 30, 255, 9, 9, 9, 0};
    const View view = ovrin::rgba_view(pixels, sizeof pixels, 3, 1);
    ASSERT_TRUE(premultiply(view).ok());
    const uint8_t multiplied[] = {128, 50, 1, 128, 10, 20, 30, 255, 0, 0, 0, 0};
    EXPECT_TRUE(same_bytes(pixels, multiplied, sizeof pixels));
    ASSERT_TRUE(unpremultiply(view).ok());
    const uint8_t back[] = {255, 100, 2, 128, 10, 20, 30, 255, 0, 0, 0, 0};
    EXPECT_TRUE(same_bytes(pixels, back, sizeof pixels));
}

TEST(CppAlpha, FullAlphaAfterTheQuarterFilter) {
    // One white pixel beside a transparent one, two bytes between the rows.
    uint8_t pixels[] = {252, 252, 252, 252, 7, 7, 126, 63, 0, 126};
    EXPECT_EQ(ovrin::white_after(Filter::kQuarter), 252);
    EXPECT_EQ(ovrin::white_after(Filter::kLanczos), 255);
    ASSERT_TRUE(unpremultiply(ovrin::rgba_view(pixels, sizeof pixels, 1, 2, 6),
                              ovrin::white_after(Filter::kQuarter))
                    .ok());
    const uint8_t expected[] = {252, 252, 252, 255, 7, 7, 251, 126, 0, 128};
    EXPECT_TRUE(same_bytes(pixels, expected, sizeof pixels));
}

}  // namespace
