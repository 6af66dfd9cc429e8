// SPDX-License-Identifier: Apache-2.0
// Our exports as the benchmark calls them.
#pragma once

#include "contender.h"

namespace bench {

using OurCall = void(const Job& job, const Picture& src, const Picture& canvas);

struct OurCalls {
    OurCall* single;   // on the calling thread
    OurCall* wrapper;  // may use threads; null where there is no such export
};

OurCalls our_nv21();
OurCalls our_i420();
OurCalls our_rgba();
OurCalls our_rgb();
OurCalls our_nearest();

// Into the job's canvas.
OurCalls our_letterbox(Layout layout);

}  // namespace bench
