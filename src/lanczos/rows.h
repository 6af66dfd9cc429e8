// SPDX-License-Identifier: Apache-2.0
// Destination rows of a Lanczos picture.
#pragma once

#include <stddef.h>
#include <stdint.h>

#include "kernels/lanczos.h"
#include "lanczos/weights.h"

namespace ovrin {

struct LanczosPicture {
    const uint8_t* src;
    int32_t src_w;
    int32_t src_h;
    ptrdiff_t src_pitch;  // bytes
    int32_t src_components;
    uint8_t* dst;  // the first of the rows
    int32_t dst_w;
    int32_t dst_h;
    ptrdiff_t dst_pitch;
    int32_t dst_components;
    const double* column_weights;
    const double* row_weights;
};

// The source rows of a destination row, with their first and last pixels repeated three times on
// either side, or the part of them that a strip of the picture needs. Pixels count from the first
// of the repeated ones.
class LanczosCache {
public:
    explicit LanczosCache(const LanczosPicture& picture);
    ~LanczosCache() { free(data_); }
    LanczosCache(const LanczosCache&) = delete;
    LanczosCache& operator=(const LanczosCache&) = delete;

    bool ready() const { return data_ != nullptr; }

    // From now on rows are wanted from pixel `first` to before pixel `end`.
    void narrow_to(const LanczosPicture& picture, int32_t first, int64_t end);

    // Points row.taps[k] to source row middle_row - 3 + k, or the nearest one that exists.
    void load(const LanczosPicture& picture, int64_t middle_row, LanczosRow& row);

private:
    void copy_row(const LanczosPicture& picture, int32_t slot, int32_t row);

    ptrdiff_t pitch_;
    uint8_t* data_;
    int64_t first_;
    int64_t end_;
    int32_t rows_[kLanczosTaps];  // the source row in each slot; negative: none
};

// Computes destination rows [first, end).
void filter_rows(PlanLanczos* plan_lanczos, const LanczosPicture& picture, LanczosCache& cache,
                 int32_t first, int32_t end);

}  // namespace ovrin
