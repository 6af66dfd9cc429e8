// SPDX-License-Identifier: Apache-2.0
// Our exports as the benchmark calls them.
#pragma once

#include "contender.h"

namespace bench {

using OurCall = void(const Job& job, const Picture& src, const Picture& canvas);

struct OurCalls {
    OurCall* single;   // on the calling thread; null where there is no such export
    OurCall* wrapper;  // may use threads; likewise
};

OurCalls our_nv21();
OurCalls our_i420();
OurCalls our_rgba();
OurCalls our_rgb();
OurCalls our_nearest();

// The bilinear engine: blending, and in bands.
OurCalls our_bilinear(Layout layout);
OurCalls our_banded_bilinear(Layout layout);

OurCalls our_lanczos();

// Into the job's canvas.
OurCalls our_letterbox(Layout layout);

}  // namespace bench
