// SPDX-License-Identifier: Apache-2.0
#include "kernels/cpu.h"
#include "kernels/sets.h"

namespace ovrin {

const Kernels scalar_kernels = {plan_quarters_scalar, bilinear_blend_scalar, bilinear_edges_scalar,
                                bilinear_copy_scalar, &lanczos_scalar,       copy_every_scalar};

namespace {

#if defined(__x86_64__)

constexpr Kernels kAvx2Kernels = {plan_quarters_avx2, bilinear_blend_avx2, bilinear_edges_scalar,
                                  bilinear_copy_avx2, &lanczos_avx2,       copy_every_scalar};
constexpr Kernels kAvx512Kernels = {plan_quarters_avx512,  bilinear_blend_avx512,
                                    bilinear_edges_scalar, bilinear_copy_avx512,
                                    &lanczos_avx512,       copy_every_avx512};

const Kernels* best_kernels() {
    const CpuFeatures cpu = cpu_features();
    if (cpu.avx512_vbmi) return &kAvx512Kernels;
    if (cpu.avx2) return &kAvx2Kernels;
    return &scalar_kernels;
}

#elif defined(__aarch64__)

constexpr Kernels kNeonKernels = {plan_quarters_neon, bilinear_blend_neon, bilinear_edges_scalar,
                                  bilinear_copy_neon, &lanczos_neon,       copy_every_neon};

const Kernels* best_kernels() {
    return &kNeonKernels;
}

#else

const Kernels* best_kernels() {
    return &scalar_kernels;
}

#endif

// Every thread that finds it empty stores the same pointer to a constant table.
const Kernels* chosen = nullptr;

}  // namespace

const Kernels& kernels() {
    const Kernels* set = __atomic_load_n(&chosen, __ATOMIC_RELAXED);
    if (set == nullptr) {
        set = best_kernels();
        __atomic_store_n(&chosen, set, __ATOMIC_RELAXED);
    }
    return *set;
}

void force_kernels(const Kernels& set) {
    __atomic_store_n(&chosen, &set, __ATOMIC_RELAXED);
}

int32_t available_kernels(NamedKernels sets[kMostSets]) {
    int32_t count = 0;
    sets[count++] = {"scalar", &scalar_kernels};
#if defined(__x86_64__)
    const CpuFeatures cpu = cpu_features();
    if (cpu.avx2) sets[count++] = {"avx2", &kAvx2Kernels};
    if (cpu.avx512_vbmi) sets[count++] = {"avx512", &kAvx512Kernels};
#elif defined(__aarch64__)
    sets[count++] = {"neon", &kNeonKernels};
#endif
    return count;
}

}  // namespace ovrin
