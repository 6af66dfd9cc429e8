// SPDX-License-Identifier: Apache-2.0
// Which kernels a processor gets. Linked with --wrap, so that this machine can pass for others; the
// kernels themselves do not run here.
#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

#include "kernels/cpu.h"
#include "kernels/kernels.h"

namespace {

ovrin::CpuFeatures features = {false, false};

}  // namespace

extern "C" {
// ovrin::cpu_features
ovrin::CpuFeatures __real__ZN5ovrin12cpu_featuresEv();
ovrin::CpuFeatures __wrap__ZN5ovrin12cpu_featuresEv();

ovrin::CpuFeatures __wrap__ZN5ovrin12cpu_featuresEv() {
    return features;
}
}

#if defined(__x86_64__)

namespace {

std::vector<std::string> names_of_sets() {
    ovrin::NamedKernels sets[ovrin::kMaxSets];
    const int32_t count = ovrin::available_kernels(sets);
    std::vector<std::string> names;
    for (int32_t i = 0; i < count; ++i) names.emplace_back(sets[i].name);
    return names;
}

// The choice is made once, so each is made in a process of its own: it ends with 0 when the last of
// the available sets was chosen.
void expect_last_set_is_chosen() {
    EXPECT_EXIT(
        {
            ovrin::NamedKernels sets[ovrin::kMaxSets];
            const int32_t count = ovrin::available_kernels(sets);
            exit(&ovrin::kernels() == sets[count - 1].kernels ? 0 : 1);
        },
        ::testing::ExitedWithCode(0), "");
}

}  // namespace

TEST(KernelChoice, ProcessorsGetTheBestOfTheirSets) {
    const struct {
        ovrin::CpuFeatures features;
        std::vector<std::string> sets;
    } processors[] = {{{false, false}, {"scalar"}},
                      {{true, false}, {"scalar", "avx2"}},
                      {{true, true}, {"scalar", "avx2", "avx512"}}};
    for (const auto& processor : processors) {
        features = processor.features;
        EXPECT_EQ(names_of_sets(), processor.sets);
        expect_last_set_is_chosen();
    }
}

// Otherwise every processor could pass for an old one, with the right bytes from slow kernels.
TEST(KernelChoice, TheProcessorHasWhatTheCompilerFindsToo) {
    const ovrin::CpuFeatures own = __real__ZN5ovrin12cpu_featuresEv();
    const bool avx2 = __builtin_cpu_supports("avx2") && __builtin_cpu_supports("fma");
    EXPECT_EQ(own.avx2, avx2);
    EXPECT_EQ(own.avx512_vbmi,
              avx2 && __builtin_cpu_supports("avx512f") && __builtin_cpu_supports("avx512bw") &&
                  __builtin_cpu_supports("avx512dq") && __builtin_cpu_supports("avx512vl") &&
                  __builtin_cpu_supports("avx512vbmi"));
}

#else

TEST(KernelChoice, ProcessorsGetTheBestOfTheirSets) {
    GTEST_SKIP() << "skipped: only x86-64 has a choice";
}

#endif

TEST(KernelChoice, WithoutAvx2ThereIsNoAvx512) {
    const ovrin::CpuFeatures own = __real__ZN5ovrin12cpu_featuresEv();
    EXPECT_TRUE(own.avx2 || !own.avx512_vbmi);
}
