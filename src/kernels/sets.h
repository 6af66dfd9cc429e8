// SPDX-License-Identifier: Apache-2.0
// What each instruction set's files give to the tables in select.cpp.
#pragma once

#include "kernels/kernels.h"

namespace ovrin {

PlanQuarters plan_quarters_scalar;
PlanQuarters plan_quarters_avx2;
PlanQuarters plan_quarters_avx512;
PlanQuarters plan_quarters_neon;

extern const BilinearBlend bilinear_blend_scalar[3];
extern const BilinearBlend bilinear_blend_avx2[3];
extern const BilinearBlend bilinear_blend_neon[3];
extern const BilinearEdges bilinear_edges_scalar[3];

LanczosRowKernel lanczos_row_scalar;
LanczosRowKernel lanczos_row_avx2;
LanczosRowKernel lanczos_row_neon;

CopyEvery copy_every_scalar;
CopyEvery copy_every_avx512;
CopyEvery copy_every_neon;

}  // namespace ovrin
