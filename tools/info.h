// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "options.h"

namespace tool {

// Prints what each file holds, or what is wrong with it on standard error. False when something is.
bool say_what_files_are(const Options& options);

}  // namespace tool
