// SPDX-License-Identifier: Apache-2.0
#include "yuv420/work_buffer.h"

#include <stdlib.h>

namespace ovrin {

WorkBuffer::WorkBuffer(const Yuv420Layout& grid)
    : data_(static_cast<uint8_t*>(malloc(2 * static_cast<size_t>(grid.luma_size())))) {}

WorkBuffer::~WorkBuffer() {
    free(data_);
}

}  // namespace ovrin
