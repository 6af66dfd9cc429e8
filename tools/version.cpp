// SPDX-License-Identifier: Apache-2.0
#include "version.h"

#include <ovrinresize.h>

// The library's own look at the processor, compiled in: it does not tell its choice.
#include "kernels/cpu.h"

namespace tool {

namespace {

const char* kernels() {
#if defined(OVRIN_KERNELS)
    return OVRIN_KERNELS;
#elif defined(__aarch64__)
    return "neon";
#else
    const ovrin::CpuFeatures cpu = ovrin::cpu_features();
    if (cpu.avx512_vbmi) return "avx512";
    return cpu.avx2 ? "avx2" : "scalar";
#endif
}

}  // namespace

std::string version_text() {
    return std::string("ovrinresize " OVRINRESIZE_VERSION "\nlibovrinresize " OVRINRESIZE_VERSION
                       ", kernels: ") +
           kernels();
}

}  // namespace tool
