// SPDX-License-Identifier: Apache-2.0
// Bilinear rows with NEON. They go through several vectors in step: processors that work in order
// would wait for each result before they use it.
#include <arm_neon.h>
#include <stddef.h>
#include <string.h>

#include "kernels/bilinear_quads_inl.h"
#include "kernels/prefetch.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kStepQuads = 4;
constexpr int32_t kStepSums = kStepQuads * kQuadBytes;
constexpr int32_t kVectorBytes = 16;

#if defined(__wasm__)
constexpr int32_t kSumShift = 0;
#else
// The byte of the result then begins the upper half of 32 bits, where narrowing additions take it.
constexpr int32_t kSumShift = 4;
#endif

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
    const auto sum = [&](int32_t k) {
        return vreinterpretq_u32_s32(vshlq_n_s32(vpaddq_s32(l[k], h[k]), kSumShift));
    };
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

#if defined(__wasm__)

// WebAssembly looks up in one vector at a time: groups would take it up to six times as long as
// quads.
template <int N>
BilinearAcross* plan_across_groups(BilinearPlan& /*plan*/, const BilinearColumns& /*columns*/) {
    return nullptr;
}

// upper * (4096 - wy) + lower * wy with one multiplication.
class BlendDown {
public:
    explicit BlendDown(int32_t wy) : weight_(static_cast<uint32_t>(wy)) {}

    uint8x16_t blend(const uint32_t* upper, const uint32_t* lower) const {
        const uint16x8_t low = vuzp2q_u16(sum(upper, lower), sum(upper + 4, lower + 4));
        const uint16x8_t high = vuzp2q_u16(sum(upper + 8, lower + 8), sum(upper + 12, lower + 12));
        // Of the odd 16-bit halves, the odd bytes are the results.
        return vuzp2q_u8(vreinterpretq_u8_u16(low), vreinterpretq_u8_u16(high));
    }

private:
    uint16x8_t sum(const uint32_t* upper, const uint32_t* lower) const {
        const uint32x4_t from = vld1q_u32(upper);
        const uint32x4_t step = vsubq_u32(vld1q_u32(lower), from);
        return vreinterpretq_u16_u32(
            vmlaq_n_u32(vshlq_n_u32(from, kBilinearWeightBits), step, weight_));
    }

    uint32_t weight_;
};

#else

// Groups of 16 destination bytes take their left and their right samples from one window. Their
// weights are those of the left samples, one for each byte, or for each sample of four; half of
// what sums are shifted by, for products are doubled.
constexpr int32_t kGroupBytes = 16;
constexpr int32_t kWeightShift = kSumShift - 1;
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
        plan.left_weights[N == 4 ? wanted / N : wanted] =
            static_cast<int16_t>((kBilinearOne - columns.weight[byte / N]) * (1 << kWeightShift));
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

// Lookups that bring four bytes to the upper halves of 32 bits each; the rest becomes 0.
constexpr uint8_t k0 = 0xFF;
constexpr uint8_t kUpperHalves[4][kGroupBytes] = {
    {k0, k0, 0, k0, k0, k0, 1, k0, k0, k0, 2, k0, k0, k0, 3, k0},
    {k0, k0, 4, k0, k0, k0, 5, k0, k0, k0, 6, k0, k0, k0, 7, k0},
    {k0, k0, 8, k0, k0, k0, 9, k0, k0, k0, 10, k0, k0, k0, 11, k0},
    {k0, k0, 12, k0, k0, k0, 13, k0, k0, k0, 14, k0, k0, k0, 15, k0},
};
static_assert(kBilinearWeightBits + kSumShift == 16);

// right * 4096 + (left - right) * weight, shifted, four bytes in each vector of sums.
struct GroupSums {
    int32x4_t values[4];
    int16x8_t low_steps;  // left - right
    int16x8_t high_steps;

    GroupSums(uint8x16_t left, uint8x16_t right)
        : low_steps(vreinterpretq_s16_u16(vsubl_u8(vget_low_u8(left), vget_low_u8(right)))),
          high_steps(vreinterpretq_s16_u16(vsubl_high_u8(left, right))) {
        for (int k = 0; k < 4; ++k) {
            values[k] = vreinterpretq_s32_u8(vqtbl1q_u8(right, vld1q_u8(kUpperHalves[k])));
        }
    }

    // A weight for each byte.
    void add(int16x8_t low, int16x8_t high) {
        values[0] = vqdmlal_s16(values[0], vget_low_s16(low_steps), vget_low_s16(low));
        values[1] = vqdmlal_high_s16(values[1], low_steps, low);
        values[2] = vqdmlal_s16(values[2], vget_low_s16(high_steps), vget_low_s16(high));
        values[3] = vqdmlal_high_s16(values[3], high_steps, high);
    }

    // A weight for each four bytes, from the given one on.
    template <int kFirst>
    void add(int16x8_t weights) {
        values[0] = vqdmlal_laneq_s16(values[0], vget_low_s16(low_steps), weights, kFirst);
        values[1] = vqdmlal_high_laneq_s16(values[1], low_steps, weights, kFirst + 1);
        values[2] = vqdmlal_laneq_s16(values[2], vget_low_s16(high_steps), weights, kFirst + 2);
        values[3] = vqdmlal_high_laneq_s16(values[3], high_steps, weights, kFirst + 3);
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
    const int16_t* weights = plan.left_weights;
    for (ptrdiff_t i = 0; i < bytes; i += kStepGroups * kGroupBytes) {
        const Window<kWindowBytes> first(row + window[0]);
        const Window<kWindowBytes> second(row + window[1]);
        const auto indices = [&](int32_t k) { return vld1q_u8(shuffle + k * kGroupBytes); };
        GroupSums first_sums(first.look_up(indices(0)), first.look_up(indices(1)));
        GroupSums second_sums(second.look_up(indices(2)), second.look_up(indices(3)));
        if constexpr (N == 4) {
            const int16x8_t eight = vld1q_s16(weights);
            first_sums.add<0>(eight);
            second_sums.add<4>(eight);
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

template <int N>
BilinearAcross* plan_across_groups(BilinearPlan& plan, const BilinearColumns& columns) {
    constexpr BilinearAcross* kAcross[] = {across_groups<N, 16>, across_groups<N, 32>,
                                           across_groups<N, 48>, across_groups<N, 64>};
    for (int32_t i = 0; i < 4; ++i) {
        if (plan_groups_in_windows<N>(plan, columns, 16 * (i + 1))) return kAcross[i];
    }
    return nullptr;
}

// lower + (lower - upper) * (wy - 4096) / 4096: a multiplication that doubles and takes the upper
// half of the product divides exactly enough. What it loses lies below the shifted sums' result.
class BlendDown {
public:
    explicit BlendDown(int32_t wy)
        : weight_(vdupq_n_s32((wy - kBilinearOne) * (1 << (31 - kBilinearWeightBits)))) {}

    uint8x16_t blend(const uint32_t* upper, const uint32_t* lower) const {
        return vuzp1q_u8(upper_halves(upper, lower), upper_halves(upper + 8, lower + 8));
    }

private:
    // Of eight sums; their low bytes are the results.
    uint8x16_t upper_halves(const uint32_t* upper, const uint32_t* lower) const {
        const int32x4_t a = vreinterpretq_s32_u32(vld1q_u32(lower));
        const int32x4_t b = vreinterpretq_s32_u32(vld1q_u32(lower + 4));
        const int16x4_t halves = vaddhn_s32(a, step(a, upper));
        return vreinterpretq_u8_s16(vaddhn_high_s32(halves, b, step(b, upper + 4)));
    }

    int32x4_t step(int32x4_t lower, const uint32_t* upper) const {
        const int32x4_t from = vreinterpretq_s32_u32(vld1q_u32(upper));
        return vqdmulhq_s32(vsubq_s32(lower, from), weight_);
    }

    int32x4_t weight_;
};

#endif

template <int N>
BilinearAcross* plan_across(BilinearPlan& plan, const BilinearColumns& columns) {
    BilinearAcross* groups = plan_across_groups<N>(plan, columns);
    if (groups != nullptr) return groups;
    return plan_quads(plan, columns, {16, 1, kStepQuads}) ? across_quads : nullptr;
}

// Null where no window fits into the row.
BilinearAcross* plan_across(BilinearPlan& plan, const BilinearColumns& columns) {
    if (columns.sample_bytes == 1) return plan_across<1>(plan, columns);
    if (columns.sample_bytes == 2) return plan_across<2>(plan, columns);
    return plan_across<4>(plan, columns);
}

void down(uint8_t* dst, const BilinearSums& upper, const BilinearSums& lower, int32_t wy,
          const BilinearPlan& plan, const BilinearNext& next) {
    const int32_t bytes = plan.bytes();
    prefetch(next.rows[1], next.bytes);
    if (next.rows[0] != next.rows[1]) prefetch(next.rows[0], next.bytes);
    const BlendDown rows(wy);
    const auto vector = [&](int32_t i) { return rows.blend(upper.values + i, lower.values + i); };
    int32_t i = 0;
    for (; i + 2 * kVectorBytes <= bytes; i += 2 * kVectorBytes) {
        const uint8x16_t first = vector(i);
        const uint8x16_t second = vector(i + kVectorBytes);
        vst1q_u8(dst + i, first);
        vst1q_u8(dst + i + kVectorBytes, second);
    }
    for (; i < bytes; i += kVectorBytes) {
        uint8_t last[kVectorBytes];
        vst1q_u8(last, vector(i));
        const int32_t rest = bytes - i;
        memcpy(dst + i, last, static_cast<size_t>(rest < kVectorBytes ? rest : kVectorBytes));
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
    BilinearAcross* across = plan_across(plan, columns);
    if (across == nullptr) return plan_bilinear_scalar(plan, columns);
    return {across, down, kSumShift};
}

BilinearCopy* plan_bilinear_copy_neon(BilinearPlan& plan, const BilinearColumns& columns) {
    if (plan_groups(plan, columns, 16, 16)) return copy_of_16;
    if (plan_groups(plan, columns, 16, 32)) return copy_of_32;
    if (plan_groups(plan, columns, 16, 64)) return copy_of_64;
    return plan_bilinear_copy_scalar(plan, columns);
}

}  // namespace ovrin
