// SPDX-License-Identifier: Apache-2.0
// Resizing of 4:2:0 pictures, for both formats: on the calling thread, and in bands.
#pragma once

#include <ovrinresize.h>

#include "yuv420/source.h"

namespace ovrin {

// Into a contiguous picture of width x height.
void resize_yuv420(const Yuv420Source& source, uint8_t* dst, int32_t width, int32_t height);

// Into the target's canvas; without a target as resize_yuv420. The target's stride is taken as it
// stands, the source's is that of a source without a target.
void resize_yuv420_planes(Yuv420Source source, uint8_t* dst, int32_t width, int32_t height,
                          const ovrin_resize_target* target);

// The same in bands. False when nothing has been written, because the picture makes fewer than two
// bands, has no grid, or memory or a thread is missing: the caller takes the way above.
bool resize_yuv420_in_bands(const Yuv420Source& source, uint8_t* dst, int32_t width,
                            int32_t height);

// A target's stride of 0 or less stands for the source's. False also below 1024 source rows.
bool resize_yuv420_planes_in_bands(Yuv420Source source, uint8_t* dst, int32_t width, int32_t height,
                                   const ovrin_resize_target* target);

}  // namespace ovrin
