// SPDX-License-Identifier: Apache-2.0
// Kernels alone: each of each set that this processor has, on rows that the caches hold.
#pragma once

#include <iosfwd>
#include <string>

#include "runner.h"

namespace bench {

// A table with a row for each kernel and shape whose description holds `filter`. False: none does.
bool print_kernels(std::ostream& out, const std::string& filter, const Effort& effort);

}  // namespace bench
