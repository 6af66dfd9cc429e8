// SPDX-License-Identifier: Apache-2.0
// The inner loops of the library, one table of function pointers per instruction set. Nothing
// outside this folder knows which set is in use. Each family's header holds its contract.
#pragma once

#include "kernels/bilinear.h"
#include "kernels/copy.h"
#include "kernels/lanczos.h"
#include "kernels/quarter.h"

namespace ovrin {

struct Kernels {
    PlanQuarters* plan_quarters;
    PlanBilinear* plan_bilinear;
    PlanBilinearCopy* plan_bilinear_copy;
    PlanLanczos* plan_lanczos;
    CopyEvery* copy_every;
};

// The plain C++ kernels, which define what every other set must compute.
extern const Kernels scalar_kernels;

// The set in use: the best that this processor has. Every call of the library asks once and passes
// it down.
const Kernels& kernels();

// For tests and benchmarks of the library's objects: all sets that this processor can run, the
// scalar one first, and the choice of one of them for all calls from now on.
struct NamedKernels {
    const char* name;
    const Kernels* kernels;
};
constexpr int32_t kMaxSets = 4;
int32_t available_kernels(NamedKernels sets[kMaxSets]);
void force_kernels(const Kernels& set);

}  // namespace ovrin
