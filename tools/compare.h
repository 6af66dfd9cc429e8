// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "options.h"

namespace tool {

// Prints how far the two files' pictures or frames are apart, and returns whether that is as near
// as the options want. Throws Error, also when sizes or numbers of frames differ.
bool compare(const Options& options);

}  // namespace tool
