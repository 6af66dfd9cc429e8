// SPDX-License-Identifier: Apache-2.0
#include "stack.h"

#include <pthread.h>
#include <string.h>

#include <algorithm>
#include <stdexcept>
#include <vector>

#include "table.h"

namespace bench {

namespace {

constexpr size_t kStackBytes = size_t{1} << 20;
constexpr size_t kPage = 4096;
constexpr uint8_t kPaint = 0xA5;

void* run_on_thread(void* argument) {
    (*static_cast<std::function<void()>*>(argument))();
    return nullptr;
}

// Bytes of a painted stack that a thread changes. What is written but happens to be paint is not
// counted; that is at most a few bytes at the deepest point.
size_t touched_bytes(std::function<void()> run) {
    std::vector<uint8_t> memory(kStackBytes + kPage);
    const size_t misaligned = reinterpret_cast<uintptr_t>(memory.data()) % kPage;
    uint8_t* stack = memory.data() + (kPage - misaligned) % kPage;
    memset(stack, kPaint, kStackBytes);

    pthread_attr_t attributes;
    pthread_t thread;
    pthread_attr_init(&attributes);
    pthread_attr_setstack(&attributes, stack, kStackBytes);
    const int failure = pthread_create(&thread, &attributes, run_on_thread, &run);
    pthread_attr_destroy(&attributes);
    if (failure != 0) throw std::runtime_error("no thread to measure the stack of");
    pthread_join(thread, nullptr);

    const uint8_t* end = stack + kStackBytes;
    const uint8_t* deepest =
        std::find_if(stack, stack + kStackBytes, [](uint8_t byte) { return byte != kPaint; });
    return static_cast<size_t>(end - deepest);
}

}  // namespace

void print_stack_use(std::ostream& out, const std::vector<Case>& cases) {
    const size_t idle = touched_bytes([] {});
    Table table(out, {{"family", 13, true},
                      {"case", 39, true},
                      {"one thread", 10, false},
                      {"wrapper", 10, false}});
    for (const Case& test : cases) {
        const Job& job = test.job;
        std::vector<uint8_t> src(picture_bytes(job.layout, job.src) + kSlackBytes);
        std::vector<uint8_t> dst(picture_bytes(job.layout, job.canvas) + kSlackBytes);
        const Picture from = picture_at(src.data(), job.layout, job.src);
        const Picture to = picture_at(dst.data(), job.layout, job.canvas);
        const auto use = [&](OurCall* call) -> std::string {
            if (call == nullptr) return "-";
            return std::to_string(touched_bytes([&] { call(job, from, to); }) - idle);
        };
        table.print_row({test.family, test.name, use(test.ours.single), use(test.ours.wrapper)});
    }
}

}  // namespace bench
