// SPDX-License-Identifier: Apache-2.0
// How the vector sets plan a strip. A destination vector holds a whole number of samples; its bytes
// are gathered from a few whole source vectors, the windows, by byte shuffles. A window starts
// where the destination vector's first tap lies, or earlier at the end of a row: no window reaches
// past the row, so kernels load whole vectors and have no border case.
#pragma once

#include <stddef.h>
#include <string.h>

#include "kernels/inline.h"
#include "kernels/quarter.h"

namespace ovrin {

namespace {

// How a row is cut: the samples of a destination vector and the windows that it takes. No windows:
// a plan of this kind does not fit the row. Where the ratio repeats, it does so from one vector to
// the next, or `period` further on.
struct WindowShape {
    int32_t samples;
    int32_t windows;
    int32_t period;
};

// Windows of `window_bytes` that `samples` destination samples need; 0 when they are more than
// `max_windows`, or longer together than the source row.
int32_t windows_needed(const QuarterRowShape& shape, int32_t samples, int32_t window_bytes,
                       int32_t max_windows) {
    const int64_t s = shape.src_columns;
    const int64_t points = (samples - 1) * s + ((3 * s) >> 2) - (s >> 2);
    // Points `points` apart lie at most this many cells apart, wherever the first one lies.
    const int64_t cells = (points + shape.dst_columns - 1) / shape.dst_columns;
    const int64_t windows = ((cells + 1) * shape.sample_bytes + window_bytes - 1) / window_bytes;
    const int64_t row_bytes = int64_t{shape.src_columns} * shape.sample_bytes;
    const bool fits = windows <= max_windows && windows * window_bytes <= row_bytes;
    return fits && row_bytes <= INT32_MAX ? static_cast<int32_t>(windows) : 0;
}

// As many samples in a vector as the windows allow: half, a quarter and an eighth of a vector still
// beat samples one by one. Of many samples only a multiple of four: simple ratios then repeat from
// vector to vector.
inline WindowShape window_shape(const QuarterRowShape& shape, int32_t vector_bytes,
                                int32_t max_windows) {
    int32_t samples = vector_bytes / shape.sample_bytes;
    if (samples > 16) samples -= samples % 4;
    const int32_t fewest = samples < 16 ? 2 : samples / 8;
    for (; samples >= fewest; samples /= 2) {
        const int32_t windows = windows_needed(shape, samples, vector_bytes, max_windows);
        if (windows > 0) return {samples, windows, 1};
    }
    return {0, 0, 0};
}

// The taps of a destination vector, as bytes from the start of its windows, which span at most 256
// bytes together. What follows the vector's last sample has no meaning.
struct WindowTaps {
    alignas(64) uint8_t left[64 + sizeof(uint32_t)];
    alignas(64) uint8_t right[64 + sizeof(uint32_t)];
    int32_t base;  // first byte of the windows within the row
};

// The bytes of a sample of up to four, from the first one on.
void put_bytes(uint8_t* offsets, int32_t first) {
    const uint32_t bytes = static_cast<uint32_t>(first) * 0x01010101U + 0x03020100U;
    memcpy(offsets, &bytes, sizeof bytes);
}

inline void locate_taps(WindowTaps& window, const Tap* taps, int32_t count, const QuarterPlan& plan,
                        int32_t span) {
    const int32_t n = plan.sample_bytes;
    const int32_t first = n * taps[0].left;
    const int32_t last_base = static_cast<int32_t>(plan.row_bytes) - span;
    window.base = first < last_base ? first : last_base;
    memset(window.left, 0, sizeof window.left);
    memset(window.right, 0, sizeof window.right);
    for (int32_t i = 0; i < count; ++i) {
        put_bytes(window.left + n * i, n * taps[i].left - window.base);
        put_bytes(window.right + n * i, n * taps[i].right - window.base);
    }
}

// Copies less than 2 * kMost bytes, a power of two. Calling memcpy would take as long as a row of a
// small picture takes for ten vectors.
template <int32_t kMost>
OVRIN_ALWAYS_INLINE void copy_part(uint8_t* dst, const uint8_t* src, int32_t bytes) {
    if constexpr (kMost > 0) {
        const bool has = (bytes & kMost) != 0;
        if (has) memcpy(dst, src, kMost);
        const ptrdiff_t done = has ? kMost : 0;
        copy_part<kMost / 2>(dst + done, src + done, bytes);
    }
}

// Lets `put` write a vector whose first bytes belong to dst: into a copy, so that nothing past them
// is touched.
template <int32_t kVector, bool kAdd, class Put>
void through_copy(uint8_t* dst, int32_t bytes, const Put& put) {
    alignas(kVector) uint8_t copy[kVector];
    if (kAdd) memcpy(copy, dst, static_cast<size_t>(bytes));
    put(copy);
    copy_part<kVector>(dst, copy, bytes);
}

// Source cells from the taps of some samples to those of as many next ones, where these are the
// same taps but for that; 0 where they are not.
int64_t repeating_cells(const QuarterRowShape& shape, int32_t samples) {
    const int64_t points = int64_t{samples} * shape.src_columns;
    return points % shape.dst_columns == 0 ? points / shape.dst_columns : 0;
}

// Lets the next vectors have the masks of those a period before them. False, where a window would
// begin past last_base.
template <class Entry>
bool repeat_period(Entry* entry, int32_t period, int64_t bytes, int32_t last_base) {
    for (int32_t k = 0; k < period; ++k) {
        entry[k] = entry[k - period];
        if (!entry[k].move(bytes, last_base)) return false;
    }
    return true;
}

// Plans vectors until the samples or the storage end. Entries, one for each vector, grow from the
// front of the storage, blocks of `mask_bytes` from its back. Simple ratios repeat: as long as they
// do, vectors share the blocks of the first `period`, which stay in the cache and leave room for
// longer strips.
//
// encode(masks, entry, taps, count) writes the masks of the vector with these taps, and all of its
// entry but where the masks are. An entry's move(bytes, last_base) moves its windows on; false, and
// nothing is moved, when one would begin past last_base.
template <class Entry, class Encode>
void plan_vectors(QuarterPlan& plan, const QuarterRowShape& shape, QuarterColumns& columns,
                  int32_t samples, int32_t span, int32_t mask_bytes, int32_t period,
                  const Encode& encode) {
    constexpr int32_t kEntryBytes = static_cast<int32_t>(sizeof(Entry));
    const int32_t period_samples = period * plan.vector_samples;
    const int64_t cells = repeating_cells(shape, period_samples);
    const auto last_base = static_cast<int32_t>(plan.row_bytes - span);
    auto* const entries = reinterpret_cast<Entry*>(plan.bytes);
    int32_t masks = kPlanBytes;
    int32_t room = kPlanBytes;
    int32_t vectors = 0;
    plan.repeating = 0;
    for (plan.samples = 0; plan.samples < samples;) {
        room -= kEntryBytes;
        if (room < mask_bytes) return;
        Entry* const entry = entries + vectors;
        const int32_t rest = samples - plan.samples;
        if (cells > 0 && vectors >= period && rest >= period_samples &&
            repeat_period(entry, period, cells * plan.sample_bytes, last_base)) {
            columns.skip_cells(cells);
            plan.samples += period_samples;
            room -= (period - 1) * kEntryBytes;
            vectors += period;
            // From the first one on: where a period once did not fit, no later one does.
            plan.repeating = vectors;
            continue;
        }
        const int32_t count = rest < plan.vector_samples ? rest : plan.vector_samples;
        Tap taps[64];
        for (int32_t i = 0; i < count; ++i) taps[i] = columns.next();
        uint8_t* block = plan.bytes + masks - mask_bytes;
        encode(block, *entry, taps, count);
        const bool repeats = masks < kPlanBytes && memcmp(block, plan.bytes + masks,
                                                          static_cast<size_t>(mask_bytes)) == 0;
        if (!repeats) {
            masks -= mask_bytes;
            room -= mask_bytes;
        }
        entry->masks = masks;
        plan.samples += count;
        ++vectors;
    }
}

// The plan of sets that shuffle whole vectors: of every destination vector, the offsets of its taps
// from the start of its windows.
struct VectorEntry {
    int32_t base;   // first byte of the windows within a row
    int32_t masks;  // where its Offsets lie in the plan

    bool move(int64_t bytes, int32_t last_base) {
        if (base + bytes > last_base) return false;
        base += static_cast<int32_t>(bytes);
        return true;
    }
};

template <int32_t kVector>
struct Offsets {
    alignas(kVector) uint8_t left[kVector];
    uint8_t right[kVector];
};

template <int32_t kVector>
void plan_offsets(QuarterPlan& plan, const QuarterRowShape& shape, const WindowShape& vector,
                  QuarterColumns& columns, int32_t samples) {
    const int32_t span = vector.windows * kVector;
    plan.sample_bytes = shape.sample_bytes;
    plan.vector_samples = vector.samples;
    plan.row_bytes = int64_t{shape.src_columns} * shape.sample_bytes;
    const auto encode = [&](uint8_t* masks, VectorEntry& entry, const Tap* taps, int32_t count) {
        WindowTaps window;
        locate_taps(window, taps, count, plan, span);
        memcpy(masks, window.left, kVector);
        memcpy(masks + kVector, window.right, kVector);
        entry.base = window.base;
    };
    plan_vectors<VectorEntry>(plan, shape, columns, samples, span, 2 * kVector, vector.period,
                              encode);
}

}  // namespace

}  // namespace ovrin
