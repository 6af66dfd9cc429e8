// SPDX-License-Identifier: Apache-2.0
// The limit: no way to compute a picture is faster than fetching what it is computed from and
// writing the result.
#include <string.h>

#include "contender.h"

namespace bench {

namespace {

constexpr uintptr_t kLineBytes = 64;

// Half a cache line: the widest vector that compilers keep in registers without being told the
// exact processor.
struct Line {
    using Half = uint64_t __attribute__((vector_size(kLineBytes / 2), may_alias));
    Half low;
    Half high;
};

#if defined(__x86_64__)
#define WIDE_VECTORS __attribute__((target_clones("avx2", "default")))
#else
#define WIDE_VECTORS
#endif

// The cache lines that hold bytes of a row.
struct Lines {
    const Line* first;
    size_t count;
};

Lines lines_of(const uint8_t* row, size_t bytes) {
    const uintptr_t inside = reinterpret_cast<uintptr_t>(row) % kLineBytes;
    return {reinterpret_cast<const Line*>(row - inside),
            (inside + bytes + kLineBytes - 1) / kLineBytes};
}

// Loads a row's cache lines, and has those of the next row fetched: the processor's own
// prefetching, which stops at pages and misses short rows, gets half as far.
WIDE_VECTORS void read_lines(Lines row, const uint8_t* next) {
    Line::Half low = {}, high = {};
    for (size_t i = 0; i < row.count; ++i) {
        __builtin_prefetch(next + i * kLineBytes);
        low |= row.first[i].low;
        high |= row.first[i].high;
    }
    const Line::Half all = low | high;
    // Somebody takes the value, so the compiler computes it.
    __asm__ volatile("" : : "m"(all));
}

// The same for two rows side by side. Where one begins elsewhere in a line than the other, it may
// take a line more, which is left out.
WIDE_VECTORS void read_lines_of_two(Lines a, Lines b, const uint8_t* next_a,
                                    const uint8_t* next_b) {
    Line::Half low = {}, high = {};
    const size_t count = a.count < b.count ? a.count : b.count;
    for (size_t i = 0; i < count; ++i) {
        __builtin_prefetch(next_a + i * kLineBytes);
        __builtin_prefetch(next_b + i * kLineBytes);
        low |= a.first[i].low | b.first[i].low;
        high |= a.first[i].high | b.first[i].high;
    }
    const Line::Half all = low | high;
    __asm__ volatile("" : : "m"(all));
}

// The source rows of target row j, of S rows scaled to D, in ascending order.
std::vector<int32_t> rows_of(Sampling sampling, int64_t j, int64_t s, int64_t d) {
    const auto row = [&](int64_t scaled) {
        const int64_t r = scaled / d;
        return static_cast<int32_t>(r < s ? r : s - 1);
    };
    switch (sampling) {
        case Sampling::kQuarter:
            return {row(j * s + (s >> 2)), row(j * s + ((3 * s) >> 2))};
        case Sampling::kPoint:
            return {row(j * s + s / 2)};
        case Sampling::kBilinear:
            return {row(j * s), row(j * s + d)};
        case Sampling::kEveryRow:
            break;
    }
    std::vector<int32_t> rows;
    for (int32_t r = row(j * s); r <= row((j + 1) * s - 1); ++r) rows.push_back(r);
    return rows;
}

// The distinct source rows of a plane, and how many of them the target rows up to each one touch.
struct PlaneRows {
    std::vector<int32_t> rows;
    std::vector<size_t> touched;
};

PlaneRows sampled_rows(Sampling sampling, int32_t s, int32_t d) {
    PlaneRows plane;
    for (int32_t j = 0; j < d; ++j) {
        for (const int32_t row : rows_of(sampling, j, s, d)) {
            if (plane.rows.empty() || row > plane.rows.back()) plane.rows.push_back(row);
        }
        plane.touched.push_back(plane.rows.size());
    }
    return plane;
}

enum class Order { kOneByOne, kSideBySide };

// Reads the rows from the `read`th to before the `until`th.
void read_rows(const Plane& src, const std::vector<int32_t>& rows, size_t read, size_t until,
               Order order) {
    const auto row = [&](size_t i) { return src.row(rows[i < rows.size() ? i : rows.size() - 1]); };
    const auto lines = [&](size_t i) { return lines_of(row(i), src.row_bytes()); };
    for (; order == Order::kSideBySide && read + 2 <= until; read += 2) {
        read_lines_of_two(lines(read), lines(read + 1), row(read + 2), row(read + 3));
    }
    for (; read < until; ++read) read_lines(lines(read), row(read + 1));
}

// Target rows are written in step with the reading; the rest of a canvas comes last.
void stream_plane(const Plane& src, const Plane& canvas, const PlaneRows& plane, Order order) {
    size_t read = 0;
    for (size_t y = 0; y < static_cast<size_t>(canvas.size.height); ++y) {
        const size_t until = y < plane.touched.size() ? plane.touched[y] : read;
        read_rows(src, plane.rows, read, until, order);
        read = until;
        memset(canvas.row(static_cast<int32_t>(y)), 0, canvas.row_bytes());
    }
}

}  // namespace

std::vector<Contender> limits_of(const Job& job, Sampling sampling) {
    const Picture src = picture_at(nullptr, job.layout, job.src);
    const Picture dst = picture_at(nullptr, job.layout, job.dst);
    std::vector<PlaneRows> rows;
    for (size_t p = 0; p < static_cast<size_t>(src.plane_count); ++p) {
        rows.push_back(
            sampled_rows(sampling, src.planes[p].size.height, dst.planes[p].size.height));
    }
    const auto limit = [&](const char* name, Order order) -> Contender {
        return {Role::kLimit, name, [rows, order](const Picture& from, const Picture& canvas) {
                    for (size_t p = 0; p < rows.size(); ++p) {
                        stream_plane(from.planes[p], canvas.planes[p], rows[p], order);
                    }
                }};
    };
    return {limit("limit, row after row", Order::kOneByOne),
            limit("limit, rows side by side", Order::kSideBySide)};
}

double sampled_pixels(const Job& job, Sampling sampling) {
    const size_t rows = sampled_rows(sampling, job.src.height, job.dst.height).rows.size();
    return static_cast<double>(rows) * job.src.width;
}

}  // namespace bench
