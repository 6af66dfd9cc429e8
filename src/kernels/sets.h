// SPDX-License-Identifier: Apache-2.0
// What each instruction set's files give to the tables in select.cpp.
#pragma once

#include "kernels/kernels.h"

namespace ovrin {

PlanQuarters plan_quarters_scalar;
PlanQuarters plan_quarters_avx2;
PlanQuarters plan_quarters_avx512;
PlanQuarters plan_quarters_neon;
PlanSimpleQuarters plan_simple_quarters_avx2;
PlanSimpleQuarters plan_simple_quarters_neon;

extern const BilinearBlend bilinear_blend_scalar[3];
extern const BilinearBlend bilinear_blend_avx2[3];
extern const BilinearBlend bilinear_blend_avx512[3];
extern const BilinearBlend bilinear_blend_neon[3];
extern const BilinearEdges bilinear_edges_scalar[3];
extern const BilinearCopy bilinear_copy_scalar[3];
extern const BilinearCopy bilinear_copy_avx2[3];
extern const BilinearCopy bilinear_copy_avx512[3];
extern const BilinearCopy bilinear_copy_neon[3];

extern const LanczosKernels lanczos_scalar;
extern const LanczosKernels lanczos_avx2;
extern const LanczosKernels lanczos_avx512;
extern const LanczosKernels lanczos_neon;

CopyEvery copy_every_scalar;
CopyEvery copy_every_avx2;
CopyEvery copy_every_neon;

}  // namespace ovrin
