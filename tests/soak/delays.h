// SPDX-License-Identifier: Apache-2.0
// Threads dawdle wherever they meet, and may be refused. Linked with --wrap, so that each of the
// library's calls passes through here.
#pragma once

#include <cstdint>

namespace ovrin_test {

int64_t delays();
int64_t refusals();

enum class Refuse { kNothing, kAtRandom, kPools };

// While one of these lives, the thread that made it is refused threads, mutexes and conditions.
// At random never two threads one after the other: without one to end it a pool would stay.
// Otherwise whole pools, by their first mutex: bit n of `pools` is for the nth.
class Refusing {
public:
    explicit Refusing(Refuse what, uint32_t pools = 0);
    ~Refusing();

    Refusing(const Refusing&) = delete;
    Refusing& operator=(const Refusing&) = delete;
};

}  // namespace ovrin_test
