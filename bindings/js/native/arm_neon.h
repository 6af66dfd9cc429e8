/* SPDX-License-Identifier: Apache-2.0 */
/* The NEON intrinsics in terms of WebAssembly's vector instructions. */
#ifndef OVRINRESIZE_JS_ARM_NEON_H
#define OVRINRESIZE_JS_ARM_NEON_H

#define SIMDE_ENABLE_NATIVE_ALIASES
#include <simde/arm/neon.h>

/* Debian's SIMDe has all that the kernels use but this. */
#define vmlal_high_lane_s16(sums, values, weights, lane) \
    vmlal_lane_s16(sums, vget_high_s16(values), weights, lane)

#endif
