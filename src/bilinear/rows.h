// SPDX-License-Identifier: Apache-2.0
// The rows of a scaled picture, plane by plane.
#pragma once

#include "bilinear/plan.h"
#include "kernels/kernels.h"

namespace ovrin {

// Blends the whole extent.
void blend_rows(const Kernels& set, const BilinearGeometry& geometry, const BilinearAxes& axes,
                const BilinearExtent& extent);

// Copies the top left one of the samples that would be blended, for the first `columns` of the
// rows [first_row, end_row).
void copy_rows(const Kernels& set, const BilinearGeometry& geometry, const BilinearAxes& axes,
               int32_t columns, int32_t first_row, int32_t end_row);

}  // namespace ovrin
