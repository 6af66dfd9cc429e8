// SPDX-License-Identifier: Apache-2.0
// One call of each threaded function, on pictures just high enough for threads, so that little but
// the threads costs time.
#pragma once

#include <cstdint>
#include <functional>
#include <vector>

namespace ovrin_test {

using Bytes = std::vector<uint8_t>;

struct Call {
    const char* function;
    std::function<Bytes()> run;  // gives the picture
    int pools = 0;               // that it makes one after the other, if it shows which it gets
};

std::vector<Call> threaded_calls();

// Some that do all work on the calling thread.
std::vector<Call> calling_thread_calls();

// How often: ./dev soak sets OVRIN_SOAK_LARGE.
int repetitions(int usual, int large);

}  // namespace ovrin_test
