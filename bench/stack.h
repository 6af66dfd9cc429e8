// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <iosfwd>

#include "cases.h"

namespace bench {

// Prints how deep our calls reach into the stack of the thread that makes them.
void print_stack_use(std::ostream& out, const std::vector<Case>& cases);

}  // namespace bench
