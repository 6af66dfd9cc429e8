// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "yuv420/layout.h"

namespace ovrin {

inline Yuv420Source two_planes(const uint8_t* y, const uint8_t* vu, int32_t width, int32_t height,
                               int32_t row_bytes) {
    return {kInterleavedChroma, width, height, row_bytes, y, {vu, nullptr}};
}

}  // namespace ovrin
