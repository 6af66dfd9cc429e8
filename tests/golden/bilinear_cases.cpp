// SPDX-License-Identifier: Apache-2.0
// The bilinear engine: every format code, with and without a canvas, large reductions, bands.
#include "golden/cases.h"
#include "golden/content.h"

namespace golden {

namespace {

using Bilinear = decltype(&ov_bilinear_sg);

constexpr int32_t kFormats[] = {2, 7, 8, 18, 19};
constexpr int32_t kUnknownFormat = 3;

bool has_pixels(int32_t format) {
    return format == 7 || format == 8;
}

std::string prefix(const std::string& name, int32_t format) {
    return name + ":f" + std::to_string(format) + ":";
}

size_t picture_bytes(int32_t format, int32_t w, int32_t h) {
    return has_pixels(format) ? packed_bytes(w, h, 4) : yuv420_bytes(w, h);
}

// What the engine may read behind a plane whose rows have `stride` samples.
size_t readable_behind(int32_t stride) {
    return 4 * (2 * static_cast<size_t>(stride) + 4);
}

void run_size(std::vector<Result>& results, const std::string& name, Bilinear resize,
              int32_t format, const Size& size) {
    const std::string full_name = prefix(name, format) + text(size);
    const std::vector<uint8_t> src =
        content(hash_of(full_name),
                picture_bytes(format, size.src_w, size.src_h) + readable_behind(size.src_w));
    Destination dst(picture_bytes(format, size.dst_w, size.dst_h));
    resize(src.data(), dst.bytes(), size.src_w, size.src_h, size.dst_w, size.dst_h, format,
           nullptr);
    results.push_back({full_name, dst.hash()});
}

void run_placement(std::vector<Result>& results, const std::string& name, Bilinear resize,
                   int32_t format, const Placement& p) {
    const std::string full_name = prefix(name, format) + text(p);
    const uint64_t seed = hash_of(full_name);
    const int32_t rows = p.src_h + 3;
    const std::vector<uint8_t> luma = content(seed, packed_bytes(p.stride, rows, 4));
    const std::vector<uint8_t> chroma = content(seed + 1, packed_bytes(p.stride, rows, 2));
    ovrin_resize_target target = {};
    target.src_vu_plane = chroma.data();
    target.src_u_plane = chroma.data();
    target.src_v_plane = chroma.data() + 1;
    target.src_width = p.src_w;
    target.src_height = p.src_h;
    target.src_stride = p.stride;
    target.src_buffer_height = p.src_h;
    target.format = format;
    target.canvas_width = p.canvas_w;
    target.canvas_height = p.canvas_h;
    target.dst_x = p.x;
    target.dst_y = p.y;
    Destination dst(picture_bytes(format, p.canvas_w, p.canvas_h));
    resize(luma.data(), dst.bytes(), p.src_w, p.src_h, p.dst_w, p.dst_h, -1, &target);
    results.push_back({full_name, dst.hash()});
}

const std::vector<Size>& short_sizes() {
    static const std::vector<Size> sizes = {
        {1, 1, 1, 1},      {2, 2, 5, 4},     {8, 6, 8, 6},      {64, 48, 32, 24},  {33, 17, 66, 35},
        {67, 41, 33, 19},  {90, 9, 700, 11}, {1300, 5, 600, 4}, {16, 100, 16, 30}, {50, 50, 49, 51},
        {20, 16, 130, 60}, {6, 6, 0, 3},     {0, 4, 3, 3},
    };
    return sizes;
}

const std::vector<Size>& sizes_of_bands() {
    static const std::vector<Size> sizes = {
        {9, 1024, 7, 1024}, {12, 500, 17, 1100}, {10, 3000, 6, 1500}, {33, 2, 5, 1030}};
    return sizes;
}

const std::vector<Size>& large_reductions() {
    static const std::vector<Size> sizes = {{64, 64, 16, 16},    {100, 90, 10, 9},
                                            {257, 130, 20, 7},   {64, 2100, 8, 130},
                                            {16, 4200, 4, 1026}, {96, 80, 32, 10}};
    return sizes;
}

void run_entry(std::vector<Result>& results, const std::string& name, Bilinear resize) {
    for (const int32_t format : kFormats) {
        for (const Size& size : short_sizes()) run_size(results, name, resize, format, size);
        for (const Size& size : sizes_of_bands()) run_size(results, name, resize, format, size);
        for (const Placement& p : placements()) {
            run_placement(results, name, resize, format, p);
        }
    }
    run_size(results, name, resize, kUnknownFormat, {8, 6, 4, 3});
}

// ---- Bands ----

struct Tables {
    std::vector<int32_t> index;
    std::vector<int32_t> weight;

    Tables(int32_t src, int32_t dst) {
        for (int32_t i = 0; i < dst; ++i) {
            index.push_back(i * src / dst);
            weight.push_back(1024 + i * src % dst * 4096 / dst);
        }
    }
};

void run_band(std::vector<Result>& results, decltype(&_ov_bilinear_tp) task, int32_t format,
              const Size& size, int32_t first_row, int32_t end_row) {
    const std::string full_name = prefix("_ov_bilinear_tp", format) + text(size) + "rows" +
                                  std::to_string(first_row) + "-" + std::to_string(end_row);
    const std::vector<uint8_t> src =
        content(hash_of(full_name),
                picture_bytes(format, size.src_w, size.src_h) + readable_behind(size.src_w));
    const Tables columns(size.src_w, size.dst_w);
    const Tables rows(size.src_h, size.dst_h);
    Destination dst(picture_bytes(format, size.dst_w, size.dst_h));
    ovrin_bilinear_band band = {};
    band.src_width = size.src_w;
    band.src_height = size.src_h;
    band.dst_w = band.canvas_width = size.dst_w;
    band.dst_h = size.dst_h;
    band.src = src.data();
    band.dst = dst.bytes();
    band.format = format;
    band.col_weight = columns.weight.data();
    band.row_weight = rows.weight.data();
    band.col_index = columns.index.data();
    band.row_index = rows.index.data();
    band.first_row = first_row;
    band.end_row = end_row;
    band.bpp = has_pixels(format) ? 4 : 1;
    band.src_pitch = size.src_w * band.bpp;
    task(&band);
    results.push_back({full_name, dst.hash()});
}

}  // namespace

void run_bilinear_cases(const Api& api, std::vector<Result>& results) {
    run_entry(results, "ov_bilinear_sg", api.ov_bilinear_sg);
    run_entry(results, "ov_bilinear", api.ov_bilinear);
    for (const int32_t format : kFormats) {
        for (const Size& size : large_reductions()) {
            run_size(results, "ov_bilinear_ex", api.ov_bilinear_ex, format, size);
        }
        run_size(results, "ov_bilinear_ex", api.ov_bilinear_ex, format, {33, 17, 66, 35});
        run_placement(results, "ov_bilinear_ex", api.ov_bilinear_ex, format, placements().front());
        run_band(results, api._ov_bilinear_tp, format, {40, 30, 25, 20}, 0, 20);
        run_band(results, api._ov_bilinear_tp, format, {40, 30, 25, 20}, 6, 11);
        run_band(results, api._ov_bilinear_tp, format, {31, 12, 600, 26}, 13, 26);
    }
    run_band(results, api._ov_bilinear_tp, kUnknownFormat, {8, 6, 4, 3}, 0, 3);
}

}  // namespace golden
