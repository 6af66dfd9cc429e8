// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <ostream>

#include "runner.h"

namespace bench {

// What threads cost and what they gain: pictures of 1024 rows and more on the calling thread and on
// several, with every set of kernels that the processor has, and where the time goes.
void print_thread_costs(std::ostream& out, const Effort& effort);

}  // namespace bench
