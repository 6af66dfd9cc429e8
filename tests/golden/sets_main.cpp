// SPDX-License-Identifier: Apache-2.0
// The library's objects with one set of kernels forced give the bytes of the golden file:
//   golden_sets SET FILE    compares
//   golden_sets SET         prints what the file should hold
#include <cstdio>
#include <cstring>

#include "golden/file.h"
#include "kernels/kernels.h"

namespace {

constexpr int kSkipped = 77;

const ovrin::Kernels* find_set(const char* name) {
    ovrin::NamedKernels sets[ovrin::kMaxSets];
    const int32_t count = ovrin::available_kernels(sets);
    for (int32_t i = 0; i < count; ++i) {
        if (strcmp(sets[i].name, name) == 0) return sets[i].kernels;
    }
    return nullptr;
}

bool is_known(const char* name) {
    for (const char* known : {"scalar", "avx2", "avx512", "neon"}) {
        if (strcmp(known, name) == 0) return true;
    }
    return false;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc < 2 || argc > 3 || !is_known(argv[1])) {
        fprintf(stderr, "usage: %s scalar|avx2|avx512|neon [FILE]\n", argv[0]);
        return 2;
    }
    const ovrin::Kernels* set = find_set(argv[1]);
    if (set == nullptr) {
        printf("skipped: this processor does not have %s\n", argv[1]);
        return kSkipped;
    }
    ovrin::force_kernels(*set);
    const golden::Api linked = OVRIN_LINKED_API;
    const std::vector<golden::Result> results = golden::run_cases(linked);
    if (argc == 2) {
        golden::print(results);
        return 0;
    }
    return golden::equal_file(results, argv[2]) ? 0 : 1;
}
