// SPDX-License-Identifier: Apache-2.0
// Quarter-point rows with AVX2. Byte shuffles stay inside 16-byte lanes, so that how many of them a
// destination vector takes depends on how far its taps lie apart.
#include <immintrin.h>

#include "kernels/inline.h"
#include "kernels/quarter_averages_x86_inl.h"
#include "kernels/quarter_windows_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kLane = 16;
constexpr int32_t kVector = 32;

// What one window of source bytes makes. A window of a vector is shuffled once for what lies in its
// low lane and what lies in its high one, and then both are joined.
enum class Reach {
    kNear,    // a window of 16 bytes makes a lane: enlarging
    kMiddle,  // one of 32 bytes makes a lane, the left and the right taps by a shuffle each
    kFar,     // one of 32 bytes makes up to half a lane: left and right taps side by side
};

constexpr int32_t window_bytes(Reach reach) {
    return reach == Reach::kNear ? kLane : kVector;
}

// The windows of a vector: one for each lane, or for each half of one.
constexpr int32_t kMostWindows = 4;

constexpr int32_t window_count(Reach reach) {
    return reach == Reach::kFar ? kMostWindows : 2;
}

constexpr int32_t mask_count(Reach reach) {
    return reach == Reach::kNear ? 2 : 4;
}

// Storage of a plan, for every destination vector.
struct WindowsEntry {
    int32_t bases[kMostWindows];  // first bytes of the windows within a row
    int32_t masks;                // where in the plan the vector's masks lie

    bool move(int64_t bytes, int32_t last_base) {
        for (const int32_t base : bases) {
            if (base + bytes > last_base) return false;
        }
        for (int32_t& base : bases) base += static_cast<int32_t>(bytes);
        return true;
    }
};

constexpr uint8_t kNoByte = 0x80;  // a shuffle gives 0 for it

// For every byte of a destination lane, the byte of its window that goes there.
struct LaneOffsets {
    alignas(kLane) uint8_t bytes[kLane + sizeof(uint32_t)];

    LaneOffsets() { memset(bytes, kNoByte, sizeof bytes); }

    // Samples go from `at` on; nothing goes behind them.
    template <class FirstByte>
    void put(int32_t at, int32_t samples, int32_t sample_bytes, const FirstByte& first_byte) {
        uint8_t* end = bytes + at;
        for (int32_t i = 0; i < samples; ++i, end += sample_bytes) put_bytes(end, first_byte(i));
        memset(end, kNoByte, sizeof(uint32_t));
    }

    // As a mask for a lane that holds the window's bytes from `start` on. Adding 0x70 with
    // saturation leaves the top bit clear for offsets 0 to 15 and sets it for all others.
    void store(uint8_t* mask, int32_t start) const {
        const __m128i offsets = _mm_load_si128(reinterpret_cast<const __m128i*>(bytes));
        const __m128i inside = _mm_sub_epi8(offsets, _mm_set1_epi8(static_cast<char>(start)));
        _mm_store_si128(reinterpret_cast<__m128i*>(mask),
                        _mm_adds_epu8(inside, _mm_set1_epi8(0x70)));
    }
};

template <Reach kReach>
void encode(uint8_t* masks, WindowsEntry& entry, const Tap* taps, int32_t count,
            const QuarterPlan& plan) {
    const int32_t n = plan.sample_bytes;
    const int32_t window_samples = plan.vector_samples / window_count(kReach);
    const int32_t last_base = static_cast<int32_t>(plan.row_bytes) - window_bytes(kReach);
    for (int32_t w = 0; w < window_count(kReach); ++w, taps += window_samples) {
        const int32_t left = count - w * window_samples;
        const int32_t samples = left < window_samples ? (left > 0 ? left : 0) : window_samples;
        // A window without samples lies where the one before does.
        if (samples > 0) {
            const int32_t first = n * taps[0].left;
            entry.bases[w] = first < last_base ? first : last_base;
        } else {
            entry.bases[w] = entry.bases[w - 1];
        }
        const int32_t base = entry.bases[w];
        const auto left_byte = [&](int32_t i) { return n * taps[i].left - base; };
        const auto right_byte = [&](int32_t i) { return n * taps[i].right - base; };
        LaneOffsets lefts;
        lefts.put(0, samples, n, left_byte);
        if (kReach == Reach::kFar) {
            lefts.put(kLane / 2, samples, n, right_byte);
            lefts.store(masks + w * kVector, 0);
            lefts.store(masks + w * kVector + kLane, kLane);
            continue;
        }
        LaneOffsets rights;
        rights.put(0, samples, n, right_byte);
        if (kReach == Reach::kNear) {
            lefts.store(masks + w * kLane, 0);
            rights.store(masks + kVector + w * kLane, 0);
            continue;
        }
        lefts.store(masks + 2 * w * kVector, 0);
        lefts.store(masks + 2 * w * kVector + kLane, kLane);
        rights.store(masks + (2 * w + 1) * kVector, 0);
        rights.store(masks + (2 * w + 1) * kVector + kLane, kLane);
    }
    // Those that a vector of this reach has not move along with it, too.
    for (int32_t w = window_count(kReach); w < kMostWindows; ++w) entry.bases[w] = entry.bases[0];
}

OVRIN_ALWAYS_INLINE __m256i load_window(const uint8_t* window) {
    return clear_low_bits(_mm256_loadu_si256(reinterpret_cast<const __m256i*>(window)));
}

OVRIN_ALWAYS_INLINE __m256i load_window(const uint8_t* low, const uint8_t* high) {
    const __m256i lanes = _mm256_inserti128_si256(
        _mm256_castsi128_si256(_mm_loadu_si128(reinterpret_cast<const __m128i*>(low))),
        _mm_loadu_si128(reinterpret_cast<const __m128i*>(high)), 1);
    return clear_low_bits(lanes);
}

// Twice the sums of the rows' quarters.
template <bool kPair, class... Bases>
OVRIN_ALWAYS_INLINE __m256i sums_of(const QuarterRows& rows, Bases... base) {
    const __m256i top = load_window(rows.top + base...);
    return kPair ? _mm256_avg_epu8(top, load_window(rows.bottom + base...)) : halve(top);
}

// Both lanes of a in the low lane, and both lanes of b in the high one.
OVRIN_ALWAYS_INLINE __m256i join(__m256i a, __m256i b) {
    return _mm256_or_si256(_mm256_blend_epi32(a, b, 0xF0), _mm256_permute2x128_si256(a, b, 0x21));
}

template <Reach kReach, bool kPair>
OVRIN_ALWAYS_INLINE __m256i gather(const QuarterRows& rows, const QuarterPlan& plan,
                                   const WindowsEntry& entry) {
    const auto* masks = reinterpret_cast<const __m256i*>(plan.bytes + entry.masks);
    const auto shuffle = [&](__m256i window, int32_t mask) {
        return _mm256_shuffle_epi8(window, _mm256_load_si256(masks + mask));
    };
    const auto sums = [&](int32_t w) { return sums_of<kPair>(rows, entry.bases[w]); };
    if (kReach == Reach::kNear) {
        const __m256i lanes = sums_of<kPair>(rows, entry.bases[0], entry.bases[1]);
        return _mm256_avg_epu8(shuffle(lanes, 0), shuffle(lanes, 1));
    }
    if (kReach == Reach::kMiddle) {
        const __m256i low = sums(0);
        const __m256i high = sums(1);
        return _mm256_avg_epu8(join(shuffle(low, 0), shuffle(high, 2)),
                               join(shuffle(low, 1), shuffle(high, 3)));
    }
    const __m256i first = join(shuffle(sums(0), 0), shuffle(sums(2), 2));
    const __m256i second = join(shuffle(sums(1), 1), shuffle(sums(3), 3));
    return _mm256_avg_epu8(_mm256_unpacklo_epi64(first, second),
                           _mm256_unpackhi_epi64(first, second));
}

// A shuffle that brings the samples of a lane's two halves together; zeros follow.
__m256i order_of_halves(int32_t half_bytes) {
    const auto all = [](int32_t value) { return _mm_set1_epi8(static_cast<char>(value)); };
    const __m128i index = _mm_setr_epi8(0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15);
    const __m128i gap =
        _mm_and_si128(_mm_cmpgt_epi8(index, all(half_bytes - 1)), all(kLane / 2 - half_bytes));
    const __m128i behind = _mm_cmpgt_epi8(index, all(2 * half_bytes - 1));
    return _mm256_broadcastsi128_si256(_mm_or_si128(_mm_add_epi8(index, gap), behind));
}

template <bool kAdd>
OVRIN_ALWAYS_INLINE void put_lane(uint8_t* dst, __m128i samples) {
    auto* lane = reinterpret_cast<__m128i*>(dst);
    if (kAdd) samples = _mm_add_epi8(samples, _mm_loadu_si128(lane));
    _mm_storeu_si128(lane, samples);
}

// Lanes of so many bytes. Zeros follow a lane's samples up to 16 bytes.
template <bool kAdd>
OVRIN_ALWAYS_INLINE void put_lanes(uint8_t* dst, __m256i samples, int32_t lane_bytes) {
    put_lane<kAdd>(dst, _mm256_castsi256_si128(samples));
    put_lane<kAdd>(dst + lane_bytes, _mm256_extracti128_si256(samples, 1));
}

// Fetches the next rows where every second window begins. Windows lie about half a cache line
// apart; where they lie further, the processor finds some lines by itself. Fetching line by line
// took a loop, which cost more than what is fetched twice.
template <Reach kReach, bool kPair>
OVRIN_ALWAYS_INLINE void fetch_next(const QuarterRows& rows, const WindowsEntry& entry) {
    if (kReach == Reach::kNear) return;  // enlarging, rows come again
    for (int32_t w = 0; w < window_count(kReach); w += 2) {
        __builtin_prefetch(rows.next_top + entry.bases[w]);
        if (kPair) __builtin_prefetch(rows.next_bottom + entry.bases[w]);
    }
}

// Whole vectors are stored as long as they end inside the strip: what follows the samples of one is
// stored by the next.
template <Reach kReach, bool kPair, bool kAdd>
void run_windows(uint8_t* dst, const QuarterRows& source, const QuarterPlan& plan) {
    const QuarterRows rows = source;
    const int32_t lane = plan.vector_samples / 2 * plan.sample_bytes;
    const __m256i order = order_of_halves(lane / 2);
    const auto* entry = reinterpret_cast<const WindowsEntry*>(plan.bytes);
    int32_t rest = plan.samples * plan.sample_bytes;
    const auto next = [&]() __attribute__((always_inline)) {
        const __m256i samples = gather<kReach, kPair>(rows, plan, *entry);
        fetch_next<kReach, kPair>(rows, *entry);
        ++entry;
        return kReach == Reach::kFar ? _mm256_shuffle_epi8(samples, order) : samples;
    };
    for (; rest >= lane + kLane; rest -= 2 * lane, dst += 2 * lane) {
        put_lanes<kAdd>(dst, next(), lane);
    }
    for (; rest > 0; rest -= 2 * lane, dst += 2 * lane) {
        const __m256i samples = next();
        through_copy<kVector, kAdd>(dst, rest < 2 * lane ? rest : 2 * lane,
                                    [&](uint8_t* copy) { put_lanes<kAdd>(copy, samples, lane); });
    }
}

template <Reach kReach>
constexpr QuarterKernels kWindowKernels = {run_windows<kReach, true, false>,
                                           run_windows<kReach, true, true>,
                                           run_windows<kReach, false, true>};

template <Reach kReach>
const QuarterKernels& plan_windows(QuarterPlan& plan, const QuarterRowShape& shape,
                                   QuarterColumns& columns, int32_t samples,
                                   int32_t window_samples) {
    plan.sample_bytes = shape.sample_bytes;
    plan.vector_samples = window_samples * window_count(kReach);
    plan.row_bytes = int64_t{shape.src_columns} * shape.sample_bytes;
    plan_vectors<WindowsEntry>(
        plan, shape, columns, samples, window_bytes(kReach), mask_count(kReach) * kVector, 1,
        [&](uint8_t* masks, WindowsEntry& entry, const Tap* taps, int32_t count) {
            encode<kReach>(masks, entry, taps, count, plan);
        });
    return kWindowKernels<kReach>;
}

bool fit_window(const QuarterRowShape& shape, int32_t samples, Reach reach) {
    return windows_needed(shape, samples, window_bytes(reach), 1) == 1;
}

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
    const int32_t lane = kLane / shape.sample_bytes;
    if (fit_window(shape, lane, Reach::kNear)) {
        return plan_windows<Reach::kNear>(plan, shape, columns, samples, lane);
    }
    if (fit_window(shape, lane, Reach::kMiddle)) {
        return plan_windows<Reach::kMiddle>(plan, shape, columns, samples, lane);
    }
    for (int32_t half = kLane / 2 / shape.sample_bytes; half > 0; --half) {
        if (!fit_window(shape, half, Reach::kFar)) continue;
        return plan_windows<Reach::kFar>(plan, shape, columns, samples, half);
    }
    return plan_quarters_scalar(plan, shape, columns, samples);
}

}  // namespace ovrin
