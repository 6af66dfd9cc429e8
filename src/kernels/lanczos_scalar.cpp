// SPDX-License-Identifier: Apache-2.0
#include "kernels/lanczos_chain_inl.h"
#include "kernels/sets.h"

namespace ovrin {

namespace {

void prepare(LanczosStrip& /*strip*/) {}

void filter_row(LanczosStrip& strip, const LanczosRow& row) {
    filter_by_chains(strip, row);
}

}  // namespace

const LanczosKernels lanczos_scalar = {prepare, filter_row};

}  // namespace ovrin
