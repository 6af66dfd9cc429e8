/* SPDX-License-Identifier: Apache-2.0 */
/*
 * Loaded before all other libraries: counts what our libraries ask of the system, memory and
 * threads, refuses some of it, and knows what they have not given back. What others ask for passes
 * through.
 */
#define _GNU_SOURCE
#include <dlfcn.h>
#include <jni.h>
#include <link.h>
#include <pthread.h>
#include <stdatomic.h>
#include <stdbool.h>
#include <stdint.h>
#include <string.h>

void* __libc_malloc(size_t size);
void* __libc_calloc(size_t count, size_t size);
void __libc_free(void* block);

enum { kLibraries = 4, kBlocks = 1 << 12 };

static struct { uintptr_t begin, end; } libraries[kLibraries];
static int library_count;

static pthread_mutex_t lock = PTHREAD_MUTEX_INITIALIZER;
static void* blocks[kBlocks]; /* not given back; null where free */
static atomic_int live;
static int requests;
static int refused_from;
static bool refuse_later;
static int refusals;

static int add_library(struct dl_phdr_info* info, size_t size, void* unused) {
    (void)size;
    (void)unused;
    if (strstr(info->dlpi_name, "libovrinresize") == NULL || library_count == kLibraries) return 0;
    for (int i = 0; i < info->dlpi_phnum; ++i) {
        const ElfW(Phdr)* segment = &info->dlpi_phdr[i];
        if (segment->p_type != PT_LOAD || !(segment->p_flags & PF_X)) continue;
        libraries[library_count].begin = info->dlpi_addr + segment->p_vaddr;
        libraries[library_count].end = libraries[library_count].begin + segment->p_memsz;
        ++library_count;
    }
    return 0;
}

static bool is_ours(void* caller) {
    for (int i = 0; i < library_count; ++i) {
        const uintptr_t at = (uintptr_t)caller;
        if (at >= libraries[i].begin && at < libraries[i].end) return true;
    }
    return false;
}

/*
 * Only single threads are refused: where none can be started at all, the library cannot end a pool
 * either, and keeps it, as its header says.
 */
static bool is_refused(bool is_thread) {
    pthread_mutex_lock(&lock);
    ++requests;
    const bool is_later = refuse_later && !is_thread && requests > refused_from;
    const bool refused = refused_from > 0 && (requests == refused_from || is_later);
    if (refused) ++refusals;
    pthread_mutex_unlock(&lock);
    return refused;
}

static void replace_block(void* from, void* to, int change) {
    pthread_mutex_lock(&lock);
    for (int i = 0; i < kBlocks; ++i) {
        if (blocks[i] != from) continue;
        blocks[i] = to;
        live += change;
        break;
    }
    pthread_mutex_unlock(&lock);
}

static void* kept(void* block) {
    if (block != NULL) replace_block(NULL, block, 1);
    return block;
}

void* malloc(size_t size) {
    if (!is_ours(__builtin_return_address(0))) return __libc_malloc(size);
    return is_refused(false) ? NULL : kept(__libc_malloc(size));
}

void* calloc(size_t count, size_t size) {
    if (!is_ours(__builtin_return_address(0))) return __libc_calloc(count, size);
    return is_refused(false) ? NULL : kept(__libc_calloc(count, size));
}

void free(void* block) {
    if (block != NULL && live > 0) replace_block(block, NULL, -1);
    __libc_free(block);
}

int pthread_create(pthread_t* thread, const pthread_attr_t* attributes, void* (*run)(void*),
                   void* argument) {
    int (*create)(pthread_t*, const pthread_attr_t*, void* (*)(void*), void*);
    *(void**)&create = dlsym(RTLD_NEXT, "pthread_create");
    if (is_ours(__builtin_return_address(0)) && is_refused(true)) return 11; /* EAGAIN */
    return create(thread, attributes, run, argument);
}

JNIEXPORT jint JNICALL Java_ovrin_resize_test_Faults_watch(JNIEnv* env, jclass type) {
    (void)env;
    (void)type;
    library_count = 0;
    dl_iterate_phdr(add_library, NULL);
    return library_count;
}

/* Of the requests from here on, the nth is refused, and with `later` all that follow; 0: none is.
 */
JNIEXPORT void JNICALL Java_ovrin_resize_test_Faults_refuse(JNIEnv* env, jclass type, jint nth,
                                                            jboolean later) {
    (void)env;
    (void)type;
    pthread_mutex_lock(&lock);
    requests = refusals = 0;
    refused_from = nth;
    refuse_later = later;
    pthread_mutex_unlock(&lock);
}

JNIEXPORT jint JNICALL Java_ovrin_resize_test_Faults_requests(JNIEnv* env, jclass type) {
    (void)env;
    (void)type;
    return requests;
}

JNIEXPORT jint JNICALL Java_ovrin_resize_test_Faults_refusals(JNIEnv* env, jclass type) {
    (void)env;
    (void)type;
    return refusals;
}

JNIEXPORT jint JNICALL Java_ovrin_resize_test_Faults_liveBlocks(JNIEnv* env, jclass type) {
    (void)env;
    (void)type;
    return live;
}
