// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

#include "kernels/kernels.h"

namespace bench {

// The sets of kernels that this processor has, the library's choice last.
std::vector<ovrin::NamedKernels> all_sets();

// What a measurement with these sets depends on, one fact a line.
std::vector<std::string> describe_machine(const std::vector<ovrin::NamedKernels>& sets);

}  // namespace bench
