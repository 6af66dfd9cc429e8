// SPDX-License-Identifier: Apache-2.0
// Who is measured: our exports, the limit, and the peers.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "picture.h"

namespace bench {

// Resizes one picture into another.
using Resize = std::function<void(const Picture& src, const Picture& dst)>;

enum class Role {
    kSingle,   // our export, on the calling thread
    kWrapper,  // our export that may use threads
    kLimit,    // what memory alone would cost
    kPeer,
    kCopier,  // a peer whose filter copies single samples here: no work to compare a filter with
};

struct Contender {
    Role role;
    std::string name;
    Resize run;
    std::string set = {};  // of our exports: the kernels
};

// Kinds of filters that peers offer, as bits.
enum : unsigned {
    kPoint = 1,
    kBilinear = 2,
    kArea = 4,
    kLanczos = 8,
    kSmoothing = kBilinear | kArea | kLanczos,  // all that look at more than one sample
};

// What a source shows. Most rules do not care, so theirs change from round to round.
enum class Content {
    kNoise,
    kSoft,   // a gradient with a little noise
    kEdges,  // black and white, like text
    kMixed,
};

// What there is to do: scale the source to a size, at some place in a canvas.
struct Job {
    Layout layout;
    Size src;
    Size dst;
    Size canvas;  // dst itself, unless the picture is letterboxed
    int32_t x;
    int32_t y;
    Content content;

    bool letterboxed() const { return canvas.width != dst.width || canvas.height != dst.height; }
};

// Which source rows a rule touches for a target row.
enum class Sampling { kQuarter, kPoint, kBilinear, kEveryRow };

// Read every cache line of the sampled rows once and write the destination once: the rows one after
// the other, or those of a destination row side by side. Which is faster depends on the job.
std::vector<Contender> limits_of(const Job& job, Sampling sampling);

// Luma pixels, or pixels, of the rows that are sampled.
double sampled_pixels(const Job& job, Sampling sampling);

// The peers' ways to do the job with filters of these kinds.
std::vector<Contender> libyuv_contenders(const Job& job, unsigned filters);
std::vector<Contender> opencv_contenders(const Job& job, unsigned filters);
std::vector<Contender> swscale_contenders(const Job& job, unsigned filters);

// Their names and versions.
std::string libyuv_version();
std::string opencv_version();
std::string swscale_version();

}  // namespace bench
