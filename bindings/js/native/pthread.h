/* SPDX-License-Identifier: Apache-2.0 */
/* The types that the library's header names, for a C library without threads. */
#ifndef OVRINRESIZE_JS_PTHREAD_H
#define OVRINRESIZE_JS_PTHREAD_H

typedef int pthread_t;
typedef int pthread_mutex_t;
typedef int pthread_cond_t;

#endif
