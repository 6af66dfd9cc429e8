// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "picture.h"

namespace tool {

// For strong reductions, where every source pixel should count: exact halvings as far as they go,
// and the Lanczos engine for what is left of the ratio, before the last of them. Reductions to more
// than half are the Lanczos engine's alone. Uses up the source.
void resize_thumbnail(Picture* source, Picture* result);

}  // namespace tool
