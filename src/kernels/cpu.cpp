// SPDX-License-Identifier: Apache-2.0
#include "kernels/cpu.h"

#if defined(__x86_64__)
#include <cpuid.h>
#include <stdint.h>
#endif

namespace ovrin {

#if defined(__x86_64__)

namespace {

struct CpuidLeaf {
    unsigned eax = 0, ebx = 0, ecx = 0, edx = 0;

    explicit CpuidLeaf(unsigned leaf) { __get_cpuid_count(leaf, 0, &eax, &ebx, &ecx, &edx); }
};

constexpr bool has(unsigned flags, unsigned wanted) {
    return (flags & wanted) == wanted;
}

unsigned saved_state() {
    unsigned low, high;
    __asm__ volatile("xgetbv" : "=a"(low), "=d"(high) : "c"(0));
    return low;
}

constexpr unsigned kYmmState = 0x06;
constexpr unsigned kZmmState = 0xE6;

}  // namespace

CpuFeatures features_of(const CpuWords& words) {
    const bool avx2 = has(words.basic_ecx, bit_OSXSAVE | bit_AVX | bit_FMA) &&
                      has(words.extended_ebx, bit_AVX2) && has(words.saved_state, kYmmState);
    const bool avx512 =
        avx2 && has(words.extended_ebx, bit_AVX512F | bit_AVX512BW | bit_AVX512DQ | bit_AVX512VL) &&
        has(words.extended_ecx, bit_AVX512VBMI) && has(words.saved_state, kZmmState);
    return {avx2, avx512};
}

CpuFeatures cpu_features() {
    const CpuidLeaf basic(1);
    const CpuidLeaf extended(7);
    // Without OSXSAVE there is no instruction that tells what is saved.
    const unsigned state = has(basic.ecx, bit_OSXSAVE) ? saved_state() : 0;
    return features_of({basic.ecx, extended.ebx, extended.ecx, state});
}

#else

CpuFeatures cpu_features() {
    return {false, false};
}

#endif

}  // namespace ovrin
