// SPDX-License-Identifier: Apache-2.0
// The library with one function that does nothing. All others are those of the library it needs.
#include <ovrinresize.h>

void ovrin_resize_rgb888(const uint8_t* /*src*/, uint8_t* /*dst*/, int32_t /*src_w*/,
                         int32_t /*src_h*/, int32_t /*dst_w*/, int32_t /*dst_h*/) {}
