// SPDX-License-Identifier: Apache-2.0
extern "C" {
#include <libavutil/pixfmt.h>
#include <libswscale/swscale.h>
}

#include <memory>
#include <stdexcept>

#include "contender.h"

namespace bench {

namespace {

struct Filter {
    const char* name;
    int flags;
    unsigned kind;
};

constexpr Filter kFilters[] = {
    {"swscale point", SWS_POINT, kPoint},
    {"swscale fast bilinear", SWS_FAST_BILINEAR, kBilinear},
    {"swscale bilinear", SWS_BILINEAR, kBilinear},
    {"swscale area", SWS_AREA, kArea},
    {"swscale Lanczos", SWS_LANCZOS, kLanczos},
};

AVPixelFormat format_of(Layout layout) {
    switch (layout) {
        case Layout::kRgba:
            return AV_PIX_FMT_RGBA;
        case Layout::kRgb:
            return AV_PIX_FMT_RGB24;
        case Layout::kI420:
            return AV_PIX_FMT_YUV420P;
        case Layout::kNv21:
            break;
    }
    return AV_PIX_FMT_NV21;
}

using Context = std::shared_ptr<SwsContext>;

// Made once for all calls, so that its tables do not count against it.
Context make_context(const Job& job, int flags) {
    const AVPixelFormat format = format_of(job.layout);
    SwsContext* context = sws_getContext(job.src.width, job.src.height, format, job.dst.width,
                                         job.dst.height, format, flags, nullptr, nullptr, nullptr);
    if (context == nullptr) throw std::runtime_error("swscale refuses the job");
    return {context, sws_freeContext};
}

void scale(SwsContext* context, const Picture& src, const Picture& dst) {
    const uint8_t* from[4] = {};
    uint8_t* to[4] = {};
    int from_pitch[4] = {};
    int to_pitch[4] = {};
    for (size_t p = 0; p < static_cast<size_t>(src.plane_count); ++p) {
        from[p] = src.planes[p].data;
        to[p] = dst.planes[p].data;
        from_pitch[p] = static_cast<int>(src.planes[p].pitch);
        to_pitch[p] = static_cast<int>(dst.planes[p].pitch);
    }
    sws_scale(context, from, from_pitch, 0, src.size.height, to, to_pitch);
}

}  // namespace

std::vector<Contender> swscale_contenders(const Job& job, unsigned filters) {
    std::vector<Contender> contenders;
    for (const Filter& filter : kFilters) {
        if ((filter.kind & filters) == 0) continue;
        const Context context = make_context(job, filter.flags);
        contenders.push_back(
            {Role::kPeer, filter.name, [context](const Picture& src, const Picture& dst) {
                 scale(context.get(), src, dst);
             }});
    }
    return contenders;
}

std::string swscale_version() {
    const unsigned version = ::swscale_version();
    return "swscale " + std::to_string(version >> 16) + "." + std::to_string(version >> 8 & 255) +
           "." + std::to_string(version & 255);
}

}  // namespace bench
