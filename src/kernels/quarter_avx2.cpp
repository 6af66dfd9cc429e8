// SPDX-License-Identifier: Apache-2.0
// Quarter-point rows with AVX2. Byte shuffles stay inside 16-byte lanes, so each lane is a
// destination vector with windows of its own; two lanes go at a time.
#include <immintrin.h>

#include "kernels/inline.h"
#include "kernels/quarter_averages_x86_inl.h"
#include "kernels/quarter_windows_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kLane = 16;
constexpr int32_t kVector = 32;
constexpr int32_t kMaxWindows = 8;

// Storage of a plan, for every two lanes.
struct LanesEntry {
    int32_t low;  // first bytes of the lanes' windows within a row
    int32_t high;
    int32_t masks;  // where in the plan lie, for each window, the masks of the left and right taps

    bool move(int64_t bytes, int32_t last_base) {
        if (low + bytes > last_base || high + bytes > last_base) return false;
        low += static_cast<int32_t>(bytes);
        high += static_cast<int32_t>(bytes);
        return true;
    }
};

constexpr int32_t mask_bytes(int32_t windows) {
    return windows * 2 * kVector;
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

int32_t encode_lane(uint8_t* masks, const Tap* taps, int32_t count, const QuarterPlan& plan,
                    int32_t windows) {
    WindowTaps window;
    locate_taps(window, taps, count, plan, windows * kLane);
    store_masks(masks, window, windows);
    return window.base;
}

void encode(uint8_t* masks, LanesEntry& entry, const Tap* taps, int32_t count,
            const QuarterPlan& plan, int32_t windows) {
    const int32_t lane = plan.vector_samples / 2;
    const int32_t low = count < lane ? count : lane;
    // A lane without a tap of its own stays where the other one is.
    const int32_t high = count > lane ? lane : 0;
    entry.low = encode_lane(masks, taps, low, plan, windows);
    entry.high = encode_lane(masks + kLane, taps + high, count - high, plan, windows);
}

void fetch_lanes(const uint8_t* row, LanesEntry entry, int32_t window) {
    _mm_prefetch(row + entry.low + window * kLane, _MM_HINT_T0);
    _mm_prefetch(row + entry.high + window * kLane, _MM_HINT_T0);
}

__m256i load_lanes(const uint8_t* row, LanesEntry entry, int32_t window) {
    const auto* low = reinterpret_cast<const __m128i*>(row + entry.low + window * kLane);
    const auto* high = reinterpret_cast<const __m128i*>(row + entry.high + window * kLane);
    return _mm256_inserti128_si256(_mm256_castsi128_si256(_mm_loadu_si128(low)),
                                   _mm_loadu_si128(high), 1);
}

// Two lanes: twice the sums of the rows' quarters, then what is gathered for either tap. A cache
// line holds four windows, so only every fourth one has its line fetched for the next rows.
template <int kWindows, bool kPair>
OVRIN_ALWAYS_INLINE __m256i gather(const QuarterRows& rows, const QuarterPlan& plan,
                                   LanesEntry entry) {
    const uint8_t* masks = plan.bytes + entry.masks;
    __m256i left = _mm256_setzero_si256();
    __m256i right = _mm256_setzero_si256();
    for (int w = 0; w < kWindows; ++w) {
        const __m256i top = clear_low_bits(load_lanes(rows.top, entry, w));
        const __m256i sums =
            kPair ? _mm256_avg_epu8(top, clear_low_bits(load_lanes(rows.bottom, entry, w)))
                  : halve(top);
        if (kWindows > 1 && w % 4 == 0) {
            fetch_lanes(rows.next_top, entry, w);
            if (kPair) fetch_lanes(rows.next_bottom, entry, w);
        }
        const auto* mask = reinterpret_cast<const __m256i*>(masks + w * 2 * kVector);
        left = _mm256_or_si256(left, _mm256_shuffle_epi8(sums, _mm256_load_si256(mask)));
        right = _mm256_or_si256(right, _mm256_shuffle_epi8(sums, _mm256_load_si256(mask + 1)));
    }
    return _mm256_avg_epu8(left, right);
}

template <bool kAdd>
void put_lane(uint8_t* dst, __m128i samples) {
    auto* lane = reinterpret_cast<__m128i*>(dst);
    if (kAdd) samples = _mm_add_epi8(samples, _mm_loadu_si128(lane));
    _mm_storeu_si128(lane, samples);
}

template <bool kAdd>
void put_part(uint8_t* dst, __m128i samples, int32_t bytes) {
    through_copy<kLane, kAdd>(dst, bytes, [&](uint8_t* copy) { put_lane<kAdd>(copy, samples); });
}

__m256i first_bytes_of_lanes(int32_t count) {
    const __m128i index = _mm_setr_epi8(0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15);
    return _mm256_broadcastsi128_si256(
        _mm_cmplt_epi8(index, _mm_set1_epi8(static_cast<char>(count))));
}

// Whole lanes are stored as long as they end inside the strip: what follows the samples of one is
// stored by the next.
template <int kWindows, bool kPair, bool kAdd>
void run_windows(uint8_t* dst, const QuarterRows& source, const QuarterPlan& plan) {
    const QuarterRows rows = source;
    const int32_t step = plan.vector_samples / 2 * plan.sample_bytes;
    const __m256i kept = first_bytes_of_lanes(step);
    const auto* entry = reinterpret_cast<const LanesEntry*>(plan.bytes);
    int32_t rest = plan.samples * plan.sample_bytes;
    const auto next = [&]() __attribute__((always_inline)) {
        __m256i samples = gather<kWindows, kPair>(rows, plan, *entry++);
        return kAdd ? _mm256_and_si256(samples, kept) : samples;
    };
    for (; rest >= step + kLane; rest -= 2 * step, dst += 2 * step) {
        const __m256i samples = next();
        put_lane<kAdd>(dst, _mm256_castsi256_si128(samples));
        put_lane<kAdd>(dst + step, _mm256_extracti128_si256(samples, 1));
    }
    for (; rest > 0; rest -= 2 * step, dst += 2 * step) {
        const __m256i samples = next();
        put_part<kAdd>(dst, _mm256_castsi256_si128(samples), rest < step ? rest : step);
        if (rest <= step) break;
        const int32_t high = rest - step;
        put_part<kAdd>(dst + step, _mm256_extracti128_si256(samples, 1), high < step ? high : step);
    }
}

template <int kWindows>
constexpr QuarterKernels quarter_kernels() {
    return {run_windows<kWindows, true, false>, run_windows<kWindows, true, true>,
            run_windows<kWindows, false, true>};
}

constexpr QuarterKernels kQuarterKernels[kMaxWindows] = {
    quarter_kernels<1>(), quarter_kernels<2>(), quarter_kernels<3>(), quarter_kernels<4>(),
    quarter_kernels<5>(), quarter_kernels<6>(), quarter_kernels<7>(), quarter_kernels<8>()};

// From this reduction on, windows hold so few taps of samples of four bytes that these are loaded
// one by one, with the scalar kernels' plan. Nothing is fetched for the next rows: so little lies
// between two loads that the processor finds those to come by itself.
constexpr int32_t kMinWordReduction = 7;

OVRIN_ALWAYS_INLINE __m128i load_word(const uint8_t* sample) {
    return clear_low_bits(_mm_loadu_si32(sample));
}

// Twice the quarters of both taps in a row.
OVRIN_ALWAYS_INLINE __m128i average_taps(const uint8_t* row, ptrdiff_t left, ptrdiff_t right) {
    return _mm_avg_epu8(load_word(row + left), load_word(row + right));
}

template <bool kPair, bool kAdd>
void run_words(uint8_t* dst, const QuarterRows& source, const QuarterPlan& plan) {
    const QuarterRows rows = source;
    for (int32_t i = 0; i < plan.samples; ++i, dst += sizeof(int32_t)) {
        const ptrdiff_t left = ptrdiff_t{4} * plan.taps[i].left;
        const ptrdiff_t right = ptrdiff_t{4} * plan.taps[i].right;
        const __m128i top = average_taps(rows.top, left, right);
        __m128i sums = kPair ? _mm_avg_epu8(top, average_taps(rows.bottom, left, right))
                             : _mm_srli_epi16(top, 1);
        if (kAdd) sums = _mm_add_epi8(sums, _mm_loadu_si32(dst));
        _mm_storeu_si32(dst, sums);
    }
}

constexpr QuarterKernels kWordKernels = {run_words<true, false>, run_words<true, true>,
                                         run_words<false, true>};

}  // namespace

const QuarterKernels& plan_quarters_avx2(QuarterPlan& plan, const QuarterRowShape& shape,
                                         QuarterColumns& columns, int32_t samples) {
    const QuarterKernels* simple = plan_simple_quarters_avx2(plan, shape, columns, samples);
    if (simple != nullptr) return *simple;
    if (shape.sample_bytes == 4 && shape.src_columns / kMinWordReduction >= shape.dst_columns) {
        plan_quarters_scalar(plan, shape, columns, samples);
        return kWordKernels;
    }
    const WindowShape lane = window_shape(shape, kLane, kMaxWindows);
    if (lane.windows == 0) return plan_quarters_scalar(plan, shape, columns, samples);
    plan.sample_bytes = shape.sample_bytes;
    plan.vector_samples = 2 * lane.samples;
    plan.row_bytes = int64_t{shape.src_columns} * shape.sample_bytes;
    plan_vectors<LanesEntry>(
        plan, shape, columns, samples, lane.windows * kLane, mask_bytes(lane.windows),
        [&](uint8_t* masks, LanesEntry& entry, const Tap* taps, int32_t count) {
            encode(masks, entry, taps, count, plan, lane.windows);
        });
    return kQuarterKernels[lane.windows - 1];
}

}  // namespace ovrin
