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
// however a set arranges them: such a sum lies within 6 u * 255 H of the exact one. The seven row
// sums are added to 0.5 by seven fused operations, with rounded weights: at most 8 u * 255 V H more
// from the terms, and 7 u * 0.5 from the 0.5. Together 14 u * 255 V H + 3.5 u. A set may begin with
// 0 instead and measure from whole numbers: then 0.5 less the distance is off by u / 2, and nothing
// else by more. Calling it 14.5 u * (255 V H + 1) leaves 0.5 u * 255 V H for products of errors and
// for the rounding of the chain and of this bound itself, which take less than a thousandth of
// that.
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
            return sum_pixel_row<Set>(sums, plan, src);
    }
}

// The chains of four neighbouring bytes, which belong to several pixels.
void run_narrow_chains(const LanczosColumns& columns, const LanczosRow& row, int32_t first) {
    const int32_t n = columns.src_components;
    for (int32_t i = first; i < first + kPixel && i < columns.count * n; ++i) {
        const double* weights = columns.weights + int64_t{i / n} * kLanczosTaps;
        const int64_t tap = int64_t{columns.index[i / n]} * n + i % n;
        row.dst[i] = rounded(sum_of_taps(row, weights, tap, n));
    }
}

// Adds rows block by block. Where pixels are uncertain often it is hard to predict which, so a
// block's are appended without branches. Returns the number of uncertain pixels. Where pixels have
// less components, four neighbouring bytes take their place.
template <class Rows>
int32_t add_rows(const LanczosColumns& columns, const LanczosRow& row, const Rows& rows,
                 uint8_t* uncertain) {
    const int32_t bytes = columns.count * columns.dst_components;
    int32_t found = 0;
    for (int32_t x = 0; x * kPixel < bytes; x += kBlock) {
        uint8_t* dst = row.dst + x * kPixel;
        const int32_t left = bytes - x * kPixel;
        uint64_t near;
        if (left >= kBlock * kPixel) {
            near = rows.add_block(dst, x);
        } else {
            uint8_t last[kBlock * kPixel];
            near = rows.add_block(last, x);
            memcpy(dst, last, static_cast<size_t>(left));
        }
        if (near == 0) continue;
        for (int32_t i = x; i < x + kBlock; ++i, near >>= kPixel) {
            uncertain[found] = static_cast<uint8_t>(i);
            found += (near & 0xF) != 0 ? 1 : 0;
        }
    }
    return found;
}

// A set supplies:
//   convert       kConverted bytes as floats
//   sum_group     a group's pixels: their taps, weighed by column
//   WeightedRows  the sums of all source rows, and their weights
//     add_block     a block's bytes, and four bits for each pixel, of which any is set if a
//                   component lies within the distance of another byte
//   run_chains    some pixels, exactly
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
    uint8_t uncertain[kLanczosColumns];
    static_assert(kLanczosColumns <= 256, "a byte numbers a pixel of a strip");
    const int32_t count = add_rows(columns, row, weighted, uncertain);
    if (count == 0) return;
    if (columns.dst_components == kPixel) {
        Set::run_chains(columns, row, uncertain, count);
    } else {
        for (int32_t i = 0; i < count; ++i) run_narrow_chains(columns, row, uncertain[i] * kPixel);
    }
}

template <class Set>
FilterLanczos* plan_filter(LanczosStripPlan& plan, const LanczosColumns& columns) {
    return plan_approximation(plan, columns) ? filter_row<Set> : filter_by_chains;
}

}  // namespace

}  // namespace ovrin
