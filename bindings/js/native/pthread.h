/* SPDX-License-Identifier: Apache-2.0 */
/*
 * POSIX threads for a system that has none: a thread is always refused, and what there is runs
 * alone, so that every lock is free.
 */
#ifndef OVRINRESIZE_JS_PTHREAD_H
#define OVRINRESIZE_JS_PTHREAD_H

#include <errno.h>

typedef int pthread_t;
typedef int pthread_mutex_t;
typedef int pthread_cond_t;

static inline int pthread_create(pthread_t* thread, const void* attributes, void* (*start)(void*),
                                 void* argument) {
    (void)thread, (void)attributes, (void)start, (void)argument;
    return EAGAIN;
}
static inline int pthread_join(pthread_t thread, void** result) {
    (void)thread, (void)result;
    return ESRCH;
}
static inline int pthread_detach(pthread_t thread) {
    (void)thread;
    return ESRCH;
}
static inline pthread_t pthread_self(void) {
    return 0;
}

static inline int pthread_mutex_init(pthread_mutex_t* mutex, const void* attributes) {
    (void)mutex, (void)attributes;
    return 0;
}
static inline int pthread_mutex_lock(pthread_mutex_t* mutex) {
    (void)mutex;
    return 0;
}
static inline int pthread_mutex_unlock(pthread_mutex_t* mutex) {
    (void)mutex;
    return 0;
}

static inline int pthread_cond_init(pthread_cond_t* condition, const void* attributes) {
    (void)condition, (void)attributes;
    return 0;
}
static inline int pthread_cond_broadcast(pthread_cond_t* condition) {
    (void)condition;
    return 0;
}
/* Nobody could end the wait. */
static inline int pthread_cond_wait(pthread_cond_t* condition, pthread_mutex_t* mutex) {
    (void)condition, (void)mutex;
    return EDEADLK;
}

#endif
