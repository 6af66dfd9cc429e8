// SPDX-License-Identifier: Apache-2.0
// Conversion between pixel formats. Between I420 and NV21 and from RGB to RGBA nothing is lost.
// Between RGB and YUV the formulas are those of JPEG: ITU-R BT.601, luma and chroma from 0 to 255;
// gray is luma alone.
#pragma once

#include "picture.h"

namespace tool {

Picture converted(const Picture& picture, PixelFormat format);

}  // namespace tool
