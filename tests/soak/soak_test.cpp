// SPDX-License-Identifier: Apache-2.0
// Pools and threaded calls, over and over, while threads dawdle wherever they meet. Linked with
// --wrap, so that each of the library's calls below passes through a delay first.
#include <gtest/gtest.h>
#include <ovrinresize.h>
#include <sched.h>
#include <unistd.h>

#include <atomic>
#include <cstring>
#include <functional>
#include <iostream>
#include <vector>

#include "reference/yuv420.h"
#include "support/compare.h"
#include "support/letterbox.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

std::atomic<uint32_t> threads_seen{0};
std::atomic<int64_t> delays{0};

// Mostly nothing, sometimes the rest of the time slice, now and then a sleep in which others get
// far ahead. Each thread draws numbers of its own.
void dawdle() {
    thread_local uint32_t state = 0x9E3779B9U * (2 * threads_seen++ + 1);
    state ^= state << 13;
    state ^= state >> 17;
    state ^= state << 5;
    if (state % 4 != 0) return;
    delays.fetch_add(1, std::memory_order_relaxed);
    if (state % 64 == 0) {
        usleep(state / 64 % 60);
    } else {
        sched_yield();
    }
}

// A task that its worker takes up late, so that it can meet any other.
struct LateTask {
    void (*function)(void*);
    void* argument;

    static void run(void* self) {
        const LateTask task = *static_cast<LateTask*>(self);
        delete static_cast<LateTask*>(self);
        static std::atomic<uint32_t> turn{0};
        const uint32_t number = turn++ * 0x9E3779B9U >> 20;
        if (number % 16 == 0) usleep(number / 16);
        dawdle();
        task.function(task.argument);
    }
};

}  // namespace

extern "C" {
int __real_pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                          void* (*start)(void*), void* argument);
int __real_pthread_join(pthread_t thread, void** result);
int __real_pthread_mutex_lock(pthread_mutex_t* mutex);
int __real_pthread_mutex_unlock(pthread_mutex_t* mutex);
int __real_pthread_cond_wait(pthread_cond_t* condition, pthread_mutex_t* mutex);
int __real_pthread_cond_broadcast(pthread_cond_t* condition);
int32_t __real_ovrin_threadpool_add_task(ovrin_threadpool* pool, void (*function)(void*),
                                         void* argument, int32_t wait);

int __wrap_pthread_create(pthread_t* thread, const pthread_attr_t* attributes,
                          void* (*start)(void*), void* argument) {
    dawdle();
    return __real_pthread_create(thread, attributes, start, argument);
}

int __wrap_pthread_join(pthread_t thread, void** result) {
    dawdle();
    return __real_pthread_join(thread, result);
}

int __wrap_pthread_mutex_lock(pthread_mutex_t* mutex) {
    dawdle();
    return __real_pthread_mutex_lock(mutex);
}

int __wrap_pthread_mutex_unlock(pthread_mutex_t* mutex) {
    dawdle();
    return __real_pthread_mutex_unlock(mutex);
}

int __wrap_pthread_cond_wait(pthread_cond_t* condition, pthread_mutex_t* mutex) {
    dawdle();
    return __real_pthread_cond_wait(condition, mutex);
}

int __wrap_pthread_cond_broadcast(pthread_cond_t* condition) {
    dawdle();
    return __real_pthread_cond_broadcast(condition);
}

int32_t __wrap_ovrin_threadpool_add_task(ovrin_threadpool* pool, void (*function)(void*),
                                         void* argument, int32_t wait) {
    dawdle();
    auto* task = new LateTask{function, argument};
    const int32_t result = __real_ovrin_threadpool_add_task(pool, LateTask::run, task, wait);
    if (result != 1) delete task;
    return result;
}
}

namespace {

// All of it under the thread sanitizer; elsewhere a part, as little can be seen there.
int repetitions(int count) {
#if defined(__SANITIZE_THREAD__)
    return count;
#else
    return rounds(count / 10);
#endif
}

struct Counter {
    std::atomic<int> runs{0};
    static void run(void* self) { static_cast<Counter*>(self)->runs.fetch_add(1); }
};

// 1079 rows to 20: bands of 53 rows, the lower of which share rows with their neighbours.
constexpr int32_t kRows = 1079;
constexpr int32_t kW = 3, kH = 20;

const uint8_t* src() {
    static const std::vector<uint8_t> bytes = Random(161).bytes(3000000);
    return bytes.data();
}

const uint8_t* plane(int index) {
    return src() + 100000 * index;
}

using Bytes = std::vector<uint8_t>;

Bytes drawn(int64_t size, const std::function<void(uint8_t*)>& draw) {
    std::vector<uint32_t> words(static_cast<size_t>(size + 3) / 4);
    auto* bytes = reinterpret_cast<uint8_t*>(words.data());
    draw(bytes);
    return Bytes(bytes, bytes + size);
}

struct Call {
    const char* function;
    std::function<Bytes()> run;
};

ovrin_resize_target canvas(uint8_t* dst) {
    ovrin_resize_target target = letterbox(kW + 2, kH + 2, kW, kH, 1, 1);
    target.src_width = target.src_stride = 4;
    target.src_height = kRows;
    target.dst = dst;
    return target;
}

template <class Function>
Call rgba(const char* name, Function* resize) {
    return {name, [=] {
                return drawn(kW * kH * 4, [=](uint8_t* dst) {
                    resize(src(), reinterpret_cast<uint32_t*>(dst), 4, kRows, kW, kH);
                });
            }};
}

template <class Function>
Call rgba_on_canvas(const char* name, Function* resize) {
    return {name, [=] {
                return drawn((kW + 2) * (kH + 2) * 4, [=](uint8_t* dst) {
                    ovrin_resize_target target = canvas(dst);
                    resize(src(), 4, kRows, &target);
                });
            }};
}

template <class Function>
Call contiguous(const char* name, Function* resize) {
    return {name, [=] {
                return drawn(reference::i420_size(kW, kH),
                             [=](uint8_t* dst) { resize(src(), dst, 4, kRows, kW, kH); });
            }};
}

// On a canvas of either 4:2:0 layout.
Call on_canvas(const char* name, void (*resize)(const ovrin_resize_target*)) {
    return {name, [=] {
                return drawn(reference::nv21_size(kW + 2, kH + 2), [=](uint8_t* dst) {
                    const ovrin_resize_target target = canvas(dst);
                    resize(&target);
                });
            }};
}

Call into_picture(const char* name, void (*resize)(uint8_t*)) {
    return {name, [=] { return drawn(reference::nv21_size(kW, kH), resize); }};
}

// Bands of 256 destination rows: a long strip of a source.
Bytes bilinear_strip() {
    return drawn(2 * kRows * 4, [](uint8_t* dst) {
        ov_bilinear(src(), dst, 2, 256 * kRows, 2, kRows, 7, nullptr);
    });
}

// Two passes in bands.
Bytes bilinear_halved() {
    return drawn(kRows * 4, [](uint8_t* dst) {
        ov_bilinear_ex(src(), dst, 4, 4 * kRows, 1, kRows, 7, nullptr);
    });
}

Bytes lanczos_bands() {
    return drawn(2 * 160 * 4,
                 [](uint8_t* dst) { ovrin_resize_lanczos(src(), dst, 3, 100, 2, 160, 4); });
}

std::vector<Call> threaded_calls() {
    return {
        rgba("ovrin_resize_rgba8888", ovrin_resize_rgba8888),
        rgba("ovrin_resize_rgba8888_tps", ovrin_resize_rgba8888_tps),
        rgba_on_canvas("ovrin_resize_rgba8888_keep_ratio", ovrin_resize_rgba8888_keep_ratio),
        rgba_on_canvas("ovrin_resize_rgba_keep_ratio_tps", ovrin_resize_rgba_keep_ratio_tps),
        contiguous("ovrin_resize_yuv420", ovrin_resize_yuv420),
        contiguous("ovrin_resize_yuv420_tps", ovrin_resize_yuv420_tps),
        into_picture("ovrin_resize_y_u_v",
                     [](uint8_t* dst) {
                         ovrin_resize_y_u_v(plane(0), plane(1), plane(2), dst, 4, kRows, kW, kH);
                     }),
        on_canvas("ovrin_resize_y_u_v_keep_ratio",
                  [](const ovrin_resize_target* target) {
                      ovrin_resize_y_u_v_keep_ratio(plane(0), plane(1), plane(2), 4, kRows, target);
                  }),
        on_canvas("ovrin_resize_y_u_v_tps",
                  [](const ovrin_resize_target* target) {
                      ovrin_resize_y_u_v_tps(plane(0), plane(1), plane(2), nullptr, 4, kRows, 0, 0,
                                             target);
                  }),
        contiguous("ovrin_resize_nv21", ovrin_resize_nv21),
        contiguous("ovrin_resize_nv21_tps", ovrin_resize_nv21_tps),
        into_picture(
            "ovrin_resize_y_nv21",
            [](uint8_t* dst) { ovrin_resize_y_nv21(plane(0), plane(1), dst, 4, kRows, kW, kH); }),
        on_canvas("ovrin_resize_y_nv21_keep_ratio",
                  [](const ovrin_resize_target* target) {
                      ovrin_resize_y_nv21_keep_ratio(plane(0), plane(1), 4, kRows, target);
                  }),
        on_canvas("ovrin_resize_y_nv_tps",
                  [](const ovrin_resize_target* target) {
                      ovrin_resize_y_nv_tps(plane(0), plane(1), nullptr, 4, kRows, 0, 0, target);
                  }),
        {"ov_bilinear", bilinear_strip},
        {"ov_bilinear_ex", bilinear_halved},
        {"ovrin_resize_lanczos", lanczos_bands},
    };
}

}  // namespace

TEST(Soak, PoolsRunAllTheirTasksAndEnd) {
    Random random(162);
    SCOPED_TRACE(random.trace());
    const int cycles = repetitions(10000);
    Counter in_background;
    int left_to_background = 0;
    for (int i = 0; i < cycles; ++i) {
        ovrin_threadpool* pool = ovrin_threadpool_init(random.between(1, 4));
        ASSERT_NE(pool, nullptr);
        const bool waits = random.between(0, 7) != 0;
        const int tasks = random.between(0, 8);
        Counter here;
        Counter* counter = waits ? &here : &in_background;
        for (int n = 0; n < tasks; ++n) {
            ASSERT_EQ(ovrin_threadpool_add_task(pool, Counter::run, counter, n % 2), 1);
        }
        ovrin_threadpool_free(pool, waits ? 1 : 0);
        if (waits) {
            ASSERT_EQ(here.runs, tasks);
        } else {
            left_to_background += tasks;
        }
    }
    for (int i = 0; i < 60000 && in_background.runs < left_to_background; ++i) usleep(1000);
    EXPECT_EQ(in_background.runs, left_to_background);
    std::cout << cycles << " pools, " << delays << " delays\n";
}

TEST(Soak, ThreadedCallsGiveTheSameBytesEachTime) {
    const int times = repetitions(1000);
    const std::vector<Call> calls = threaded_calls();
    for (const Call& call : calls) {
        SCOPED_TRACE(call.function);
        const Bytes first = call.run();
        for (int i = 1; i < times; ++i) {
            const Bytes again = call.run();
            ASSERT_TRUE(same_bytes(again.data(), first.data(), first.size())) << "call " << i;
        }
    }
    std::cout << calls.size() << " functions, " << times << " calls of each, " << delays
              << " delays\n";
}
