// SPDX-License-Identifier: Apache-2.0
// The bilinear engine in bands of destination rows. Bands copy samples where the single-threaded
// way blends them.
#include "bands/records.h"
#include "bands/split.h"
#include "bilinear/rows.h"

namespace ovrin {

namespace {

// The geometry that a task works with: what the record says, but for what its target says.
BilinearGeometry geometry_of_band(const ovrin_bilinear_band& band) {
    BilinearGeometry g = geometry_of({band.src, band.dst, band.src_width, band.src_height,
                                      band.canvas_width, band.dst_h, band.format, band.target});
    if (band.target == nullptr && band.bpp > 0) g.src_stride = band.src_pitch / band.bpp;
    return g;
}

int64_t src_row_bytes(const BilinearGeometry& geometry) {
    return int64_t{geometry.src_stride} * bytes_per_pixel(geometry.layout);
}

ovrin_bilinear_band template_band(const BilinearCall& call, const BilinearGeometry& geometry,
                                  const BilinearTables& tables, const BilinearExtent& extent) {
    ovrin_bilinear_band band = {};
    band.target = call.target;
    band.src_width = geometry.src_width;
    band.src_height = geometry.src_height;
    band.dst_w = extent.columns;
    band.dst_h = extent.rows;
    band.src = call.src;
    band.dst = call.dst;
    band.format = geometry.format;
    band.col_weight = tables.col_weight;
    band.row_weight = tables.row_weight;
    band.col_index = tables.col_index;
    band.row_index = tables.row_index;
    band.canvas_width = geometry.canvas_width;
    band.bpp = bytes_per_pixel(geometry.layout);
    band.src_pitch = static_cast<int32_t>(src_row_bytes(geometry));
    band.edge_cols = extent.edge_cols;
    return band;
}

// Bands are counted for the whole picture; rows that the canvas has no room for stay out.
void fill_bands(ovrin_bilinear_band* bands, int32_t count, int32_t height,
                const ovrin_bilinear_band& first, int32_t edge_rows) {
    for (int32_t i = 0; i < count; ++i) {
        const int64_t end = (int64_t{i} + 1) * height;
        bands[i] = first;
        bands[i].first_row = i * height;
        bands[i].end_row =
            i == count - 1 || end > first.dst_h ? first.dst_h : static_cast<int32_t>(end);
    }
    bands[count - 1].edge_rows = edge_rows;
}

// False when the picture is left to the calling thread.
bool resize_in_bands(const BilinearCall& call) {
    const int32_t height = band_height(call.src_h, call.dst_h);
    const int32_t count = band_count(call.dst_h, height);
    if (count < 2 || call.dst_h < kThreadedRows) return false;
    const BilinearGeometry geometry = geometry_of(call);
    // A band record holds the source's row length in 32 bits.
    if (!is_supported(geometry) || src_row_bytes(geometry) > INT32_MAX) return false;
    BandPool pool;
    if (!pool.ready()) return false;
    BilinearTables tables(call.dst_w, call.dst_h);
    if (!tables.ready()) return true;
    const BandRecords<ovrin_bilinear_band> bands(count);
    if (bands.data() == nullptr) return false;
    tables.fill(geometry);
    const BilinearExtent extent = extent_of(geometry, tables);
    fill_bands(bands.data(), count, height, template_band(call, geometry, tables, extent),
               extent.edge_rows);
    clear_canvas(geometry, extent);
    run_records(pool, _ov_bilinear_tp, bands);
    return true;
}

}  // namespace

}  // namespace ovrin

using namespace ovrin;

void _ov_bilinear_tp(void* band) {
    const auto& record = *static_cast<const ovrin_bilinear_band*>(band);
    const BilinearGeometry geometry = geometry_of_band(record);
    if (geometry.layout == BilinearLayout::kUnknown) return;
    copy_rows(kernels(), geometry,
              {record.col_index, record.col_weight, record.row_index, record.row_weight},
              record.dst_w, record.first_row, record.end_row);
}

void ov_bilinear(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h, int32_t dst_w,
                 int32_t dst_h, int32_t format, const ovrin_resize_target* target) {
    if (src_w == 0 || src_h == 0 || dst_w < 1 || dst_h < 1) return;
    const BilinearCall call = {src, dst, src_w, src_h, dst_w, dst_h, format, target};
    if (!resize_in_bands(call)) {
        ov_bilinear_sg(src, dst, src_w, src_h, dst_w, dst_h, format, target);
    }
}
