// SPDX-License-Identifier: Apache-2.0
// Rows whose columns have a simple ratio, such as 2:1 or 3:2. The same few taps repeat all along
// the row: kernels made for them need no offsets, and load every source vector once.
//
// A set describes each of its ratios in a class, the pattern:
//
//   kRatio                           the ratio
//   kSampleBytes                     bytes of the samples that it is for
//   kDstBytes                        what it makes at once: whole groups of kRatio.dst samples
//   store<kPair>(dst, top, bottom)   makes them, of both rows or of the top one alone
//
// and says with kOverrun where that overwrites what follows.
#pragma once

#include <stddef.h>
#include <string.h>

#include "kernels/inline.h"
#include "kernels/quarter.h"
#include "kernels/quarter_rows_inl.h"

namespace ovrin {

namespace {

// `src` source columns make a group of `dst` destination columns, with these taps.
struct SimpleRatio {
    int32_t src;
    int32_t dst;
    Tap taps[3];
};

constexpr SimpleRatio kTwoToOne = {2, 1, {{0, 1}}};
constexpr SimpleRatio kThreeToOne = {3, 1, {{0, 2}}};
constexpr SimpleRatio kFourToOne = {4, 1, {{1, 3}}};
constexpr SimpleRatio kThreeToTwo = {3, 2, {{0, 1}, {1, 2}}};
constexpr SimpleRatio kFourToThree = {4, 3, {{0, 1}, {1, 2}, {3, 3}}};
constexpr SimpleRatio kTwoToThree = {2, 3, {{0, 0}, {0, 1}, {1, 1}}};

// Whether the columns that come next have these taps: from one group to the next the points move by
// a whole number of source columns, so that the taps of one group tell those of all others. Only
// for whole groups.
bool has_taps(const SimpleRatio& ratio, const QuarterRowShape& shape, QuarterColumns columns,
              int32_t samples) {
    if (int64_t{shape.src_columns} * ratio.dst != int64_t{shape.dst_columns} * ratio.src) {
        return false;
    }
    if (samples % ratio.dst != 0) return false;
    const int64_t first = columns.left.cell() - ratio.taps[0].left;
    const int64_t read = int64_t{samples} / ratio.dst * ratio.src;
    if (first < 0 || first > shape.src_columns - read) return false;
    for (int32_t i = 0; i < ratio.dst; ++i) {
        const Tap tap = columns.next();
        if (tap.left != first + ratio.taps[i].left) return false;
        if (tap.right != first + ratio.taps[i].right) return false;
    }
    return true;
}

// Source bytes that make so many destination bytes.
template <class Pattern>
constexpr ptrdiff_t src_bytes(ptrdiff_t dst_bytes) {
    return dst_bytes / Pattern::kRatio.dst * Pattern::kRatio.src;
}

// Whether a pattern fetches the next rows while it works on these.
template <class Pattern>
constexpr bool kFetches = true;

template <class Pattern, bool kPair>
OVRIN_ALWAYS_INLINE void fetch_next(const QuarterRows& rows, ptrdiff_t offset) {
    if (!kFetches<Pattern>) return;
    constexpr ptrdiff_t kCacheLine = 64;
    for (ptrdiff_t i = 0; i < src_bytes<Pattern>(Pattern::kDstBytes); i += kCacheLine) {
        __builtin_prefetch(rows.next_top + offset + i);
        if (kPair) __builtin_prefetch(rows.next_bottom + offset + i);
    }
}

// Bytes behind those that it makes which a pattern's store() may overwrite.
template <class Pattern>
constexpr int32_t kOverrun = 0;

// Makes the pattern's bytes in a copy. Of them the first `done` lie at dst already: storing them
// once more changes nothing, and copying a known number of bytes is no call; adding them would.
template <class Pattern, bool kPair, bool kAdd>
OVRIN_ALWAYS_INLINE void make_through_copy(uint8_t* dst, const uint8_t* top, const uint8_t* bottom,
                                           ptrdiff_t done) {
    alignas(64) uint8_t copy[Pattern::kDstBytes + kOverrun<Pattern>];
    Pattern::template store<kPair>(copy, top, bottom);
    if (!kAdd) {
        memcpy(dst, copy, Pattern::kDstBytes);
        return;
    }
    memset(copy, 0, static_cast<size_t>(done));
    for (int32_t i = 0; i < Pattern::kDstBytes; ++i)
        dst[i] = static_cast<uint8_t>(dst[i] + copy[i]);
}

// The last vectors end where the strip ends, and share some bytes with those before them.
template <class Pattern, bool kPair, bool kAdd>
void run_pattern(uint8_t* dst, const QuarterRows& source, const QuarterPlan& plan) {
    constexpr ptrdiff_t kStep = Pattern::kDstBytes;
    const QuarterRows rows = from_byte<kPair>(source, plan.first_byte);
    const ptrdiff_t bytes = ptrdiff_t{plan.samples} * Pattern::kSampleBytes;
    const ptrdiff_t last = bytes - kStep;
    ptrdiff_t done = 0;
    if (!kAdd) {
        for (ptrdiff_t offset = 0; done <= last - kOverrun<Pattern>; done += kStep) {
            fetch_next<Pattern, kPair>(rows, offset);
            Pattern::template store<kPair>(dst + done, rows.top + offset, rows.bottom + offset);
            offset += src_bytes<Pattern>(kStep);
        }
        if constexpr (kOverrun<Pattern> == 0) {
            if (done == bytes) return;
            const ptrdiff_t offset = src_bytes<Pattern>(last);
            return Pattern::template store<kPair>(dst + last, rows.top + offset,
                                                  rows.bottom + offset);
        }
    }
    for (; done < bytes; done += kStep) {
        const ptrdiff_t at = done < last ? done : last;
        const ptrdiff_t offset = src_bytes<Pattern>(at);
        fetch_next<Pattern, kPair>(rows, offset);
        make_through_copy<Pattern, kPair, kAdd>(dst + at, rows.top + offset, rows.bottom + offset,
                                                done - at);
    }
}

template <class Pattern>
constexpr QuarterKernels kPatternKernels = {run_pattern<Pattern, true, false>,
                                            run_pattern<Pattern, true, true>,
                                            run_pattern<Pattern, false, true>};

// Plans the strip when it follows the pattern, and returns the kernels; null when it does not, or
// is too short.
template <class Pattern>
const QuarterKernels* plan_pattern(QuarterPlan& plan, const QuarterRowShape& shape,
                                   QuarterColumns& columns, int32_t samples) {
    constexpr SimpleRatio kRatio = Pattern::kRatio;
    constexpr int32_t kSamples = Pattern::kDstBytes / Pattern::kSampleBytes;
    static_assert(kSamples % kRatio.dst == 0);
    if (shape.sample_bytes != Pattern::kSampleBytes || samples < kSamples) return nullptr;
    if (!has_taps(kRatio, shape, columns, samples)) return nullptr;
    plan.sample_bytes = shape.sample_bytes;
    plan.samples = samples;
    plan.first_byte = (columns.left.cell() - kRatio.taps[0].left) * shape.sample_bytes;
    columns.skip_cells(int64_t{samples} / kRatio.dst * kRatio.src);
    return &kPatternKernels<Pattern>;
}

// The same for the first of several patterns that it follows.
template <class... Patterns>
const QuarterKernels* plan_patterns(QuarterPlan& plan, const QuarterRowShape& shape,
                                    QuarterColumns& columns, int32_t samples) {
    const QuarterKernels* kernels = nullptr;
    (void)(... || ((kernels = plan_pattern<Patterns>(plan, shape, columns, samples)) != nullptr));
    return kernels;
}

}  // namespace

}  // namespace ovrin
