// SPDX-License-Identifier: Apache-2.0
// The bilinear engine on the calling thread.
#include "bilinear/rows.h"

using namespace ovrin;

void ov_bilinear_sg(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h, int32_t dst_w,
                    int32_t dst_h, int32_t format, const ovrin_resize_target* target) {
    if (src_w == 0 || src_h == 0 || dst_w < 1 || dst_h < 1) return;
    const BilinearGeometry geometry =
        geometry_of({src, dst, src_w, src_h, dst_w, dst_h, format, target});
    if (!is_supported(geometry)) return;
    BilinearTables tables(dst_w, dst_h);
    if (!tables.ready()) return;
    tables.fill(geometry);
    const BilinearExtent extent = extent_of(geometry, tables);
    clear_canvas(geometry, extent);
    blend_rows(kernels(), geometry, tables, extent);
}
