// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "options.h"

namespace tool {

// Resizes many pictures, several at a time. Those that fail are reported and left out. Returns how
// many they are. Throws Error when there is nothing to begin with.
int64_t run_batch(const Options& options);

}  // namespace tool
