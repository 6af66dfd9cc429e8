// SPDX-License-Identifier: Apache-2.0
// The contract of the copying kernels.
#pragma once

#include <stdint.h>

namespace ovrin {

// dst[i] = src[i * step], for i in [0, count) and a step of 0 or more. `next` is the row that will
// be asked for next. Reads nothing past the last of these words.
using CopyEvery = void(uint32_t* dst, const uint32_t* src, int32_t step, int32_t count,
                       const uint32_t* next);

}  // namespace ovrin
