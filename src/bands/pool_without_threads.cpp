// SPDX-License-Identifier: Apache-2.0
// In place of pool.cpp where there are no threads: as if each of them were refused.
#include "bands/pool.h"

namespace ovrin {

BandPool::BandPool() : pool_(nullptr) {}

BandPool::~BandPool() {}

// Not reached: no pool is ready.
void BandPool::run(void (*work)(void*), void* argument) {
    work(argument);
}

bool run_while_workers_start(void (*work)(void*), void* argument) {
    work(argument);
    return true;
}

}  // namespace ovrin
