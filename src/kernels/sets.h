// SPDX-License-Identifier: Apache-2.0
// What each instruction set's files give to the tables in select.cpp.
#pragma once

#include "kernels/kernels.h"

namespace ovrin {

BeginQuarterPlan begin_quarter_plan_scalar;
BeginQuarterPlan begin_quarter_plan_avx2;
BeginQuarterPlan begin_quarter_plan_avx512;
BeginQuarterPlan begin_quarter_plan_neon;

CopyTaps4 copy_taps4_scalar;

}  // namespace ovrin
