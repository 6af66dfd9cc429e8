// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "options.h"

namespace tool {

// Calls the library's functions with every set of kernels that this processor has, or those of
// another library, prints how many results are as everywhere, and returns whether all are. Throws
// Error when the other library cannot be called.
bool selftest(const Options& options);

}  // namespace tool
