// SPDX-License-Identifier: Apache-2.0
// The rows of a scaled picture, plane by plane.
#pragma once

#include "bilinear/plan.h"

namespace ovrin {

// What the row functions read of the tables; they may belong to a caller's band record.
struct BilinearAxes {
    const int32_t* col_index;
    const int32_t* col_weight;
    const int32_t* row_index;
    const int32_t* row_weight;
};

inline BilinearAxes axes_of(const BilinearTables& tables) {
    return {tables.col_index, tables.col_weight, tables.row_index, tables.row_weight};
}

// Blends the whole extent.
void blend_rows(const BilinearGeometry& geometry, const BilinearAxes& axes,
                const BilinearExtent& extent);

// Copies the top left one of the samples that would be blended, for the first `columns` of the
// rows [first_row, end_row).
void copy_rows(const BilinearGeometry& geometry, const BilinearAxes& axes, int32_t columns,
               int32_t first_row, int32_t end_row);

}  // namespace ovrin
