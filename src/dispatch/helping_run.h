// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <ovrinresize.h>
#include <stddef.h>

namespace ovrin {

// Runs task(band) once for each of `count` band records of `band_bytes`, in any order and side by
// side, on the pool's workers and on the calling thread, which takes tasks from the pool's queue
// like a worker. A band that the pool refuses runs on the calling thread. Ends and releases the
// pool; all bands are done on return.
void run_bands_with_caller(ovrin_threadpool* pool, void (*task)(void*), void* bands, int32_t count,
                           size_t band_bytes);

}  // namespace ovrin
