// SPDX-License-Identifier: Apache-2.0
#include "cases.h"

#include <utility>

namespace bench {

namespace {

struct Scaling {
    Size src;
    Size dst;
};

constexpr Scaling kCameraSizes[] = {
    {{4000, 3000}, {1000, 750}}, {{3840, 2160}, {1920, 1080}}, {{1920, 1080}, {1280, 720}},
    {{4000, 3000}, {1280, 960}}, {{1920, 1080}, {640, 360}},   {{1280, 720}, {300, 168}},
};

// Interface work: thumbnails for classifiers, and enlarging.
constexpr Scaling kPixelSizes[] = {
    {{4000, 3000}, {224, 224}},
    {{1280, 720}, {1920, 1080}},
};

// Our nearest neighbour rounds the ratio to a whole number. Where it rounds up, part of the
// destination is left as it was, and peers would have more to do.
constexpr Scaling kNearestSizes[] = {
    {{4000, 3000}, {1000, 750}},
    {{3840, 2160}, {1920, 1080}},
    {{4000, 3000}, {1280, 960}},
    {{1920, 1080}, {640, 360}},
};

constexpr Scaling kBilinearSizes[] = {
    {{1920, 1080}, {1366, 768}},
    {{1280, 720}, {1920, 1080}},
    {{1920, 1080}, {640, 360}},
};

// Results of 1024 rows or more: others are blended.
constexpr Scaling kBandedSizes[] = {
    {{4000, 3000}, {1440, 1080}},
    {{3840, 2160}, {1920, 1080}},
    {{1280, 720}, {1920, 1080}},
};

constexpr Scaling kLanczosSizes[] = {
    {{1920, 1080}, {1280, 720}},
    {{640, 480}, {1280, 960}},
    {{1280, 720}, {320, 180}},
};

// From 1 to 100 megapixels, a quarter of the size each way.
constexpr Scaling kGrowth[] = {
    {{1168, 864}, {292, 216}},    {{2048, 1536}, {512, 384}},   {{4032, 3024}, {1008, 756}},
    {{5760, 4320}, {1440, 1080}}, {{8192, 6144}, {2048, 1536}}, {{11584, 8688}, {2896, 2172}},
};

struct Letterbox {
    Size src;
    Size dst;
    Size canvas;
    int32_t x;
    int32_t y;
};

constexpr Letterbox kLetterboxes[] = {
    {{4000, 3000}, {960, 720}, {1280, 720}, 160, 0},
    {{1920, 1080}, {1280, 720}, {1280, 960}, 0, 120},
};

Job plain_job(Layout layout, const Scaling& sizes, Content content = Content::kMixed) {
    return {layout, sizes.src, sizes.dst, sizes.dst, 0, 0, content};
}

std::string size_name(Size size) {
    return std::to_string(size.width) + "x" + std::to_string(size.height);
}

std::string scaling_name(const Job& job) {
    return size_name(job.src) + " to " + size_name(job.dst);
}

class List {
public:
    // Cases that differ only in size.
    template <size_t n>
    void add(const std::string& family, Layout layout, const Scaling (&sizes)[n], Sampling sampling,
             unsigned peer_filters, const OurCalls& ours) {
        for (const Scaling& scaling : sizes) {
            const Job job = plain_job(layout, scaling);
            cases_.push_back({family, scaling_name(job), job, sampling, peer_filters, ours});
        }
    }

    void add_letterboxes(const char* layout_name, Layout layout) {
        for (const Letterbox& box : kLetterboxes) {
            const Job job = {layout, box.src, box.dst, box.canvas, box.x, box.y, Content::kMixed};
            const std::string name =
                layout_name + (" " + scaling_name(job)) + " in " + size_name(job.canvas);
            cases_.push_back(
                {"keep-ratio", name, job, Sampling::kQuarter, kSmoothing, our_letterbox(layout)});
        }
    }

    // What Lanczos costs us depends on the picture: see how it decides a byte.
    void add_lanczos(Content content, const std::string& content_name) {
        for (const Scaling& scaling : kLanczosSizes) {
            const Job job = plain_job(Layout::kRgba, scaling, content);
            cases_.push_back({"Lanczos", scaling_name(job) + ", " + content_name, job,
                              Sampling::kEveryRow, kLanczos, our_lanczos()});
        }
    }

    std::vector<Case> take() { return std::move(cases_); }

private:
    std::vector<Case> cases_;
};

void add_quarter_cases(List& list) {
    const auto quarter = Sampling::kQuarter;
    list.add("NV21", Layout::kNv21, kCameraSizes, quarter, kSmoothing, our_nv21());
    list.add("I420", Layout::kI420, kCameraSizes, quarter, kSmoothing, our_i420());
    list.add("RGBA", Layout::kRgba, kCameraSizes, quarter, kSmoothing, our_rgba());
    list.add("RGBA", Layout::kRgba, kPixelSizes, quarter, kSmoothing, our_rgba());
    list.add("RGB888", Layout::kRgb, kCameraSizes, quarter, kSmoothing, our_rgb());
    list.add("RGB888", Layout::kRgb, kPixelSizes, quarter, kSmoothing, our_rgb());
    list.add_letterboxes("NV21", Layout::kNv21);
    list.add_letterboxes("I420", Layout::kI420);
    list.add_letterboxes("RGBA", Layout::kRgba);
}

void add_nearest_cases(List& list) {
    list.add("nearest", Layout::kRgba, kNearestSizes, Sampling::kPoint, kPoint, our_nearest());
}

void add_engine_cases(List& list) {
    const auto rows = Sampling::kBilinear;
    list.add("bilinear RGBA", Layout::kRgba, kBilinearSizes, rows, kBilinear,
             our_bilinear(Layout::kRgba));
    list.add("bilinear NV21", Layout::kNv21, kBilinearSizes, rows, kBilinear,
             our_bilinear(Layout::kNv21));
    list.add("banded RGBA", Layout::kRgba, kBandedSizes, Sampling::kPoint, kPoint,
             our_banded_bilinear(Layout::kRgba));
    list.add("banded NV21", Layout::kNv21, kBandedSizes, Sampling::kPoint, kPoint,
             our_banded_bilinear(Layout::kNv21));
    list.add_lanczos(Content::kNoise, "noise");
    list.add_lanczos(Content::kSoft, "soft");
    list.add_lanczos(Content::kEdges, "hard edges");
}

// Without Lanczos: it is slow, and never the best peer.
void add_growth_cases(List& list) {
    const unsigned peer_filters = kBilinear | kArea;
    list.add("growth NV21", Layout::kNv21, kGrowth, Sampling::kQuarter, peer_filters, our_nv21());
    list.add("growth RGBA", Layout::kRgba, kGrowth, Sampling::kQuarter, peer_filters, our_rgba());
}

// Peers know nothing of canvases: they paint theirs, then scale into a part of it.
Contender letterboxed(Contender peer, const Job& job) {
    const Resize scale = std::move(peer.run);
    peer.run = [scale, job](const Picture& src, const Picture& canvas) {
        paint_black(canvas);
        scale(src, part_of(canvas, job.x, job.y, job.dst));
    };
    return peer;
}

}  // namespace

std::vector<Case> all_cases() {
    List list;
    add_quarter_cases(list);
    add_nearest_cases(list);
    add_engine_cases(list);
    add_growth_cases(list);
    return list.take();
}

std::vector<Contender> contenders_of(const Case& test,
                                     const std::vector<ovrin::NamedKernels>& sets) {
    std::vector<Contender> all = limits_of(test.job, test.sampling);
    const auto add_ours = [&](Role role, const char* name, OurCall* call,
                              const ovrin::NamedKernels& set) {
        if (call == nullptr) return;
        const auto run = [call, job = test.job, kernels = set.kernels](const Picture& src,
                                                                       const Picture& dst) {
            ovrin::force_kernels(*kernels);
            call(job, src, dst);
        };
        all.push_back({role, name, run, set.name});
    };
    for (const ovrin::NamedKernels& set : sets) {
        add_ours(Role::kSingle, "one thread", test.ours.single, set);
        add_ours(Role::kWrapper, "wrapper", test.ours.wrapper, set);
    }
    for (const auto& peers : {libyuv_contenders, opencv_contenders, swscale_contenders}) {
        for (Contender& peer : peers(test.job, test.peer_filters)) {
            all.push_back(test.job.letterboxed() ? letterboxed(std::move(peer), test.job)
                                                 : std::move(peer));
        }
    }
    return all;
}

}  // namespace bench
