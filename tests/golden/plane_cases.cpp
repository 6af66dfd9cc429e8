// SPDX-License-Identifier: Apache-2.0
// 4:2:0 pictures: I420 and NV21 in one buffer, planes apart, in a canvas, in bands.
#include <cstddef>

#include "golden/cases.h"
#include "golden/content.h"

namespace golden {

namespace {

using Contiguous = decltype(&ovrin_resize_yuv420);

void run_contiguous(std::vector<Result>& results, const std::string& name, Contiguous resize) {
    for (const std::vector<Size>* sizes : {&low_sizes(), &tall_sizes(), &empty_sizes()}) {
        for (const Size& size : *sizes) {
            const std::string full_name = name + ":" + text(size);
            const std::vector<uint8_t> src =
                content(hash_of(full_name), yuv420_bytes(size.src_w, size.src_h));
            Destination dst(yuv420_bytes(size.dst_w, size.dst_h));
            resize(src.data(), dst.bytes(), size.src_w, size.src_h, size.dst_w, size.dst_h);
            results.push_back({full_name, dst.hash()});
        }
    }
}

// A source in planes whose luma rows lie `stride` bytes apart.
struct Planes {
    std::vector<uint8_t> y;
    std::vector<uint8_t> u;
    std::vector<uint8_t> v;
    std::vector<uint8_t> vu;

    Planes(uint64_t seed, int32_t stride, int32_t h)
        : y(content(seed, packed_bytes(stride, h, 1))),
          u(content(seed + 1, packed_bytes((stride + 1) / 2, (h + 1) / 2, 1))),
          v(content(seed + 2, u.size())),
          vu(content(seed + 3, u.size() * 2)) {}
};

// resize(planes, destination, size) over all sizes, without a target.
template <class Resize>
void run_planes(std::vector<Result>& results, const std::string& name, const Resize& resize) {
    for (const std::vector<Size>* sizes : {&low_sizes(), &tall_sizes()}) {
        for (const Size& size : *sizes) {
            const std::string full_name = name + ":" + text(size);
            const Planes planes(hash_of(full_name), size.src_w, size.src_h);
            Destination dst(yuv420_bytes(size.dst_w, size.dst_h));
            resize(planes, dst.bytes(), size);
            results.push_back({full_name, dst.hash()});
        }
    }
}

// resize(planes, placement, target) over all placements, and with a row length of 0, which stands
// for the width or repeats the first row.
template <class Resize>
void run_canvas(std::vector<Result>& results, const std::string& name, const Resize& resize) {
    for (const Placement& placement : placements()) {
        for (const int32_t stride : {placement.stride, 0}) {
            Placement p = placement;
            p.stride = stride;
            const std::string full_name = name + ":" + text(p);
            const Planes planes(hash_of(full_name), placement.stride, p.src_h);
            Destination dst(yuv420_bytes(p.canvas_w, p.canvas_h));
            ovrin_resize_target target = {};
            target.src_width = p.src_w;
            target.src_height = p.src_h;
            target.src_stride = p.stride;
            target.src_buffer_height = p.src_h;
            target.dst = dst.bytes();
            target.dst_width = p.dst_w;
            target.dst_height = p.dst_h;
            target.canvas_width = p.canvas_w;
            target.canvas_height = p.canvas_h;
            target.dst_x = p.x;
            target.dst_y = p.y;
            resize(planes, p, &target);
            results.push_back({full_name, dst.hash()});
        }
    }
}

void run_three_planes(const Api& api, std::vector<Result>& results) {
    run_planes(results, "ovrin_resize_y_u_v",
               [&](const Planes& src, uint8_t* dst, const Size& size) {
                   api.ovrin_resize_y_u_v(src.y.data(), src.u.data(), src.v.data(), dst, size.src_w,
                                          size.src_h, size.dst_w, size.dst_h);
               });
    run_canvas(results, "ovrin_resize_y_u_v_keep_ratio",
               [&](const Planes& src, const Placement& p, const ovrin_resize_target* target) {
                   api.ovrin_resize_y_u_v_keep_ratio(src.y.data(), src.u.data(), src.v.data(),
                                                     p.src_w, p.src_h, target);
               });
    const auto both_ways = [&](const std::string& name, decltype(&ovrin_resize_y_u_v_sg) resize) {
        run_planes(results, name, [&](const Planes& src, uint8_t* dst, const Size& size) {
            resize(src.y.data(), src.u.data(), src.v.data(), dst, size.src_w, size.src_h,
                   size.dst_w, size.dst_h, nullptr);
        });
        run_canvas(results, name,
                   [&](const Planes& src, const Placement& p, const ovrin_resize_target* target) {
                       resize(src.y.data(), src.u.data(), src.v.data(), nullptr, p.src_w, p.src_h,
                              0, 0, target);
                   });
    };
    both_ways("ovrin_resize_y_u_v_sg", api.ovrin_resize_y_u_v_sg);
    both_ways("ovrin_resize_y_u_v_tps", api.ovrin_resize_y_u_v_tps);
}

void run_two_planes(const Api& api, std::vector<Result>& results) {
    run_planes(results, "ovrin_resize_y_nv21",
               [&](const Planes& src, uint8_t* dst, const Size& size) {
                   api.ovrin_resize_y_nv21(src.y.data(), src.vu.data(), dst, size.src_w, size.src_h,
                                           size.dst_w, size.dst_h);
               });
    run_canvas(results, "ovrin_resize_y_nv21_keep_ratio",
               [&](const Planes& src, const Placement& p, const ovrin_resize_target* target) {
                   api.ovrin_resize_y_nv21_keep_ratio(src.y.data(), src.vu.data(), p.src_w, p.src_h,
                                                      target);
               });
    const auto both_ways = [&](const std::string& name, decltype(&ovrin_resize_y_nv_sg) resize) {
        run_planes(results, name, [&](const Planes& src, uint8_t* dst, const Size& size) {
            resize(src.y.data(), src.vu.data(), dst, size.src_w, size.src_h, size.dst_w, size.dst_h,
                   nullptr);
        });
        run_canvas(results, name,
                   [&](const Planes& src, const Placement& p, const ovrin_resize_target* target) {
                       resize(src.y.data(), src.vu.data(), nullptr, p.src_w, p.src_h, 0, 0, target);
                   });
    };
    both_ways("ovrin_resize_y_nv_sg", api.ovrin_resize_y_nv_sg);
    both_ways("ovrin_resize_y_nv_tps", api.ovrin_resize_y_nv_tps);
}

// ---- Bands ----

// The two kinds of record differ in the names of their chroma fields only.
int32_t& chroma_rows(ovrin_yuv_band& band) {
    return band.uv_rows;
}
int32_t& chroma_rows(ovrin_nv21_band& band) {
    return band.vu_rows;
}
int32_t chroma_start(const ovrin_yuv_band& band) {
    return band.uv_start_row;
}
int32_t chroma_start(const ovrin_nv21_band& band) {
    return band.vu_start_row;
}
void set_planes(ovrin_yuv_band& band, const Planes& planes) {
    band.src = planes.y.data();
    band.src_u = planes.u.data();
    band.src_v = planes.v.data();
}
void set_planes(ovrin_nv21_band& band, const Planes& planes) {
    band.src = planes.y.data();
    band.src_vu = planes.vu.data();
}

int32_t grid_side(int32_t side) {
    return (side + 3) / 4 * 4;
}

// The band's rows as a driver sets them: the last band takes what is left.
template <class Band>
void set_rows(Band& band, Band& next, const BandedSize& s) {
    const int32_t left = s.size.src_h - band.y_start_row;
    const int32_t chroma_left = (s.size.src_h + 1) / 2 - chroma_start(band);
    const bool is_last = left <= s.band_rows;
    band.y_rows = is_last ? left : s.band_rows;
    chroma_rows(band) = is_last && chroma_left > 0 ? chroma_left : chroma_rows(next);
}

struct BandResults {
    Hash records;
    uint64_t pixels;
};

// Walks the bands of a picture and has the task draw them into a work buffer or, where the size is
// a multiple of 4 each way, into the destination. prepare(band) sets the source.
template <class Band, class Walk, class Prepare>
BandResults run_bands(const BandedSize& s, const Walk& walk, const Prepare& prepare,
                      void (*task)(void*)) {
    const int32_t grid_w = grid_side(s.size.dst_w);
    const int32_t grid_h = grid_side(s.size.dst_h);
    Destination target(packed_bytes(grid_w, grid_h, 2), 3);
    Band band = {};
    band.src_width = band.src_row_bytes = s.size.src_w;
    band.src_height = band.src_rows = s.size.src_h;
    band.dst_width = s.size.dst_w;
    band.dst_height = s.size.dst_h;
    band.band_rows = s.band_rows;
    const bool fits = grid_w == s.size.dst_w && grid_h == s.size.dst_h;
    (fits ? band.dst : band.work) = target.bytes();
    prepare(band);

    BandResults results = {};
    Hash pixels;
    while (band.y_start_row < s.size.src_h) {
        Band next = band;
        walk(s.size.src_w, s.size.src_h, s.size.dst_w, s.size.dst_h, &next);
        // All fields before the pointers, without the gap that follows them.
        results.records.add(&next, offsetof(Band, src_y_offset) + 2 * sizeof(int32_t));
        results.records.add(next.y_rows);
        results.records.add(chroma_rows(next));
        set_rows(band, next, s);
        task(&band);
        pixels.add(band.done);
        band = next;
    }
    target.hash_into(pixels);
    results.pixels = pixels.value();
    return results;
}

// One picture through the task for planes and through the one for a single buffer.
template <class Band, class Walk>
void run_band_tasks(std::vector<Result>& results, const BandedSize& s, const char* walker,
                    const Walk& walk, const char* planes_name, void (*planes_task)(void*),
                    const char* contiguous_name, void (*contiguous_task)(void*)) {
    const std::string tail = ":" + text(s);
    const Planes planes(hash_of(planes_name + tail), s.size.src_w + 6, s.size.src_h);
    const BandResults apart = run_bands<Band>(
        s, walk,
        [&](Band& band) {
            band.src_row_bytes = s.size.src_w + 6;
            set_planes(band, planes);
        },
        planes_task);
    const std::vector<uint8_t> picture =
        content(hash_of(contiguous_name + tail), yuv420_bytes(s.size.src_w, s.size.src_h));
    const BandResults contiguous = run_bands<Band>(
        s, walk, [&](Band& band) { band.src = picture.data(); }, contiguous_task);
    Hash records = apart.records;
    const uint64_t packed_records = contiguous.records.value();
    records.add(&packed_records, sizeof packed_records);
    results.push_back({walker + tail, records.value()});
    results.push_back({planes_name + tail, apart.pixels});
    results.push_back({contiguous_name + tail, contiguous.pixels});
}

}  // namespace

void run_plane_cases(const Api& api, std::vector<Result>& results) {
    run_contiguous(results, "ovrin_resize_yuv420", api.ovrin_resize_yuv420);
    run_contiguous(results, "ovrin_resize_yuv420_sg", api.ovrin_resize_yuv420_sg);
    run_contiguous(results, "ovrin_resize_yuv420_tps", api.ovrin_resize_yuv420_tps);
    run_contiguous(results, "ovrin_resize_nv21", api.ovrin_resize_nv21);
    run_contiguous(results, "ovrin_resize_nv21_sg", api.ovrin_resize_nv21_sg);
    run_contiguous(results, "ovrin_resize_nv21_tps", api.ovrin_resize_nv21_tps);
    run_three_planes(api, results);
    run_two_planes(api, results);
    for (const BandedSize& s : banded_sizes()) {
        run_band_tasks<ovrin_yuv_band>(
            results, s, "ovrin_resize_yuv420_get_pos", api.ovrin_resize_yuv420_get_pos,
            "_resize_y_u_v_tp", api._resize_y_u_v_tp, "_resize_yuv420_tp", api._resize_yuv420_tp);
        run_band_tasks<ovrin_nv21_band>(
            results, s, "ovrin_resize_nv21_get_pos", api.ovrin_resize_nv21_get_pos,
            "_resize_y_nv21_tp", api._resize_y_nv21_tp, "_resize_nv21_tp", api._resize_nv21_tp);
    }
}

}  // namespace golden
