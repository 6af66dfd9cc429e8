// SPDX-License-Identifier: Apache-2.0
#include <string.h>

#include "kernels/sets.h"

namespace ovrin {

namespace {

// A sample's bytes, each shifted right by 2, side by side in one number: byte by byte this loop
// would take three times as long.
template <int N>
uint32_t quarter(const uint8_t* sample) {
    uint32_t bytes = 0;
    memcpy(&bytes, sample, N);
    return (bytes >> 2) & 0x3F3F3F3F;
}

template <int N>
uint32_t quarters(const uint8_t* row, const Tap& tap) {
    return quarter<N>(row + int64_t{N} * tap.left) + quarter<N>(row + int64_t{N} * tap.right);
}

template <int N>
void store(uint8_t* dst, uint32_t sums) {
    memcpy(dst, &sums, N);
}

template <int N>
void add(uint8_t* dst, uint32_t sums) {
    uint8_t bytes[sizeof sums];
    memcpy(bytes, &sums, sizeof sums);
    for (int c = 0; c < N; ++c) dst[c] = static_cast<uint8_t>(dst[c] + bytes[c]);
}

template <int N>
void fetch(const uint8_t* next_row, const Tap& tap) {
    __builtin_prefetch(next_row + int64_t{N} * tap.left);
}

template <int N>
uint32_t pair_of_quarters(const QuarterRows& rows, const Tap& tap) {
    fetch<N>(rows.next_top, tap);
    fetch<N>(rows.next_bottom, tap);
    return quarters<N>(rows.top, tap) + quarters<N>(rows.bottom, tap);
}

template <int N>
void store_pair(uint8_t* dst, const QuarterRows& rows, const QuarterPlan& plan) {
    for (int32_t i = 0; i < plan.samples; ++i, dst += N) {
        store<N>(dst, pair_of_quarters<N>(rows, plan.taps[i]));
    }
}

template <int N>
void add_pair(uint8_t* dst, const QuarterRows& rows, const QuarterPlan& plan) {
    for (int32_t i = 0; i < plan.samples; ++i, dst += N) {
        add<N>(dst, pair_of_quarters<N>(rows, plan.taps[i]));
    }
}

template <int N>
void add_row(uint8_t* dst, const QuarterRows& rows, const QuarterPlan& plan) {
    for (int32_t i = 0; i < plan.samples; ++i, dst += N) {
        fetch<N>(rows.next_top, plan.taps[i]);
        add<N>(dst, quarters<N>(rows.top, plan.taps[i]));
    }
}

template <int N>
constexpr QuarterKernels quarter_kernels() {
    return {store_pair<N>, add_pair<N>, add_row<N>};
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
