// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace tool {

// The version of the tool and its library, and the library's kernels that this processor runs.
std::string version_text();

}  // namespace tool
