// SPDX-License-Identifier: Apache-2.0
// What the fuzzers of the command-line tool share. Whatever they are given, the tool's functions
// return or throw Error, and what they return holds together.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

#include "error.h"
#include "size.h"

namespace fuzz {

inline void require(bool holds, const char* what) {
    if (holds) return;
    fprintf(stderr, "FUZZER FOUND: %s\n", what);
    abort();
}

// Small pictures only: a header of a few bytes can announce one that takes seconds.
constexpr int64_t kMostPixels = 1 << 14;

// Whether the action got to its end, and not to an Error.
template <class Action>
bool succeeds(Action action) {
    try {
        action();
        return true;
    } catch (const tool::Error& error) {
        require(error.what()[0] != '\0', "an error without a message");
        return false;
    }
}

// As the command line gives it: it ends with the first zero.
inline std::string text(const uint8_t* data, size_t size) {
    const auto* const letters = reinterpret_cast<const char*>(data);
    return {letters, strnlen(letters, size)};
}

}  // namespace fuzz

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size);
