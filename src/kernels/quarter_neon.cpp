// SPDX-License-Identifier: Apache-2.0
// Quarter-point rows with NEON. A table lookup takes up to four windows at once and gives 0 for
// offsets outside them, or leaves the byte as it is.
#include <arm_neon.h>
#include <stddef.h>
#include <string.h>

#include "kernels/inline.h"
#include "kernels/quarter_rows_inl.h"
#include "kernels/quarter_windows_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

constexpr int32_t kVector = 16;
constexpr int32_t kTableWindows = 4;  // windows of one lookup
constexpr int32_t kMaxWindows = 8;

// The rows' quarters of one window.
template <bool kPair>
OVRIN_ALWAYS_INLINE uint8x16_t load_window(const QuarterRows& rows, ptrdiff_t offset) {
    const uint8x16_t quarters = vshrq_n_u8(vld1q_u8(rows.top + offset), 2);
    return kPair ? vsraq_n_u8(quarters, vld1q_u8(rows.bottom + offset), 2) : quarters;
}

// Looks both taps up in `kWindows` windows of one table and adds them to `taps`.
template <int kWindows, bool kPair>
OVRIN_ALWAYS_INLINE uint8x16_t look_up(uint8x16_t taps, const QuarterRows& rows, uint8x16_t left,
                                       uint8x16_t right, ptrdiff_t offset) {
    const auto window = [&](int32_t w) { return load_window<kPair>(rows, offset + w * kVector); };
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

// A cache line holds four windows, so only one fetch in four is needed for the next rows.
// Enlarging, they are mostly those of now.
template <int kWindows, bool kPair>
OVRIN_ALWAYS_INLINE void fetch(const QuarterRows& rows, ptrdiff_t offset) {
    for (int32_t w = 0; w < kWindows; w += 4) {
        __builtin_prefetch(rows.next_top + offset + w * kVector);
        if (kPair) __builtin_prefetch(rows.next_bottom + offset + w * kVector);
    }
}

// The same in all windows of a vector. Offsets below the second table wrap to values that lie
// outside it.
template <int kWindows, bool kPair>
OVRIN_ALWAYS_INLINE uint8x16_t look_up_all(const QuarterRows& rows, uint8x16_t left,
                                           uint8x16_t right, ptrdiff_t offset) {
    constexpr int kFirst = kWindows < kTableWindows ? kWindows : kTableWindows;
    uint8x16_t taps = look_up<kFirst, kPair>(vdupq_n_u8(0), rows, left, right, offset);
    if constexpr (kWindows > kTableWindows) {
        constexpr int kTableBytes = kTableWindows * kVector;
        const uint8x16_t table_bytes = vdupq_n_u8(kTableBytes);
        taps = look_up<kWindows - kTableWindows, kPair>(taps, rows, vsubq_u8(left, table_bytes),
                                                        vsubq_u8(right, table_bytes),
                                                        offset + kTableBytes);
    }
    return taps;
}

const Offsets<kVector>& offsets_of(const QuarterPlan& plan, VectorEntry entry) {
    return *reinterpret_cast<const Offsets<kVector>*>(plan.bytes + entry.masks);
}

template <int kWindows, bool kPair>
OVRIN_ALWAYS_INLINE uint8x16_t gather(const QuarterRows& rows, const QuarterPlan& plan,
                                      VectorEntry entry) {
    const Offsets<kVector>& offsets = offsets_of(plan, entry);
    const uint8x16_t left = vld1q_u8(offsets.left);
    const uint8x16_t right = vld1q_u8(offsets.right);
    return look_up_all<kWindows, kPair>(rows, left, right, entry.base);
}

template <bool kAdd>
void put(uint8_t* dst, uint8x16_t samples) {
    vst1q_u8(dst, kAdd ? vaddq_u8(samples, vld1q_u8(dst)) : samples);
}

template <bool kAdd>
void put_part(uint8_t* dst, uint8x16_t samples, int32_t bytes) {
    through_copy<kVector, kAdd>(dst, bytes, [&](uint8_t* copy) { put<kAdd>(copy, samples); });
}

uint8x16_t first_bytes(int32_t count) {
    const uint8x16_t index = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15};
    return vcltq_u8(index, vdupq_n_u8(static_cast<uint8_t>(count)));
}

// Registers hold two vectors with the tables of this many windows.
constexpr int32_t kMaxWindowsOfTwo = 5;

// Whole vectors are stored as long as they end inside the strip: what follows the samples of one
// is stored by the next. Two at a time, before either is stored: in-order processors would
// otherwise wait for the end of one before they begin the other.
template <int kWindows, bool kPair, bool kAdd>
void run_windows_from(int32_t done, uint8_t* dst, const QuarterRows& source,
                      const QuarterPlan& plan) {
    const QuarterRows rows = source;
    const int32_t step = plan.vector_samples * plan.sample_bytes;
    const uint8x16_t kept = first_bytes(step);
    const auto* entry = reinterpret_cast<const VectorEntry*>(plan.bytes) + done;
    int32_t rest = plan.samples * plan.sample_bytes - done * step;
    dst += done * step;
    const auto vector = [&](VectorEntry at) __attribute__((always_inline)) {
        const uint8x16_t samples = gather<kWindows, kPair>(rows, plan, at);
        return kAdd ? vandq_u8(samples, kept) : samples;
    };
    if constexpr (kWindows <= kMaxWindowsOfTwo) {
        for (; rest >= step + kVector; rest -= 2 * step, dst += 2 * step, entry += 2) {
            if (kWindows > 1) fetch<2 * kWindows, kPair>(rows, entry[0].base);
            const uint8x16_t first = vector(entry[0]);
            const uint8x16_t second = vector(entry[1]);
            put<kAdd>(dst, first);
            put<kAdd>(dst + step, second);
        }
    }
    for (; rest >= kVector; rest -= step, dst += step, ++entry) {
        if (kWindows > 1) fetch<kWindows, kPair>(rows, entry->base);
        put<kAdd>(dst, vector(*entry));
    }
    for (; rest > 0; rest -= step, dst += step, ++entry) {
        put_part<kAdd>(dst, vector(*entry), rest < step ? rest : step);
    }
}

template <int kWindows, bool kPair, bool kAdd>
void run_windows(uint8_t* dst, const QuarterRows& rows, const QuarterPlan& plan) {
    run_windows_from<kWindows, kPair, kAdd>(0, dst, rows, plan);
}

template <int kWindows>
constexpr QuarterKernels quarter_kernels() {
    return {run_windows<kWindows, true, false>, run_windows<kWindows, true, true>,
            run_windows<kWindows, false, true>};
}

constexpr QuarterKernels kQuarterKernels[kMaxWindows] = {
    quarter_kernels<1>(), quarter_kernels<2>(), quarter_kernels<3>(), quarter_kernels<4>(),
    quarter_kernels<5>(), quarter_kernels<6>(), quarter_kernels<7>(), quarter_kernels<8>()};

#if defined(__wasm__)

// WebAssembly has fewer registers, and no lookups in several vectors.
const QuarterKernels* plan_repeating(QuarterPlan& /*plan*/, const QuarterRowShape& /*shape*/,
                                     const WindowShape& /*widest*/, QuarterColumns& /*columns*/,
                                     int32_t /*samples*/) {
    return nullptr;
}

#else

// Vectors whose offsets repeat, from each to the next or to the one after that, by pairs: the
// offsets stay in registers.
template <int kWindows>
void run_repeating(uint8_t* dst, const QuarterRows& rows, const QuarterPlan& plan) {
    const ptrdiff_t step = ptrdiff_t{plan.vector_samples} * plan.sample_bytes;
    const auto* entry = reinterpret_cast<const VectorEntry*>(plan.bytes);
    const ptrdiff_t src_step = entry[2].base - entry[0].base;
    const QuarterRows first = from_byte<true>(rows, entry[0].base);
    const QuarterRows second = from_byte<true>(rows, entry[1].base);
    const Offsets<kVector>& first_offsets = offsets_of(plan, entry[0]);
    const Offsets<kVector>& second_offsets = offsets_of(plan, entry[1]);
    const uint8x16_t first_left = vld1q_u8(first_offsets.left);
    const uint8x16_t first_right = vld1q_u8(first_offsets.right);
    const uint8x16_t second_left = vld1q_u8(second_offsets.left);
    const uint8x16_t second_right = vld1q_u8(second_offsets.right);
    const int32_t vectors = plan.repeating;
    uint8_t* to = dst;
    ptrdiff_t offset = 0;
    for (int32_t i = 0; i < vectors; i += 2, to += 2 * step, offset += src_step) {
        if (kWindows > 1) fetch<2 * kWindows, true>(first, offset);
        const auto a = look_up_all<kWindows, true>(first, first_left, first_right, offset);
        const auto b = look_up_all<kWindows, true>(second, second_left, second_right, offset);
        vst1q_u8(to, a);
        vst1q_u8(to + step, b);
    }
    run_windows_from<kWindows, true, false>(vectors, dst, rows, plan);
}

template <int kWindows>
constexpr QuarterKernels repeating_kernels() {
    return {run_repeating<kWindows>, run_windows<kWindows, true, true>,
            run_windows<kWindows, false, true>};
}

constexpr QuarterKernels kRepeatingKernels[kMaxWindowsOfTwo] = {
    repeating_kernels<1>(), repeating_kernels<2>(), repeating_kernels<3>(), repeating_kernels<4>(),
    repeating_kernels<5>()};

// What a vector takes: loads and shifts of the windows of two rows, lookups, additions and the
// store. Large processors take three times as long for lookups in more than two windows.
constexpr int32_t vector_cost(const WindowShape& vector) {
    return 4 * vector.windows + (vector.windows > 2 ? 10 : 6);
}

// The shape of vectors that repeat; of fewer samples than there is room for, where that costs
// hardly more for a sample. No windows: there is none.
WindowShape repeating_shape(const QuarterRowShape& shape, const WindowShape& widest) {
    WindowShape best = {0, 0, 0};
    for (int32_t samples = widest.samples; samples > 1; --samples) {
        if (repeating_cells(shape, 2 * samples) == 0) continue;
        const int32_t windows = windows_needed(shape, samples, kVector, kMaxWindowsOfTwo);
        if (windows == 0) continue;
        const WindowShape vector = {samples, windows, 2};
        if (best.windows == 0 || vector_cost(vector) * best.samples < vector_cost(best) * samples) {
            best = vector;
        }
    }
    const bool pays =
        8 * vector_cost(best) * widest.samples <= 9 * vector_cost(widest) * best.samples;
    return pays ? best : WindowShape{0, 0, 0};
}

// Of the vectors that repeat, pairs, and only those that end inside the strip.
int32_t whole_pairs(const QuarterPlan& plan) {
    const int32_t step = plan.vector_samples * plan.sample_bytes;
    const int32_t whole = (plan.samples * plan.sample_bytes - kVector) / step + 1;
    const int32_t vectors = plan.repeating < whole ? plan.repeating : whole;
    return vectors < 4 ? 0 : vectors - vectors % 2;
}

// Null, and no columns are taken, where offsets do not repeat, or too few vectors have them.
const QuarterKernels* plan_repeating(QuarterPlan& plan, const QuarterRowShape& shape,
                                     const WindowShape& widest, QuarterColumns& columns,
                                     int32_t samples) {
    const WindowShape vector = repeating_shape(shape, widest);
    if (vector.windows == 0 || samples < 4 * vector.samples) return nullptr;
    const QuarterColumns first = columns;
    plan_offsets<kVector>(plan, shape, vector, columns, samples);
    plan.repeating = whole_pairs(plan);
    if (plan.repeating > 0) return &kRepeatingKernels[vector.windows - 1];
    columns = first;
    return nullptr;
}

#endif

// From this reduction on, windows hold so few taps of samples of four bytes that these are loaded
// one by one, with the scalar kernels' plan.
constexpr int32_t kMinWordReduction = 7;

// The left and the right taps of four samples in one row.
class WordTaps {
public:
    OVRIN_ALWAYS_INLINE WordTaps(const uint8_t* row, const Tap* taps)
        : left_(vdupq_n_u32(0)), right_(left_) {
        const auto* words = reinterpret_cast<const uint32_t*>(row);
        load<0>(words, taps);
        load<1>(words, taps);
        load<2>(words, taps);
        load<3>(words, taps);
    }

    OVRIN_ALWAYS_INLINE uint8x16_t add_quarters_to(uint8x16_t sums) const {
        sums = vsraq_n_u8(sums, vreinterpretq_u8_u32(left_), 2);
        return vsraq_n_u8(sums, vreinterpretq_u8_u32(right_), 2);
    }

private:
    template <int kLane>
    OVRIN_ALWAYS_INLINE void load(const uint32_t* words, const Tap* taps) {
        left_ = vld1q_lane_u32(words + taps[kLane].left, left_, kLane);
        right_ = vld1q_lane_u32(words + taps[kLane].right, right_, kLane);
    }

    uint32x4_t left_;
    uint32x4_t right_;
};

template <bool kPair>
OVRIN_ALWAYS_INLINE uint8x16_t gather_words(const QuarterRows& rows, const Tap* taps) {
    const uint8x16_t sums = WordTaps(rows.top, taps).add_quarters_to(vdupq_n_u8(0));
    return kPair ? WordTaps(rows.bottom, taps).add_quarters_to(sums) : sums;
}

template <bool kPair, bool kAdd>
void run_words(uint8_t* dst, const QuarterRows& source, const QuarterPlan& plan) {
    const QuarterRows rows = source;
    const int32_t samples = plan.samples;
    int32_t i = 0;
    for (; i + 4 <= samples; i += 4, dst += kVector) {
        put<kAdd>(dst, gather_words<kPair>(rows, plan.taps + i));
    }
    if (i == samples) return;
    Tap last[4];
    for (int32_t k = 0; k < 4; ++k) last[k] = plan.taps[i + k < samples ? i + k : i];
    put_part<kAdd>(dst, gather_words<kPair>(rows, last), 4 * (samples - i));
}

constexpr QuarterKernels kWordKernels = {run_words<true, false>, run_words<true, true>,
                                         run_words<false, true>};

}  // namespace

const QuarterKernels& plan_quarters_neon(QuarterPlan& plan, const QuarterRowShape& shape,
                                         QuarterColumns& columns, int32_t samples) {
    const QuarterKernels* simple = plan_simple_quarters_neon(plan, shape, columns, samples);
    if (simple != nullptr) return *simple;
    if (shape.sample_bytes == 4 && shape.src_columns / kMinWordReduction >= shape.dst_columns) {
        plan_quarters_scalar(plan, shape, columns, samples);
        return kWordKernels;
    }
    const WindowShape widest = window_shape(shape, kVector, kMaxWindows);
    if (widest.windows == 0) return plan_quarters_scalar(plan, shape, columns, samples);
    const QuarterKernels* repeating = plan_repeating(plan, shape, widest, columns, samples);
    if (repeating != nullptr) return *repeating;
    plan_offsets<kVector>(plan, shape, widest, columns, samples);
    return kQuarterKernels[widest.windows - 1];
}

}  // namespace ovrin
