// SPDX-License-Identifier: Apache-2.0
// android_loader LIBRARY GOLDEN_FILE: loads the library for Android into this Linux program, lets
// its thread pool work, and compares all golden cases. Ends with 3 when it refuses to load the
// library.
#include <unistd.h>

#include <atomic>
#include <cstdio>

#include "golden/file.h"
#include "image.h"
#include "shims.h"

namespace {

constexpr int kRefused = 3;

// The pool's record is opaque here: its locks have other sizes than this program's.
struct Pool {
    void* (*init)(int32_t);
    int32_t (*add_task)(void*, void (*)(void*), void*, int32_t);
    void (*free)(void*, int32_t);
    int32_t (*sleep)(uint32_t);
};

template <class Function>
void look_up(const loader::Image& image, const char* name, Function*& function) {
    function = reinterpret_cast<Function*>(image.find(name));
}

void count(void* counter) {
    static_cast<std::atomic<int>*>(counter)->fetch_add(1);
}

// More tasks than the pool has slots; ended by the caller, or in the background.
bool pool_works(const Pool& pool, int32_t sync) {
    constexpr int kTasks = 5000;
    std::atomic<int> done{0};
    void* made = pool.init(4);
    if (made == nullptr) return false;
    int queued = 0;
    for (int i = 0; i < kTasks; ++i) queued += pool.add_task(made, count, &done, 1);
    pool.free(made, sync);
    for (int i = 0; i < 100000 && done != kTasks; ++i) pool.sleep(1000);
    printf("thread pool, %s: %d of %d tasks done\n",
           sync != 0 ? "ended by its caller" : "ended in the background", done.load(), kTasks);
    return queued == kTasks && done == kTasks;
}

bool pool_works(const loader::Image& image) {
    Pool pool = {};
    look_up(image, "ovrin_threadpool_init", pool.init);
    look_up(image, "ovrin_threadpool_add_task", pool.add_task);
    look_up(image, "ovrin_threadpool_free", pool.free);
    look_up(image, "ov_sleep", pool.sleep);
    if (pool.init == nullptr || pool.add_task == nullptr || pool.free == nullptr ||
        pool.sleep == nullptr) {
        printf("the library exports no thread pool\n");
        return false;
    }
    return pool_works(pool, 1) && pool_works(pool, 0);
}

bool same_bytes(const loader::Image& image, const char* golden_file) {
    golden::Api api;
    const char* missing = golden::look_up(api, [&](const char* name) { return image.find(name); });
    if (missing != nullptr) {
        printf("the library does not export %s\n", missing);
        return false;
    }
    return golden::equal_file(golden::run_cases(api), golden_file);
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 3) {
        fprintf(stderr, "usage: %s LIBRARY GOLDEN_FILE\n", argv[0]);
        return 2;
    }
    const long page_size = sysconf(_SC_PAGESIZE);
    printf("page size %ld\n", page_size);
    if (!loader::has_room_for_canary()) {
        printf("this program was linked without room for Android's canary\n");
        return 2;
    }
    loader::Image image;
    if (!image.load(argv[1], static_cast<size_t>(page_size), loader::find_shim)) {
        printf("refused: %s: %s\n", argv[1], image.refusal().c_str());
        return kRefused;
    }
    printf("loaded %s\n", argv[1]);
    return pool_works(image) && same_bytes(image, argv[2]) ? 0 : 1;
}
