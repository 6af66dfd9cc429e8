// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace ovrin {

// What this processor and its operating system offer beyond the baseline of the architecture.
struct CpuFeatures {
    bool avx2;         // and FMA
    bool avx512_vbmi;  // and the foundation, BW, DQ and VL
};

CpuFeatures cpu_features();

}  // namespace ovrin
