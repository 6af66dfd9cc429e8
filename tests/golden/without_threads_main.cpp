// SPDX-License-Identifier: Apache-2.0
// Where the system refuses threads, the library's objects give the bytes of the golden file but for
// the cases of a second one: those where the header says that threads make a difference.
//   golden_without_threads GOLDEN EXCEPTIONS    compares
//   golden_without_threads                      prints all results
#include <cstdio>

#include "golden/file.h"
#include "support/faults.h"

int main(int argc, char** argv) {
    if (argc != 1 && argc != 3) {
        fprintf(stderr, "usage: %s [GOLDEN EXCEPTIONS]\n", argv[0]);
        return 2;
    }
    faults::fail(faults::Kind::kThread, 1, true);
    const golden::Api linked = OVRIN_LINKED_API;
    const std::vector<golden::Result> results = golden::run_cases(linked);
    if (argc == 1) {
        golden::print(results);
        return 0;
    }
    return golden::equal_files(results, {argv[1], argv[2]}) ? 0 : 1;
}
