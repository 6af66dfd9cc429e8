// SPDX-License-Identifier: Apache-2.0
// 4:2:0 frames as cameras deliver them: any row lengths, U and V in memory of their own or in turn,
// buffers that end with a plane's last sample. All of them give what the packed picture gives.
#include <gtest/gtest.h>
#include <ovrinresize.hpp>

#include <cstdint>
#include <memory>
#include <vector>

#include "support/guarded_buffer.h"
#include "support/random.h"

namespace {

using ovrin::ConstPlane;
using ovrin::ConstView;
using ovrin::Format;
using ovrin::Plane;
using ovrin::Size;
using ovrin::Threads;
using ovrin::View;
using ovrin_test::GuardedBuffer;
using ovrin_test::Random;
using ovrin_test::rounds;

enum class Layout { kPlanes, kVu, kUv, kGaps };
constexpr Layout kLayouts[] = {Layout::kPlanes, Layout::kVu, Layout::kUv, Layout::kGaps};

int32_t half(int32_t luma) {
    return (luma + 1) / 2;
}

struct Strides {
    int32_t y;
    int32_t uv;
};

// Memory that holds the samples of the frame and not a byte more.
class Frame {
public:
    Frame(Layout layout, Size size, Strides strides)
        : layout_(layout), size_(size), strides_(strides) {
        const bool alone = layout == Layout::kPlanes || layout == Layout::kGaps;
        const size_t plane = length(chroma_, strides.uv, step());
        y_ = std::make_unique<GuardedBuffer<uint8_t>>(length(size, strides.y, 1));
        first_ = std::make_unique<GuardedBuffer<uint8_t>>(alone ? plane : plane + 1);
        if (alone) second_ = std::make_unique<GuardedBuffer<uint8_t>>(plane);
    }

    int32_t step() const { return layout_ == Layout::kPlanes ? 1 : 2; }

    Plane y() { return {y_->data(), y_->size(), strides_.y}; }
    Plane u() { return chroma(layout_ == Layout::kVu); }
    Plane v() {
        if (second_ != nullptr) return {second_->data(), second_->size(), strides_.uv, step()};
        return chroma(layout_ == Layout::kUv);
    }

    View view() { return ovrin::i420_view(y(), u(), v(), size_.width, size_.height); }

    void fill(const std::vector<uint8_t>& packed) {
        const uint8_t* next = packed.data();
        for_each([&](uint8_t& sample) { sample = *next++; });
    }

    std::vector<uint8_t> gathered() {
        std::vector<uint8_t> all;
        for_each([&](const uint8_t& sample) { all.push_back(sample); });
        return all;
    }

    size_t largest_block() const { return y_->size(); }

private:
    static size_t length(Size plane, int32_t row, int32_t pixel) {
        return static_cast<size_t>(int64_t{plane.height - 1} * row +
                                   int64_t{plane.width - 1} * pixel + 1);
    }

    // A plane that shares its memory ends one byte before that does.
    Plane chroma(bool one_on) {
        const size_t bytes = first_->size() - (second_ == nullptr ? 1 : 0);
        return {first_->data() + (one_on ? 1 : 0), bytes, strides_.uv, step()};
    }

    template <class Visit>
    void for_each(Visit visit) {
        const Plane planes[] = {y(), u(), v()};
        for (int i = 0; i < 3; ++i) {
            const Size samples = i == 0 ? size_ : chroma_;
            const int64_t pixel = i == 0 ? 1 : step();
            for (int64_t row = 0; row < samples.height; ++row) {
                for (int64_t x = 0; x < samples.width; ++x) {
                    visit(planes[i].data[row * planes[i].row_stride + x * pixel]);
                }
            }
        }
    }

    Layout layout_;
    Size size_;
    Strides strides_;
    Size chroma_ = {half(size_.width), half(size_.height)};
    std::unique_ptr<GuardedBuffer<uint8_t>> y_;
    std::unique_ptr<GuardedBuffer<uint8_t>> first_;
    std::unique_ptr<GuardedBuffer<uint8_t>> second_;
};

size_t i420_bytes(Size size) {
    return ovrin::picture_bytes(Format::kI420, size.width, size.height);
}

std::vector<uint8_t> resized(const std::vector<uint8_t>& packed, Size from, Size to) {
    std::vector<uint8_t> result(i420_bytes(to));
    ovrin_resize_yuv420_sg(packed.data(), result.data(), from.width, from.height, to.width,
                           to.height);
    return result;
}

// Rows that lie as far apart as they must, as a target record can say, and as it cannot.
std::vector<Strides> strides_for(Layout layout, Size size) {
    const int32_t pixel = layout == Layout::kPlanes ? 1 : 2;
    const int32_t row = half(size.width) * pixel;
    const int32_t padded = half(size.width + 6) * pixel;
    return {{size.width, row},      {size.width + 6, padded},  {size.width, padded},
            {size.width + 30, row}, {size.width + 5, row + 1}, {size.width + 1, row + 64}};
}

// The sources, into a packed picture of I420, one of NV21, and planes with gaps everywhere.
void resize_all_ways(Size from, Size to, Random& random) {
    const std::vector<uint8_t> packed = random.bytes(i420_bytes(from));
    const std::vector<uint8_t> expected = resized(packed, from, to);
    for (const Layout layout : kLayouts) {
        for (const Strides strides : strides_for(layout, from)) {
            SCOPED_TRACE(::testing::Message()
                         << from.width << "x" << from.height << " to " << to.width << "x"
                         << to.height << ", layout " << static_cast<int>(layout) << ", rows "
                         << strides.y << " and " << strides.uv << " apart");
            Frame source(layout, from, strides);
            source.fill(packed);
            const Threads threads = random.pick({Threads::kAuto, Threads::kOne, Threads::kMany});

            GuardedBuffer<uint8_t> i420(i420_bytes(to), ovrin_test::Flush::kEnd, 99);
            ASSERT_STREQ(resize(source.view(),
                                ovrin::i420_view(i420.data(), i420.size(), to.width, to.height),
                                ovrin::Filter::kQuarter, threads)
                             .text,
                         "");
            EXPECT_EQ(i420.copy(), expected);

            GuardedBuffer<uint8_t> nv21(i420_bytes(to), ovrin_test::Flush::kEnd, 99);
            const View as_planes =
                ovrin::nv21_as_i420_view(nv21.data(), nv21.size(), to.width, to.height);
            ASSERT_STREQ(resize(source.view(), as_planes, ovrin::Filter::kQuarter, threads).text,
                         "");
            std::vector<uint8_t> planar(i420_bytes(to));
            ASSERT_TRUE(
                copy(as_planes, ovrin::i420_view(planar.data(), planar.size(), to.width, to.height))
                    .ok());
            EXPECT_EQ(planar, expected);

            const Layout other = random.pick({Layout::kPlanes, Layout::kVu, Layout::kUv});
            const std::vector<Strides> rows = strides_for(other, to);
            // Planes whose bytes take turns need rows of whole pairs.
            Frame result(other, to, rows[random.pick({0u, 1u, 2u, 3u})]);
            ASSERT_STREQ(
                resize(source.view(), result.view(), ovrin::Filter::kQuarter, threads).text, "");
            EXPECT_EQ(result.gathered(), expected);
        }
    }
}

TEST(CppCamera, EveryLayoutGivesWhatThePackedPictureGives) {
    Random random(1);
    SCOPED_TRACE(random.trace());
    const Size sizes[] = {{1, 1},   {2, 2},   {1, 7},   {9, 1},    {3, 5},
                          {16, 12}, {17, 13}, {64, 48}, {65, 130}, {201, 99}};
    for (const Size from : sizes) {
        for (const Size to : sizes) resize_all_ways(from, to, random);
    }
}

TEST(CppCamera, RandomSizes) {
    Random random(2);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(60); ++i) {
        resize_all_ways({random.between(1, 300), random.between(1, 300)},
                        {random.between(1, 90), random.between(1, 90)}, random);
    }
}

// Results whose sides are rounded up get larger than any picture may be.
TEST(CppCamera, LargestSides) {
    Random random(6);
    resize_all_ways({40, 3}, {ovrin::kLargestSide, 2}, random);
    resize_all_ways({3, 40}, {2, ovrin::kLargestSide}, random);
    resize_all_ways({ovrin::kLargestSide, 2}, {21, 3}, random);
}

TEST(CppCamera, Threads) {
    Random random(3);
    for (const Size to : {Size{40, 256}, Size{33, 77}}) {
        resize_all_ways({90, 1024}, to, random);
        resize_all_ways({51, 1301}, to, random);
    }
}

// An NV21 view is read where it lies, too.
TEST(CppCamera, Nv21RowsApart) {
    Random random(4);
    const Size from = {101, 57};
    const Size to = {25, 14};
    const std::vector<uint8_t> packed = random.bytes(i420_bytes(from));
    const std::vector<uint8_t> expected = resized(packed, from, to);
    for (const Strides strides : {Strides{101, 120}, Strides{128, 128}, Strides{128, 102}}) {
        Frame source(Layout::kVu, from, strides);
        source.fill(packed);
        ConstPlane vu = source.v();
        vu.bytes += 1;
        std::vector<uint8_t> nv21(i420_bytes(to));
        ASSERT_STREQ(resize(ovrin::nv21_view(ConstPlane(source.y()), vu, from.width, from.height),
                            ovrin::nv21_view(nv21.data(), nv21.size(), to.width, to.height))
                         .text,
                     "");
        std::vector<uint8_t> planar(i420_bytes(to));
        ASSERT_TRUE(copy(ovrin::nv21_as_i420_view(nv21.data(), nv21.size(), to.width, to.height),
                         ovrin::i420_view(planar.data(), planar.size(), to.width, to.height))
                        .ok());
        EXPECT_EQ(planar, expected);
    }
}

TEST(CppCamera, CopiesAreExact) {
    Random random(5);
    for (const Size size : {Size{1, 1}, Size{7, 5}, Size{64, 48}, Size{101, 33}}) {
        const std::vector<uint8_t> packed = random.bytes(i420_bytes(size));
        for (const Layout from : kLayouts) {
            for (const Layout to : kLayouts) {
                Frame source(from, size, strides_for(from, size)[1]);
                Frame result(to, size, strides_for(to, size)[3]);
                source.fill(packed);
                ASSERT_STREQ(copy(source.view(), result.view()).text, "");
                EXPECT_EQ(result.gathered(), packed);
            }
        }
    }
}

TEST(CppCamera, Refusals) {
    std::vector<uint8_t> bytes(64);
    const ConstView src = ovrin::i420_view(bytes.data(), bytes.size(), 4, 4);
    std::vector<uint8_t> other(64);
    EXPECT_STREQ(copy(src, ovrin::i420_view(other.data(), other.size(), 4, 2)).text,
                 "src is 4x4, dst is 4x2");
    EXPECT_STREQ(copy(src, ovrin::nv21_view(other.data(), other.size(), 4, 4)).text,
                 "src is I420, dst is NV21");
    EXPECT_STREQ(copy(src, ovrin::i420_view(bytes.data() + 8, 24, 4, 4)).text,
                 "src and dst: Y and Y overlap in 8 bytes");
    const auto as_planes = [&](uint8_t* data, size_t length, int32_t width) {
        return copy(src, ovrin::nv21_as_i420_view(data, length, width, 4)).code;
    };
    EXPECT_EQ(as_planes(nullptr, 24, 4), ovrin::ErrorCode::kNull);
    EXPECT_EQ(as_planes(other.data(), 23, 4), ovrin::ErrorCode::kNull);
    EXPECT_EQ(as_planes(other.data(), 15, 4), ovrin::ErrorCode::kBufferTooSmall);
    EXPECT_EQ(as_planes(other.data(), 24, 0), ovrin::ErrorCode::kEmpty);
    EXPECT_EQ(as_planes(other.data(), 24, 4), ovrin::ErrorCode::kOk);
    // Rows of a gigabyte are copied, not read where they lie: there is only one here.
    const ovrin::ConstPlane y(bytes.data(), 4, 4);
    const ovrin::ConstPlane far(bytes.data() + 16, 2, INT32_MAX);
    EXPECT_TRUE(resize(ovrin::i420_view(y, far, far, 4, 1),
                       ovrin::i420_view(other.data(), other.size(), 2, 1))
                    .ok());
}

}  // namespace
