// SPDX-License-Identifier: Apache-2.0
// Preloaded: a program that starts a thread ends.
#include <pthread.h>

#include <cstdlib>

extern "C" int pthread_create(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*) noexcept {
    abort();
}
