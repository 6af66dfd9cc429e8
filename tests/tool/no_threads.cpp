// SPDX-License-Identifier: Apache-2.0
// Preloaded: a program that starts a thread ends; where THREADS is "refused", it gets none.
#include <pthread.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>

extern "C" int pthread_create(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*) noexcept {
    const char* const threads = getenv("THREADS");
    if (threads != nullptr && strcmp(threads, "refused") == 0) return EAGAIN;
    abort();
}
