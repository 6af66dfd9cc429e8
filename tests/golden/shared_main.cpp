// SPDX-License-Identifier: Apache-2.0
// golden_shared FILE: the shared object gives the bytes of the golden file.
#include <cstdio>

#include "golden/file.h"

int main(int argc, char** argv) {
    if (argc != 2) {
        fprintf(stderr, "usage: %s FILE\n", argv[0]);
        return 2;
    }
    const golden::Api linked = OVRIN_LINKED_API;
    return golden::equal_file(golden::run_cases(linked), argv[1]) ? 0 : 1;
}
