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

PlanBilinear plan_bilinear_scalar;
PlanBilinear plan_bilinear_avx2;
PlanBilinear plan_bilinear_avx512;
PlanBilinear plan_bilinear_neon;

PlanBilinearCopy plan_bilinear_copy_scalar;
PlanBilinearCopy plan_bilinear_copy_avx2;
PlanBilinearCopy plan_bilinear_copy_avx512;
PlanBilinearCopy plan_bilinear_copy_neon;

PlanLanczos plan_lanczos_scalar;
PlanLanczos plan_lanczos_avx2;
PlanLanczos plan_lanczos_avx512;
PlanLanczos plan_lanczos_neon;
PlanLanczos plan_lanczos_wasm;

CopyEvery copy_every_scalar;
CopyEvery copy_every_avx2;
CopyEvery copy_every_neon;

}  // namespace ovrin
