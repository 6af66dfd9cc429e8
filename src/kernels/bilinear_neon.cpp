// SPDX-License-Identifier: Apache-2.0
// Blended bilinear rows with NEON, a quad at a time.
#include <arm_neon.h>
#include <string.h>

#include "kernels/bilinear_quads_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kStepQuads = 4;
constexpr int32_t kStepSums = kStepQuads * kQuadBytes;
constexpr int32_t kStepBytes = 16;  // of a finished row

// What follows goes through four quads in step: processors that work in order would wait for each
// result before they use it.

// Left and right samples of four quads, blended.
void blend_quads(uint32_t* sums, const uint8_t* row, const BilinearPlan& plan, int32_t quad) {
    // Lookups outside the table give 0: the high bytes of the 16-bit samples.
    const auto samples = [&](int32_t k) {
        return vreinterpretq_s16_u8(
            vqtbl1q_u8(vld1q_u8(row + plan.windows[quad + k]), vld1q_u8(plan.shuffles[quad + k])));
    };
    const auto weights = [&](int32_t k) {
        return vreinterpretq_s16_s32(vld1q_s32(plan.weights[quad + k]));
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

void across(BilinearSums& sums, const uint8_t* row, const BilinearPlan& plan) {
    const int32_t count = plan.bytes();
    for (int32_t i = 0; i < count; i += kStepSums) {
        blend_quads(sums.values + i, row, plan, i / kQuadBytes);
    }
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
    SteadyFetch fetch(next, bytes / kStepBytes);
    const uint32_t weight = static_cast<uint32_t>(wy);
    int32_t i = 0;
    for (; i + kStepBytes <= bytes; i += kStepBytes) {
        fetch.step();
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
    if (plan_quads(plan, columns, {16, 1, kStepQuads})) return {across, down};
    return {plan_bilinear_scalar(plan, columns).across, down};
}

BilinearCopy* plan_bilinear_copy_neon(BilinearPlan& plan, const BilinearColumns& columns) {
    if (plan_groups(plan, columns, 16, 16)) return copy_of_16;
    if (plan_groups(plan, columns, 16, 32)) return copy_of_32;
    if (plan_groups(plan, columns, 16, 64)) return copy_of_64;
    return plan_bilinear_copy_scalar(plan, columns);
}

}  // namespace ovrin
