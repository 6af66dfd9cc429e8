// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <functional>

#include "size.h"

namespace tool {

// Takes rows of a picture, from first_row on.
using TakeRows = std::function<void(int32_t first_row, int32_t rows, const uint8_t* samples)>;

// The Lanczos engine on samples of 1 to 4 bytes that lie side by side. The result is never whole in
// memory: so many threads, the calling one among them, share its bands, each of an even number of
// rows but perhaps the last, and call `take` with them. The bytes are those of ov_lanczos().
void lanczos_in_bands(const uint8_t* src, Size from, Size to, int32_t channels, int32_t threads,
                      const TakeRows& take);

}  // namespace tool
