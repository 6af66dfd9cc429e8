// SPDX-License-Identifier: Apache-2.0
#include "threads.h"

#include <time.h>

#include <algorithm>
#include <iomanip>
#include <memory>
#include <sstream>

#include "bands/pool.h"
#include "bands/split.h"
#include "kernels/kernels.h"
#include "ours.h"
#include "quarter/sampler.h"
#include "table.h"

namespace bench {

namespace {

struct Format {
    const char* name;
    Layout layout;
    OurCalls calls;
};

// The lowest picture that goes in bands, full HD, 12 and 50 megapixels.
constexpr Size kSources[] = {{64, 1024}, {1920, 1080}, {4000, 3000}, {8192, 6144}};

std::string number(double value, int digits) {
    std::ostringstream text;
    text << std::fixed << std::setprecision(digits) << value;
    return text.str();
}

std::string microseconds(double seconds) {
    return number(seconds * 1e6, 1);
}

Contender ours(Role role, const char* name, OurCall* call, const Job& job) {
    return {role, name, [=](const Picture& src, const Picture& dst) { call(job, src, dst); }};
}

void print_format(Table& table, const char* set, const Format& format, const Effort& effort) {
    for (const Size& src : kSources) {
        const Size dst = {src.width / 4, src.height / 4};
        const Job job = {format.layout, src, dst, dst, 0, 0, Content::kNoise};
        const std::vector<Samples> samples =
            measure(job,
                    {ours(Role::kSingle, "_sg", format.calls.single, job),
                     ours(Role::kWrapper, "_tps", format.calls.wrapper, job)},
                    effort);
        const double single = quartiles(samples[0]).median;
        const double threaded = quartiles(samples[1]).median;
        table.print_row(
            {set, format.name, std::to_string(src.width) + "x" + std::to_string(src.height),
             microseconds(single), microseconds(threaded), microseconds(threaded - single),
             number(paired_ratio(samples[0], samples[1]).median, 2)});
    }
}

void print_gains(std::ostream& out, const Effort& effort) {
    const Format formats[] = {{"NV21", Layout::kNv21, our_nv21()},
                              {"I420", Layout::kI420, our_i420()},
                              {"RGBA", Layout::kRgba, our_rgba()}};
    out << "Pictures to a quarter of their width and height, on the calling thread and on "
           "several:\n\n";
    Table table(out, {{"kernels", 7, true},
                      {"format", 6, true},
                      {"source", 9, true},
                      {"_sg us", 8, false},
                      {"_tps us", 8, false},
                      {"more us", 8, false},
                      {"gain", 5, false}});
    const ovrin::Kernels& chosen = ovrin::kernels();
    ovrin::NamedKernels sets[ovrin::kMaxSets];
    const int32_t count = ovrin::available_kernels(sets);
    for (int32_t i = 0; i < count; ++i) {
        ovrin::force_kernels(*sets[i].kernels);
        for (const Format& format : formats) print_format(table, sets[i].name, format, effort);
    }
    ovrin::force_kernels(chosen);
}

// ---- Where the time goes --------------------------------------------------------------------

// The median, in seconds, of many runs of one step.
template <class Step>
double median_of(const Step& step) {
    Samples samples(301);
    for (double& sample : samples) sample = step();
    return quartiles(samples).median;
}

double now() {
    timespec time;
    clock_gettime(CLOCK_MONOTONIC, &time);
    return static_cast<double>(time.tv_sec) + 1e-9 * static_cast<double>(time.tv_nsec);
}

template <class Work>
double seconds_of(const Work& work) {
    const double start = now();
    work();
    return now() - start;
}

// A threaded call with nothing to do, as its threads see it.
struct EmptyCall {
    double start = 0;
    double caller_began = 0;
    double last_task_began = 0;
    double returned = 0;

    static EmptyCall run() {
        struct Shared {
            pthread_t caller;
            int32_t next;
            double began[ovrin::kBandThreads + 1];

            static void work(void* argument) {
                auto& shared = *static_cast<Shared*>(argument);
                const bool is_caller = pthread_equal(pthread_self(), shared.caller) != 0;
                const int32_t i =
                    is_caller ? 0 : 1 + __atomic_fetch_add(&shared.next, 1, __ATOMIC_RELAXED);
                shared.began[i] = now();
            }
        };
        Shared shared = {pthread_self(), 0, {}};
        EmptyCall call;
        call.start = now();
        ovrin::run_while_workers_start(Shared::work, &shared);
        call.returned = now();
        call.caller_began = shared.began[0];
        call.last_task_began =
            *std::max_element(shared.began + 1, shared.began + 1 + ovrin::kBandThreads);
        return call;
    }
};

// Luma of 12 megapixels to a sixteenth, or so few rows that the plan is all the work.
double seconds_of_luma(int32_t rows) {
    constexpr int32_t kSrcW = 4000, kSrcH = 3000, kDstW = 1000, kDstH = 750;
    static const std::unique_ptr<uint8_t[]> src(new uint8_t[size_t{kSrcW} * kSrcH]());
    static const std::unique_ptr<uint8_t[]> dst(new uint8_t[size_t{kDstW} * kDstH]());
    ovrin::QuarterPlane plane = {};
    plane.src = src.get();
    plane.src_pitch = plane.src_columns = kSrcW;
    plane.src_rows = kSrcH;
    plane.dst = dst.get();
    plane.dst_pitch = plane.dst_columns = plane.columns = kDstW;
    plane.dst_rows = kDstH;
    plane.rows = rows;
    plane.sample_bytes = 1;
    return median_of([&] { return seconds_of([&] { ovrin::sample_plane(plane); }); });
}

void print_steps(std::ostream& out) {
    ovrin_threadpool* pool = nullptr;
    const auto make = [&] { return seconds_of([&] { pool = ovrin_threadpool_init(4); }); };
    const auto end = [&] { return seconds_of([&] { ovrin_threadpool_free(pool, 1); }); };
    const double making = median_of([&] {
        const double seconds = make();
        end();
        return seconds;
    });
    const double ending = median_of([&] {
        make();
        return end();
    });
    const auto step = [](double EmptyCall::*from, double EmptyCall::*to) {
        return median_of([&] {
            const EmptyCall call = EmptyCall::run();
            return call.*to - call.*from;
        });
    };
    out << "\nWhere the time goes:\n\n";
    Table table(out, {{"step", 66, true}, {"us", 8, false}});
    const auto print = [&](const char* name, double seconds) {
        table.print_row({name, microseconds(seconds)});
    };
    print("a pool of four: making it, workers and all", making);
    print("... ending it, idle", ending);
    print("a call with nothing to do: until the calling thread can begin",
          step(&EmptyCall::start, &EmptyCall::caller_began));
    print("... until the last of the workers' tasks has begun",
          step(&EmptyCall::start, &EmptyCall::last_task_began));
    print("... from then until it returns",
          step(&EmptyCall::last_task_began, &EmptyCall::returned));
    print("12 megapixels of luma to a quarter each way: all rows", seconds_of_luma(750));
    print("... one row: little more than the plan, which each thread makes", seconds_of_luma(1));
}

}  // namespace

void print_thread_costs(std::ostream& out, const Effort& effort) {
    print_gains(out, effort);
    print_steps(out);
}

}  // namespace bench
