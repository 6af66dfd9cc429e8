// SPDX-License-Identifier: Apache-2.0
#include "runner.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cmath>
#include <cstdlib>
#include <memory>
#include <numeric>
#include <random>

namespace bench {

namespace {

constexpr size_t kPage = 4096;
constexpr size_t kCacheLine = 64;
constexpr size_t kFewestRounds = 5;

// Bytes on a page boundary.
class Buffer {
public:
    explicit Buffer(size_t bytes)
        : size_((bytes + kSlackBytes + kPage - 1) / kPage * kPage),
          data_(static_cast<uint8_t*>(std::aligned_alloc(kPage, size_)), std::free) {
        if (data_ == nullptr) throw std::bad_alloc();
        std::fill_n(data_.get(), size_, uint8_t{0});
    }

    uint8_t* data() const { return data_.get(); }
    size_t size() const { return size_; }

private:
    size_t size_;
    std::unique_ptr<uint8_t, decltype(&std::free)> data_;
};

uint8_t content_byte(Content content, size_t i, uint32_t random) {
    if (content == Content::kNoise) return static_cast<uint8_t>(random);
    if (content == Content::kSoft) return static_cast<uint8_t>((i >> 6) % 251 + random % 5);
    return (random & 0x300) == 0 ? 0 : 255;
}

Buffer make_source(size_t bytes, Content content) {
    Buffer buffer(bytes);
    std::minstd_rand random(static_cast<unsigned>(content) + 1);
    for (size_t i = 0; i < buffer.size(); ++i) {
        buffer.data()[i] = content_byte(content, i, static_cast<uint32_t>(random() >> 8));
    }
    return buffer;
}

// One for each content that a job shows.
std::vector<Buffer> make_sources(const Job& job) {
    const size_t bytes = picture_bytes(job.layout, job.src);
    std::vector<Buffer> sources;
    if (job.content == Content::kMixed) {
        for (const Content content : {Content::kNoise, Content::kSoft, Content::kEdges}) {
            sources.push_back(make_source(bytes, content));
        }
    } else {
        sources.push_back(make_source(bytes, job.content));
    }
    return sources;
}

double seconds_since(std::chrono::steady_clock::time_point start) {
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

void flush_line(const uint8_t* line) {
#if defined(__x86_64__)
    __builtin_ia32_clflush(line);
#elif defined(__aarch64__)
    __asm__ volatile("dc civac, %0" : : "r"(line) : "memory");
#else
#error "how does this processor flush a cache line?"
#endif
}

// Writes a picture's cache lines back and drops them. Its planes lie behind one another.
void flush(const Picture& picture) {
    const size_t bytes = picture_bytes(picture.layout, picture.size);
    for (size_t i = 0; i < bytes + kCacheLine; i += kCacheLine) flush_line(picture.data() + i);
    std::atomic_thread_fence(std::memory_order_seq_cst);
}

// Both in seconds per call.
double sample_cold(const Resize& run, const Picture& src, const Picture& dst, int calls) {
    double seconds = 0;
    for (int i = 0; i < calls; ++i) {
        flush(src);
        flush(dst);
        const auto start = std::chrono::steady_clock::now();
        run(src, dst);
        seconds += seconds_since(start);
    }
    return seconds / calls;
}

double sample_warm(const Resize& run, const Picture& src, const Picture& dst, int calls) {
    // A picture moves into the third-level cache over several calls, as it leaves the second. Where
    // that would take long, it matters little.
    constexpr int kWarmUpCalls = 8;
    constexpr double kMostWarmUpSeconds = 0.01;
    const auto warm_up = std::chrono::steady_clock::now();
    run(src, dst);
    for (int i = 1; i < kWarmUpCalls && seconds_since(warm_up) < kMostWarmUpSeconds; ++i) {
        run(src, dst);
    }
    const auto start = std::chrono::steady_clock::now();
    for (int i = 0; i < calls; ++i) run(src, dst);
    return seconds_since(start) / calls;
}

double sample(Caches caches, const Resize& run, const Picture& src, const Picture& dst, int calls) {
    return caches == Caches::kCold ? sample_cold(run, src, dst, calls)
                                   : sample_warm(run, src, dst, calls);
}

// Calls in a sample of each contender.
std::vector<int> calls_per_sample(const std::vector<Contender>& contenders, const Picture& src,
                                  const Picture& dst, const Effort& effort) {
    std::vector<int> calls;
    for (const Contender& contender : contenders) {
        const double once = sample(effort.caches, contender.run, src, dst, 1);
        calls.push_back(1 + static_cast<int>(std::min(effort.least_seconds / once, 1000.0)));
    }
    return calls;
}

}  // namespace

std::vector<Samples> measure(const Job& job, const std::vector<Contender>& contenders,
                             const Effort& effort) {
    const std::vector<Buffer> sources = make_sources(job);
    const Buffer target(picture_bytes(job.layout, job.canvas));
    const auto source_at = [&](size_t round) {
        return picture_at(sources[round % sources.size()].data(), job.layout, job.src);
    };
    // Where the two pictures lie to each other within a page matters to loads behind stores, so it
    // changes from round to round.
    const auto target_at = [&](size_t round) {
        const size_t offset = round * 5 * kCacheLine % kPage;
        return picture_at(target.data() + offset, job.layout, job.canvas);
    };

    const std::vector<int> calls = calls_per_sample(contenders, source_at(0), target_at(0), effort);
    std::vector<Samples> samples(contenders.size());
    std::vector<size_t> order(contenders.size());
    std::iota(order.begin(), order.end(), size_t{0});
    std::minstd_rand random(std::random_device{}());
    const auto start = std::chrono::steady_clock::now();
    for (size_t round = 0; round < static_cast<size_t>(effort.rounds); ++round) {
        if (round >= kFewestRounds && seconds_since(start) > effort.most_seconds) break;
        const Picture src = source_at(round);
        const Picture dst = target_at(round);
        std::shuffle(order.begin(), order.end(), random);
        for (const size_t i : order) {
            samples[i].push_back(sample(effort.caches, contenders[i].run, src, dst, calls[i]));
        }
    }
    return samples;
}

Quartiles quartiles(Samples samples) {
    std::sort(samples.begin(), samples.end());
    const auto at = [&](double part) {
        const double position = part * static_cast<double>(samples.size() - 1);
        const double below = std::floor(position);
        const size_t i = static_cast<size_t>(below);
        const size_t next = std::min(i + 1, samples.size() - 1);
        return samples[i] + (position - below) * (samples[next] - samples[i]);
    };
    return {at(0.25), at(0.5), at(0.75)};
}

Quartiles paired_ratio(const Samples& a, const Samples& b) {
    Samples ratios;
    for (size_t i = 0; i < a.size(); ++i) ratios.push_back(a[i] / b[i]);
    return quartiles(std::move(ratios));
}

}  // namespace bench
