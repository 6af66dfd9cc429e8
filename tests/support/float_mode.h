// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

#if defined(__x86_64__)
#include <immintrin.h>
#endif

namespace ovrin_test {

// While one exists, the calling thread (and any that it starts) takes subnormal numbers for zero.
class FlushToZero {
public:
#if defined(__x86_64__)
    static constexpr bool kSupported = true;

private:
    using Mode = uint32_t;
    static constexpr Mode kFlush = 0x8040;  // flush-to-zero and denormals-are-zero
    static Mode get() {
        return _mm_getcsr();
    }
    static void set(Mode mode) {
        _mm_setcsr(mode);
    }
#elif defined(__aarch64__)
    static constexpr bool kSupported = true;

private:
    using Mode = uint64_t;
    static constexpr Mode kFlush = Mode{1} << 24;
    static Mode get() {
        Mode mode;
        asm volatile("mrs %0, fpcr" : "=r"(mode));
        return mode;
    }
    static void set(Mode mode) {
        asm volatile("msr fpcr, %0" : : "r"(mode));
    }
#else
    static constexpr bool kSupported = false;

private:
    using Mode = int;
    static constexpr Mode kFlush = 0;
    static Mode get() {
        return 0;
    }
    static void set(Mode) {}
#endif

public:
    FlushToZero() : before_(get()) {
        set(before_ | kFlush);
    }
    ~FlushToZero() {
        set(before_);
    }
    FlushToZero(const FlushToZero&) = delete;
    FlushToZero& operator=(const FlushToZero&) = delete;

private:
    Mode before_;
};

}  // namespace ovrin_test
