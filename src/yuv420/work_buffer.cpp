// SPDX-License-Identifier: Apache-2.0
#include "yuv420/work_buffer.h"

namespace ovrin {

// Out of line, because compilers that see memory obtained and released without being used leave
// both out, and with them the call's failure.
__attribute__((noinline)) WorkBuffer::WorkBuffer(const Yuv420Layout& grid)
    : data_(static_cast<uint8_t*>(malloc(2 * static_cast<size_t>(grid.luma_plane())))) {}

}  // namespace ovrin
