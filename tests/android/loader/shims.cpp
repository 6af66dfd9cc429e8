// SPDX-License-Identifier: Apache-2.0
#include "shims.h"

#include <pthread.h>
#include <unistd.h>

#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace loader {

namespace {

// Link this file first: then its thread-local data are the first behind the thread pointer, where
// Android has its canary and Linux whatever comes first.
constexpr int kCanaryWords = 16;
__thread volatile uint64_t canary_room[kCanaryWords] = {0x0102030405060708};

constexpr size_t kCanaryOffset = 0x28;

// Android's mutexes and conditions are smaller than, or not aligned as, those of Linux. Each holds
// where the real one is, and a mark that it was made.
template <class Real, size_t kBytes>
struct alignas(4) Shim {
    uint8_t bytes[kBytes];
};
using Mutex = Shim<pthread_mutex_t, 40>;
using Condition = Shim<pthread_cond_t, 48>;

struct Content {
    void* real;
    uint64_t mark;
};
constexpr uint64_t kMark = 0x6F7672696E6D7478;

template <class Real, size_t kBytes>
Real* real_of(const Shim<Real, kBytes>* shim) {
    Content content;
    memcpy(&content, shim, sizeof content);
    if (content.mark != kMark) {
        fprintf(stderr, "a mutex or condition is used that nobody made\n");
        abort();
    }
    return static_cast<Real*>(content.real);
}

// Writes all of it, so that a neighbour that should not be there shows.
template <class Real, size_t kBytes>
Real* make(Shim<Real, kBytes>* shim) {
    const Content content = {malloc(sizeof(Real)), kMark};
    if (content.real == nullptr) abort();
    memset(shim, 0xA5, sizeof *shim);
    memcpy(shim, &content, sizeof content);
    return static_cast<Real*>(content.real);
}

int mutex_init(Mutex* mutex, const void* attributes) {
    if (attributes != nullptr) abort();
    return pthread_mutex_init(make(mutex), nullptr);
}
int mutex_lock(Mutex* mutex) {
    return pthread_mutex_lock(real_of(mutex));
}
int mutex_unlock(Mutex* mutex) {
    return pthread_mutex_unlock(real_of(mutex));
}
int cond_init(Condition* condition, const void* attributes) {
    if (attributes != nullptr) abort();
    return pthread_cond_init(make(condition), nullptr);
}
int cond_wait(Condition* condition, Mutex* mutex) {
    return pthread_cond_wait(real_of(condition), real_of(mutex));
}
int cond_broadcast(Condition* condition) {
    return pthread_cond_broadcast(real_of(condition));
}

// Handles have the same size on both.
static_assert(sizeof(pthread_t) == sizeof(long), "");

int create(pthread_t* thread, const void* attributes, void* (*run)(void*), void* argument) {
    if (attributes != nullptr) abort();
    return pthread_create(thread, nullptr, run, argument);
}

[[noreturn]] void stack_chk_fail() {
    fprintf(stderr, "stack corruption detected\n");
    abort();
}

struct Entry {
    const char* name;
    void* address;
};

template <class Function>
Entry entry(const char* name, Function* function) {
    return {name, reinterpret_cast<void*>(function)};
}

}  // namespace

void* find_shim(const char* name) {
    static const Entry entries[] = {
        entry("__stack_chk_fail", stack_chk_fail),
        entry("calloc", calloc),
        entry("free", free),
        entry("malloc", malloc),
        entry("memcmp", memcmp),
        entry("memcpy", memcpy),
        entry("memset", memset),
        entry("pthread_cond_broadcast", cond_broadcast),
        entry("pthread_cond_init", cond_init),
        entry("pthread_cond_wait", cond_wait),
        entry("pthread_create", create),
        entry("pthread_detach", pthread_detach),
        entry("pthread_join", pthread_join),
        entry("pthread_mutex_init", mutex_init),
        entry("pthread_mutex_lock", mutex_lock),
        entry("pthread_mutex_unlock", mutex_unlock),
        entry("pthread_self", pthread_self),
        entry("sin", static_cast<double (*)(double)>(sin)),
        entry("strlen", static_cast<size_t (*)(const char*)>(strlen)),
        entry("usleep", usleep),
        entry("vsnprintf", vsnprintf),
    };
    for (const Entry& known : entries) {
        if (strcmp(known.name, name) == 0) return known.address;
    }
    return nullptr;
}

bool has_room_for_canary() {
    const auto canary = reinterpret_cast<uintptr_t>(__builtin_thread_pointer()) + kCanaryOffset;
    const auto room = reinterpret_cast<uintptr_t>(&canary_room[0]);
    return canary >= room && canary + sizeof canary_room[0] <= room + sizeof canary_room;
}

}  // namespace loader
