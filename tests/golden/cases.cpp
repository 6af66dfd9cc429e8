// SPDX-License-Identifier: Apache-2.0
#include "golden/cases.h"

namespace golden {

std::vector<Result> run_cases(const Api& api) {
    std::vector<Result> results;
    run_packed_cases(api, results);
    run_plane_cases(api, results);
    run_bilinear_cases(api, results);
    run_lanczos_cases(api, results);
    return results;
}

}  // namespace golden
