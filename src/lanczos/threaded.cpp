// SPDX-License-Identifier: Apache-2.0
// The Lanczos engine in bands of destination rows.
#include <ovrinresize.h>
#include <string.h>

#include "bands/records.h"
#include "bands/split.h"
#include "kernels/kernels.h"
#include "lanczos/rows.h"

namespace ovrin {

namespace {

constexpr int32_t kPlacedBytes = 4;  // bytes per pixel that bands are placed by

struct LanczosCall {
    const uint8_t* src;
    uint8_t* dst;
    int32_t src_w;
    int32_t src_h;
    int32_t dst_w;
    int32_t dst_h;
    int32_t bytes_per_pixel;
};

// Of a picture with bands, which has destination rows.
bool is_empty(const LanczosCall& call) {
    return call.dst == nullptr || call.src_w < 1 || call.src_h < 1 || call.dst_w < 1 ||
           call.bytes_per_pixel < 1;
}

void fill_bands(ovrin_lanczos_band* bands, int32_t count, int32_t height, const LanczosCall& call,
                const LanczosPlan& plan) {
    for (int32_t i = 0; i < count; ++i) {
        ovrin_lanczos_band& band = bands[i];
        band.src_w = call.src_w;
        band.src_h = call.src_h;
        band.dst_w = call.dst_w;
        band.dst_h = call.dst_h;
        band.src = call.src;
        band.first_row = i * height;
        band.dst = call.dst + int64_t{call.dst_w} * band.first_row * kPlacedBytes;
        band.bytes_per_pixel = call.bytes_per_pixel;
        band.rows = i == count - 1 ? call.dst_h - band.first_row : height;
        band.table = plan.table;
        band.column_weights = plan.columns.data();
        band.row_weights = plan.rows.data();
    }
}

// False when the picture is left to the calling thread.
bool resize_in_bands(const LanczosCall& call) {
    const int32_t height = band_height(call.src_h, call.dst_h);
    const int32_t count = band_count(call.dst_h, height);
    if (count < 2 || is_empty(call)) return false;
    BandPool pool;
    if (!pool.ready()) return false;
    LanczosPlan plan(call.dst_w, call.dst_h);
    if (!plan.ready()) return true;
    const BandRecords<ovrin_lanczos_band> bands(count);
    if (bands.data() == nullptr) return false;
    plan.fill(call.src_w, call.src_h);
    fill_bands(bands.data(), count, height, call, plan);
    memset(call.dst, 0,
           static_cast<size_t>(call.dst_w) * static_cast<size_t>(call.dst_h) * kPlacedBytes);
    run_records(pool, _resize_lanczos_tp, bands);
    return true;
}

}  // namespace

}  // namespace ovrin

using namespace ovrin;

void _resize_lanczos_tp(void* band) {
    const auto& record = *static_cast<const ovrin_lanczos_band*>(band);
    if (record.dst == nullptr || record.src == nullptr || record.table == nullptr) return;
    if (record.src_w < 1 || record.src_h < 1 || record.dst_w < 1 || record.dst_h < 1) return;
    if (record.bytes_per_pixel < 1 || record.rows < 1) return;
    LanczosPicture picture = {};
    picture.src = record.src;
    picture.src_w = record.src_w;
    picture.src_h = record.src_h;
    picture.src_pitch = ptrdiff_t{record.src_w} * record.bytes_per_pixel;
    picture.src_components = record.bytes_per_pixel;
    picture.dst = record.dst;
    picture.dst_w = record.dst_w;
    picture.dst_h = record.dst_h;
    picture.dst_pitch = ptrdiff_t{record.dst_w} * record.bytes_per_pixel;
    picture.dst_components = record.bytes_per_pixel;
    picture.column_weights = record.column_weights;
    picture.row_weights = record.row_weights;
    LanczosCache cache(picture);
    if (!cache.ready()) return;
    filter_rows(kernels().plan_lanczos, picture, cache, record.first_row,
                record.first_row + record.rows);
}

void ovrin_resize_lanczos(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h,
                          int32_t dst_w, int32_t dst_h, int32_t bytes_per_pixel) {
    const LanczosCall call = {src, dst, src_w, src_h, dst_w, dst_h, bytes_per_pixel};
    if (!resize_in_bands(call)) {
        ov_lanczos(src, src_w, src_h, dst, dst_w, dst_h, bytes_per_pixel);
    }
}
