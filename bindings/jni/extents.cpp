// SPDX-License-Identifier: Apache-2.0
#include "extents.h"

namespace ovrin_jni {

namespace {

constexpr int64_t larger(int64_t a, int64_t b) {
    return a > b ? a : b;
}

// Where the bilinear engine samples one axis. Positions are computed as the engine does, in single
// precision, and never decrease.
struct Axis {
    int32_t src;
    int32_t dst;
    int32_t edge;  // the first output sample that is not blended along this axis; dst when all are

    Axis(int32_t src_size, int32_t dst_size) : src(src_size), dst(dst_size), edge(0) {
        int32_t end = dst;
        while (edge < end) {
            const int32_t middle = edge + (end - edge) / 2;
            if (at(middle) >= src - 2) {
                end = middle;
            } else {
                edge = middle + 1;
            }
        }
        // The edge begins where a sample sits exactly on the last but one; reductions that step
        // over that have none.
        if (edge < dst && at(edge) != src - 2) edge = dst;
    }

    int32_t at(int32_t i) const {
        const float scale = static_cast<float>(src) / static_cast<float>(dst);
        return static_cast<int32_t>(static_cast<float>(i) * scale);
    }

    // Chroma is made for every second output sample.
    int32_t last(int32_t step) const { return (dst - 1) / step * step; }
    int32_t last_blended(int32_t step) const { return (edge - 1) / step * step; }
    bool has_blended() const { return edge > 0; }
    bool has_edge(int32_t step) const { return last(step) >= edge; }
};

struct Plane {
    int64_t pitch;       // samples from one row to the next
    int64_t edge_pitch;  // from the upper to the lower sample of a column at the edge
    int32_t step;        // 1, or 2 for chroma
    int32_t round_up;    // 1 when the chroma of an odd column lies to its right
};

// The samples up to the last that is read.
int64_t plane_samples(const Axis& columns, const Axis& rows, const Plane& plane) {
    const int32_t step = plane.step;
    const auto first_of_row = [&](int32_t row) { return rows.at(row) / step * plane.pitch; };
    const auto column = [&](int32_t i) { return int64_t{columns.at(i) + plane.round_up} / step; };
    int64_t samples = 0;
    if (rows.has_blended()) {
        const int64_t row = first_of_row(rows.last_blended(step));
        if (columns.has_blended()) {
            samples = row + plane.pitch + column(columns.last_blended(step)) + 2;
        }
        if (columns.has_edge(step)) {
            samples = larger(samples, row + plane.edge_pitch + column(columns.last(step)) + 1);
        }
    }
    if (rows.has_edge(step)) {
        const int64_t row = first_of_row(rows.last(step));
        samples = larger(samples, row + column(columns.last(step)) + 2);
    }
    return samples;
}

}  // namespace

int64_t bilinear_source_bytes(Size src, Size dst, BilinearFormat format) {
    const Axis columns(src.width, dst.width);
    const Axis rows(src.height, dst.height);
    const int64_t first_plane = plane_samples(columns, rows, {src.width, src.width, 1, 0});
    if (format == kPixels) return 4 * larger(src.pixels(), first_plane);
    const int64_t pitch = half_rounded_up(src.width);
    const bool planar = format == kPlanar;
    const int64_t chroma =
        plane_samples(columns, rows, {pitch, planar ? src.width : pitch, 2, planar ? 1 : 0});
    // V lies behind U, so what is read behind V is what counts.
    const int64_t before = src.pixels() + (planar ? chroma_samples(src) : 0);
    const int64_t read = larger(first_plane, before + chroma * (planar ? 1 : 2));
    return larger(yuv420_bytes(src), read);
}

int64_t bilinear_ex_source_bytes(Size src, Size dst, BilinearFormat format) {
    const int64_t direct = bilinear_source_bytes(src, dst, format);
    if (src.width / dst.width < 4 || src.height / dst.height < 4) return direct;
    // Without memory for halving it is done directly.
    const Size half = {src.width / 2, src.height / 2};
    return larger(direct, bilinear_source_bytes(src, half, format));
}

}  // namespace ovrin_jni
