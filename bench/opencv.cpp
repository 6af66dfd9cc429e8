// SPDX-License-Identifier: Apache-2.0
#include <opencv2/core/version.hpp>
#include <opencv2/imgproc.hpp>

#include "contender.h"

namespace bench {

namespace {

struct Filter {
    const char* name;
    int mode;
    unsigned kind;
};

constexpr Filter kFilters[] = {
    {"OpenCV nearest", cv::INTER_NEAREST, kPoint},
    {"OpenCV linear", cv::INTER_LINEAR, kBilinear},
    {"OpenCV area", cv::INTER_AREA, kArea},
    {"OpenCV Lanczos4", cv::INTER_LANCZOS4, kLanczos},
};

// Interleaved chroma is a picture of two channels.
cv::Mat as_matrix(const Plane& plane) {
    return {plane.size.height, plane.size.width, CV_8UC(plane.sample_bytes), plane.data,
            static_cast<size_t>(plane.pitch)};
}

void scale(const Picture& src, const Picture& dst, int mode) {
    for (size_t p = 0; p < static_cast<size_t>(src.plane_count); ++p) {
        cv::Mat target = as_matrix(dst.planes[p]);
        cv::resize(as_matrix(src.planes[p]), target, target.size(), 0, 0, mode);
    }
}

}  // namespace

std::vector<Contender> opencv_contenders(const Job& /*job*/, unsigned filters) {
    cv::setNumThreads(1);
    std::vector<Contender> contenders;
    for (const Filter& filter : kFilters) {
        if ((filter.kind & filters) == 0) continue;
        const int mode = filter.mode;
        contenders.push_back(
            {Role::kPeer, filter.name,
             [mode](const Picture& src, const Picture& dst) { scale(src, dst, mode); }});
    }
    return contenders;
}

std::string opencv_version() {
    return "OpenCV " CV_VERSION;
}

}  // namespace bench
