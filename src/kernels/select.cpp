// SPDX-License-Identifier: Apache-2.0
#if defined(OVRIN_KERNELS)
#include <string.h>
#endif

#include "kernels/cpu.h"
#include "kernels/sets.h"

namespace ovrin {

const Kernels scalar_kernels = {plan_quarters_scalar, plan_bilinear_scalar,
                                plan_bilinear_copy_scalar, plan_lanczos_scalar, copy_every_scalar};

namespace {

#if defined(__x86_64__)
constexpr Kernels kAvx2Kernels = {plan_quarters_avx2, plan_bilinear_avx2, plan_bilinear_copy_avx2,
                                  plan_lanczos_avx2, copy_every_avx2};
constexpr Kernels kAvx512Kernels = {plan_quarters_avx512, plan_bilinear_avx512,
                                    plan_bilinear_copy_avx512, plan_lanczos_avx512,
                                    copy_every_avx2};
#elif defined(__aarch64__)
constexpr Kernels kNeonKernels = {plan_quarters_neon, plan_bilinear_neon, plan_bilinear_copy_neon,
                                  plan_lanczos_neon, copy_every_neon};
#elif defined(__wasm_simd128__)
// The NEON kernels, in WebAssembly's instructions. Those have no fused multiply-add, and no loads
// that part interleaved words.
constexpr Kernels kSimd128Kernels = {plan_quarters_neon, plan_bilinear_neon,
                                     plan_bilinear_copy_neon, plan_lanczos_wasm, copy_every_scalar};
#elif defined(__wasm__)
constexpr Kernels kWasmKernels = {plan_quarters_scalar, plan_bilinear_scalar,
                                  plan_bilinear_copy_scalar, plan_lanczos_wasm, copy_every_scalar};
#endif

const Kernels* best_kernels() {
    NamedKernels sets[kMaxSets];
    int32_t best = available_kernels(sets) - 1;
#if defined(OVRIN_KERNELS)
    // A build for tests of one set; it runs only where the processor has it.
    while (strcmp(sets[best].name, OVRIN_KERNELS) != 0) {
        if (--best < 0) __builtin_trap();
    }
#endif
    return sets[best].kernels;
}

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

// In ascending order of speed.
int32_t available_kernels(NamedKernels sets[kMaxSets]) {
    int32_t count = 0;
    sets[count++] = {"scalar", &scalar_kernels};
#if defined(__x86_64__)
    const CpuFeatures cpu = cpu_features();
    if (cpu.avx2) sets[count++] = {"avx2", &kAvx2Kernels};
    if (cpu.avx512_vbmi) sets[count++] = {"avx512", &kAvx512Kernels};
#elif defined(__aarch64__)
    sets[count++] = {"neon", &kNeonKernels};
#elif defined(__wasm_simd128__)
    sets[count++] = {"simd128", &kSimd128Kernels};
#elif defined(__wasm__)
    sets[count++] = {"wasm", &kWasmKernels};
#endif
    return count;
}

}  // namespace ovrin
