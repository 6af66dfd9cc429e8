// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#include "size.h"

namespace tool {

// For strong reductions, where every sample of the source should count: exact halvings as far as
// they go, and the Lanczos engine for what is left of the ratio, before the last of them.
// Reductions to more than half are the Lanczos engine's alone. Samples have 1 to 4 bytes. Uses up
// the source.
void resize_thumbnail(uint8_t* src, Size from, uint8_t* dst, Size to, int32_t channels);

}  // namespace tool
