// SPDX-License-Identifier: Apache-2.0
// Random source pictures in buffers that hold exactly what the picture covers.
#pragma once

#include <gtest/gtest.h>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "reference/nv21.h"
#include "reference/yuv.h"
#include "support/guarded_buffer.h"
#include "support/random.h"

namespace ovrin_test {

// Rows of `row_bytes` bytes, `stride` bytes apart. The buffer ends with the last row's own bytes,
// however wide the stride. A negative stride puts the first row last in memory.
class GuardedPlane {
public:
    GuardedPlane(Random& random, int64_t row_bytes, int64_t rows, int64_t stride,
                 Flush flush = Flush::kEnd)
        : buffer_(random.bytes(size_of(row_bytes, rows, stride)), flush) {
        if (stride < 0 && rows > 0) first_ = static_cast<size_t>((rows - 1) * -stride);
    }

    const uint8_t* first() const { return buffer_.data() + first_; }

private:
    static size_t size_of(int64_t row_bytes, int64_t rows, int64_t stride) {
        if (row_bytes <= 0 || rows <= 0) return 0;
        const int64_t distance = stride < 0 ? -stride : stride;
        return static_cast<size_t>((rows - 1) * distance + row_bytes);
    }

    GuardedBuffer<uint8_t> buffer_;
    size_t first_ = 0;
};

// Y, U and V planes, each in a buffer of its own. `stride` is the luma row length.
struct PlanarPicture {
    GuardedPlane y, u, v;
    reference::YuvSource view;

    PlanarPicture(Random& random, int32_t w, int32_t h, int32_t stride, Flush flush = Flush::kEnd)
        : y(random, w, h, stride, flush),
          u(random, (w + 1) >> 1, (h + 1) >> 1, (stride + 1) >> 1, flush),
          v(random, (w + 1) >> 1, (h + 1) >> 1, (stride + 1) >> 1, flush),
          view{y.first(), u.first(), v.first(), w, h, stride} {}
};

// Y and VU planes, each in a buffer of its own.
struct SemiPlanarPicture {
    GuardedPlane y, vu;
    reference::Nv21Source view;

    SemiPlanarPicture(Random& random, int32_t w, int32_t h, int32_t stride,
                      Flush flush = Flush::kEnd)
        : y(random, w, h, stride, flush),
          vu(random, (w + 1) & ~1, (h + 1) >> 1, (stride + 1) & ~1, flush),
          view{y.first(), vu.first(), w, h, stride} {}
};

inline size_t bytes_of_i420(int32_t w, int32_t h) {
    return static_cast<size_t>(reference::i420_size(w, h));
}
inline size_t bytes_of_nv21(int32_t w, int32_t h) {
    return static_cast<size_t>(reference::nv21_size(w, h));
}

struct Sizes {
    int32_t src_w, src_h, dst_w, dst_h;
};

inline ::testing::Message describe(const Sizes& s, Flush flush = Flush::kEnd) {
    return ::testing::Message() << s.src_w << "x" << s.src_h << " to " << s.dst_w << "x" << s.dst_h
                                << (flush == Flush::kEnd ? " end" : " start");
}

}  // namespace ovrin_test
