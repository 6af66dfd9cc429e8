// SPDX-License-Identifier: Apache-2.0
// Stands between the library's objects and the C library; linked with --wrap for each function.
#include "support/faults.h"

#include <pthread.h>
#include <unistd.h>

#include <atomic>
#include <cstdlib>
#include <cstring>
#include <mutex>
#include <unordered_map>

extern "C" {
void* __real_malloc(size_t size);
void* __real_calloc(size_t count, size_t size);
void __real_free(void* block);
int __real_pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                          void* (*start)(void*), void* argument);
int __real_pthread_mutex_init(pthread_mutex_t* mutex, const pthread_mutexattr_t* attributes);
int __real_pthread_cond_init(pthread_cond_t* condition, const pthread_condattr_t* attributes);
}

namespace {

constexpr int kKinds = 5;

std::atomic<int> call_count[kKinds];
std::atomic<size_t> largest{0};
std::atomic<int> failing_kind{-1};
std::atomic<int> failing_call{0};
std::atomic<bool> failing_later{false};
std::atomic<bool> failed{false};

std::mutex blocks_mutex;
std::unordered_map<void*, size_t>& blocks() {  // and their sizes
    static auto* map = new std::unordered_map<void*, size_t>;
    return *map;
}

int index_of(faults::Kind kind) {
    return static_cast<int>(kind);
}

bool refuses(faults::Kind kind) {
    const int call = ++call_count[index_of(kind)];
    if (failing_kind != index_of(kind)) return false;
    if (call < failing_call || (call > failing_call && !failing_later)) return false;
    failed = true;
    return true;
}

void ask(size_t size) {
    size_t before = largest;
    while (before < size && !largest.compare_exchange_weak(before, size)) {
    }
}

void* remember(void* block, size_t size) {
    const std::lock_guard<std::mutex> lock(blocks_mutex);
    if (block != nullptr) blocks()[block] = size;
    return block;
}

int block_count() {
    const std::lock_guard<std::mutex> lock(blocks_mutex);
    return static_cast<int>(blocks().size());
}

}  // namespace

extern "C" {

void* __wrap_malloc(size_t size) {
    ask(size);
    void* block = refuses(faults::Kind::kMalloc) ? nullptr : __real_malloc(size);
    // Whoever counts on fresh memory being zero is found out.
    if (block != nullptr) memset(block, 0xA5, size);
    return remember(block, size);
}

void* __wrap_calloc(size_t count, size_t size) {
    ask(count * size);
    if (refuses(faults::Kind::kCalloc)) return nullptr;
    return remember(__real_calloc(count, size), count * size);
}

void __wrap_free(void* block) {
    {
        const std::lock_guard<std::mutex> lock(blocks_mutex);
        blocks().erase(block);
    }
    __real_free(block);
}

int __wrap_pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                          void* (*start)(void*), void* argument) {
    if (refuses(faults::Kind::kThread)) return 11;
    return __real_pthread_create(thread, attributes, start, argument);
}

int __wrap_pthread_mutex_init(pthread_mutex_t* mutex, const pthread_mutexattr_t* attributes) {
    if (refuses(faults::Kind::kMutex)) return 12;
    return __real_pthread_mutex_init(mutex, attributes);
}

int __wrap_pthread_cond_init(pthread_cond_t* condition, const pthread_condattr_t* attributes) {
    if (refuses(faults::Kind::kCondition)) return 12;
    return __real_pthread_cond_init(condition, attributes);
}
}

namespace faults {

const char* name(Kind kind) {
    constexpr const char* kNames[kKinds] = {"malloc", "calloc", "pthread_create",
                                            "pthread_mutex_init", "pthread_cond_init"};
    return kNames[index_of(kind)];
}

void reset() {
    failing_kind = -1;
    failed = false;
    largest = 0;
    for (std::atomic<int>& count : call_count) count = 0;
}

void fail(Kind kind, int nth, bool and_all_later) {
    reset();
    failing_call = nth;
    failing_later = and_all_later;
    failing_kind = index_of(kind);
}

int calls(Kind kind) {
    return call_count[index_of(kind)];
}

size_t largest_block() {
    return largest;
}

bool has_failed() {
    return failed;
}

int live_blocks(int seconds) {
    for (int i = 0; i < seconds * 1000 && block_count() > 0; ++i) usleep(1000);
    return block_count();
}

std::vector<void*> live_blocks_of(size_t size) {
    const std::lock_guard<std::mutex> lock(blocks_mutex);
    std::vector<void*> result;
    for (const auto& [block, block_size] : blocks()) {
        if (block_size == size) result.push_back(block);
    }
    return result;
}

}  // namespace faults
