// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "yuv420/source.h"

namespace ovrin {

inline Yuv420Source two_planes(const uint8_t* y, const uint8_t* vu, int32_t width, int32_t height) {
    return {kNv21, width, height, width, y, {vu, nullptr}};
}

}  // namespace ovrin
