/* SPDX-License-Identifier: Apache-2.0 */
/* Stub: some of what is in Android's header. */
#pragma once

#include <stdarg.h>
#include <stddef.h>

#ifdef __cplusplus
extern "C" {
#endif

int vsnprintf(char* to, size_t size, const char* format, va_list arguments);

#ifdef __cplusplus
}
#endif
