// SPDX-License-Identifier: Apache-2.0
// Band records, filled with what the fuzzer's bytes say.
#pragma once

#include <cstring>

#include "support.h"

namespace fuzz {

// A record of garbage: a field that a function should not read differs from what it should be.
template <class Band>
Band garbage() {
    Band band;
    memset(static_cast<void*>(&band), 0x5A, sizeof band);
    return band;
}

template <class Band>
bool same(const Band& a, const Band& b) {
    return memcmp(&a, &b, sizeof a) == 0;
}

}  // namespace fuzz
