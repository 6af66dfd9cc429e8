// SPDX-License-Identifier: Apache-2.0
#include "lanczos/rows.h"

#include <string.h>

#include "kernels/kernels.h"

namespace ovrin {

namespace {

// Columns are handed to the kernel in blocks; their positions are a running sum over the whole row.
constexpr int32_t kColumnBlock = 1024;

int64_t clamped(int64_t row, int32_t rows) {
    if (row < 0) return 0;
    return row < rows ? row : int64_t{rows} - 1;
}

}  // namespace

// Pixels with more components than the source's run past the last slot; they read zeros there.
LanczosCache::LanczosCache(int32_t src_w, int32_t src_components, int32_t dst_components)
    : pitch_((ptrdiff_t{src_w} + 2 * kLanczosMargin) * src_components),
      data_(static_cast<uint8_t*>(
          calloc(static_cast<size_t>(pitch_ + dst_components), kLanczosTaps))) {}

void LanczosCache::load(const LanczosRows& picture, int64_t middle_row) {
    const size_t pixel = static_cast<size_t>(picture.src_components);
    const size_t row_bytes = static_cast<size_t>(picture.src_w) * pixel;
    for (int32_t k = 0; k < kLanczosTaps; ++k) {
        const int64_t row = clamped(middle_row - kLanczosMargin + k, picture.src_h);
        const uint8_t* src = picture.src + row * picture.src_pitch;
        uint8_t* slot = data_ + k * pitch_;
        uint8_t* after = slot + kLanczosMargin * pixel + row_bytes;
        for (int32_t i = 0; i < kLanczosMargin; ++i, slot += pixel) memcpy(slot, src, pixel);
        memcpy(slot, src, row_bytes);
        for (int32_t i = 0; i < kLanczosMargin; ++i, after += pixel) {
            memcpy(after, src + row_bytes - pixel, pixel);
        }
    }
}

void filter_rows(const LanczosRows& picture, LanczosCache& cache, int32_t first, int32_t end) {
    const double row_step = static_cast<double>(picture.src_h) / picture.dst_h;
    const double column_step = static_cast<double>(picture.src_w) / picture.dst_w;
    const auto filter = kernels().lanczos_row;
    int32_t index[kColumnBlock];
    uint8_t* dst_row = picture.dst;
    for (int32_t y = first; y < end; ++y, dst_row += picture.dst_pitch) {
        cache.load(picture, static_cast<int64_t>(row_step * y));
        double position = 0.0;
        for (int32_t x = 0; x < picture.dst_w; x += kColumnBlock) {
            const int32_t rest = picture.dst_w - x;
            const int32_t count = rest < kColumnBlock ? rest : kColumnBlock;
            for (int32_t i = 0; i < count; ++i, position += column_step) {
                index[i] = static_cast<int32_t>(position);
            }
            filter({dst_row + ptrdiff_t{x} * picture.dst_components, cache.data(), cache.pitch(),
                    picture.src_components, picture.dst_components, index,
                    picture.column_weights + int64_t{x} * kLanczosTaps,
                    picture.row_weights + int64_t{y} * kLanczosTaps, count});
        }
    }
}

}  // namespace ovrin
