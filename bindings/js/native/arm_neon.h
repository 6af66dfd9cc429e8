/* SPDX-License-Identifier: Apache-2.0 */
/* The NEON intrinsics in terms of WebAssembly's vector instructions. */
#ifndef OVRINRESIZE_JS_ARM_NEON_H
#define OVRINRESIZE_JS_ARM_NEON_H

#define SIMDE_ENABLE_NATIVE_ALIASES
#include <simde/arm/neon.h>

#endif
