// SPDX-License-Identifier: Apache-2.0
#include <libyuv/scale.h>
#include <libyuv/scale_argb.h>
#include <libyuv/scale_rgb.h>
#include <libyuv/version.h>

#include "contender.h"

namespace bench {

namespace {

struct Filter {
    const char* name;
    libyuv::FilterMode mode;
    unsigned kind;
};

constexpr Filter kFilters[] = {
    {"libyuv point", libyuv::kFilterNone, kPoint},
    {"libyuv bilinear", libyuv::kFilterBilinear, kBilinear},
    {"libyuv box", libyuv::kFilterBox, kArea},
};

int pitch(const Plane& plane) {
    return static_cast<int>(plane.pitch);
}

void scale(const Picture& src, const Picture& dst, libyuv::FilterMode mode) {
    const auto& s = src.planes;
    const auto& d = dst.planes;
    const Size from = src.size;
    const Size to = dst.size;
    switch (src.layout) {
        case Layout::kRgba:
            libyuv::ARGBScale(s[0].data, pitch(s[0]), from.width, from.height, d[0].data,
                              pitch(d[0]), to.width, to.height, mode);
            break;
        case Layout::kRgb:
            libyuv::RGBScale(s[0].data, pitch(s[0]), from.width, from.height, d[0].data,
                             pitch(d[0]), to.width, to.height, mode);
            break;
        case Layout::kI420:
            libyuv::I420Scale(s[0].data, pitch(s[0]), s[1].data, pitch(s[1]), s[2].data,
                              pitch(s[2]), from.width, from.height, d[0].data, pitch(d[0]),
                              d[1].data, pitch(d[1]), d[2].data, pitch(d[2]), to.width, to.height,
                              mode);
            break;
        case Layout::kNv21:
            libyuv::NV12Scale(s[0].data, pitch(s[0]), s[1].data, pitch(s[1]), from.width,
                              from.height, d[0].data, pitch(d[0]), d[1].data, pitch(d[1]), to.width,
                              to.height, mode);
            break;
    }
}

bool is_odd_ratio(int32_t src, int32_t dst) {
    return src % dst == 0 && src / dst % 2 == 1;
}

// At odd whole ratios libyuv copies one sample of every cell, unless it averages boxes of a plane.
Role role_of(const Job& job, const Filter& filter) {
    const bool has_planes = job.layout == Layout::kI420 || job.layout == Layout::kNv21;
    const bool copies = filter.kind != kPoint && !(filter.kind == kArea && has_planes) &&
                        is_odd_ratio(job.src.width, job.dst.width) &&
                        is_odd_ratio(job.src.height, job.dst.height);
    return copies ? Role::kCopier : Role::kPeer;
}

}  // namespace

std::vector<Contender> libyuv_contenders(const Job& job, unsigned filters) {
    std::vector<Contender> contenders;
    for (const Filter& filter : kFilters) {
        if ((filter.kind & filters) == 0) continue;
        const libyuv::FilterMode mode = filter.mode;
        contenders.push_back(
            {role_of(job, filter), filter.name,
             [mode](const Picture& src, const Picture& dst) { scale(src, dst, mode); }});
    }
    return contenders;
}

std::string libyuv_version() {
    return "libyuv " + std::to_string(LIBYUV_VERSION);
}

}  // namespace bench
