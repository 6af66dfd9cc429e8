// SPDX-License-Identifier: Apache-2.0
// How the vector sets plan a strip. Bytes of a target vector are gathered from a few whole source
// vectors, the windows, by byte shuffles; samples of any size are just bytes here. A window starts
// where the target vector's first tap lies, or earlier at the end of a row: no window reaches past
// the row, so kernels load whole vectors and have no border case.
//
// For inclusion by kernel files only: everything has internal linkage, because each of them is
// compiled for another instruction set.
#pragma once

#include <string.h>

#include "kernels/kernels.h"

namespace ovrin {

namespace {

// Bytes from a target vector's first tap to its last, at most.
int64_t widest_span(const QuarterRowShape& shape, int32_t vector_bytes) {
    const int64_t n = shape.sample_bytes;
    const int64_t s = shape.source_extent;
    // Samples that a vector touches; one of 3 bytes may begin and end inside a sample.
    const int64_t samples = vector_bytes % n == 0 ? vector_bytes / n : (vector_bytes - 2) / n + 2;
    const int64_t points = (samples - 1) * s + ((3 * s) >> 2) - (s >> 2);
    // Points `points` apart lie at most this many cells apart, wherever the first one lies.
    const int64_t cells = (points + shape.target_extent - 1) / shape.target_extent;
    return (cells + 1) * n;
}

// Windows of `window_bytes` that a target vector needs; 0 when they are too many, or longer
// together than the source row.
int32_t windows_needed(const QuarterRowShape& shape, int32_t vector_bytes, int32_t window_bytes,
                       int32_t most) {
    const int64_t windows = (widest_span(shape, vector_bytes) + window_bytes - 1) / window_bytes;
    const int64_t row_bytes = int64_t{shape.source_samples} * shape.sample_bytes;
    const bool fits = windows <= most && windows * window_bytes <= row_bytes;
    return fits && row_bytes <= INT32_MAX ? static_cast<int32_t>(windows) : 0;
}

// The taps of a target vector, as bytes from the start of its windows. Windows span at most 256
// bytes together.
struct WindowTaps {
    int32_t base;  // first byte of the windows within the row
    alignas(64) uint8_t left[64];
    alignas(64) uint8_t right[64];
};

// The vector of `bytes` that starts at byte `first` of the samples whose taps are given. What is
// behind `bytes` repeats some tap: vectors are computed whole and stored in part.
void locate_taps(WindowTaps& window, const Tap* taps, int32_t first, int32_t bytes,
                 const QuarterPlan& plan, int32_t span) {
    const int32_t n = plan.sample_bytes;
    const int32_t last_base = static_cast<int32_t>(plan.row_bytes) - span;
    int32_t sample = first / n;
    int32_t c = first % n;
    const int32_t base = n * taps[sample].left;
    window.base = base < last_base ? base : last_base;
    memset(window.left, 0, sizeof window.left);
    memset(window.right, 0, sizeof window.right);
    for (int32_t i = 0; i < bytes; ++sample, c = 0) {
        const int32_t left = n * taps[sample].left - window.base;
        const int32_t right = n * taps[sample].right - window.base;
        for (; c < n && i < bytes; ++c, ++i) {
            window.left[i] = static_cast<uint8_t>(left + c);
            window.right[i] = static_cast<uint8_t>(right + c);
        }
    }
}

}  // namespace

}  // namespace ovrin
