// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <stdint.h>
#include <stdlib.h>

namespace ovrin {

constexpr int32_t kLanczosTaps = 7;
constexpr int32_t kLanczosMargin = 3;  // taps on either side of the middle one

// Seven weights for each sample of a destination axis. Null data when there was no memory.
class LanczosWeights {
public:
    explicit LanczosWeights(int32_t count)
        : count_(count),
          data_(static_cast<double*>(
              calloc(static_cast<size_t>(count), kLanczosTaps * sizeof(double)))) {}
    ~LanczosWeights() { free(data_); }
    LanczosWeights(const LanczosWeights&) = delete;
    LanczosWeights& operator=(const LanczosWeights&) = delete;

    const double* data() const { return data_; }

    // First what an axis wants of the kernel's table, then, when that is filled, the weights.
    // Columns lie at a running sum of src / dst, rows at a multiple of it: the two round
    // differently.
    void want_columns(float* table, int32_t src_w);
    void want_rows(float* table, int32_t src_h);
    void fill(const float* table);

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
    float* table;  // the kernel's, where it is wanted
};

}  // namespace ovrin
