// SPDX-License-Identifier: Apache-2.0
// The cases: calls with made-up pictures, each with a name and a hash of everything it could write.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "golden/api.h"

namespace golden {

struct Result {
    std::string name;  // the function, a colon, and what it was given
    uint64_t hash;
};

// Runs all cases, in the order of the golden file.
std::vector<Result> run_cases(const Api& api);

// The parts of it.
void run_packed_cases(const Api& api, std::vector<Result>& results);
void run_plane_cases(const Api& api, std::vector<Result>& results);
void run_bilinear_cases(const Api& api, std::vector<Result>& results);
void run_lanczos_cases(const Api& api, std::vector<Result>& results);

}  // namespace golden
