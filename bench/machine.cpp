// SPDX-License-Identifier: Apache-2.0
#include "machine.h"

#include <unistd.h>

#include <fstream>

#include "contender.h"

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

std::string names_of(const std::vector<ovrin::NamedKernels>& sets) {
    std::string names;
    for (const ovrin::NamedKernels& set : sets)
        names += (names.empty() ? "" : ", ") + std::string(set.name);
    return names;
}

std::string compiler() {
#if defined(__clang__)
    return "clang " __clang_version__;
#else
    return "g++ " __VERSION__;
#endif
}

}  // namespace

std::vector<ovrin::NamedKernels> all_sets() {
    ovrin::NamedKernels sets[ovrin::kMaxSets];
    const int32_t count = ovrin::available_kernels(sets);
    return {sets, sets + count};
}

std::vector<std::string> describe_machine(const std::vector<ovrin::NamedKernels>& sets) {
    return {
        "processor: " + processor() + ", " + std::to_string(sysconf(_SC_NPROCESSORS_ONLN)) +
            " cores",
        "our kernels: " + names_of(sets) + "; compiled by " + compiler(),
        "peers, one thread each: " + libyuv_version() + ", " + opencv_version() + ", " +
            swscale_version(),
    };
}

}  // namespace bench
