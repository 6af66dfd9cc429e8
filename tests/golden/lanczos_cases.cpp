// SPDX-License-Identifier: Apache-2.0
// The Lanczos engine: table, transform, bands.
#include <cstdlib>

#include "golden/cases.h"
#include "golden/content.h"

namespace golden {

namespace {

const std::vector<Size>& sizes() {
    static const std::vector<Size> all = {
        {1, 1, 1, 1},     {7, 5, 7, 5},     {40, 30, 20, 15}, {33, 17, 50, 29}, {67, 41, 33, 19},
        {130, 9, 40, 11}, {5, 60, 13, 100}, {64, 64, 9, 8},   {300, 7, 310, 5}, {12, 63, 11, 63},
    };
    return all;
}

std::string name_of(const std::string& function, int32_t components, const Size& size) {
    return function + ":c" + std::to_string(components) + ":" + text(size);
}

void run_table(const Api& api, std::vector<Result>& results) {
    constexpr size_t kEntries = 16000;
    float* table = api.create_lanczos_lookup();
    Hash hash;
    if (table != nullptr) hash.add(table, kEntries * sizeof *table);
    free(table);
    results.push_back({"create_lanczos_lookup:", hash.value()});
}

void run_image_checks(const Api& api, std::vector<Result>& results) {
    uint8_t byte = 0;
    const lanczos_image images[] = {{4, 3, 16, 4, &byte},  {0, 3, 16, 4, &byte},
                                    {4, -1, 16, 4, &byte}, {4, 3, 0, 4, &byte},
                                    {4, 3, 16, 0, &byte},  {4, 3, 16, 4, nullptr}};
    Hash hash;
    for (const lanczos_image& image : images) hash.add(api.checkOvImage(&image));
    hash.add(api.checkOvImage(nullptr));
    results.push_back({"checkOvImage:", hash.value()});
}

void run_transform(const Api& api, std::vector<Result>& results, int32_t components,
                   const Size& size) {
    const std::string name = name_of("OvTransformLanczos", components, size);
    const int32_t src_stride = size.src_w * components + 5;
    const int32_t dst_stride = size.dst_w * components + 7;
    std::vector<uint8_t> bytes = content(hash_of(name), packed_bytes(src_stride, size.src_h, 1));
    Destination dst(packed_bytes(dst_stride, size.dst_h, 1));
    const lanczos_image from = {size.src_w, size.src_h, src_stride, components, bytes.data()};
    const lanczos_image to = {size.dst_w, size.dst_h, dst_stride, components, dst.bytes()};
    api.OvTransformLanczos(&from, &to);
    results.push_back({name, dst.hash()});
}

void run_pictures(const Api& api, std::vector<Result>& results, int32_t components,
                  const Size& size) {
    const std::string name = name_of("ov_lanczos", components, size);
    const std::vector<uint8_t> src =
        content(hash_of(name), packed_bytes(size.src_w, size.src_h, components));
    Destination dst(packed_bytes(size.dst_w, size.dst_h, components));
    api.ov_lanczos(src.data(), size.src_w, size.src_h, dst.bytes(), size.dst_w, size.dst_h,
                   components);
    results.push_back({name, dst.hash()});
    Destination threaded(packed_bytes(size.dst_w, size.dst_h, 4));
    api.ovrin_resize_lanczos(src.data(), threaded.bytes(), size.src_w, size.src_h, size.dst_w,
                             size.dst_h, components);
    results.push_back({name_of("ovrin_resize_lanczos", components, size), threaded.hash()});
}

void run_pairs(const Api& api, std::vector<Result>& results, const Size& size) {
    const std::string name = "ov_lanczos_nv:" + text(size);
    const std::vector<uint8_t> src =
        content(hash_of(name), packed_bytes(size.src_w, size.src_h, 3));
    Destination dst(packed_bytes(size.dst_w, size.dst_h, 3));
    api.ov_lanczos_nv(src.data(), size.src_w, size.src_h, dst.bytes(), size.dst_w, size.dst_h);
    results.push_back({name, dst.hash()});
}

// Seven weights for each column or row, in 256ths: around a middle one, or all over the place so
// that their sum overshoots.
std::vector<double> made_up_weights(int32_t count, bool overshoot) {
    std::vector<double> weights;
    for (int32_t i = 0; i < count; ++i) {
        const int32_t middle = 200 - i % 64;
        for (int32_t j = 0; j < 7; ++j) {
            int32_t weight = j == 3 ? middle : j == 4 ? 256 - middle : 0;
            if (overshoot) weight = (i * 37 + j * 101) % 511 - 200;
            weights.push_back(weight / 256.0);
        }
    }
    return weights;
}

void run_band(const Api& api, std::vector<Result>& results, int32_t components, const Size& size,
              bool overshoot) {
    const int32_t first_row = size.dst_h / 3;
    const int32_t rows = size.dst_h - first_row;
    const std::string name =
        name_of("_resize_lanczos_tp", components, size) + (overshoot ? "over" : "");
    const std::vector<uint8_t> src =
        content(hash_of(name), packed_bytes(size.src_w, size.src_h, components));
    const std::vector<double> columns = made_up_weights(size.dst_w, overshoot);
    const std::vector<double> all_rows = made_up_weights(size.dst_h, overshoot);
    const float table = 0.0F;
    Destination dst(packed_bytes(size.dst_w, rows, components));
    ovrin_lanczos_band band = {};
    band.src_w = size.src_w;
    band.src_h = size.src_h;
    band.dst_w = size.dst_w;
    band.dst_h = size.dst_h;
    band.src = src.data();
    band.dst = dst.bytes();
    band.bytes_per_pixel = components;
    band.first_row = first_row;
    band.rows = rows;
    band.table = &table;
    band.column_weights = columns.data();
    band.row_weights = all_rows.data();
    api._resize_lanczos_tp(&band);
    results.push_back({name, dst.hash()});
}

}  // namespace

void run_lanczos_cases(const Api& api, std::vector<Result>& results) {
    run_table(api, results);
    run_image_checks(api, results);
    for (const Size& size : sizes()) {
        for (const int32_t components : {1, 2, 3, 4}) {
            run_pictures(api, results, components, size);
        }
        run_transform(api, results, 3, size);
        run_transform(api, results, 4, size);
        run_pairs(api, results, size);
        run_band(api, results, 4, size, false);
        run_band(api, results, 4, size, true);
        run_band(api, results, 1, size, false);
    }
}

}  // namespace golden
