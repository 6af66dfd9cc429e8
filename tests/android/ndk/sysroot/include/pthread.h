/* SPDX-License-Identifier: Apache-2.0 */
/* Stub: some of what is in Android's header, with its sizes on 64-bit platforms. */
#pragma once

#ifdef __cplusplus
extern "C" {
#endif

typedef long pthread_t;
typedef long pthread_mutexattr_t;
typedef long pthread_condattr_t;
typedef struct pthread_attr_t pthread_attr_t;
typedef struct {
    int opaque[10];
} pthread_mutex_t;
typedef struct {
    int opaque[12];
} pthread_cond_t;

int pthread_create(pthread_t* thread, const pthread_attr_t* attributes, void* (*run)(void*),
                   void* argument);
int pthread_join(pthread_t thread, void** result);
int pthread_detach(pthread_t thread);
pthread_t pthread_self(void);

int pthread_mutex_init(pthread_mutex_t* mutex, const pthread_mutexattr_t* attributes);
int pthread_mutex_lock(pthread_mutex_t* mutex);
int pthread_mutex_unlock(pthread_mutex_t* mutex);

int pthread_cond_init(pthread_cond_t* condition, const pthread_condattr_t* attributes);
int pthread_cond_wait(pthread_cond_t* condition, pthread_mutex_t* mutex);
int pthread_cond_broadcast(pthread_cond_t* condition);

#ifdef __cplusplus
}
#endif
