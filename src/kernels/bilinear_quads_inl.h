// SPDX-License-Identifier: Apache-2.0
// How the vector sets plan a bilinear strip. Four destination bytes, a quad, take their eight
// source bytes from one window of each row by a byte shuffle that also widens them: left and right
// sample of each byte lie side by side as 16-bit numbers, ready to be multiplied by a pair of
// weights. Sets with wide shuffles serve several quads from one window.
#pragma once

#include <string.h>

#include "kernels/bilinear.h"
#include "kernels/prefetch.h"

namespace ovrin {

namespace {

constexpr int32_t kQuadBytes = 4;
constexpr uint8_t kZeroByte = 0x80;  // a shuffle gives 0 for it

// Two 16-bit weights of a destination byte: the left sample's in the low half.
int32_t weight_pair(int32_t weight) {
    return static_cast<int32_t>(static_cast<uint32_t>(weight) << 16 |
                                (static_cast<uint32_t>(kBilinearOne - weight) & 0xFFFF));
}

int32_t rounded_up(int32_t bytes, int32_t step) {
    return (bytes + step - 1) / step * step;
}

// Where the windows of a strip begin. They stay between the first and the last byte that the
// columns name, whose right samples lie `to_right` samples after their left ones.
template <int N>
class WindowBases {
public:
    WindowBases(const BilinearColumns& columns, int32_t to_right, int32_t window_bytes)
        : columns_(columns),
          last_(N * (int64_t{columns.index[columns.count - 1]} + to_right + 1) - window_bytes) {}

    bool fit() const { return last_ <= INT32_MAX && last_ >= int64_t{N} * columns_.index[0]; }

    // For a window whose first sample is that of `column`; columns past the last one take the last.
    int64_t base(int32_t column) const {
        if (column >= columns_.count) return last_;
        const int64_t first = int64_t{N} * columns_.index[column];
        return first < last_ ? first : last_;
    }

private:
    const BilinearColumns& columns_;
    const int64_t last_;
};

// How a strip is to be cut: the size of a window, how many quads share it, and how many quads the
// kernel takes in one step.
struct QuadShape {
    int32_t window_bytes;
    int32_t window_quads;
    int32_t step_quads;
};

// Plans a quad whose window begins `base` bytes into a row. False: the window does not reach.
template <int N>
bool plan_quad(BilinearPlan& plan, int32_t quad, int64_t base, int32_t window_bytes) {
    const BilinearColumns& columns = *plan.columns;
    const int32_t to_right = N * columns.to_right;
    for (int32_t i = 0; i < kQuadBytes; ++i) {
        const int32_t wanted = quad * kQuadBytes + i;
        const int32_t byte = wanted < columns.count * N ? wanted : columns.count * N - 1;
        const int64_t left = int64_t{N} * columns.index[byte / N] + byte % N - base;
        if (left < 0 || left + to_right >= window_bytes) return false;
        uint8_t* shuffle = plan.shuffles[quad] + i * 4;
        shuffle[0] = static_cast<uint8_t>(left);
        shuffle[1] = kZeroByte;
        shuffle[2] = static_cast<uint8_t>(left + to_right);
        shuffle[3] = kZeroByte;
        plan.weight_pairs[quad][i] = weight_pair(columns.weight[byte / N]);
    }
    plan.windows[quad] = static_cast<int32_t>(base);
    return true;
}

template <int N>
bool plan_quads_of(BilinearPlan& plan, const BilinearColumns& columns, const QuadShape& shape) {
    plan.columns = &columns;
    const WindowBases<N> windows(columns, columns.to_right, shape.window_bytes);
    if (!windows.fit()) return false;
    const int32_t quads = rounded_up(columns.count * N, shape.step_quads * kQuadBytes) / kQuadBytes;
    for (int32_t quad = 0; quad < quads; ++quad) {
        const int32_t first_quad = quad - quad % shape.window_quads;
        const int64_t base = windows.base(first_quad * kQuadBytes / N);
        if (!plan_quad<N>(plan, quad, base, shape.window_bytes)) return false;
    }
    return true;
}

// Plans whole steps; quads past the last byte repeat it. False: windows do not fit into the row, or
// quads do not fit into them, and there is no plan.
bool plan_quads(BilinearPlan& plan, const BilinearColumns& columns, const QuadShape& shape) {
    if (columns.sample_bytes == 1) return plan_quads_of<1>(plan, columns, shape);
    if (columns.sample_bytes == 2) return plan_quads_of<2>(plan, columns, shape);
    return plan_quads_of<4>(plan, columns, shape);
}

template <int N>
bool plan_groups_of(BilinearPlan& plan, const BilinearColumns& columns, int32_t group_bytes,
                    int32_t window_bytes) {
    plan.columns = &columns;
    const WindowBases<N> windows(columns, 0, window_bytes);
    if (!windows.fit()) return false;
    const int32_t bytes = columns.count * N;
    uint8_t* shuffle = plan.shuffles[0];
    for (int32_t i = 0; i < bytes; i += group_bytes) {
        const int64_t base = windows.base(i / N);
        plan.windows[i / group_bytes] = static_cast<int32_t>(base);
        for (int32_t k = i; k < i + group_bytes; ++k) {
            const int32_t byte = k < bytes ? k : bytes - 1;
            const int64_t from = int64_t{N} * columns.index[byte / N] + byte % N - base;
            if (from < 0 || from >= window_bytes) return false;
            shuffle[k] = static_cast<uint8_t>(from);
        }
    }
    return true;
}

// Plans copies of groups of bytes by a byte shuffle of a window each, the shuffles one after the
// other; bytes past the last one repeat it. False: windows do not fit into the row, or groups do
// not fit into them, and there is no plan.
bool plan_groups(BilinearPlan& plan, const BilinearColumns& columns, int32_t group_bytes,
                 int32_t window_bytes) {
    if (columns.sample_bytes == 1) {
        return plan_groups_of<1>(plan, columns, group_bytes, window_bytes);
    }
    if (columns.sample_bytes == 2) {
        return plan_groups_of<2>(plan, columns, group_bytes, window_bytes);
    }
    return plan_groups_of<4>(plan, columns, group_bytes, window_bytes);
}

// Calls copy_group(dst, window, shuffle) for every group, the last of them into a buffer if it is
// not whole.
template <int kGroupBytes, class CopyGroup>
void copy_groups(uint8_t* dst, const uint8_t* row, const BilinearPlan& plan,
                 const CopyGroup& copy_group) {
    const int32_t bytes = plan.bytes();
    const uint8_t* shuffle = plan.shuffles[0];
    const int32_t* window = plan.windows;
    int32_t i = 0;
    for (; i + kGroupBytes <= bytes; i += kGroupBytes) {
        copy_group(dst + i, row + *window++, shuffle + i);
    }
    if (i < bytes) {
        uint8_t last[kGroupBytes];
        copy_group(last, row + *window, shuffle + i);
        memcpy(dst + i, last, static_cast<size_t>(bytes - i));
    }
}

// Fetches rows line by line while something else goes on in so many steps: asked for all at once,
// lines would wait for each other, and the processor for them.
class SteadyFetch {
public:
    SteadyFetch(const BilinearNext& next, int32_t steps)
        : next_(next), step_bytes_(next.bytes / (steps > 0 ? steps : 1)) {}

    OVRIN_ALWAYS_INLINE void step() {
        wanted_ += step_bytes_;
        for (; fetched_ < wanted_; fetched_ += kCacheLine) {
            for (const uint8_t* row : next_.rows) __builtin_prefetch(row + fetched_);
        }
    }

private:
    const BilinearNext next_;
    const int64_t step_bytes_;
    int64_t wanted_ = 0;
    int64_t fetched_ = 0;
};

}  // namespace

}  // namespace ovrin
