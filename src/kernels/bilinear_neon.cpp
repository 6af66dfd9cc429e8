// SPDX-License-Identifier: Apache-2.0
// Bilinear rows with NEON. They go through several vectors in step: processors that work in order
// would wait for each result before they use it.
#include <arm_neon.h>
#include <stddef.h>
#include <string.h>

#include "kernels/bilinear_quads_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kStepQuads = 4;
constexpr int32_t kStepSums = kStepQuads * kQuadBytes;
constexpr int32_t kStepBytes = 16;  // of a finished row

// Left and right samples of four quads, blended.
void blend_quads(uint32_t* sums, const uint8_t* row, const BilinearPlan& plan, int32_t quad) {
    // Lookups outside the table give 0: the high bytes of the 16-bit samples.
    const auto samples = [&](int32_t k) {
        return vreinterpretq_s16_u8(
            vqtbl1q_u8(vld1q_u8(row + plan.windows[quad + k]), vld1q_u8(plan.shuffles[quad + k])));
    };
    const auto weights = [&](int32_t k) {
        return vreinterpretq_s16_s32(vld1q_s32(plan.weight_pairs[quad + k]));
    };
    const int16x8_t s[] = {samples(0), samples(1), samples(2), samples(3)};
    const int16x8_t w[] = {weights(0), weights(1), weights(2), weights(3)};
    const auto low = [&](int32_t k) { return vmull_s16(vget_low_s16(s[k]), vget_low_s16(w[k])); };
    const auto high = [&](int32_t k) { return vmull_high_s16(s[k], w[k]); };
    const int32x4_t l[] = {low(0), low(1), low(2), low(3)};
    const int32x4_t h[] = {high(0), high(1), high(2), high(3)};
    const auto sum = [&](int32_t k) { return vreinterpretq_u32_s32(vpaddq_s32(l[k], h[k])); };
    const uint32x4_t all[] = {sum(0), sum(1), sum(2), sum(3)};
    vst1q_u32(sums, all[0]);
    vst1q_u32(sums + 4, all[1]);
    vst1q_u32(sums + 8, all[2]);
    vst1q_u32(sums + 12, all[3]);
}

void across_quads(BilinearSums& sums, const uint8_t* row, const BilinearPlan& plan) {
    const int32_t count = plan.bytes();
    for (int32_t i = 0; i < count; i += kStepSums) {
        blend_quads(sums.values + i, row, plan, i / kQuadBytes);
    }
}

// Groups of 16 destination bytes take their left and their right samples from one window. Their
// weights are those of the right samples, one for each byte, or for each sample of four.
constexpr int32_t kGroupBytes = 16;
constexpr int32_t kStepGroups = 2;

// Plans a group whose window begins `base` bytes into a row. False: the window does not reach.
template <int N>
bool plan_group(BilinearPlan& plan, int32_t group, int64_t base, int32_t window_bytes) {
    const BilinearColumns& columns = *plan.columns;
    const int32_t to_right = N * columns.to_right;
    uint8_t* shuffle = plan.shuffles[2 * group];
    for (int32_t i = 0; i < kGroupBytes; ++i) {
        const int32_t wanted = group * kGroupBytes + i;
        const int32_t byte = wanted < columns.count * N ? wanted : columns.count * N - 1;
        const int64_t left = int64_t{N} * columns.index[byte / N] + byte % N - base;
        if (left < 0 || left + to_right >= window_bytes) return false;
        shuffle[i] = static_cast<uint8_t>(left);
        shuffle[kGroupBytes + i] = static_cast<uint8_t>(left + to_right);
        plan.right_weights[N == 4 ? wanted / N : wanted] =
            static_cast<int16_t>(columns.weight[byte / N]);
    }
    plan.windows[group] = static_cast<int32_t>(base);
    return true;
}

// Plans whole steps; bytes past the last one repeat it. False: windows do not fit into the row, or
// groups do not fit into them.
template <int N>
bool plan_groups_in_windows(BilinearPlan& plan, const BilinearColumns& columns,
                            int32_t window_bytes) {
    plan.columns = &columns;
    const WindowBases<N> windows(columns, columns.to_right, window_bytes);
    if (!windows.fit()) return false;
    const int32_t groups = rounded_up(columns.count * N, kStepGroups * kGroupBytes) / kGroupBytes;
    for (int32_t group = 0; group < groups; ++group) {
        const int64_t base = windows.base(group * kGroupBytes / N);
        if (!plan_group<N>(plan, group, base, window_bytes)) return false;
    }
    return true;
}

template <int kWindowBytes>
struct Window;

template <>
struct Window<16> {
    uint8x16_t bytes;
    explicit Window(const uint8_t* first) : bytes(vld1q_u8(first)) {}
    uint8x16_t look_up(uint8x16_t indices) const { return vqtbl1q_u8(bytes, indices); }
};

template <>
struct Window<32> {
    uint8x16x2_t bytes;
    explicit Window(const uint8_t* first) : bytes(vld1q_u8_x2(first)) {}
    uint8x16_t look_up(uint8x16_t indices) const { return vqtbl2q_u8(bytes, indices); }
};

template <>
struct Window<48> {
    uint8x16x3_t bytes;
    explicit Window(const uint8_t* first) : bytes(vld1q_u8_x3(first)) {}
    uint8x16_t look_up(uint8x16_t indices) const { return vqtbl3q_u8(bytes, indices); }
};

template <>
struct Window<64> {
    uint8x16x4_t bytes;
    explicit Window(const uint8_t* first) : bytes(vld1q_u8_x4(first)) {}
    uint8x16_t look_up(uint8x16_t indices) const { return vqtbl4q_u8(bytes, indices); }
};

// left * 4096 + (right - left) * weight, four bytes in each vector of sums.
struct GroupSums {
    int32x4_t values[4];
    int16x8_t low_steps;  // right - left
    int16x8_t high_steps;

    GroupSums(uint8x16_t left, uint8x16_t right)
        : low_steps(vreinterpretq_s16_u16(vsubl_u8(vget_low_u8(right), vget_low_u8(left)))),
          high_steps(vreinterpretq_s16_u16(vsubl_high_u8(right, left))) {
        const uint8x16_t zero = vdupq_n_u8(0);
        const uint16x8_t low = vreinterpretq_u16_u8(vzip1q_u8(left, zero));
        const uint16x8_t high = vreinterpretq_u16_u8(vzip2q_u8(left, zero));
        const auto shifted = [](uint16x4_t samples) {
            return vreinterpretq_s32_u32(vshll_n_u16(samples, kBilinearWeightBits));
        };
        values[0] = shifted(vget_low_u16(low));
        values[1] = shifted(vget_high_u16(low));
        values[2] = shifted(vget_low_u16(high));
        values[3] = shifted(vget_high_u16(high));
    }

    // A weight for each byte.
    void add(int16x8_t low, int16x8_t high) {
        values[0] = vmlal_s16(values[0], vget_low_s16(low_steps), vget_low_s16(low));
        values[1] = vmlal_high_s16(values[1], low_steps, low);
        values[2] = vmlal_s16(values[2], vget_low_s16(high_steps), vget_low_s16(high));
        values[3] = vmlal_high_s16(values[3], high_steps, high);
    }

    // A weight for each four bytes.
    void add(int16x4_t weights) {
        values[0] = vmlal_lane_s16(values[0], vget_low_s16(low_steps), weights, 0);
        values[1] = vmlal_high_lane_s16(values[1], low_steps, weights, 1);
        values[2] = vmlal_lane_s16(values[2], vget_low_s16(high_steps), weights, 2);
        values[3] = vmlal_high_lane_s16(values[3], high_steps, weights, 3);
    }

    void store(uint32_t* sums) const {
        for (int k = 0; k < 4; ++k) vst1q_u32(sums + 4 * k, vreinterpretq_u32_s32(values[k]));
    }
};

template <int N, int kWindowBytes>
void across_groups(BilinearSums& sums, const uint8_t* row, const BilinearPlan& plan) {
    const ptrdiff_t bytes = plan.bytes();
    const int32_t* window = plan.windows;
    const uint8_t* shuffle = plan.shuffles[0];
    const int16_t* weights = plan.right_weights;
    for (ptrdiff_t i = 0; i < bytes; i += kStepGroups * kGroupBytes) {
        const Window<kWindowBytes> first(row + window[0]);
        const Window<kWindowBytes> second(row + window[1]);
        const auto indices = [&](int32_t k) { return vld1q_u8(shuffle + k * kGroupBytes); };
        GroupSums first_sums(first.look_up(indices(0)), first.look_up(indices(1)));
        GroupSums second_sums(second.look_up(indices(2)), second.look_up(indices(3)));
        if constexpr (N == 4) {
            const int16x8_t eight = vld1q_s16(weights);
            first_sums.add(vget_low_s16(eight));
            second_sums.add(vget_high_s16(eight));
        } else {
            first_sums.add(vld1q_s16(weights), vld1q_s16(weights + 8));
            second_sums.add(vld1q_s16(weights + 16), vld1q_s16(weights + 24));
        }
        first_sums.store(sums.values + i);
        second_sums.store(sums.values + i + kGroupBytes);
        window += kStepGroups;
        shuffle += 2 * kStepGroups * kGroupBytes;
        weights += N == 4 ? 8 : 32;
    }
}

// WebAssembly looks up in one vector at a time: groups would take it up to six times as long as
// quads.
#if defined(__wasm__)
constexpr bool kPlansGroups = false;
#else
constexpr bool kPlansGroups = true;
#endif

template <int N>
BilinearAcross* plan_across(BilinearPlan& plan, const BilinearColumns& columns) {
    if constexpr (kPlansGroups) {
        constexpr BilinearAcross* kAcross[] = {across_groups<N, 16>, across_groups<N, 32>,
                                               across_groups<N, 48>, across_groups<N, 64>};
        for (int32_t i = 0; i < 4; ++i) {
            if (plan_groups_in_windows<N>(plan, columns, 16 * (i + 1))) return kAcross[i];
        }
    }
    if (plan_quads(plan, columns, {16, 1, kStepQuads})) return across_quads;
    return plan_bilinear_scalar(plan, columns).across;
}

BilinearAcross* plan_across(BilinearPlan& plan, const BilinearColumns& columns) {
    if (columns.sample_bytes == 1) return plan_across<1>(plan, columns);
    if (columns.sample_bytes == 2) return plan_across<2>(plan, columns);
    return plan_across<4>(plan, columns);
}

// upper * (4096 - wy) + lower * wy with one multiplication. The top bytes are the results.
uint8x16_t blend_bytes(const uint32_t* upper, const uint32_t* lower, uint32_t wy) {
    const auto load_upper = [&](int32_t k) { return vld1q_u32(upper + 4 * k); };
    const auto load_lower = [&](int32_t k) { return vld1q_u32(lower + 4 * k); };
    const uint32x4_t from[] = {load_upper(0), load_upper(1), load_upper(2), load_upper(3)};
    const uint32x4_t to[] = {load_lower(0), load_lower(1), load_lower(2), load_lower(3)};
    const auto shifted = [&](int32_t k) { return vshlq_n_u32(from[k], kBilinearWeightBits); };
    const auto step = [&](int32_t k) { return vsubq_u32(to[k], from[k]); };
    const uint32x4_t begin[] = {shifted(0), shifted(1), shifted(2), shifted(3)};
    const uint32x4_t steps[] = {step(0), step(1), step(2), step(3)};
    const auto sum = [&](int32_t k) {
        return vreinterpretq_u16_u32(vmlaq_n_u32(begin[k], steps[k], wy));
    };
    const uint16x8_t sums[] = {sum(0), sum(1), sum(2), sum(3)};
    // The odd 16-bit halves hold the top bytes; of those, the odd bytes are the results.
    const uint16x8_t low = vuzp2q_u16(sums[0], sums[1]);
    const uint16x8_t high = vuzp2q_u16(sums[2], sums[3]);
    return vuzp2q_u8(vreinterpretq_u8_u16(low), vreinterpretq_u8_u16(high));
}

void down(uint8_t* dst, const BilinearSums& upper, const BilinearSums& lower, int32_t wy,
          const BilinearPlan& plan, const BilinearNext& next) {
    const int32_t bytes = plan.bytes();
    SteadyFetch(next, 1).step();
    const uint32_t weight = static_cast<uint32_t>(wy);
    int32_t i = 0;
    for (; i + kStepBytes <= bytes; i += kStepBytes) {
        vst1q_u8(dst + i, blend_bytes(upper.values + i, lower.values + i, weight));
    }
    if (i < bytes) {
        uint8_t last[kStepBytes];
        vst1q_u8(last, blend_bytes(upper.values + i, lower.values + i, weight));
        memcpy(dst + i, last, static_cast<size_t>(bytes - i));
    }
}

void copy_of_16(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan) {
    copy_groups<16>(dst, row, plan, [](uint8_t* to, const uint8_t* window, const uint8_t* shuffle) {
        vst1q_u8(to, vqtbl1q_u8(vld1q_u8(window), vld1q_u8(shuffle)));
    });
}

void copy_of_32(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan) {
    copy_groups<16>(dst, row, plan, [](uint8_t* to, const uint8_t* window, const uint8_t* shuffle) {
        vst1q_u8(to, vqtbl2q_u8(vld1q_u8_x2(window), vld1q_u8(shuffle)));
    });
}

void copy_of_64(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan) {
    copy_groups<16>(dst, row, plan, [](uint8_t* to, const uint8_t* window, const uint8_t* shuffle) {
        vst1q_u8(to, vqtbl4q_u8(vld1q_u8_x4(window), vld1q_u8(shuffle)));
    });
}

}  // namespace

BilinearKernels plan_bilinear_neon(BilinearPlan& plan, const BilinearColumns& columns) {
    return {plan_across(plan, columns), down};
}

BilinearCopy* plan_bilinear_copy_neon(BilinearPlan& plan, const BilinearColumns& columns) {
    if (plan_groups(plan, columns, 16, 16)) return copy_of_16;
    if (plan_groups(plan, columns, 16, 32)) return copy_of_32;
    if (plan_groups(plan, columns, 16, 64)) return copy_of_64;
    return plan_bilinear_copy_scalar(plan, columns);
}

}  // namespace ovrin
