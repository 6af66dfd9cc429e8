// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <stdint.h>
#include <stdlib.h>

#include "kernels/lanczos.h"

namespace ovrin {

constexpr int32_t kLanczosMargin = 3;  // taps on either side of the middle one

// For each sample of a destination axis, the weights of its taps. Null data when there was no
// memory.
class LanczosWeights {
public:
    explicit LanczosWeights(int32_t count)
        : count_(count),
          data_(static_cast<double*>(
              calloc(static_cast<size_t>(count), kLanczosTaps * sizeof(double)))) {}
    ~LanczosWeights() { free(data_); }
    LanczosWeights(const LanczosWeights&) = delete;
    LanczosWeights& operator=(const LanczosWeights&) = delete;

    int32_t count() const { return count_; }
    const double* data() const { return data_; }
    double* of_sample(int32_t i) { return data_ + int64_t{i} * kLanczosTaps; }

private:
    int32_t count_;
    double* data_;
};

// Both sides of the filter, for one picture.
struct LanczosPlan {
    LanczosPlan(int32_t dst_w, int32_t dst_h);
    ~LanczosPlan();
    LanczosPlan(const LanczosPlan&) = delete;
    LanczosPlan& operator=(const LanczosPlan&) = delete;

    bool ready() const;
    void fill(int32_t src_w, int32_t src_h);

    LanczosWeights columns;
    LanczosWeights rows;
    float* table;  // the filter's, where it is wanted; 0 elsewhere
};

}  // namespace ovrin
