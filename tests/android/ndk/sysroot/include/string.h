/* SPDX-License-Identifier: Apache-2.0 */
/* Stub: some of what is in Android's header. */
#pragma once

#include <stddef.h>

#ifdef __cplusplus
extern "C" {
#endif

void* memcpy(void* to, const void* from, size_t size);
void* memmove(void* to, const void* from, size_t size);
void* memset(void* to, int byte, size_t size);
size_t strlen(const char* text);
int memcmp(const void* a, const void* b, size_t size);

#ifdef __cplusplus
}
#endif
