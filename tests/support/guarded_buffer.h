// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/mman.h>
#include <unistd.h>

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <vector>

namespace ovrin_test {

// Which end of the buffer lies against an inaccessible page without a byte between.
enum class Flush { kEnd, kStart };

// `size` elements between two inaccessible pages, flush against one of them: reading or writing
// past that end faults. The few bytes between the other end and its page hold a pattern; intact()
// tells whether they still do.
template <class T>
class GuardedBuffer {
public:
    explicit GuardedBuffer(size_t size, Flush flush = Flush::kEnd, uint8_t fill = 0) : size_(size) {
        const size_t page = static_cast<size_t>(sysconf(_SC_PAGESIZE));
        const size_t bytes = size * sizeof(T);
        inner_bytes_ = (bytes + page - 1) / page * page;
        map_bytes_ = inner_bytes_ + 2 * page;
        void* map = mmap(nullptr, map_bytes_, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
        if (map == MAP_FAILED) abort();
        map_ = static_cast<uint8_t*>(map);
        inner_ = map_ + page;
        if (inner_bytes_ > 0 && mprotect(inner_, inner_bytes_, PROT_READ | PROT_WRITE) != 0) {
            abort();
        }
        offset_ = flush == Flush::kEnd ? inner_bytes_ - bytes : 0;
        memset(inner_, kPattern, inner_bytes_);
        memset(inner_ + offset_, fill, bytes);
    }

    GuardedBuffer(const std::vector<T>& content, Flush flush = Flush::kEnd)
        : GuardedBuffer(content.size(), flush) {
        if (!content.empty()) memcpy(data(), content.data(), content.size() * sizeof(T));
    }

    ~GuardedBuffer() { munmap(map_, map_bytes_); }

    GuardedBuffer(const GuardedBuffer&) = delete;
    GuardedBuffer& operator=(const GuardedBuffer&) = delete;

    T* data() { return reinterpret_cast<T*>(inner_ + offset_); }
    const T* data() const { return reinterpret_cast<const T*>(inner_ + offset_); }
    size_t size() const { return size_; }
    T& operator[](size_t i) { return data()[i]; }
    const T& operator[](size_t i) const { return data()[i]; }

    std::vector<T> copy() const { return std::vector<T>(data(), data() + size_); }

    bool intact() const {
        const size_t end = offset_ + size_ * sizeof(T);
        for (size_t i = 0; i < inner_bytes_; ++i) {
            if ((i < offset_ || i >= end) && inner_[i] != kPattern) return false;
        }
        return true;
    }

private:
    static constexpr uint8_t kPattern = 0xA5;

    size_t size_;
    size_t inner_bytes_ = 0;
    size_t map_bytes_ = 0;
    uint8_t* map_ = nullptr;
    uint8_t* inner_ = nullptr;
    size_t offset_ = 0;
};

}  // namespace ovrin_test
