// SPDX-License-Identifier: Apache-2.0
// What all fuzzers share: bytes become numbers and pictures, pictures lie between inaccessible
// pages, and what the library writes is compared with its definition under every instruction set.
#pragma once

#include <ovrinresize.h>

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <vector>

#include "kernels/kernels.h"
#include "reference/yuv420.h"
#include "support/extents.h"

namespace fuzz {

using ovrin_test::Sizes;

// Numbers from the fuzzer's bytes, in order; zeros once they are used up.
class Input {
public:
    Input(const uint8_t* data, size_t size) : data_(data), size_(size) {}

    uint8_t byte() {
        if (at_ == size_) return 0;
        return data_[at_++];
    }
    uint16_t word() { return static_cast<uint16_t>(byte() | byte() << 8); }

    // [low, high], from one byte, or from two if the range needs them.
    int32_t between(int32_t low, int32_t high) {
        const int32_t values = high - low + 1;
        return low + (values <= 256 ? byte() : word()) % values;
    }
    template <class T>
    T pick(std::initializer_list<T> values) {
        return values.begin()[byte() % values.size()];
    }
    bool flag() { return byte() % 2 != 0; }

    // Mostly small; sometimes beside a multiple of a vector's width.
    int32_t width() {
        const uint8_t b = byte();
        if (b < 200) return 1 + b % 20;
        if (b < 240) return 1 + 2 * (b - 200);
        return (b - 240) * 16 + between(-1, 1) + 16;
    }
    // Small: pictures get their variety from widths.
    int32_t height() {
        const uint8_t b = byte();
        return b < 240 ? 1 + b % 8 : 1 + 3 * (b - 240);
    }
    // For functions whose definition takes long.
    int32_t short_width() {
        const uint8_t b = byte();
        return b < 240 ? 1 + b % 12 : 1 + 3 * (b - 240);
    }
    // What no picture is: 0 or less.
    int32_t nothing() { return pick({0, -1, -2, -77, INT32_MIN + 1, INT32_MIN}); }

private:
    const uint8_t* data_;
    size_t size_;
    size_t at_ = 0;
};

// From 48 rows on a picture may be cut into bands, for which drivers start threads.
constexpr int32_t kMostRowsWithoutThreads = 47;

inline Sizes sizes(Input& in) {
    Sizes s;
    s.src_w = in.width();
    s.src_h = in.height();
    s.dst_w = in.width();
    s.dst_h = in.height();
    return s;
}

inline Sizes short_sizes(Input& in) {
    Sizes s;
    s.src_w = in.short_width();
    s.src_h = in.between(1, 12);
    s.dst_w = in.short_width();
    s.dst_h = in.between(1, 6);
    return s;
}

// Now and then some sizes become what no picture has.
inline void empty_some(Input& in, Sizes& s) {
    const uint8_t which = in.byte() % 64;
    if (which < 48) return;
    if (which & 1) s.src_w = in.nothing();
    if (which & 2) s.src_h = in.nothing();
    if (which & 4) s.dst_w = in.nothing();
    if (which & 8) s.dst_h = in.nothing();
}

// Bytes for pictures, cheaply: the fuzzer chooses a seed and a kind.
class Pixels {
public:
    explicit Pixels(Input& in)
        : kind_(in.byte() % 8), state_(in.byte() * 0x9E3779B97F4A7C15U + 1) {}

    void fill(uint8_t* bytes, size_t count);

private:
    uint64_t next() {
        state_ ^= state_ << 13;
        state_ ^= state_ >> 7;
        state_ ^= state_ << 17;
        return state_;
    }

    int kind_;
    uint64_t state_;
};

// Which end of a buffer lies against an inaccessible page without a byte between.
enum class Flush { kEnd, kStart };

inline Flush flush(Input& in) {
    return in.flag() ? Flush::kEnd : Flush::kStart;
}

// A buffer in the arena: `size` bytes flush against an inaccessible page, and a pattern on their
// other side.
class Buffer {
public:
    Buffer(size_t size, Flush flush);

    uint8_t* data() const { return data_; }
    uint32_t* words() const { return reinterpret_cast<uint32_t*>(data_); }
    size_t size() const { return size_; }

    // Stops when the bytes differ from `expected` (`size` of them), or the pattern was overwritten.
    void check(const void* expected, const char* set) const;
    void check_unchanged(const char* set) const;

    // What it holds from now on must stay: for sources.
    void keep();
    void fill(uint8_t byte);

private:
    uint8_t* data_;
    size_t size_;
    Flush flush_;
    std::vector<uint8_t> kept_;
};

// All buffers are given up: to be called first in every run.
void begin_run();

// A packed source.
Buffer source(Pixels& pixels, int64_t bytes, Flush flush);

// A source plane: rows of `row_bytes` bytes, `stride` bytes apart.
class Plane {
public:
    Plane(Pixels& pixels, int64_t row_bytes, int64_t rows, int64_t stride, Flush flush)
        : extent_(row_bytes, rows, stride),
          buffer_(source(pixels, static_cast<int64_t>(extent_.bytes), flush)) {}

    const uint8_t* first() const { return buffer_.data() + extent_.first; }
    void check_unchanged(const char* set) const { buffer_.check_unchanged(set); }

private:
    ovrin_test::PlaneExtent extent_;
    Buffer buffer_;
};

// Luma and chroma planes, each in a buffer of its own. `stride` is the luma row length.
struct Yuv420Planes {
    Plane y, chroma[2];
    reference::Yuv420Source view;

    Yuv420Planes(const reference::ChromaLayout& layout, Pixels& pixels, int32_t w, int32_t h,
                 int32_t stride, Flush flush)
        : y(pixels, w, h, stride, flush),
          chroma{
              {pixels, reference::chroma_row(layout, w), reference::half(h),
               reference::chroma_row(layout, stride), flush},
              {pixels, reference::chroma_row(layout, w), layout.planes > 1 ? reference::half(h) : 0,
               reference::chroma_row(layout, stride), flush}},
          view{layout, y.first(), {chroma[0].first(), chroma[1].first()}, w, h, stride} {}

    void check_unchanged(const char* set) const {
        for (const Plane* plane : {&y, &chroma[0], &chroma[1]}) plane->check_unchanged(set);
    }
};

// Stops the run unless `holds`.
void require(bool holds, const char* what, const char* set);

// call(name) under every instruction set that this processor has, or as many of them as
// OVRIN_FUZZ_SETS says: 1 is the scalar one alone.
struct Sets {
    Sets();
    ovrin::NamedKernels sets[ovrin::kMaxSets];
    int32_t count;
};
const Sets& all_sets();

template <class Call>
void under_every_set(Call call) {
    const Sets& all = all_sets();
    for (int32_t i = 0; i < all.count; ++i) {
        ovrin::force_kernels(*all.sets[i].kernels);
        call(all.sets[i].name);
    }
}

// draw(dst) must turn a destination full of `fill` into `expected`, under every set.
template <class Draw>
void check_drawing(const std::vector<uint8_t>& expected, Flush flush, uint8_t fill, Draw draw) {
    Buffer dst(expected.size(), flush);
    under_every_set([&](const char* set) {
        dst.fill(fill);
        draw(dst, set);
        dst.check(expected.data(), set);
    });
}

// A canvas and a picture of dst_w x dst_h on it: inside, across its edges or beyond. Fields that
// nobody should use hold garbage.
ovrin_resize_target letterbox(Input& in, int32_t dst_w, int32_t dst_h);

inline size_t bytes_of(const std::vector<uint32_t>& words) {
    return words.size() * sizeof(uint32_t);
}

}  // namespace fuzz

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size);
