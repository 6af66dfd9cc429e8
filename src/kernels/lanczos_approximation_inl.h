// SPDX-License-Identifier: Apache-2.0
// How vector kernels decide the bytes of a Lanczos row without computing every one exactly.
//
// The result is defined by a chain of 49 double-precision operations per component. For up to four
// components a pixel is first computed in single precision, columns before rows: the sums of seven
// taps within a source row are kept for all result rows that need them. Where the distance from the
// exact result cannot matter, that decides the byte; elsewhere the chain does, for all such pixels
// of a row together.
//
// How far the two lie apart, with u = 2^-24, and V and H the sums of the absolute row and column
// weights. Each term of a sum is off by u of its size for every rounding that it goes through. In a
// source row these are the rounding of the weight to single precision and at most five operations,
// however a set arranges them; bytes of the same weight may be added before, which is exact. Such a
// sum lies within 6 u * 255 H of the exact one. The seven row sums are added to 0.5 by seven fused
// operations, with rounded weights: at most 8 u * 255 V H more from the terms, and 7 u * 0.5 from
// the 0.5. Together 14 u * 255 V H + 3.5 u. A set may begin with 0 instead and measure from whole
// numbers: then 0.5 less the distance is off by u / 2, and nothing else by more. Calling it
// 14.5 u * (255 V H + 1) leaves 0.5 u * 255 V H for products of errors and for the rounding of the
// chain and of this bound itself, which take less than a thousandth of that.
#pragma once

#include <string.h>

#include "kernels/lanczos_chain_inl.h"

namespace ovrin {

namespace {

constexpr int32_t kPixel = 4;         // components, most of them; what follows is made for those
constexpr int32_t kGroup = 4;         // pixels whose taps are weighed together
constexpr int32_t kBlock = 16;        // pixels, or as many bytes, whose rows are added together
constexpr int32_t kSpanPixels = 512;  // source pixels that are held as floats at once

// Sums of absolute weights up to this leave room for the approximation. Those of the kernel are
// 1.55 at most, others may come from a caller.
constexpr double kSmallWeights = 1.9;

// Distance from a boundary between two bytes within which the chain decides.
float uncertain_distance(double row_weights, double column_weights) {
    return static_cast<float>(14.5 / (1 << 24) * (255.0 * row_weights * column_weights + 1.0));
}

double sum_of_absolutes(const double* weights) {
    double sum = 0.0;
    for (int32_t i = 0; i < kLanczosTaps; ++i) sum += fabs(weights[i]);
    return sum;
}

// The components of some source pixels. One pixel more than the last tap's is read, with weight 0.
struct Span {
    alignas(64) float values[(kSpanPixels + 1) * kPixel];
};

int32_t padded_count(const LanczosStripPlan& plan) {
    return (plan.columns->count + kBlock - 1) / kBlock * kBlock;
}

// Columns from `x` on, in whole groups, whose taps lie within one span. 0: not even a group's.
int32_t columns_in_span(const LanczosStripPlan& plan, int32_t x) {
    const int64_t end = int64_t{plan.index[x]} + kSpanPixels - kLanczosTaps;
    const int32_t padded = padded_count(plan);
    int32_t count = 0;
    while (x + count < padded && plan.index[x + count + kGroup - 1] <= end) count += kGroup;
    return count;
}

bool spans_hold_groups(const LanczosStripPlan& plan) {
    for (int32_t x = 0; x < padded_count(plan); x += kGroup) {
        if (columns_in_span(plan, x) == 0) return false;
    }
    return true;
}

// Rounds the weights to single precision, and completes the last block with columns of weight 0.
void copy_columns(LanczosStripPlan& plan) {
    const LanczosColumns& columns = *plan.columns;
    for (int32_t x = 0; x < columns.count; ++x) {
        const double* weights = columns.weights + int64_t{x} * kLanczosTaps;
        plan.index[x] = columns.index[x];
        for (int32_t i = 0; i < kLanczosTaps; ++i) {
            plan.weights[x][i] = static_cast<float>(weights[i]);
        }
        plan.weights[x][kLanczosTaps] = 0.0F;
    }
    for (int32_t x = columns.count; x < padded_count(plan); ++x) {
        plan.index[x] = plan.index[x - 1];
        for (float& weight : plan.weights[x]) weight = 0.0F;
    }
}

// False: the approximation is not made for such columns.
bool plan_approximation(LanczosStripPlan& plan, const LanczosColumns& columns) {
    plan.columns = &columns;
    if (columns.src_components != columns.dst_components) return false;
    if (columns.src_components > kPixel) return false;
    plan.max_weights = 0.0;
    for (int32_t x = 0; x < columns.count; ++x) {
        const double sum = sum_of_absolutes(columns.weights + int64_t{x} * kLanczosTaps);
        if (!(sum <= kSmallWeights)) return false;
        if (sum > plan.max_weights) plan.max_weights = sum;
    }
    copy_columns(plan);
    return spans_hold_groups(plan);
}

// Rounded once or twice: a sum whose first product is rounded anyway goes through as many roundings
// either way.
float add_product(float sum, float weight, float tap) {
#if defined(__wasm__)
    return sum + weight * tap;
#else
    return fmaf(weight, tap, sum);
#endif
}

// Sums of one source row of pixels with less than four components.
template <int N>
void sum_narrow_row(float* sums, const LanczosStripPlan& plan, const uint8_t* src) {
    Span span;
    const int32_t padded = padded_count(plan);
    for (int32_t x = 0; x < padded;) {
        const int32_t end = x + columns_in_span(plan, x);
        const int32_t first = plan.index[x];
        const int32_t floats = (plan.index[end - 1] - first + kLanczosTaps) * N;
        const uint8_t* bytes = src + int64_t{first} * N;
        for (int32_t i = 0; i < floats; ++i) span.values[i] = bytes[i];
        for (; x < end; ++x) {
            const float* weights = plan.weights[x];
            for (int32_t c = 0; c < N; ++c) {
                const float* taps = span.values + (plan.index[x] - first) * N + c;
                float even = weights[0] * taps[0];
                float odd = weights[1] * taps[N];
                for (int32_t i = 2; i < kLanczosTaps; i += 2) {
                    even = add_product(even, weights[i], taps[i * N]);
                    if (i + 1 < kLanczosTaps)
                        odd = add_product(odd, weights[i + 1], taps[(i + 1) * N]);
                }
                sums[x * N + c] = even + odd;
            }
        }
    }
    // Rows are added block by block.
    for (int32_t i = padded * N; i % (kBlock * kPixel) != 0; ++i) sums[i] = 0.0F;
}

// The bytes as floats; there are at least 28.
template <class Set>
void convert(float* floats, const uint8_t* bytes, int32_t count) {
    const int32_t last = count - Set::kConverted;
    for (int32_t i = 0; i < last; i += Set::kConverted) Set::convert(floats + i, bytes + i);
    Set::convert(floats + last, bytes + last);
}

// Sums of one source row of pixels with four components.
template <class Set>
void sum_pixel_row(float* sums, const LanczosStripPlan& plan, const uint8_t* src) {
    Span span;
    const int32_t padded = padded_count(plan);
    for (int32_t x = 0; x < padded;) {
        const int32_t end = x + columns_in_span(plan, x);
        const int32_t first = plan.index[x];
        const int32_t floats = (plan.index[end - 1] - first + kLanczosTaps) * kPixel;
        convert<Set>(span.values, src + int64_t{first} * kPixel, floats);
        for (int32_t i = 0; i < kPixel; ++i) span.values[floats + i] = 0.0F;
        for (; x < end; x += kGroup) {
            Set::sum_group(sums + x * kPixel, span.values, plan, x, first);
        }
    }
}

template <class Set>
void sum_source_row(float* sums, const LanczosStripPlan& plan, const uint8_t* src) {
    switch (plan.columns->src_components) {
        case 1:
            return sum_narrow_row<1>(sums, plan, src);
        case 2:
            return sum_narrow_row<2>(sums, plan, src);
        case 3:
            return sum_narrow_row<3>(sums, plan, src);
        default:
            if constexpr (Set::kMirrors) {
                if (plan.mirrored) return Set::sum_mirrored_row(sums, plan, src);
            }
            return sum_pixel_row<Set>(sums, plan, src);
    }
}

// The chain of one byte of the row.
void run_chain(const LanczosColumns& columns, const LanczosRow& row, int32_t byte) {
    const int32_t n = columns.dst_components;
    const int32_t x = byte / n;
    const int64_t first = int64_t{columns.index[x]} * n + byte % n;
    const double* weights = columns.weights + int64_t{x} * kLanczosTaps;
    row.dst[byte] = rounded(sum_of_taps(row, weights, first, n));
}

// The chains of some bytes, four to each of the set's vectors and two of those side by side to hide
// the latency. The last byte may be computed several times.
constexpr int32_t kLanes = 4;
template <class ChainsOfFour>
void run_chains_of_four(const LanczosColumns& columns, const LanczosRow& row, const uint16_t* bytes,
                        int32_t count) {
    for (int32_t i = 0; i < count; i += 2 * kLanes) {
        uint16_t some[2 * kLanes];
        for (int32_t k = 0; k < 2 * kLanes; ++k) {
            some[k] = bytes[i + k < count ? i + k : count - 1];
        }
        ChainsOfFour first(columns, some);
        ChainsOfFour second(columns, some + kLanes);
        for (int32_t r = 0; r < kLanczosTaps; ++r) {
            first.add(row.taps[r], row.weights[r]);
            second.add(row.taps[r], row.weights[r]);
        }
        first.store(row.dst, some);
        second.store(row.dst, some + kLanes);
    }
}

// The bytes of a row whose chains are to be run.
struct UncertainBytes {
    int32_t count = 0;
    uint16_t list[kLanczosColumns * kPixel];

    // Adds those of a block, which begins with byte `first`, whose bits are set. Where there are
    // any, it is hard to predict how many: so the first few are added without branches.
    void add(int32_t first, uint64_t bits) {
        if (bits == 0) return;
        for (int32_t i = 0; i < kFew; ++i) add_lowest(first, bits);
        while (bits != 0) add_lowest(first, bits);
    }

private:
    static constexpr int32_t kFew = 4;

    // Without any, the entry counts for nothing.
    void add_lowest(int32_t first, uint64_t& bits) {
        constexpr uint64_t kTop = uint64_t{1} << 63;
        list[count] = static_cast<uint16_t>(first + __builtin_ctzll(bits | kTop));
        count += bits != 0 ? 1 : 0;
        bits &= bits - 1;
    }
};

// Adds rows block by block.
template <class Rows>
void add_rows(const LanczosColumns& columns, const LanczosRow& row, const Rows& rows,
              UncertainBytes& uncertain) {
    constexpr int32_t kBlockBytes = kBlock * kPixel;
    const int32_t bytes = columns.count * columns.dst_components;
    for (int32_t i = 0; i < bytes; i += kBlockBytes) {
        uint8_t* dst = row.dst + i;
        const int32_t left = bytes - i;
        if (left >= kBlockBytes) {
            uncertain.add(i, rows.add_block(dst, i));
        } else {
            // What the block has past the end is far from another byte.
            uint8_t last[kBlockBytes];
            uncertain.add(i, rows.add_block(last, i));
            memcpy(dst, last, static_cast<size_t>(left));
        }
    }
}

// A set supplies:
//   convert       kConverted bytes as floats
//   sum_group     a group's pixels: their taps, weighed by column
//   kMirrors      whether it sums pixels of mirrored columns in another way, by sum_mirrored_row
//   WeightedRows  the sums of all source rows, and their weights
//     add_block     a block's bytes, and a bit for each, set if it lies within the distance of
//                   another byte
//   run_chains    some bytes of pixels, exactly
template <class Set>
void filter_row(const LanczosRow& row, const LanczosStripPlan& plan, LanczosSums& sums) {
    const double row_weights = sum_of_absolutes(row.weights);
    if (!(row_weights <= kSmallWeights)) return filter_by_chains(row, plan, sums);
    const float* rows[kLanczosTaps];
    for (int32_t r = 0; r < kLanczosTaps; ++r) {
        const int32_t source_row = row.source_rows[r];
        const int32_t slot = source_row % kLanczosTaps;
        if (sums.rows[slot] != source_row) {
            sum_source_row<Set>(sums.values[slot], plan, row.taps[r]);
            sums.rows[slot] = source_row;
        }
        rows[r] = sums.values[slot];
    }
    const LanczosColumns& columns = *plan.columns;
    const typename Set::WeightedRows weighted(rows, row.weights,
                                              uncertain_distance(row_weights, plan.max_weights));
    UncertainBytes uncertain;
    add_rows(columns, row, weighted, uncertain);
    if (columns.dst_components == kPixel) {
        Set::run_chains(columns, row, uncertain.list, uncertain.count);
    } else {
        for (int32_t i = 0; i < uncertain.count; ++i) run_chain(columns, row, uncertain.list[i]);
    }
}

template <class Set>
FilterLanczos* plan_filter(LanczosStripPlan& plan, const LanczosColumns& columns) {
    return plan_approximation(plan, columns) ? filter_row<Set> : filter_by_chains;
}

}  // namespace

}  // namespace ovrin
