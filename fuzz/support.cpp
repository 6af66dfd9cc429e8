// SPDX-License-Identifier: Apache-2.0
#include "support.h"

#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "support/target_record.h"

#if defined(__SANITIZE_ADDRESS__)
#define FUZZ_ASAN
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define FUZZ_ASAN
#endif
#endif

#ifdef FUZZ_ASAN
#include <sanitizer/asan_interface.h>
#else
#define ASAN_POISON_MEMORY_REGION(address, size) \
    (static_cast<void>(address), static_cast<void>(size))
#define ASAN_UNPOISON_MEMORY_REGION(address, size) \
    (static_cast<void>(address), static_cast<void>(size))
#endif

namespace fuzz {

namespace {

constexpr size_t kSlots = 24;
constexpr size_t kSlotBytes = 512 * 1024;
constexpr size_t kPatternBytes = 128;
constexpr uint8_t kPattern = 0xA5;

[[noreturn]] void stop(const char* what, const char* set) {
    fprintf(stderr, "FUZZER FOUND: %s, with %s kernels\n", what, set);
    abort();
}

// Slots between inaccessible pages, mapped once: a mapping per buffer and run would take longer
// than the run.
class Arena {
public:
    Arena() : page_(static_cast<size_t>(sysconf(_SC_PAGESIZE))) {
        const size_t bytes = kSlots * (kSlotBytes + page_) + page_;
        void* map =
            mmap(nullptr, bytes, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE, -1, 0);
        if (map == MAP_FAILED) abort();
        first_ = static_cast<uint8_t*>(map) + page_;
        for (size_t i = 0; i < kSlots; ++i) {
            if (mprotect(slot(i), kSlotBytes, PROT_READ | PROT_WRITE) != 0) abort();
        }
    }

    uint8_t* next() {
        if (used_ == kSlots) stop("more buffers than the arena has", "any");
        return slot(used_++);
    }
    void clear() { used_ = 0; }

private:
    uint8_t* slot(size_t i) const { return first_ + i * (kSlotBytes + page_); }

    size_t page_;
    uint8_t* first_;
    size_t used_ = 0;
};

Arena arena;

}  // namespace

void begin_run() {
    arena.clear();
}

Sets::Sets() {
    count = ovrin::available_kernels(sets);
    const char* most = std::getenv("OVRIN_FUZZ_SETS");
    if (most != nullptr) {
        const long wanted = std::strtol(most, nullptr, 10);
        count = static_cast<int32_t>(std::clamp<long>(wanted, 1, count));
    }
}

const Sets& all_sets() {
    static const Sets sets;
    return sets;
}

void require(bool holds, const char* what, const char* set) {
    if (!holds) stop(what, set);
}

void Pixels::fill(uint8_t* bytes, size_t count) {
    for (size_t i = 0; i < count; i += sizeof(uint64_t)) {
        uint64_t word = next();
        if (kind_ == 1) word = (word & 0x0101010101010101U) * 255;  // extremes
        if (kind_ == 2) word = ~uint64_t{0};
        if (kind_ == 3) word |= 0xFCFCFCFCFCFCFCFCU;
        memcpy(bytes + i, &word, count - i < sizeof word ? count - i : sizeof word);
    }
}

// The address sanitizer guards what lies between the buffer and the slot's far end, too.
Buffer::Buffer(size_t size, Flush flush) : size_(size), flush_(flush) {
    if (size > kSlotBytes - kPatternBytes) stop("a buffer larger than the arena's", "any");
    uint8_t* slot = arena.next();
    ASAN_UNPOISON_MEMORY_REGION(slot, kSlotBytes);
    const bool at_end = flush == Flush::kEnd;
    data_ = at_end ? slot + kSlotBytes - size : slot;
    memset(at_end ? data_ - kPatternBytes : data_ + size, kPattern, kPatternBytes);
    if (at_end) {
        ASAN_POISON_MEMORY_REGION(slot, kSlotBytes - size - kPatternBytes);
    } else {
        ASAN_POISON_MEMORY_REGION(data_ + size + kPatternBytes, kSlotBytes - size - kPatternBytes);
    }
}

void Buffer::check(const void* expected, const char* set) const {
    const uint8_t* other_side = flush_ == Flush::kEnd ? data_ - kPatternBytes : data_ + size_;
    for (size_t i = 0; i < kPatternBytes; ++i) {
        if (other_side[i] != kPattern) stop("bytes outside the buffer were written", set);
    }
    if (size_ == 0 || memcmp(data_, expected, size_) == 0) return;
    const auto* bytes = static_cast<const uint8_t*>(expected);
    size_t i = 0;
    while (data_[i] == bytes[i]) ++i;
    fprintf(stderr, "byte %zu of %zu is %d, not %d\n", i, size_, data_[i], bytes[i]);
    stop("not what the definition gives", set);
}

void Buffer::check_unchanged(const char* set) const {
    check(kept_.data(), set);
}

void Buffer::keep() {
    kept_.assign(data_, data_ + size_);
}

void Buffer::fill(uint8_t byte) {
    if (size_ > 0) memset(data_, byte, size_);
}

Buffer source(Pixels& pixels, int64_t bytes, Flush flush) {
    Buffer buffer(static_cast<size_t>(bytes), flush);
    pixels.fill(buffer.data(), buffer.size());
    buffer.keep();
    return buffer;
}

ovrin_resize_target letterbox(Input& in, int32_t dst_w, int32_t dst_h) {
    const int32_t x = in.between(0, 9);
    const int32_t y = in.between(0, 9);
    const int32_t canvas_w = dst_w + x + in.between(-12, 12);
    const int32_t canvas_h = dst_h + y + in.between(-12, 12);
    return ovrin_test::letterbox(std::max(canvas_w, 0), std::max(canvas_h, 0), dst_w, dst_h, x, y);
}

}  // namespace fuzz
