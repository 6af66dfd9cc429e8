// SPDX-License-Identifier: Apache-2.0
#include <string.h>

#include "kernels/sets.h"

namespace ovrin {

namespace {

// Adds the quarters of a sample's bytes.
template <int N>
void add_quarters(uint8_t* sums, const uint8_t* sample) {
    for (int c = 0; c < N; ++c) sums[c] = static_cast<uint8_t>(sums[c] + (sample[c] >> 2));
}

// Four bytes at once, as no byte carries into the next: one by one they would take 2.4 times as
// long.
template <>
void add_quarters<4>(uint8_t* sums, const uint8_t* sample) {
    uint32_t sum = 0;
    uint32_t bytes = 0;
    memcpy(&sum, sums, sizeof sum);
    memcpy(&bytes, sample, sizeof bytes);
    sum += (bytes >> 2) & 0x3F3F3F3F;
    memcpy(sums, &sum, sizeof sum);
}

template <int N, bool kPair, bool kAdd>
void sample_row(uint8_t* dst, const QuarterRows& rows, const QuarterPlan& plan) {
    for (int32_t i = 0; i < plan.samples; ++i, dst += N) {
        const int64_t left = int64_t{N} * plan.taps[i].left;
        const int64_t right = int64_t{N} * plan.taps[i].right;
        uint8_t sums[N] = {};
        add_quarters<N>(sums, rows.top + left);
        add_quarters<N>(sums, rows.top + right);
        if (kPair) {
            add_quarters<N>(sums, rows.bottom + left);
            add_quarters<N>(sums, rows.bottom + right);
        }
        for (int c = 0; c < N; ++c) dst[c] = static_cast<uint8_t>(sums[c] + (kAdd ? dst[c] : 0));
    }
}

template <int N>
constexpr QuarterKernels quarter_kernels() {
    return {sample_row<N, true, false>, sample_row<N, true, true>, sample_row<N, false, true>};
}

constexpr QuarterKernels kQuarterKernels[] = {quarter_kernels<1>(), quarter_kernels<2>(),
                                              quarter_kernels<3>(), quarter_kernels<4>()};

}  // namespace

const QuarterKernels& plan_quarters_scalar(QuarterPlan& plan, const QuarterRowShape& shape,
                                           QuarterColumns& columns, int32_t samples) {
    plan.sample_bytes = shape.sample_bytes;
    plan.samples = samples < kPlanTaps ? samples : kPlanTaps;
    for (int32_t i = 0; i < plan.samples; ++i) plan.taps[i] = columns.next();
    return kQuarterKernels[shape.sample_bytes - 1];
}

}  // namespace ovrin
