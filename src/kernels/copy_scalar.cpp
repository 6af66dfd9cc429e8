// SPDX-License-Identifier: Apache-2.0
#include "kernels/sets.h"

namespace ovrin {

void copy_every_scalar(uint32_t* dst, const uint32_t* src, int32_t step, int32_t count,
                       const uint32_t* /*next*/) {
    for (int64_t i = 0; i < count; ++i) dst[i] = src[i * step];
}

}  // namespace ovrin
