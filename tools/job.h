// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "options.h"

namespace tool {

// Reads what the options name, resizes and writes it. Throws Error.
void run(const Options& options);

}  // namespace tool
