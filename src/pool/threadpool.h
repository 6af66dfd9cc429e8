// SPDX-License-Identifier: Apache-2.0
// The two halves of ovrin_threadpool_init, for a pool that gets its tasks before its workers.
#pragma once

#include <ovrinresize.h>

namespace ovrin {

// A pool with room for n workers, of which none runs yet. Null when there is no memory.
ovrin_threadpool* make_pool(int32_t n);

// Starts workers until the pool has n; false when one cannot be started.
bool start_workers(ovrin_threadpool* pool, int32_t n);

}  // namespace ovrin
