// SPDX-License-Identifier: Apache-2.0
// The cases of the golden file, for the module as it ships: this one imports its memory and its
// functions.
#include <cstdlib>
#include <cstring>

#include "golden/cases.h"

extern "C" {

char* golden_lines();

// The lines of the golden file, as the module computes them, with a 0 at their end.
char* golden_lines() {
    const golden::Api linked = OVRIN_LINKED_API;
    std::string lines;
    for (const golden::Result& result : golden::run_cases(linked)) {
        lines += result.name + ' ';
        for (int shift = 60; shift >= 0; shift -= 4) {
            lines += "0123456789abcdef"[result.hash >> shift & 0xF];
        }
        lines += '\n';
    }
    return strdup(lines.c_str());
}

}  // extern "C"
