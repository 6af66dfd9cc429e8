// SPDX-License-Identifier: Apache-2.0
#include "kernels/lanczos_chain_inl.h"
#include "kernels/sets.h"

namespace ovrin {

FilterLanczos* plan_lanczos_scalar(LanczosStripPlan& plan, const LanczosColumns& columns) {
    plan.columns = &columns;
    return filter_by_chains;
}

}  // namespace ovrin
