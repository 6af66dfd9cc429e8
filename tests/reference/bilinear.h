// SPDX-License-Identifier: Apache-2.0
// The bilinear engine, written down as plainly as possible. Shares nothing with the library.
// Compile with contraction off: the tables are rounded to single precision step by step.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

#include "reference/bands.h"

namespace reference {

// Where a call reads and draws. Sizes that the caller gives apart from this, dst_w and dst_h, are
// those of the output rectangle.
struct BilinearGeometry {
    int32_t src_width;
    int32_t src_height;
    int32_t src_stride;  // pixels
    int32_t format;
    int32_t canvas_width;
    int32_t canvas_height;
    int32_t dst_x;
    int32_t dst_y;
};

// What holds for a call without a target record.
inline BilinearGeometry packed_geometry(int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h,
                                        int32_t format) {
    return {src_w, src_h, src_w, format, dst_w, dst_h, 0, 0};
}

// A source plane. It remembers how far it was read; one without bytes gives zeros, which is how a
// test learns the size of the buffer that it has to provide.
struct Plane {
    const uint8_t* bytes = nullptr;
    int64_t end = 0;  // all reads lie in [0, end)

    uint8_t at(int64_t offset) {
        end = std::max(end, offset + 1);
        return bytes == nullptr ? uint8_t{0} : bytes[offset];
    }
};

struct BilinearSource {
    Plane luma;  // or the pixels of a four-channel picture
    Plane u, v;  // format 2
    Plane vu;    // formats 18, 19
};

// The planes of a picture that lies in one buffer; null for a dry run.
inline BilinearSource contiguous_source(const uint8_t* bytes, int64_t w, int64_t h) {
    BilinearSource source;
    if (bytes == nullptr) return source;
    source.luma.bytes = bytes;
    source.vu.bytes = bytes + w * h;
    source.u.bytes = bytes + w * h;
    source.v.bytes = source.u.bytes + ((w + 1) >> 1) * ((h + 1) >> 1);
    return source;
}

// The number of bytes from the buffer's first that were read.
inline int64_t contiguous_end(const BilinearSource& source, int64_t w, int64_t h) {
    int64_t end = source.luma.end;
    if (source.vu.end > 0) end = std::max(end, w * h + source.vu.end);
    if (source.u.end > 0) end = std::max(end, w * h + source.u.end);
    if (source.v.end > 0) {
        end = std::max(end, w * h + ((w + 1) >> 1) * ((h + 1) >> 1) + source.v.end);
    }
    return end;
}

inline bool is_four_channel(int32_t format) {
    return format == 7 || format == 8;
}
inline bool is_planar(int32_t format) {
    return format == 2;
}
inline bool is_semi_planar(int32_t format) {
    return format == 18 || format == 19;
}
inline bool is_bilinear_format(int32_t format) {
    return is_four_channel(format) || is_planar(format) || is_semi_planar(format);
}

inline int64_t luma_bytes(int64_t w, int64_t h, int32_t format) {
    return w * h * (is_four_channel(format) ? 4 : 1);
}

inline int64_t chroma_bytes(int64_t w, int64_t h, int32_t format) {
    return is_four_channel(format) ? 0 : ((w + 1) >> 1) * ((h + 1) >> 1) * 2;
}

// For each output column (or row): the source column to its left and the weight of the one to the
// right of that, 4096 being 1.0.
struct BilinearTable {
    std::vector<int32_t> index;
    std::vector<int32_t> weight;
    int32_t edge = 0;  // outputs from the first whose index is src - 2 to the last; 0 if none is
};

inline BilinearTable bilinear_table(int32_t src, int32_t dst) {
    BilinearTable table;
    const float scale = static_cast<float>(src) / static_cast<float>(dst);
    for (int32_t i = 0; i < dst; ++i) {
        const float p = static_cast<float>(i) * scale;
        const int32_t index = static_cast<int32_t>(p);
        const float f = p - static_cast<float>(index);
        const double weight = (static_cast<double>(f) + 0.25) * 4096.0;
        table.index.push_back(index);
        table.weight.push_back(static_cast<int32_t>(weight));
    }
    for (int32_t i = 0; i < dst; ++i) {
        if (table.index[static_cast<size_t>(i)] == src - 2) {
            table.edge = dst - i;
            break;
        }
    }
    return table;
}

// Which of its four neighbours a sample is blended from.
enum class Kernel { kBoth, kVertical, kHorizontal, kTopLeft };

// Four neighbours, as offsets into a plane.
struct Taps {
    int64_t p00, p01, p10, p11;
};

inline uint8_t blend(Kernel kernel, Plane& plane, const Taps& taps, int32_t wx, int32_t wy) {
    const uint32_t right = static_cast<uint32_t>(wx);
    const uint32_t left = static_cast<uint32_t>(4096 - wx);
    const uint32_t below = static_cast<uint32_t>(wy);
    const uint32_t above = static_cast<uint32_t>(4096 - wy);
    uint32_t sum = 0;
    switch (kernel) {
        case Kernel::kBoth:
            sum += plane.at(taps.p00) * left * above;
            sum += plane.at(taps.p01) * right * above;
            sum += plane.at(taps.p10) * left * below;
            sum += plane.at(taps.p11) * right * below;
            break;
        case Kernel::kVertical:
            sum += plane.at(taps.p00) * (above << 12);
            sum += plane.at(taps.p10) * (below << 12);
            break;
        case Kernel::kHorizontal:
            sum += plane.at(taps.p00) * (left << 12);
            sum += plane.at(taps.p01) * (right << 12);
            break;
        case Kernel::kTopLeft:
            return plane.at(taps.p00);
    }
    return static_cast<uint8_t>(sum >> 24);
}

// Everything about a call that pixels need.
struct BilinearPlan {
    BilinearGeometry g;
    BilinearTable columns;
    BilinearTable rows;
    int32_t dst_w;  // after clipping
    int32_t dst_h;
    int32_t edge_cols;
    int32_t edge_rows;
};

inline BilinearPlan bilinear_plan(const BilinearGeometry& g, int32_t dst_w, int32_t dst_h) {
    BilinearPlan plan;
    plan.g = g;
    plan.columns = bilinear_table(g.src_width, dst_w);
    plan.rows = bilinear_table(g.src_height, dst_h);
    plan.dst_w = dst_w;
    plan.dst_h = dst_h;
    plan.edge_cols = plan.columns.edge;
    plan.edge_rows = plan.rows.edge;
    if (g.canvas_width < dst_w + g.dst_x) {
        plan.dst_w = g.canvas_width - g.dst_x;
        plan.edge_cols = 0;
    }
    if (g.canvas_height < dst_h + g.dst_y) {
        plan.dst_h = g.canvas_height - g.dst_y;
        plan.edge_cols = 0;
    }
    return plan;
}

// The region of the output rectangle that (c, r) lies in.
inline Kernel region(const BilinearPlan& plan, int32_t c, int32_t r) {
    if (r >= plan.dst_h - plan.edge_rows) return Kernel::kHorizontal;
    if (c >= plan.dst_w - plan.edge_cols) return Kernel::kVertical;
    return Kernel::kBoth;
}

inline void draw_luma(const BilinearPlan& plan, Kernel kernel, int32_t c, int32_t r, Plane& src,
                      std::vector<uint8_t>& canvas) {
    const int64_t bpp = is_four_channel(plan.g.format) ? 4 : 1;
    const int64_t pitch = plan.g.src_stride * bpp;
    const int64_t base = plan.columns.index[static_cast<size_t>(c)] * bpp +
                         plan.rows.index[static_cast<size_t>(r)] * pitch;
    const int64_t to = (int64_t{plan.g.dst_y + r} * plan.g.canvas_width + plan.g.dst_x + c) * bpp;
    for (int64_t n = 0; n < bpp; ++n) {
        const Taps taps = {base + n, base + bpp + n, base + pitch + n, base + pitch + bpp + n};
        canvas.at(static_cast<size_t>(to + n)) =
            blend(kernel, src, taps, plan.columns.weight[static_cast<size_t>(c)],
                  plan.rows.weight[static_cast<size_t>(r)]);
    }
}

inline void draw_planar_chroma(const BilinearPlan& plan, Kernel kernel, int32_t c, int32_t r,
                               BilinearSource& src, std::vector<uint8_t>& canvas) {
    const BilinearGeometry& g = plan.g;
    const int64_t cs = (g.src_stride + 1) >> 1;
    const int64_t s = ((plan.columns.index[static_cast<size_t>(c)] + 1) >> 1) +
                      (plan.rows.index[static_cast<size_t>(r)] >> 1) * cs;
    // An edge column's second tap lies one luma row length further, about two chroma rows down.
    const int64_t down = kernel == Kernel::kVertical ? g.src_stride : cs;
    const Taps taps = {s, s + 1, s + down, s + down + 1};
    const int32_t wx = plan.columns.weight[static_cast<size_t>(c)];
    const int32_t wy = plan.rows.weight[static_cast<size_t>(r)];

    const int64_t cd = (g.canvas_width + 1) >> 1;
    const int64_t u_base =
        int64_t{g.canvas_width} * g.canvas_height + (g.dst_x >> 1) + (g.dst_y >> 1) * cd;
    const int64_t v_base = u_base + cd * ((g.canvas_height + 1) >> 1);
    const int64_t at = (r >> 1) * cd + (c >> 1);
    canvas.at(static_cast<size_t>(u_base + at)) = blend(kernel, src.u, taps, wx, wy);
    canvas.at(static_cast<size_t>(v_base + at)) = blend(kernel, src.v, taps, wx, wy);
}

inline void draw_semi_planar_chroma(const BilinearPlan& plan, Kernel kernel, int32_t c, int32_t r,
                                    Plane& src, std::vector<uint8_t>& canvas) {
    const BilinearGeometry& g = plan.g;
    const int64_t cp = (g.src_stride + 1) & ~1;
    const int64_t s = (plan.columns.index[static_cast<size_t>(c)] & ~1) +
                      (plan.rows.index[static_cast<size_t>(r)] / 2) * cp;
    const int32_t wx = plan.columns.weight[static_cast<size_t>(c)];
    const int32_t wy = plan.rows.weight[static_cast<size_t>(r)];

    const int64_t cpd = (g.canvas_width + 1) & ~1;
    const int64_t base =
        int64_t{g.canvas_width} * g.canvas_height + (g.dst_x & ~1) + (g.dst_y >> 1) * cpd;
    for (int64_t n = 0; n < 2; ++n) {
        const Taps taps = {s + n, s + 2 + n, s + cp + n, s + cp + 2 + n};
        canvas.at(static_cast<size_t>(base + (r >> 1) * cpd + c + n)) =
            blend(kernel, src, taps, wx, wy);
    }
}

inline void draw(const BilinearPlan& plan, Kernel kernel, int32_t c, int32_t r, BilinearSource& src,
                 std::vector<uint8_t>& canvas) {
    draw_luma(plan, kernel, c, r, src.luma, canvas);
    if (c % 2 != 0 || r % 2 != 0) return;
    if (is_planar(plan.g.format)) draw_planar_chroma(plan, kernel, c, r, src, canvas);
    if (is_semi_planar(plan.g.format)) {
        draw_semi_planar_chroma(plan, kernel, c, r, src.vu, canvas);
    }
}

inline void clear_canvas(const BilinearGeometry& g, std::vector<uint8_t>& canvas) {
    const int64_t luma = luma_bytes(g.canvas_width, g.canvas_height, g.format);
    const int64_t chroma = chroma_bytes(g.canvas_width, g.canvas_height, g.format);
    for (int64_t i = 0; i < luma; ++i) canvas.at(static_cast<size_t>(i)) = 0;
    for (int64_t i = 0; i < chroma; ++i) canvas.at(static_cast<size_t>(luma + i)) = 128;
}

enum class Sampling { kBlend, kPoint };

// The whole picture in one way: blended, as on the calling thread, or point-sampled, as in bands.
inline void bilinear_picture(Sampling sampling, const BilinearGeometry& g, int32_t src_w,
                             int32_t src_h, int32_t dst_w, int32_t dst_h, BilinearSource& src,
                             std::vector<uint8_t>& canvas) {
    if (src_w == 0 || src_h == 0 || dst_w == 0 || dst_h == 0) return;
    if (!is_bilinear_format(g.format)) return;
    const BilinearPlan plan = bilinear_plan(g, dst_w, dst_h);
    clear_canvas(g, canvas);
    for (int32_t r = 0; r < plan.dst_h; ++r) {
        for (int32_t c = 0; c < plan.dst_w; ++c) {
            const Kernel kernel =
                sampling == Sampling::kPoint ? Kernel::kTopLeft : region(plan, c, r);
            draw(plan, kernel, c, r, src, canvas);
        }
    }
}

inline void bilinear_single(const BilinearGeometry& g, int32_t src_w, int32_t src_h, int32_t dst_w,
                            int32_t dst_h, BilinearSource& src, std::vector<uint8_t>& canvas) {
    bilinear_picture(Sampling::kBlend, g, src_w, src_h, dst_w, dst_h, src, canvas);
}

inline void bilinear(const BilinearGeometry& g, int32_t src_w, int32_t src_h, int32_t dst_w,
                     int32_t dst_h, BilinearSource& src, std::vector<uint8_t>& canvas) {
    const bool banded = dst_h > 1023 && destination_band_count(src_h, dst_h) > 1;
    bilinear_picture(banded ? Sampling::kPoint : Sampling::kBlend, g, src_w, src_h, dst_w, dst_h,
                     src, canvas);
}

// Sizes of the intermediate pictures of a large reduction.
inline std::vector<std::pair<int32_t, int32_t>> halvings(int32_t src_w, int32_t src_h,
                                                         int32_t dst_w, int32_t dst_h) {
    std::vector<std::pair<int32_t, int32_t>> sizes;
    if (dst_w * dst_h > src_w * src_h) return sizes;
    const int32_t ratio_w = dst_w == 0 ? 0 : src_w / dst_w;
    const int32_t ratio_h = dst_h == 0 ? 0 : src_h / dst_h;
    const int32_t ratio = std::min(ratio_w, ratio_h);
    for (int32_t k = 1; k < ratio / 2; k *= 2) {
        sizes.emplace_back(src_w / (2 * k), src_h / (2 * k));
    }
    return sizes;
}

// Without a target record. The two scratch buffers, which start as zeros, take turns.
inline void bilinear_ex(int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h, int32_t format,
                        BilinearSource& src, std::vector<uint8_t>& dst) {
    const size_t size = static_cast<size_t>(src_w * src_h);
    std::vector<uint8_t> scratch[2] = {std::vector<uint8_t>(size), std::vector<uint8_t>(size)};
    BilinearSource current = src;
    BilinearSource* from = &src;
    int32_t w = src_w;
    int32_t h = src_h;
    int next = 0;
    for (const auto& [new_w, new_h] : halvings(src_w, src_h, dst_w, dst_h)) {
        bilinear(packed_geometry(w, h, new_w, new_h, format), w, h, new_w, new_h, *from,
                 scratch[next]);
        current = contiguous_source(scratch[next].data(), new_w, new_h);
        from = &current;
        w = new_w;
        h = new_h;
        next = 1 - next;
    }
    bilinear(packed_geometry(w, h, dst_w, dst_h, format), w, h, dst_w, dst_h, *from, dst);
}

}  // namespace reference
