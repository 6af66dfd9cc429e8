// SPDX-License-Identifier: Apache-2.0
// The calls that are counted: a program for aarch64 that the emulator runs with its plugin, see
// plugin.cpp. Every call is made twice, and counted the second time, when names are bound and
// memory has been asked for. Prints a line for each, with tabs between:
//
//   NUMBER  case  contender  destination pixels  "blends" or "copies"
//
// usage: calls ours|peers [PART OF A CASE'S NAME]
#include <inttypes.h>
#include <stdint.h>
#include <stdio.h>
#include <string.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <string>
#include <vector>

#include "ours.h"

namespace bench {

namespace {

// System calls that the plugin waits for.
constexpr long kBegin = 4242;
constexpr long kEnd = 4243;

struct Scaling {
    Size src;
    Size dst;
};

struct Family {
    const char* name;
    Layout layout;
    OurCall* call;
    unsigned peer_filters;
    std::vector<Scaling> sizes;
};

std::vector<Family> families() {
    const std::vector<Scaling> planes = {
        {{3840, 2160}, {1920, 1080}}, {{4000, 3000}, {1000, 750}}, {{1920, 1080}, {640, 360}},
        {{1920, 1080}, {1280, 720}},  {{1280, 720}, {960, 540}},   {{1920, 1080}, {720, 405}},
        {{4000, 3000}, {1280, 960}},  {{1280, 720}, {300, 168}},
    };
    const std::vector<Scaling> pixels = {
        {{1920, 1080}, {960, 540}},  {{4000, 3000}, {1000, 750}}, {{1920, 1080}, {640, 360}},
        {{1920, 1080}, {1280, 720}}, {{1280, 720}, {1920, 1080}}, {{1280, 720}, {960, 540}},
        {{1920, 1080}, {720, 405}},  {{4000, 3000}, {1280, 960}}, {{1280, 720}, {300, 168}},
        {{4000, 3000}, {224, 224}},
    };
    const std::vector<Scaling> blended = {{{1920, 1080}, {1366, 768}}, {{1280, 720}, {1920, 1080}}};
    const std::vector<Scaling> filtered = {
        {{1920, 1080}, {1280, 720}}, {{640, 480}, {1280, 960}}, {{1280, 720}, {320, 180}}};
    const unsigned any = kBilinear | kArea;
    return {
        {"NV21", Layout::kNv21, our_nv21().single, any, planes},
        {"I420", Layout::kI420, our_i420().single, any, planes},
        {"RGBA", Layout::kRgba, our_rgba().single, any, pixels},
        {"RGB888", Layout::kRgb, our_rgb().single, any, {{{1920, 1080}, {1280, 720}}}},
        {"bilinear RGBA", Layout::kRgba, our_bilinear(Layout::kRgba).single, kBilinear, blended},
        {"bilinear NV21", Layout::kNv21, our_bilinear(Layout::kNv21).single, kBilinear, blended},
        {"Lanczos RGBA", Layout::kRgba, our_lanczos().single, kLanczos, filtered},
    };
}

using Bytes = std::vector<uint8_t>;

Bytes noise(size_t bytes) {
    Bytes content(bytes);
    uint32_t state = 1;
    for (uint8_t& byte : content) {
        state = state * 1664525 + 1013904223;
        byte = static_cast<uint8_t>(state >> 24);
    }
    return content;
}

// Counts calls of a case, and tells what the contender is.
class Counter {
public:
    explicit Counter(size_t bytes)
        : noise_(noise(bytes)), black_and_white_(noise_), result_(bytes) {
        for (uint8_t& byte : black_and_white_) byte = byte < 128 ? 0 : 255;
    }

    void count(const std::string& name, const Job& job, const Contender& contender) {
        const Picture dst = picture_at(result_.data(), job.layout, job.dst);
        contender.run(picture_at(black_and_white_.data(), job.layout, job.src), dst);
        const char* kind = has_grey(picture_bytes(job.layout, job.dst)) ? "blends" : "copies";
        const Picture src = picture_at(noise_.data(), job.layout, job.src);
        syscall(kBegin);
        contender.run(src, dst);
        syscall(kEnd, number_);
        printf("%d\t%s\t%s\t%" PRId64 "\t%s\n", number_, name.c_str(), contender.name.c_str(),
               int64_t{job.dst.width} * job.dst.height, kind);
        ++number_;
    }

private:
    // Single samples of a source in black and white are black and white.
    bool has_grey(size_t bytes) const {
        return std::any_of(result_.begin(), result_.begin() + static_cast<ptrdiff_t>(bytes),
                           [](uint8_t byte) { return byte != 0 && byte != 255; });
    }

    Bytes noise_;
    Bytes black_and_white_;
    Bytes result_;
    int number_ = 0;
};

std::string size_name(Size size) {
    return std::to_string(size.width) + "x" + std::to_string(size.height);
}

std::vector<Contender> contenders(const Family& family, const Job& job, bool ours) {
    if (ours) {
        const auto call = [call = family.call, job](const Picture& src, const Picture& dst) {
            call(job, src, dst);
        };
        return {{Role::kSingle, "ours", call}};
    }
    std::vector<Contender> all = libyuv_contenders(job, family.peer_filters);
    for (Contender& peer : opencv_contenders(job, family.peer_filters)) all.push_back(peer);
    return all;
}

void count_all(bool ours, const char* part) {
    constexpr Size kLargest = {4000, 3000};
    Counter counter(picture_bytes(Layout::kRgba, kLargest) + kSlackBytes);
    for (const Family& family : families()) {
        for (const Scaling& sizes : family.sizes) {
            const std::string name =
                family.name + (" " + size_name(sizes.src)) + " to " + size_name(sizes.dst);
            if (name.find(part) == std::string::npos) continue;
            const Job job = {family.layout, sizes.src, sizes.dst, sizes.dst, 0, 0, Content::kNoise};
            for (const Contender& contender : contenders(family, job, ours)) {
                counter.count(name, job, contender);
            }
        }
    }
}

}  // namespace

}  // namespace bench

int main(int argc, char** argv) {
    if (argc < 2) return 2;
    bench::count_all(strcmp(argv[1], "ours") == 0, argc > 2 ? argv[2] : "");
    return 0;
}
