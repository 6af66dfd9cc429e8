// SPDX-License-Identifier: Apache-2.0
// Quarter-point rows with AVX2. Byte shuffles stay inside 16-byte lanes, so each lane of a target
// vector has windows of its own.
#include <immintrin.h>

#include "kernels/quarter_windows.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kLane = 16;
constexpr int32_t kVector = 32;
constexpr int32_t kMostWindows = 8;

// Storage of a plan: for every target vector and each of its windows, the shuffle masks of the left
// and of the right taps; behind all masks, for every target vector, where its lanes' windows start.
struct LaneBases {
    int32_t low;
    int32_t high;
};

constexpr int32_t mask_bytes(int32_t windows) {
    return windows * 2 * kVector;
}

constexpr int32_t most_vectors(int32_t windows) {
    return kPlanBytes / (mask_bytes(windows) + static_cast<int32_t>(sizeof(LaneBases)));
}

constexpr int32_t bases_offset(int32_t windows) {
    return most_vectors(windows) * mask_bytes(windows);
}

// The masks of one lane. A shuffle gives 0 where the mask's top bit is set: adding 0x70 with
// saturation leaves that bit clear for offsets 0 to 15, inside the window, and sets it for others.
void store_masks(uint8_t* masks, const WindowTaps& taps, int32_t windows) {
    const __m128i left = _mm_load_si128(reinterpret_cast<const __m128i*>(taps.left));
    const __m128i right = _mm_load_si128(reinterpret_cast<const __m128i*>(taps.right));
    const __m128i outside = _mm_set1_epi8(0x70);
    for (int32_t w = 0; w < windows; ++w, masks += 2 * kVector) {
        const __m128i start = _mm_set1_epi8(static_cast<char>(w * kLane));
        const __m128i left_mask = _mm_adds_epu8(_mm_sub_epi8(left, start), outside);
        const __m128i right_mask = _mm_adds_epu8(_mm_sub_epi8(right, start), outside);
        _mm_store_si128(reinterpret_cast<__m128i*>(masks), left_mask);
        _mm_store_si128(reinterpret_cast<__m128i*>(masks + kVector), right_mask);
    }
}

int32_t append_lane(uint8_t* masks, const Tap* taps, int32_t first, int32_t bytes,
                    const QuarterPlan& plan) {
    WindowTaps window;
    locate_taps(window, taps, first, bytes, plan, plan.windows * kLane);
    store_masks(masks, window, plan.windows);
    return window.base;
}

void append(QuarterPlan& plan, const Tap* taps, int32_t count) {
    const int32_t bytes = count * plan.sample_bytes;
    int32_t vector = plan.samples * plan.sample_bytes / kVector;
    auto* bases = reinterpret_cast<LaneBases*>(plan.bytes + bases_offset(plan.windows)) + vector;
    uint8_t* masks = plan.bytes + vector * mask_bytes(plan.windows);
    const auto lane_bytes = [](int32_t rest) { return rest < kLane ? rest : kLane; };
    for (int32_t first = 0; first < bytes; first += kVector, ++bases) {
        bases->low = append_lane(masks, taps, first, lane_bytes(bytes - first), plan);
        // A lane without a tap of its own stays where the other one is.
        const int32_t second = bytes - first > kLane ? first + kLane : first;
        bases->high = append_lane(masks + kLane, taps, second, lane_bytes(bytes - second), plan);
        masks += mask_bytes(plan.windows);
    }
    plan.samples += count;
}

__m256i load_lanes(const uint8_t* row, LaneBases bases, int32_t window) {
    const auto* low = reinterpret_cast<const __m128i*>(row + bases.low + window * kLane);
    const auto* high = reinterpret_cast<const __m128i*>(row + bases.high + window * kLane);
    return _mm256_inserti128_si256(_mm256_castsi128_si256(_mm_loadu_si128(low)),
                                   _mm_loadu_si128(high), 1);
}

__m256i quarter(__m256i samples) {
    return _mm256_and_si256(_mm256_srli_epi16(samples, 2), _mm256_set1_epi8(0x3F));
}

// One target vector: the rows' quarters are summed first, then gathered for both taps.
template <int kWindows, bool kPair>
__m256i gather(const uint8_t* top, const uint8_t* bottom, LaneBases bases, const uint8_t* masks) {
    __m256i result = _mm256_setzero_si256();
    for (int w = 0; w < kWindows; ++w) {
        __m256i sums = quarter(load_lanes(top, bases, w));
        if (kPair) sums = _mm256_add_epi8(sums, quarter(load_lanes(bottom, bases, w)));
        const auto* mask = reinterpret_cast<const __m256i*>(masks + w * 2 * kVector);
        const __m256i left = _mm256_shuffle_epi8(sums, _mm256_load_si256(mask));
        const __m256i right = _mm256_shuffle_epi8(sums, _mm256_load_si256(mask + 1));
        result = _mm256_add_epi8(result, _mm256_add_epi8(left, right));
    }
    return result;
}

template <bool kAdd>
void put(uint8_t* dst, __m256i samples) {
    auto* vector = reinterpret_cast<__m256i*>(dst);
    if (kAdd) samples = _mm256_add_epi8(samples, _mm256_loadu_si256(vector));
    _mm256_storeu_si256(vector, samples);
}

// The last vector of a strip goes through a copy, so that nothing behind its bytes is touched.
template <bool kAdd>
void put_part(uint8_t* dst, __m256i samples, int32_t bytes) {
    alignas(kVector) uint8_t copy[kVector];
    if (kAdd) memcpy(copy, dst, static_cast<size_t>(bytes));
    put<kAdd>(copy, samples);
    memcpy(dst, copy, static_cast<size_t>(bytes));
}

template <int kWindows, bool kPair, bool kAdd>
void run_windows(uint8_t* dst, const uint8_t* top, const uint8_t* bottom, const QuarterPlan& plan) {
    const int32_t bytes = plan.samples * plan.sample_bytes;
    const auto* bases = reinterpret_cast<const LaneBases*>(plan.bytes + bases_offset(kWindows));
    const uint8_t* masks = plan.bytes;
    for (int32_t done = kVector; done <= bytes; done += kVector, dst += kVector, ++bases) {
        put<kAdd>(dst, gather<kWindows, kPair>(top, bottom, *bases, masks));
        masks += mask_bytes(kWindows);
    }
    if (bytes % kVector != 0) {
        put_part<kAdd>(dst, gather<kWindows, kPair>(top, bottom, *bases, masks), bytes % kVector);
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

const QuarterKernels& begin_quarter_plan_avx2(QuarterPlan& plan, const QuarterRowShape& shape) {
    const QuarterKernels& by_taps = begin_quarter_plan_scalar(plan, shape);
    const int32_t windows = windows_needed(shape, kLane, kLane, kMostWindows);
    if (windows == 0) return by_taps;
    plan.windows = windows;
    plan.capacity = most_vectors(windows) * kVector / shape.sample_bytes;
    return kQuarterKernels[windows - 1];
}

}  // namespace ovrin
