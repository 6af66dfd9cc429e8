// SPDX-License-Identifier: Apache-2.0
// Random source pictures in buffers that hold exactly what the picture covers.
#pragma once

#include <gtest/gtest.h>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "reference/yuv420.h"
#include "support/extents.h"
#include "support/guarded_buffer.h"
#include "support/random.h"

namespace ovrin_test {

// A plane of random bytes: rows of `row_bytes` bytes, `stride` bytes apart.
class GuardedPlane {
public:
    GuardedPlane(Random& random, int64_t row_bytes, int64_t rows, int64_t stride,
                 Flush flush = Flush::kEnd)
        : extent_(row_bytes, rows, stride), buffer_(random.bytes(extent_.bytes), flush) {}

    const uint8_t* first() const { return buffer_.data() + extent_.first; }

private:
    PlaneExtent extent_;
    GuardedBuffer<uint8_t> buffer_;
};

// Luma and chroma planes, each in a buffer of its own. `stride` is the luma row length.
struct Yuv420Picture {
    GuardedPlane y, chroma[2];
    reference::Yuv420Source view;

    Yuv420Picture(const reference::ChromaLayout& layout, Random& random, int32_t w, int32_t h,
                  int32_t stride, Flush flush = Flush::kEnd)
        : y(random, w, h, stride, flush),
          chroma{
              {random, reference::chroma_row(layout, w), reference::half(h),
               reference::chroma_row(layout, stride), flush},
              {random, reference::chroma_row(layout, w), layout.planes > 1 ? reference::half(h) : 0,
               reference::chroma_row(layout, stride), flush}},
          view{layout, y.first(), {chroma[0].first(), chroma[1].first()}, w, h, stride} {}
};

inline size_t bytes_of(const reference::ChromaLayout& layout, int32_t w, int32_t h) {
    return static_cast<size_t>(reference::yuv420_size(layout, w, h));
}
inline size_t bytes_of_i420(int32_t w, int32_t h) {
    return static_cast<size_t>(reference::i420_size(w, h));
}
inline size_t bytes_of_nv21(int32_t w, int32_t h) {
    return static_cast<size_t>(reference::nv21_size(w, h));
}

inline ::testing::Message describe(const Sizes& s, Flush flush = Flush::kEnd) {
    return ::testing::Message() << s.src_w << "x" << s.src_h << " to " << s.dst_w << "x" << s.dst_h
                                << (flush == Flush::kEnd ? " end" : " start");
}

}  // namespace ovrin_test
