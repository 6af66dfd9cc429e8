// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

namespace bench {

// Picks the library's kernels by the name of their set; an empty name leaves the library's choice.
// False when this processor does not have them.
bool choose_kernels(const std::string& name);

// What a measurement depends on, one fact a line.
std::vector<std::string> describe_machine();

}  // namespace bench
