// SPDX-License-Identifier: Apache-2.0
#include "kernel_bench.h"

#include <algorithm>
#include <chrono>
#include <functional>
#include <memory>
#include <ostream>
#include <random>

#include "kernels/kernels.h"
#include "lanczos/weights.h"
#include "table.h"

namespace bench {

namespace {

using ovrin::Kernels;
using ovrin::NamedKernels;

// A kernel that a set has planned for some row.
struct Planned {
    uintptr_t kernel;  // which one it is
    std::function<void(int rows)> run;
};

struct KernelCase {
    std::string kernel;  // as its contract calls it
    std::string shape;
    int32_t bytes;  // of a destination row
    std::function<Planned(const Kernels& set)> plan;
};

template <class Function>
uintptr_t identity(Function* kernel) {
    return reinterpret_cast<uintptr_t>(kernel);
}

// Source : destination.
struct Ratio {
    int32_t source;
    int32_t destination;

    std::string text() const { return std::to_string(source) + ":" + std::to_string(destination); }
    int32_t source_of(int32_t count) const { return count * source / destination; }
};

constexpr Ratio kRatios[] = {{2, 3}, {3, 2}, {2, 1}, {25, 8}, {4, 1}, {64, 15}, {18, 1}};

std::string shape_of(int32_t bytes, const char* unit, const Ratio& ratio) {
    return std::to_string(bytes) + " " + unit + (bytes == 1 ? ", " : "s, ") + ratio.text();
}

std::vector<uint8_t> noise(size_t bytes) {
    std::minstd_rand random(1);  // NOLINT(cert-msc32-c,cert-msc51-cpp): the same each time
    std::vector<uint8_t> result(bytes);
    for (uint8_t& byte : result) byte = static_cast<uint8_t>(random() >> 8);
    return result;
}

// ---- Quarter-point ----

constexpr int32_t kQuarterSamples = 960;

struct QuarterRun {
    ovrin::QuarterPlan plan;
    std::vector<uint8_t> top, bottom, dst;
};

Planned plan_quarter(const Kernels& set, int32_t bytes, const Ratio& ratio,
                     ovrin::QuarterKernel* ovrin::QuarterKernels::*which) {
    const int32_t source = ratio.source_of(kQuarterSamples);
    auto run = std::make_shared<QuarterRun>();
    run->top = run->bottom = noise(static_cast<size_t>(source) * static_cast<size_t>(bytes));
    run->dst.resize(static_cast<size_t>(kQuarterSamples) * static_cast<size_t>(bytes));
    ovrin::QuarterColumns columns = {{ovrin::quarter_point(source), source, kQuarterSamples},
                                     {ovrin::three_quarter_point(source), source, kQuarterSamples}};
    const ovrin::QuarterRowShape shape = {bytes, source, kQuarterSamples};
    ovrin::QuarterKernel* kernel =
        set.plan_quarters(run->plan, shape, columns, kQuarterSamples).*which;
    return {identity(kernel), [run, kernel](int rows) {
                const uint8_t* top = run->top.data();
                const uint8_t* bottom = run->bottom.data();
                for (int i = 0; i < rows; ++i) {
                    kernel(run->dst.data(), {top, bottom, top, bottom}, run->plan);
                }
            }};
}

void add_quarter_cases(std::vector<KernelCase>& cases) {
    struct Entry {
        const char* name;
        ovrin::QuarterKernel* ovrin::QuarterKernels::*which;
    };
    for (const Entry& entry : {Entry{"quarter store_pair", &ovrin::QuarterKernels::store_pair},
                               Entry{"quarter add_pair", &ovrin::QuarterKernels::add_pair},
                               Entry{"quarter add_row", &ovrin::QuarterKernels::add_row}}) {
        for (const int32_t bytes : {1, 2, 3, 4}) {
            for (const Ratio& ratio : kRatios) {
                cases.push_back({entry.name, shape_of(bytes, "byte", ratio),
                                 kQuarterSamples * bytes, [=](const Kernels& set) {
                                     return plan_quarter(set, bytes, ratio, entry.which);
                                 }});
            }
        }
    }
}

// ---- Bilinear ----

struct BilinearRun {
    ovrin::BilinearPlan plan;
    ovrin::BilinearSums sums[2];
    ovrin::BilinearColumns columns;
    std::vector<uint8_t> row, dst;
};

std::shared_ptr<BilinearRun> bilinear_run(int32_t bytes, const Ratio& ratio) {
    auto run = std::make_shared<BilinearRun>();
    ovrin::BilinearColumns& columns = run->columns;
    columns.sample_bytes = bytes;
    columns.count = ovrin::kBilinearColumns;
    columns.to_right = 1;
    for (int32_t i = 0; i < columns.count; ++i) {
        columns.index[i] = ratio.source_of(i);
        columns.weight[i] = 1024 + i * 37 % ovrin::kBilinearOne;
    }
    for (ovrin::BilinearSums& sums : run->sums) {
        for (uint32_t& value : sums.values) value = 100 * ovrin::kBilinearOne;
    }
    run->row =
        noise(static_cast<size_t>(ratio.source_of(columns.count) + 2) * static_cast<size_t>(bytes));
    run->dst.resize(static_cast<size_t>(columns.count) * static_cast<size_t>(bytes));
    return run;
}

Planned plan_across(const Kernels& set, int32_t bytes, const Ratio& ratio) {
    const auto run = bilinear_run(bytes, ratio);
    ovrin::BilinearAcross* across = set.plan_bilinear(run->plan, run->columns).across;
    return {identity(across), [run, across](int rows) {
                for (int i = 0; i < rows; ++i) across(run->sums[0], run->row.data(), run->plan);
            }};
}

Planned plan_down(const Kernels& set, int32_t bytes, const Ratio& ratio) {
    const auto run = bilinear_run(bytes, ratio);
    ovrin::BilinearDown* down = set.plan_bilinear(run->plan, run->columns).down;
    return {identity(down), [run, down](int rows) {
                const ovrin::BilinearNext nothing = {{run->row.data(), run->row.data()}, 0};
                for (int i = 0; i < rows; ++i) {
                    down(run->dst.data(), run->sums[0], run->sums[1], 1024 + i % 4096, run->plan,
                         nothing);
                }
            }};
}

Planned plan_copy(const Kernels& set, int32_t bytes, const Ratio& ratio) {
    const auto run = bilinear_run(bytes, ratio);
    ovrin::BilinearCopy* copy = set.plan_bilinear_copy(run->plan, run->columns);
    return {identity(copy), [run, copy](int rows) {
                for (int i = 0; i < rows; ++i) copy(run->dst.data(), run->row.data(), run->plan);
            }};
}

void add_bilinear_cases(std::vector<KernelCase>& cases) {
    struct Entry {
        const char* name;
        Planned (*plan)(const Kernels&, int32_t, const Ratio&);
    };
    for (const Entry& entry :
         {Entry{"bilinear across", plan_across}, Entry{"bilinear down", plan_down},
          Entry{"bilinear copy", plan_copy}}) {
        for (const int32_t bytes : {1, 2, 4}) {
            for (const Ratio& ratio : kRatios) {
                cases.push_back(
                    {entry.name, shape_of(bytes, "byte", ratio), ovrin::kBilinearColumns * bytes,
                     [=](const Kernels& set) { return entry.plan(set, bytes, ratio); }});
            }
        }
    }
}

// ---- Lanczos ----

// The rows of a picture as wide as a strip, of which the source's heights and numbers follow the
// ratio: kernels keep what they have filtered of a source row for the next destination rows.
constexpr int32_t kLanczosRows = 24;

struct LanczosRun {
    LanczosRun(int32_t components, const Ratio& ratio)
        : src_w(ratio.source_of(ovrin::kLanczosColumns)),
          src_h(ratio.source_of(kLanczosRows)),
          weights(ovrin::kLanczosColumns, kLanczosRows),
          pitch(size_t(src_w + ovrin::kLanczosTaps) * size_t(components)),
          src(noise(pitch * size_t(src_h))),
          dst(size_t(ovrin::kLanczosColumns * components)) {
        weights.fill(src_w, src_h);
        columns.weights = weights.columns.data();
        columns.src_components = columns.dst_components = components;
        columns.count = ovrin::kLanczosColumns;
        for (int32_t i = 0; i < columns.count; ++i) columns.index[i] = ratio.source_of(i);
        for (int32_t y = 0; y < kLanczosRows; ++y) set_row(rows[y], y, ratio.source_of(y));
    }

    void set_row(ovrin::LanczosRow& row, int32_t y, int32_t middle) {
        row.dst = dst.data();
        row.weights = weights.rows.of_sample(y);
        for (int32_t k = 0; k < ovrin::kLanczosTaps; ++k) {
            const int32_t wanted = middle - ovrin::kLanczosMargin + k;
            const int32_t source = std::min(std::max(wanted, 0), src_h - 1);
            row.source_rows[k] = source;
            row.taps[k] = src.data() + pitch * size_t(source);
        }
    }

    int32_t src_w, src_h;
    ovrin::LanczosPlan weights;
    size_t pitch;
    std::vector<uint8_t> src, dst;
    ovrin::LanczosColumns columns;
    ovrin::LanczosStripPlan plan;
    ovrin::LanczosSums sums;
    ovrin::LanczosRow rows[kLanczosRows];
};

Planned plan_lanczos(const Kernels& set, int32_t components, const Ratio& ratio) {
    const auto run = std::make_shared<LanczosRun>(components, ratio);
    ovrin::FilterLanczos* filter = set.plan_lanczos(run->plan, run->columns);
    run->sums.clear();
    return {identity(filter), [run, filter](int rows) {
                for (int i = 0; i < rows; ++i) {
                    filter(run->rows[i % kLanczosRows], run->plan, run->sums);
                }
            }};
}

void add_lanczos_cases(std::vector<KernelCase>& cases) {
    for (const int32_t components : {1, 2, 3, 4}) {
        for (const Ratio& ratio : kRatios) {
            cases.push_back({"Lanczos filter", shape_of(components, "component", ratio),
                             ovrin::kLanczosColumns * components, [=](const Kernels& set) {
                                 return plan_lanczos(set, components, ratio);
                             }});
        }
    }
}

// ---- Copying ----

constexpr int32_t kCopiedWords = 960;

Planned plan_copy_every(const Kernels& set, int32_t step) {
    const auto src = std::make_shared<std::vector<uint32_t>>(size_t(kCopiedWords * step));
    const auto dst = std::make_shared<std::vector<uint32_t>>(size_t(kCopiedWords));
    ovrin::CopyEvery* copy = set.copy_every;
    return {identity(copy), [=](int rows) {
                for (int i = 0; i < rows; ++i) {
                    copy(dst->data(), src->data(), step, kCopiedWords, src->data());
                }
            }};
}

void add_copy_cases(std::vector<KernelCase>& cases) {
    for (const int32_t step : {1, 2, 3, 4, 6, 8}) {
        cases.push_back({"copy_every", "step " + std::to_string(step), kCopiedWords * 4,
                         [=](const Kernels& set) { return plan_copy_every(set, step); }});
    }
}

// ---- Measuring ----

double seconds_for(const Planned& planned, int rows) {
    const auto start = std::chrono::steady_clock::now();
    planned.run(rows);
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

// Rows in a sample, so that it takes `least` seconds.
int rows_per_sample(const Planned& planned, double least) {
    int rows = 1;
    while (seconds_for(planned, rows) < least && rows < 1 << 24) rows *= 2;
    return rows;
}

// Seconds per row: the median over rounds, in each of which every set is sampled once.
std::vector<double> measure_sets(const std::vector<Planned>& sets, const Effort& effort) {
    std::vector<int> rows;
    rows.reserve(sets.size());
    for (const Planned& planned : sets) {
        rows.push_back(rows_per_sample(planned, effort.least_seconds));
    }
    std::vector<Samples> samples(sets.size());
    for (int round = 0; round < effort.rounds; ++round) {
        for (size_t i = 0; i < sets.size(); ++i) {
            samples[i].push_back(seconds_for(sets[i], rows[i]) / rows[i]);
        }
    }
    std::vector<double> medians;
    medians.reserve(samples.size());
    for (const Samples& set : samples) medians.push_back(quartiles(set).median);
    return medians;
}

std::vector<KernelCase> all_kernel_cases() {
    std::vector<KernelCase> cases;
    add_quarter_cases(cases);
    add_bilinear_cases(cases);
    add_lanczos_cases(cases);
    add_copy_cases(cases);
    return cases;
}

void print_case(Table& table, const KernelCase& test, const NamedKernels* sets, int32_t count,
                const Effort& effort) {
    std::vector<Planned> planned;
    planned.reserve(static_cast<size_t>(count));
    for (int32_t i = 0; i < count; ++i) planned.push_back(test.plan(*sets[i].kernels));
    const std::vector<double> seconds = measure_sets(planned, effort);
    std::vector<std::string> cells = {test.kernel, test.shape};
    for (size_t i = 0; i < planned.size(); ++i) {
        // A set may take another one's kernel where it has none of its own, or none that fits.
        const bool same = i > 0 && planned[i].kernel == planned[i - 1].kernel;
        cells.push_back(fixed(seconds[i] * 1e9 / test.bytes, 4) + (same ? " =" : "  "));
    }
    cells.push_back(fixed(seconds.front() / seconds.back(), 1));
    table.print_row(cells);
}

}  // namespace

bool print_kernels(std::ostream& out, const std::string& filter, const Effort& effort) {
    NamedKernels sets[ovrin::kMaxSets];
    const int32_t count = ovrin::available_kernels(sets);
    std::vector<KernelCase> wanted;
    for (KernelCase& test : all_kernel_cases()) {
        if ((test.kernel + " " + test.shape).find(filter) != std::string::npos) {
            wanted.push_back(std::move(test));
        }
    }
    if (wanted.empty()) return false;

    out << "nanoseconds per destination byte; = marks the kernel of the set to the left\n\n";
    std::vector<Column> columns = {{"kernel", 18, true}, {"row", 18, true}};
    for (int32_t i = 0; i < count; ++i) columns.push_back({sets[i].name, 9, false});
    columns.push_back({"faster", 6, false});
    Table table(out, columns);
    for (const KernelCase& test : wanted) print_case(table, test, sets, count, effort);
    return true;
}

}  // namespace bench
