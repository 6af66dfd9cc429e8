// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <random>
#include <string>
#include <vector>

namespace ovrin_test {

// Random sizes and pictures. The seed is fixed so that a failure repeats; OVRIN_TEST_SEED changes
// it. Name it in the failure message: SCOPED_TRACE(random.trace()).
class Random {
public:
    explicit Random(uint64_t stream)
        : seed_(environment_seed()), engine_(seed_ * 1000003 + stream) {}

    int32_t between(int32_t low, int32_t high) {
        return std::uniform_int_distribution<int32_t>(low, high)(engine_);
    }

    template <class T>
    T pick(std::initializer_list<T> values) {
        return values.begin()[between(0, static_cast<int32_t>(values.size()) - 1)];
    }

    // A width or height: mostly 1 to 70, sometimes next to a multiple of a vector's width.
    int32_t awkward_size() {
        if (between(0, 3) != 0) return between(1, 70);
        return pick({4, 8, 16, 32, 64}) * between(1, 5) + between(-1, 1);
    }

    std::vector<uint8_t> bytes(size_t count) {
        std::vector<uint8_t> result(count);
        for (uint8_t& byte : result) byte = static_cast<uint8_t>(engine_());
        return result;
    }

    std::string trace() const { return "OVRIN_TEST_SEED=" + std::to_string(seed_); }

private:
    static uint64_t environment_seed() {
        const char* text = getenv("OVRIN_TEST_SEED");
        return text == nullptr ? 1 : strtoull(text, nullptr, 10);
    }

    uint64_t seed_;
    std::mt19937_64 engine_;
};

// Repetitions of a random test: `count`, or fewer (never below 2) where OVRIN_TEST_DIVISOR says so
// because an emulator or a sanitizer makes each one slow.
inline int rounds(int count) {
    const char* text = getenv("OVRIN_TEST_DIVISOR");
    const int64_t divisor = text == nullptr ? 1 : strtoll(text, nullptr, 10);
    const int64_t result = divisor > 1 ? count / divisor : count;
    return result < 2 ? 2 : static_cast<int>(result);
}

}  // namespace ovrin_test
