// SPDX-License-Identifier: Apache-2.0
#include "machine.h"

#include <unistd.h>

#include <fstream>

#include "contender.h"
#include "kernels/kernels.h"

namespace bench {

namespace {

std::string processor() {
    std::ifstream info("/proc/cpuinfo");
    for (std::string line; std::getline(info, line);) {
        const size_t colon = line.find(": ");
        if (line.rfind("model name", 0) == 0 && colon != std::string::npos) {
            return line.substr(colon + 2);
        }
    }
    return "unknown processor";
}

std::string kernels_in_use() {
    ovrin::NamedKernels sets[ovrin::kMaxSets];
    const int32_t count = ovrin::available_kernels(sets);
    for (int32_t i = 0; i < count; ++i) {
        if (sets[i].kernels == &ovrin::kernels()) return sets[i].name;
    }
    return "unknown";
}

std::string compiler() {
#if defined(__clang__)
    return "clang " __clang_version__;
#else
    return "g++ " __VERSION__;
#endif
}

}  // namespace

bool choose_kernels(const std::string& name) {
    if (name.empty()) return true;
    ovrin::NamedKernels sets[ovrin::kMaxSets];
    const int32_t count = ovrin::available_kernels(sets);
    for (int32_t i = 0; i < count; ++i) {
        if (name != sets[i].name) continue;
        ovrin::force_kernels(*sets[i].kernels);
        return true;
    }
    return false;
}

std::vector<std::string> describe_machine() {
    return {
        "processor: " + processor() + ", " + std::to_string(sysconf(_SC_NPROCESSORS_ONLN)) +
            " cores",
        "our kernels: " + kernels_in_use() + ", compiled by " + compiler(),
        "peers, one thread each: " + libyuv_version() + ", " + opencv_version() + ", " +
            swscale_version(),
    };
}

}  // namespace bench
