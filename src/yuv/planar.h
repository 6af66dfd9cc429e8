// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "yuv420/source.h"

namespace ovrin {

inline Yuv420Source three_planes(const uint8_t* y, const uint8_t* u, const uint8_t* v,
                                 int32_t width, int32_t height) {
    return {kI420, width, height, width, y, {u, v}};
}

}  // namespace ovrin
