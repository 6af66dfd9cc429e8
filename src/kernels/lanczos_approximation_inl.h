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
// from the terms, and 7 u * 0.5 from the 0.5. Together 14 u * 255 V H + 3.5 u. Calling it 14.5 u *
// (255 V H + 1) leaves 0.5 u * 255 V H for products of errors and for the rounding of the chain and
// of this bound itself, which take less than a thousandth of that.
#pragma once

#include <string.h>

#include "kernels/lanczos_chain_inl.h"

namespace ovrin {

namespace {

constexpr int32_t kPixel = 4;         // components, most of them; what follows is made for those
constexpr int32_t kGroup = 4;         // pixels whose taps are weighed together
constexpr int32_t kBlock = 16;        // pixels, or as many bytes, whose rows are added together
constexpr int32_t kSpanPixels = 512;  // source pixels that are held as floats at once

// Distance from a boundary between two bytes within which the chain decides.
float uncertain_distance(double row_weights, double column_weights) {
    return static_cast<float>(14.5 / (1 << 24) * (255.0 * row_weights * column_weights + 1.0));
}

double sum_of_absolutes(const double* weights) {
    double sum = 0.0;
    for (int32_t i = 0; i < kTaps; ++i) sum += fabs(weights[i]);
    return sum;
}

// The components of some source pixels. One pixel more than the last tap's is read, with weight 0.
struct Span {
    alignas(64) float values[(kSpanPixels + 1) * kPixel];
};

int32_t padded_count(const LanczosStrip& strip) {
    return (strip.count + kBlock - 1) / kBlock * kBlock;
}

// Columns from `x` on, in whole groups, whose taps lie within one span. 0: not even a group's.
int32_t columns_in_span(const LanczosStrip& strip, int32_t x) {
    const int64_t end = int64_t{strip.index[x]} + kSpanPixels - kTaps;
    int32_t count = 0;
    while (x + count < padded_count(strip) && strip.index[x + count + kGroup - 1] <= end)
        count += kGroup;
    return count;
}

bool spans_hold_groups(const LanczosStrip& strip) {
    for (int32_t x = 0; x < padded_count(strip); x += kGroup) {
        if (columns_in_span(strip, x) == 0) return false;
    }
    return true;
}

// Completes the last block with columns of weight 0.
void pad_columns(LanczosStrip& strip) {
    for (int32_t x = strip.count; x % kBlock != 0; ++x) {
        strip.index[x] = strip.index[x - 1];
        for (float& weight : strip.weights[x]) weight = 0.0F;
    }
}

// Sums of components behind the last, up to a whole block.
void clear_last_sums(LanczosStrip& strip) {
    constexpr int32_t kBlockFloats = kBlock * kPixel;
    for (float* sums : strip.sums) {
        for (int32_t i = padded_count(strip) * strip.src_components; i % kBlockFloats != 0; ++i) {
            sums[i] = 0.0F;
        }
    }
}

void prepare(LanczosStrip& strip) {
    strip.has_small_weights = false;
    if (strip.src_components != strip.dst_components || strip.src_components > kPixel) return;
    strip.largest_weights = 0.0;
    for (int32_t x = 0; x < strip.count; ++x) {
        const double* weights = strip.column_weights + int64_t{x} * kTaps;
        const double sum = sum_of_absolutes(weights);
        if (!(sum <= kSmallWeights)) return;
        if (sum > strip.largest_weights) strip.largest_weights = sum;
        for (int32_t i = 0; i < kTaps; ++i) strip.weights[x][i] = static_cast<float>(weights[i]);
        strip.weights[x][kTaps] = 0.0F;
    }
    pad_columns(strip);
    clear_last_sums(strip);
    for (int32_t& row : strip.held_rows) row = -1;
    strip.has_small_weights = spans_hold_groups(strip);
}

// Sums of one source row of pixels with less than four components.
template <int N>
void sum_narrow_row(float* sums, const LanczosStrip& strip, const uint8_t* src) {
    Span span;
    for (int32_t x = 0; x < padded_count(strip);) {
        const int32_t end = x + columns_in_span(strip, x);
        const int32_t first = strip.index[x];
        const int32_t floats = (strip.index[end - 1] - first + kTaps) * N;
        const uint8_t* bytes = src + int64_t{first} * N;
        for (int32_t i = 0; i < floats; ++i) span.values[i] = bytes[i];
        for (; x < end; ++x) {
            const float* weights = strip.weights[x];
            for (int32_t c = 0; c < N; ++c) {
                const float* taps = span.values + (strip.index[x] - first) * N + c;
                float even = weights[0] * taps[0];
                float odd = weights[1] * taps[N];
                for (int32_t i = 2; i < kTaps; i += 2) {
                    even = fmaf(weights[i], taps[i * N], even);
                    if (i + 1 < kTaps) odd = fmaf(weights[i + 1], taps[(i + 1) * N], odd);
                }
                sums[x * N + c] = even + odd;
            }
        }
    }
}

// Sums of one source row of pixels with four components.
template <class Set>
void sum_pixel_row(float* sums, const LanczosStrip& strip, const uint8_t* src) {
    Span span;
    for (int32_t x = 0; x < padded_count(strip);) {
        const int32_t end = x + columns_in_span(strip, x);
        const int32_t first = strip.index[x];
        const int32_t floats = (strip.index[end - 1] - first + kTaps) * kPixel;
        Set::convert(span.values, src + int64_t{first} * kPixel, floats);
        for (int32_t i = 0; i < kPixel; ++i) span.values[floats + i] = 0.0F;
        for (; x < end; x += kGroup) {
            Set::sum_group(sums + x * kPixel, span.values, strip, x, first);
        }
    }
}

template <class Set>
void sum_source_row(float* sums, const LanczosStrip& strip, const uint8_t* src) {
    switch (strip.src_components) {
        case 1:
            return sum_narrow_row<1>(sums, strip, src);
        case 2:
            return sum_narrow_row<2>(sums, strip, src);
        case 3:
            return sum_narrow_row<3>(sums, strip, src);
        default:
            return sum_pixel_row<Set>(sums, strip, src);
    }
}

// The chains of four neighbouring bytes, which belong to several pixels.
void run_narrow_chains(const LanczosStrip& strip, const LanczosRow& row, int32_t first) {
    const int32_t n = strip.src_components;
    for (int32_t i = first; i < first + kPixel && i < strip.count * n; ++i) {
        const double* weights = strip.column_weights + int64_t{i / n} * kTaps;
        const int64_t tap = int64_t{strip.index[i / n]} * n + i % n;
        row.dst[i] = rounded(sum_of_taps(row, weights, tap, n));
    }
}

// Adds rows block by block. Where pixels are uncertain often it is hard to predict which, so a
// block's are appended without branches. Returns the number of uncertain pixels. Where pixels have
// less components, four neighbouring bytes take their place.
template <class Set>
int32_t add_rows(const LanczosStrip& strip, const LanczosRow& row, const typename Set::Sums& sums,
                 int32_t* uncertain) {
    const int32_t bytes = strip.count * strip.dst_components;
    int32_t found = 0;
    for (int32_t x = 0; x * kPixel < bytes; x += kBlock) {
        uint8_t* dst = row.dst + x * kPixel;
        const int32_t left = bytes - x * kPixel;
        uint64_t near;
        if (left >= kBlock * kPixel) {
            near = sums.add_block(dst, x);
        } else {
            uint8_t copy[kBlock * kPixel];
            near = sums.add_block(copy, x);
            memcpy(dst, copy, static_cast<size_t>(left));
        }
        if (near == 0) continue;
        for (int32_t i = x; i < x + kBlock; ++i, near >>= kPixel) {
            uncertain[found] = i;
            found += (near & 0xF) != 0 ? 1 : 0;
        }
    }
    return found;
}

// A set supplies:
//   convert      the bytes as floats; there are at least 28
//   sum_group    a group's pixels: seven taps each, weighted by column
//   Sums         the sums of seven source rows, and their weights
//     add_block  a block's bytes, and four bits for each pixel, of which any is set if a component
//                lies within the distance of another byte
//   run_chains   some pixels, exactly
template <class Set>
void filter_row(LanczosStrip& strip, const LanczosRow& row) {
    const double row_weights = sum_of_absolutes(row.row_weights);
    if (!strip.has_small_weights || !(row_weights <= kSmallWeights)) {
        filter_by_chains(strip, row);
        return;
    }
    const float* rows[kTaps];
    for (int32_t r = 0; r < kTaps; ++r) {
        const int32_t source_row = row.source_rows[r];
        const int32_t slot = source_row % kTaps;
        if (strip.held_rows[slot] != source_row) {
            sum_source_row<Set>(strip.sums[slot], strip, row.taps[r]);
            strip.held_rows[slot] = source_row;
        }
        rows[r] = strip.sums[slot];
    }
    const typename Set::Sums sums(rows, row.row_weights,
                                  uncertain_distance(row_weights, strip.largest_weights));
    int32_t uncertain[kLanczosColumns];
    const int32_t count = add_rows<Set>(strip, row, sums, uncertain);
    if (count == 0) return;
    if (strip.dst_components == kPixel) {
        Set::run_chains(strip, row, uncertain, count);
    } else {
        for (int32_t i = 0; i < count; ++i) run_narrow_chains(strip, row, uncertain[i] * kPixel);
    }
}

}  // namespace

}  // namespace ovrin
