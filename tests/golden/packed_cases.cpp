// SPDX-License-Identifier: Apache-2.0
// Packed pixels: RGBA8888 with and without a canvas, its bands, RGB888, nearest neighbour.
#include <cstddef>

#include "golden/cases.h"
#include "golden/content.h"

namespace golden {

namespace {

// resize(src, destination, size) over all sizes.
template <class Resize>
void run_sizes(std::vector<Result>& results, const std::string& name, int32_t bytes_per_pixel,
               const Resize& resize) {
    for (const std::vector<Size>* sizes : {&low_sizes(), &tall_sizes(), &empty_sizes()}) {
        for (const Size& size : *sizes) {
            const std::string full_name = name + ":" + text(size);
            const std::vector<uint8_t> src =
                content(hash_of(full_name), packed_bytes(size.src_w, size.src_h, bytes_per_pixel));
            Destination dst(packed_bytes(size.dst_w, size.dst_h, bytes_per_pixel));
            resize(src.data(), dst, size);
            results.push_back({full_name, dst.hash()});
        }
    }
}

void run_rgba(std::vector<Result>& results, const std::string& name,
              decltype(&ovrin_resize_rgba8888) resize) {
    run_sizes(results, name, 4, [&](const uint8_t* src, Destination& dst, const Size& size) {
        resize(src, dst.words(), size.src_w, size.src_h, size.dst_w, size.dst_h);
    });
}

void run_whole_pictures(const Api& api, std::vector<Result>& results) {
    run_rgba(results, "ovrin_resize_rgba8888", api.ovrin_resize_rgba8888);
    run_rgba(results, "ovrin_resize_rgba8888_sg", api.ovrin_resize_rgba8888_sg);
    run_rgba(results, "ovrin_resize_rgba8888_tps", api.ovrin_resize_rgba8888_tps);
    run_sizes(results, "ovrin_resize_rgb888", 3,
              [&](const uint8_t* src, Destination& dst, const Size& size) {
                  api.ovrin_resize_rgb888(src, dst.bytes(), size.src_w, size.src_h, size.dst_w,
                                          size.dst_h);
              });
    run_sizes(results, "ovrin_resize_nearest_rgba8888", 4,
              [&](const uint8_t* src, Destination& dst, const Size& size) {
                  api.ovrin_resize_nearest_rgba8888(reinterpret_cast<const uint32_t*>(src),
                                                    dst.words(), size.src_w, size.src_h, size.dst_w,
                                                    size.dst_h);
              });
}

ovrin_resize_target target_of(const Placement& p, uint32_t* canvas) {
    ovrin_resize_target target = {};
    target.src_width = p.src_w;
    target.src_height = p.src_h;
    target.src_stride = p.stride;
    target.src_buffer_height = p.src_h;
    target.dst = canvas;
    target.dst_width = p.dst_w;
    target.dst_height = p.dst_h;
    target.canvas_width = p.canvas_w;
    target.canvas_height = p.canvas_h;
    target.dst_x = p.x;
    target.dst_y = p.y;
    return target;
}

void run_canvas(std::vector<Result>& results, const std::string& name,
                decltype(&ovrin_resize_rgba8888_keep_ratio) resize) {
    for (const Placement& placement : placements()) {
        for (const int32_t stride : {placement.stride, 0}) {
            Placement p = placement;
            p.stride = stride;
            const std::string full_name = name + ":" + text(p);
            const std::vector<uint8_t> src =
                content(hash_of(full_name), packed_bytes(placement.stride, p.src_h, 4));
            Destination dst(packed_bytes(p.canvas_w, p.canvas_h, 4));
            ovrin_resize_target target = target_of(p, dst.words());
            resize(src.data(), p.src_w, p.src_h, &target);
            Hash hash;
            dst.hash_into(hash);
            hash.add(target.src_width);
            hash.add(target.src_height);
            hash.add(target.dst_width);
            hash.add(target.dst_height);
            results.push_back({full_name, hash.value()});
        }
    }
}

// ---- Bands ----

struct RgbaBands {
    const char* walker;
    const char* task_name;
    int32_t stride;  // added to the picture's width
    int32_t x;       // canvas words beside the picture
    int32_t skip;
};

// Walks the bands of a picture and has the task draw them, one after another.
template <class Walk>
void run_bands(std::vector<Result>& results, const RgbaBands& kind, const BandedSize& s,
               const Walk& walk, void (*task)(void*)) {
    const std::string walk_name = kind.walker + (":" + text(s));
    const std::string task_name = kind.task_name + (":" + text(s));
    const int32_t stride = s.size.src_w + kind.stride;
    const int32_t canvas_w = kind.x + s.size.dst_w + kind.skip;
    const std::vector<uint8_t> src =
        content(hash_of(task_name), packed_bytes(stride, s.size.src_h, 4));
    Destination dst(packed_bytes(canvas_w, s.size.dst_h, 4), 3);

    ovrin_rgba_band band = {};
    band.src_w = s.size.src_w;
    band.src_h = band.src_rows = s.size.src_h;
    band.src_stride = stride;
    band.dst_w = s.size.dst_w;
    band.dst_h = s.size.dst_h;
    band.dst_x = kind.x;
    band.dst_skip = kind.skip;
    band.band_rows = s.band_rows;
    band.src = src.data();
    band.dst = dst.words();
    Hash records;
    Hash flags;
    while (band.start_row < s.size.src_h) {
        ovrin_rgba_band next = band;
        walk(s.size, canvas_w, next);
        records.add(&next, offsetof(ovrin_rgba_band, src));
        records.add(next.rows_to_do);
        const int32_t left = s.size.src_h - band.start_row;
        band.rows_to_do = left < s.band_rows ? left : s.band_rows;
        task(&band);
        flags.add(band.done);
        band = next;
    }
    dst.hash_into(flags);
    results.push_back({walk_name, records.value()});
    results.push_back({task_name, flags.value()});
}

void run_all_bands(const Api& api, std::vector<Result>& results) {
    const RgbaBands packed = {"ovrin_resize_rgba8888_get_pos", "_resize_rgba8888_tp", 0, 0, 0};
    const RgbaBands in_canvas = {"ovrin_resize_rgba8888_get_pos_keep_ratio",
                                 "_resize_rgba8888_keep_ratio_tp", 5, 3, 4};
    for (const BandedSize& s : banded_sizes()) {
        run_bands(
            results, packed, s,
            [&](const Size& size, int32_t, ovrin_rgba_band& band) {
                api.ovrin_resize_rgba8888_get_pos(size.src_w, size.src_h, size.dst_w, size.dst_h,
                                                  &band);
            },
            api._resize_rgba8888_tp);
        run_bands(
            results, in_canvas, s,
            [&](const Size& size, int32_t canvas_w, ovrin_rgba_band& band) {
                api.ovrin_resize_rgba8888_get_pos_keep_ratio(
                    size.src_w, size.src_h, size.dst_w, size.dst_h, canvas_w, size.dst_h, &band);
            },
            api._resize_rgba8888_keep_ratio_tp);
    }
}

}  // namespace

void run_packed_cases(const Api& api, std::vector<Result>& results) {
    run_whole_pictures(api, results);
    run_canvas(results, "ovrin_resize_rgba8888_keep_ratio", api.ovrin_resize_rgba8888_keep_ratio);
    run_canvas(results, "ovrin_resize_rgba_keep_ratio_sg", api.ovrin_resize_rgba_keep_ratio_sg);
    run_canvas(results, "ovrin_resize_rgba_keep_ratio_tps", api.ovrin_resize_rgba_keep_ratio_tps);
    run_all_bands(api, results);
}

}  // namespace golden
