/* SPDX-License-Identifier: Apache-2.0 */
/* Stub: some of what is in Android's header. */
#pragma once

#include <stddef.h>

#ifdef __cplusplus
extern "C" {
#endif

void* malloc(size_t size);
void* calloc(size_t count, size_t size);
void* realloc(void* block, size_t size);
void free(void* block);

#ifdef __cplusplus
}
#endif
