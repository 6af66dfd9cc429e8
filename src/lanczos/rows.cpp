// SPDX-License-Identifier: Apache-2.0
#include "lanczos/rows.h"

#include <math.h>
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

bool are_small(const double* weights, int64_t sets) {
    for (int64_t i = 0; i < sets; ++i, weights += kLanczosTaps) {
        double sum = 0.0;
        for (int32_t j = 0; j < kLanczosTaps; ++j) sum += fabs(weights[j]);
        if (!(sum <= kSmallWeights)) return false;
    }
    return true;
}

}  // namespace

// Destination pixels with more components than the source's run past the last slot; they read zeros
// there.
LanczosCache::LanczosCache(const LanczosRows& picture)
    : pitch_((picture.src_w + ptrdiff_t{2} * kLanczosMargin) * picture.src_components),
      data_(static_cast<uint8_t*>(
          calloc(static_cast<size_t>(pitch_ + picture.dst_components), kLanczosTaps))) {
    for (int64_t& row : rows_) row = -1;
}

void LanczosCache::copy_row(const LanczosRows& picture, int32_t slot, int64_t row) {
    const size_t pixel = static_cast<size_t>(picture.src_components);
    const size_t row_bytes = static_cast<size_t>(picture.src_w) * pixel;
    const uint8_t* src = picture.src + row * picture.src_pitch;
    uint8_t* before = data_ + slot * pitch_;
    uint8_t* middle = before + kLanczosMargin * pixel;
    uint8_t* after = middle + row_bytes;
    memcpy(middle, src, row_bytes);
    for (int32_t i = 0; i < kLanczosMargin; ++i, before += pixel, after += pixel) {
        memcpy(before, src, pixel);
        memcpy(after, src + row_bytes - pixel, pixel);
    }
    rows_[slot] = row;
}

// Rows that stay are not copied again: of seven rows in a row no two share a slot. Only where taps
// run on into the slot behind theirs must slots lie in the order of the taps.
void LanczosCache::load(const LanczosRows& picture, int64_t middle_row,
                        const uint8_t* taps[kLanczosTaps]) {
    const bool in_order = picture.src_components != picture.dst_components;
    for (int32_t k = 0; k < kLanczosTaps; ++k) {
        const int64_t row = clamped(middle_row - kLanczosMargin + k, picture.src_h);
        const int32_t slot = in_order ? k : static_cast<int32_t>(row % kLanczosTaps);
        if (rows_[slot] != row) copy_row(picture, slot, row);
        taps[k] = data_ + slot * pitch_;
    }
}

void filter_rows(const LanczosRows& picture, LanczosCache& cache, int32_t first, int32_t end) {
    const double row_step = static_cast<double>(picture.src_h) / picture.dst_h;
    const double column_step = static_cast<double>(picture.src_w) / picture.dst_w;
    // Only rounding on absurdly wide rows could carry a position past the last column.
    const int32_t last_column = picture.src_w - 1;
    const auto filter = kernels().lanczos_row;
    int32_t index[kColumnBlock];
    const bool columns_are_small = are_small(picture.column_weights, picture.dst_w);
    LanczosRow row = {};
    row.src_components = picture.src_components;
    row.dst_components = picture.dst_components;
    row.index = index;
    for (int32_t y = first; y < end; ++y) {
        cache.load(picture, static_cast<int64_t>(row_step * y), row.taps);
        row.dst = picture.dst + ptrdiff_t{y - first} * picture.dst_pitch;
        row.column_weights = picture.column_weights;
        row.row_weights = picture.row_weights + int64_t{y} * kLanczosTaps;
        row.has_small_weights = columns_are_small && are_small(row.row_weights, 1);
        double position = 0.0;
        for (int32_t x = 0; x < picture.dst_w; x += row.count) {
            row.count = picture.dst_w - x < kColumnBlock ? picture.dst_w - x : kColumnBlock;
            for (int32_t i = 0; i < row.count; ++i, position += column_step) {
                index[i] = position < picture.src_w ? static_cast<int32_t>(position) : last_column;
            }
            filter(row);
            row.dst += ptrdiff_t{row.count} * picture.dst_components;
            row.column_weights += int64_t{row.count} * kLanczosTaps;
        }
    }
}

}  // namespace ovrin
