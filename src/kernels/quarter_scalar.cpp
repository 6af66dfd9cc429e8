// SPDX-License-Identifier: Apache-2.0
#include "kernels/sets.h"

namespace ovrin {

namespace {

void append(QuarterPlan& plan, const Tap* taps, int32_t count) {
    for (int32_t i = 0; i < count; ++i) plan.taps[plan.samples + i] = taps[i];
    plan.samples += count;
}

int quarter(uint8_t sample) {
    return sample >> 2;
}

// Byte c of a sample of N bytes.
template <int N>
int quarters(const uint8_t* row, const Tap& tap, int c) {
    return quarter(row[int64_t{N} * tap.left + c]) + quarter(row[int64_t{N} * tap.right + c]);
}

template <int N>
void store_pair(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const QuarterPlan& plan) {
    for (int32_t i = 0; i < plan.samples; ++i, dst += N) {
        const Tap tap = plan.taps[i];
        for (int c = 0; c < N; ++c) {
            dst[c] = static_cast<uint8_t>(quarters<N>(top, tap, c) + quarters<N>(bottom, tap, c));
        }
    }
}

template <int N>
void add_pair(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const QuarterPlan& plan) {
    for (int32_t i = 0; i < plan.samples; ++i, dst += N) {
        const Tap tap = plan.taps[i];
        for (int c = 0; c < N; ++c) {
            dst[c] = static_cast<uint8_t>(dst[c] + quarters<N>(top, tap, c) +
                                          quarters<N>(bottom, tap, c));
        }
    }
}

template <int N>
void add_row(uint8_t* dst, const uint8_t* row, const QuarterPlan& plan) {
    for (int32_t i = 0; i < plan.samples; ++i, dst += N) {
        const Tap tap = plan.taps[i];
        for (int c = 0; c < N; ++c) {
            dst[c] = static_cast<uint8_t>(dst[c] + quarters<N>(row, tap, c));
        }
    }
}

template <int N>
constexpr QuarterKernels quarter_kernels() {
    return {append, store_pair<N>, add_pair<N>, add_row<N>};
}

constexpr QuarterKernels kQuarterKernels[] = {quarter_kernels<1>(), quarter_kernels<2>(),
                                              quarter_kernels<3>(), quarter_kernels<4>()};

}  // namespace

const QuarterKernels& begin_quarter_plan_scalar(QuarterPlan& plan, const QuarterRowShape& shape) {
    plan.sample_bytes = shape.sample_bytes;
    plan.samples = 0;
    plan.capacity = kPlanTaps;
    plan.windows = 0;
    plan.row_bytes = int64_t{shape.source_samples} * shape.sample_bytes;
    return kQuarterKernels[shape.sample_bytes - 1];
}

}  // namespace ovrin
