// SPDX-License-Identifier: Apache-2.0
// Conversion between pixel formats. Between I420 and NV21 and from RGB to RGBA nothing is lost.
// Between RGB and YUV the formulas are those that yuv.h names; gray is luma alone.
#pragma once

#include "picture.h"

namespace tool {

Picture converted(const Picture& picture, PixelFormat format);

// As files of gray pictures want it: 0 is black and 255 white, whatever the range of YUV.
Picture in_shades(const Picture& picture);

}  // namespace tool
