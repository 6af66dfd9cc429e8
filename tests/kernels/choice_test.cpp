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

#include <cpuid.h>

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

// A processor, or a system that does not save the registers, that lacks one of them.
TEST(KernelChoice, ASetNeedsEachOfItsExtensions) {
    const ovrin::CpuWords all = {
        bit_OSXSAVE | bit_AVX | bit_FMA,
        bit_AVX2 | bit_AVX512F | bit_AVX512BW | bit_AVX512DQ | bit_AVX512VL, bit_AVX512VBMI, 0xE6};
    EXPECT_TRUE(ovrin::features_of(all).avx2);
    EXPECT_TRUE(ovrin::features_of(all).avx512_vbmi);
    const struct {
        unsigned ovrin::CpuWords::*word;
        unsigned flag;
        bool has_avx2;
    } lacking[] = {
        {&ovrin::CpuWords::basic_ecx, bit_OSXSAVE, false},
        {&ovrin::CpuWords::basic_ecx, bit_AVX, false},
        {&ovrin::CpuWords::basic_ecx, bit_FMA, false},
        {&ovrin::CpuWords::extended_ebx, bit_AVX2, false},
        {&ovrin::CpuWords::saved_state, 0x02, false},  // the low halves of AVX's registers
        {&ovrin::CpuWords::saved_state, 0x04, false},  // the high ones
        {&ovrin::CpuWords::extended_ebx, bit_AVX512F, true},
        {&ovrin::CpuWords::extended_ebx, bit_AVX512BW, true},
        {&ovrin::CpuWords::extended_ebx, bit_AVX512DQ, true},
        {&ovrin::CpuWords::extended_ebx, bit_AVX512VL, true},
        {&ovrin::CpuWords::extended_ecx, bit_AVX512VBMI, true},
        {&ovrin::CpuWords::saved_state, 0x20, true},  // AVX-512's masks
        {&ovrin::CpuWords::saved_state, 0x40, true},  // the upper halves of its registers
        {&ovrin::CpuWords::saved_state, 0x80, true},  // those that there are more of
    };
    for (const auto& lack : lacking) {
        ovrin::CpuWords words = all;
        words.*lack.word &= ~lack.flag;
        const ovrin::CpuFeatures found = ovrin::features_of(words);
        EXPECT_EQ(found.avx2, lack.has_avx2) << std::hex << lack.flag;
        EXPECT_FALSE(found.avx512_vbmi) << std::hex << lack.flag;
    }
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
