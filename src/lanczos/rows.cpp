// SPDX-License-Identifier: Apache-2.0
#include "lanczos/rows.h"

#include <string.h>

#include "kernels/prefetch.h"

namespace ovrin {

namespace {

int32_t clamped(int64_t row, int32_t rows) {
    if (row < 0) return 0;
    return row < rows ? static_cast<int32_t>(row) : rows - 1;
}

// Columns lie at a running sum over the whole row.
class ColumnPositions {
public:
    explicit ColumnPositions(const LanczosPicture& picture)
        : step_(static_cast<double>(picture.src_w) / picture.dst_w), src_w_(picture.src_w) {}

    // Only rounding on absurdly wide rows could carry a position past the last column.
    int32_t next() {
        const int32_t column = position_ < src_w_ ? static_cast<int32_t>(position_) : src_w_ - 1;
        position_ += step_;
        return column;
    }

private:
    double position_ = 0.0;
    double step_;
    int32_t src_w_;
};

}  // namespace

// Destination pixels with more components than the source's run past the last slot; they read zeros
// there.
LanczosCache::LanczosCache(const LanczosPicture& picture)
    : pitch_((picture.src_w + ptrdiff_t{2} * kLanczosMargin) * picture.src_components),
      data_(static_cast<uint8_t*>(
          calloc(static_cast<size_t>(pitch_ + picture.dst_components), kLanczosTaps))) {
    narrow_to(picture, 0, picture.src_w + int64_t{2} * kLanczosMargin);
}

// Where taps run on into the slot after theirs they need all of it.
void LanczosCache::narrow_to(const LanczosPicture& picture, int32_t first, int64_t end) {
    const bool whole = picture.src_components != picture.dst_components;
    first_ = whole ? 0 : first;
    end_ = whole ? picture.src_w + int64_t{2} * kLanczosMargin : end;
    for (int32_t& row : rows_) row = -1;
}

void LanczosCache::copy_row(const LanczosPicture& picture, int32_t slot, int32_t row) {
    const int64_t pixel = picture.src_components;
    const uint8_t* src = picture.src + row * picture.src_pitch;
    uint8_t* dst = data_ + slot * pitch_;
    const int64_t row_end = kLanczosMargin + int64_t{picture.src_w};
    const int64_t first = first_ < kLanczosMargin ? kLanczosMargin : first_;
    const int64_t end = end_ < row_end ? end_ : row_end;
    if (first < end) {
        memcpy(dst + first * pixel, src + (first - kLanczosMargin) * pixel,
               static_cast<size_t>((end - first) * pixel));
    }
    const auto repeat = [&](int64_t column, int64_t source_column) {
        memcpy(dst + column * pixel, src + source_column * pixel, static_cast<size_t>(pixel));
    };
    for (int64_t i = first_; i < kLanczosMargin; ++i) repeat(i, 0);
    for (int64_t i = row_end; i < end_; ++i) repeat(i, picture.src_w - 1);
    rows_[slot] = row;
    if (row + 1 == picture.src_h) return;
    prefetch(src + picture.src_pitch + (first - kLanczosMargin) * pixel, (end - first) * pixel);
}

// Rows that stay are not copied again: of as many neighbouring rows as there are taps no two share
// a slot. Only where taps run on into the slot after theirs must slots lie in the order of the
// taps.
void LanczosCache::load(const LanczosPicture& picture, int64_t middle_row, LanczosRow& row) {
    const bool in_order = picture.src_components != picture.dst_components;
    for (int32_t k = 0; k < kLanczosTaps; ++k) {
        const int32_t source_row = clamped(middle_row - kLanczosMargin + k, picture.src_h);
        const int32_t slot = in_order ? k : source_row % kLanczosTaps;
        if (rows_[slot] != source_row) copy_row(picture, slot, source_row);
        row.taps[k] = data_ + slot * pitch_;
        row.source_rows[k] = source_row;
    }
}

// Strip by strip: what kernels keep of a strip and its source rows stays small.
void filter_rows(PlanLanczos* plan_lanczos, const LanczosPicture& picture, LanczosCache& cache,
                 int32_t first, int32_t end) {
    const double row_step = static_cast<double>(picture.src_h) / picture.dst_h;
    ColumnPositions positions(picture);
    LanczosColumns columns;
    LanczosStripPlan plan;
    LanczosSums sums;
    columns.src_components = picture.src_components;
    columns.dst_components = picture.dst_components;
    for (int32_t x = 0; x < picture.dst_w; x += columns.count) {
        const int32_t left = picture.dst_w - x;
        columns.count = left < kLanczosColumns ? left : kLanczosColumns;
        columns.weights = picture.column_weights + int64_t{x} * kLanczosTaps;
        for (int32_t i = 0; i < columns.count; ++i) columns.index[i] = positions.next();
        FilterLanczos* filter = plan_lanczos(plan, columns);
        sums.clear();
        cache.narrow_to(picture, columns.index[0],
                        int64_t{columns.index[columns.count - 1]} + kLanczosTaps);
        for (int32_t y = first; y < end; ++y) {
            LanczosRow row;
            cache.load(picture, static_cast<int64_t>(row_step * y), row);
            row.dst = picture.dst + ptrdiff_t{y - first} * picture.dst_pitch +
                      ptrdiff_t{x} * picture.dst_components;
            row.weights = picture.row_weights + int64_t{y} * kLanczosTaps;
            filter(row, plan, sums);
        }
    }
}

}  // namespace ovrin
