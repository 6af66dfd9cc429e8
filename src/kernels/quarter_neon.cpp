// SPDX-License-Identifier: Apache-2.0
// Quarter-point rows with NEON. A table lookup takes up to four windows at once and gives 0 for
// offsets outside them, or leaves the byte as it is.
#include <arm_neon.h>

#include "kernels/quarter_windows.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kVector = 16;
constexpr int32_t kTableWindows = 4;  // windows of one lookup
constexpr int32_t kMostWindows = 8;

// Storage of a plan, for every target vector.
struct VectorPlan {
    alignas(kVector) uint8_t left[kVector];
    uint8_t right[kVector];
    int32_t base;
};

constexpr int32_t kMostVectors = kPlanBytes / static_cast<int32_t>(sizeof(VectorPlan));

void append(QuarterPlan& plan, const Tap* taps, int32_t count) {
    const int32_t bytes = count * plan.sample_bytes;
    auto* vectors = reinterpret_cast<VectorPlan*>(plan.bytes);
    VectorPlan* vector = vectors + plan.samples * plan.sample_bytes / kVector;
    for (int32_t first = 0; first < bytes; first += kVector, ++vector) {
        const int32_t rest = bytes - first;
        WindowTaps window;
        locate_taps(window, taps, first, rest < kVector ? rest : kVector, plan,
                    plan.windows * kVector);
        memcpy(vector->left, window.left, kVector);
        memcpy(vector->right, window.right, kVector);
        vector->base = window.base;
    }
    plan.samples += count;
}

// The rows' quarters of one window.
template <bool kPair>
uint8x16_t load_window(const uint8_t* top, const uint8_t* bottom, int32_t offset) {
    const uint8x16_t quarters = vshrq_n_u8(vld1q_u8(top + offset), 2);
    return kPair ? vsraq_n_u8(quarters, vld1q_u8(bottom + offset), 2) : quarters;
}

// Looks both taps up in `kWindows` windows of one table and adds them to `taps`.
template <int kWindows, bool kPair>
uint8x16_t look_up(uint8x16_t taps, const uint8_t* top, const uint8_t* bottom, uint8x16_t left,
                   uint8x16_t right, int32_t offset) {
    const auto window = [&](int32_t w) {
        return load_window<kPair>(top, bottom, offset + w * kVector);
    };
    const auto add = [&](uint8x16_t left_taps, uint8x16_t right_taps) {
        return vaddq_u8(taps, vaddq_u8(left_taps, right_taps));
    };
    if constexpr (kWindows == 1) {
        const uint8x16_t table = window(0);
        return add(vqtbl1q_u8(table, left), vqtbl1q_u8(table, right));
    } else if constexpr (kWindows == 2) {
        const uint8x16x2_t table = {{window(0), window(1)}};
        return add(vqtbl2q_u8(table, left), vqtbl2q_u8(table, right));
    } else if constexpr (kWindows == 3) {
        const uint8x16x3_t table = {{window(0), window(1), window(2)}};
        return add(vqtbl3q_u8(table, left), vqtbl3q_u8(table, right));
    } else {
        const uint8x16x4_t table = {{window(0), window(1), window(2), window(3)}};
        return add(vqtbl4q_u8(table, left), vqtbl4q_u8(table, right));
    }
}

template <int kWindows, bool kPair>
uint8x16_t gather(const uint8_t* top, const uint8_t* bottom, const VectorPlan& vector) {
    constexpr int kFirst = kWindows < kTableWindows ? kWindows : kTableWindows;
    const uint8x16_t left = vld1q_u8(vector.left);
    const uint8x16_t right = vld1q_u8(vector.right);
    uint8x16_t taps = look_up<kFirst, kPair>(vdupq_n_u8(0), top, bottom, left, right, vector.base);
    if constexpr (kWindows > kTableWindows) {
        // Offsets below the second table wrap to values that lie outside it.
        constexpr int kTableBytes = kTableWindows * kVector;
        const uint8x16_t table_bytes = vdupq_n_u8(kTableBytes);
        taps = look_up<kWindows - kTableWindows, kPair>(
            taps, top, bottom, vsubq_u8(left, table_bytes), vsubq_u8(right, table_bytes),
            vector.base + kTableBytes);
    }
    return taps;
}

template <bool kAdd>
void put(uint8_t* dst, uint8x16_t samples) {
    vst1q_u8(dst, kAdd ? vaddq_u8(samples, vld1q_u8(dst)) : samples);
}

template <int kWindows, bool kPair, bool kAdd>
void run_windows(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const QuarterPlan& plan) {
    const int32_t bytes = plan.samples * plan.sample_bytes;
    const auto* vector = reinterpret_cast<const VectorPlan*>(plan.bytes);
    for (int32_t done = kVector; done <= bytes; done += kVector, dst += kVector, ++vector) {
        put<kAdd>(dst, gather<kWindows, kPair>(top, bottom, *vector));
    }
    if (bytes % kVector != 0) {
        // Through a copy, so that nothing behind the strip is touched.
        const size_t part = static_cast<size_t>(bytes % kVector);
        uint8_t copy[kVector];
        if (kAdd) memcpy(copy, dst, part);
        put<kAdd>(copy, gather<kWindows, kPair>(top, bottom, *vector));
        memcpy(dst, copy, part);
    }
}

template <int kWindows>
void store_pair(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const QuarterPlan& plan) {
    run_windows<kWindows, true, false>(dst, top, bottom, plan);
}

template <int kWindows>
void add_pair(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const QuarterPlan& plan) {
    run_windows<kWindows, true, true>(dst, top, bottom, plan);
}

template <int kWindows>
void add_row(uint8_t* dst, const uint8_t* row, const QuarterPlan& plan) {
    run_windows<kWindows, false, true>(dst, row, nullptr, plan);
}

template <int kWindows>
constexpr QuarterKernels quarter_kernels() {
    return {append, store_pair<kWindows>, add_pair<kWindows>, add_row<kWindows>};
}

constexpr QuarterKernels kQuarterKernels[kMostWindows] = {
    quarter_kernels<1>(), quarter_kernels<2>(), quarter_kernels<3>(), quarter_kernels<4>(),
    quarter_kernels<5>(), quarter_kernels<6>(), quarter_kernels<7>(), quarter_kernels<8>()};

}  // namespace

const QuarterKernels& begin_quarter_plan_neon(QuarterPlan& plan, const QuarterRowShape& shape) {
    const QuarterKernels& by_taps = begin_quarter_plan_scalar(plan, shape);
    const int32_t windows = windows_needed(shape, kVector, kVector, kMostWindows);
    if (windows == 0) return by_taps;
    plan.windows = windows;
    plan.capacity = kMostVectors * kVector / shape.sample_bytes;
    return kQuarterKernels[windows - 1];
}

}  // namespace ovrin
