// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace ovrin {

// What this processor and its operating system offer beyond the baseline of the architecture.
struct CpuFeatures {
    bool avx2;         // and FMA
    bool avx512_vbmi;  // and the foundation, BW, DQ and VL
};

CpuFeatures cpu_features();

#if defined(__x86_64__)
// What the features are told by.
struct CpuWords {
    unsigned basic_ecx;     // of CPUID's leaf 1
    unsigned extended_ebx;  // of leaf 7, 0 where the processor has none
    unsigned extended_ecx;
    unsigned saved_state;  // registers that the system keeps when it switches threads
};

CpuFeatures features_of(const CpuWords& words);
#endif

}  // namespace ovrin
