// SPDX-License-Identifier: Apache-2.0
// Which kernels each set takes for which shapes, and how it cuts rows: against a table of the set
// in plans/. A set that silently falls back to a slower kernel, or reads a window more than it
// needs, gives the right bytes; only the table tells.
//
// OVRIN_WRITE_PLANS=1 writes the tables of this machine's sets anew: read what has changed.
#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

#include "kernels/kernels.h"
#include "support/function_names.h"

using namespace ovrin;
using ovrin_test::FunctionNames;

namespace {

const FunctionNames& names() {
    static const FunctionNames instance;
    return instance;
}

// The lines of a table: neighbouring sizes with the same plan share one.
class Table {
public:
    explicit Table(std::ostream& out) : out_(out) {}
    ~Table() { end_line(); }

    void title(const std::string& text) {
        end_line();
        out_ << '\n' << text << '\n';
    }

    void row(int32_t size, const std::string& plan) {
        if (plan != plan_) {
            end_line();
            plan_ = plan;
            first_ = size;
        }
        last_ = size;
    }

private:
    void end_line() {
        if (plan_.empty()) return;
        out_ << "  " << first_;
        if (last_ != first_) out_ << " to " << last_;
        out_ << ": " << plan_ << '\n';
        plan_.clear();
    }

    std::ostream& out_;
    std::string plan_;
    int32_t first_ = 0;
    int32_t last_ = 0;
};

// ---- Quarter points ---------------------------------------------------------------------------

struct QuarterRow {
    int32_t sample_bytes;
    int32_t source;
    int32_t destination;
};

// The first strip's kernel; and where it ends, if that is before the row does.
std::string quarter_plan(const Kernels& set, const QuarterRow& row) {
    const auto plan = std::make_unique<QuarterPlan>();
    QuarterColumns columns = {{quarter_point(row.source), row.source, row.destination},
                              {three_quarter_point(row.source), row.source, row.destination}};
    const QuarterKernels& kernels = set.plan_quarters(
        *plan, {row.sample_bytes, row.source, row.destination}, columns, row.destination);
    std::string text = names().of(kernels.store_pair);
    // Only plans of windows have vectors.
    if (text.find("run_windows") != std::string::npos ||
        text.find("run_repeating") != std::string::npos) {
        text += ", " + std::to_string(plan->vector_samples) + " samples in a vector";
    }
    if (plan->samples < row.destination) {
        text += ", " + std::to_string(plan->samples) + " in a strip";
    }
    return text;
}

void list_quarters(std::ostream& out, const Kernels& set) {
    Table table(out);
    for (const int32_t n : {1, 2, 3, 4}) {
        for (const int32_t source : {7, 40, 100, 333, 1000}) {
            table.title("Quarter points: " + std::to_string(source) + " columns, " +
                        std::to_string(n) + "-byte samples, to");
            for (int32_t destination = 1; destination <= 2 * source; ++destination) {
                table.row(destination, quarter_plan(set, {n, source, destination}));
            }
        }
        table.title("Quarter points: 20000 columns, " + std::to_string(n) + "-byte samples, to");
        for (const int32_t destination : {3000, 5000, 7001, 10000, 11111, 15000, 19999, 25000}) {
            table.row(destination, quarter_plan(set, {n, 20000, destination}));
        }
    }
}

// ---- Bilinear ---------------------------------------------------------------------------------

void fill_columns(BilinearColumns& columns, int32_t source, int32_t destination) {
    columns.count = destination < kBilinearColumns ? destination : kBilinearColumns;
    for (int32_t i = 0; i < columns.count; ++i) {
        columns.index[i] = static_cast<int32_t>(int64_t{i} * source / destination);
        columns.weight[i] = 1024 + i % 4096;
    }
}

void list_bilinear(std::ostream& out, const Kernels& set) {
    const auto columns = std::make_unique<BilinearColumns>();
    const auto plan = std::make_unique<BilinearPlan>();
    const auto list = [&](const std::string& title, const auto& describe) {
        Table table(out);
        for (const int32_t source : {7, 40, 100, 333}) {
            table.title(title + ": " + std::to_string(source) + " columns, " +
                        std::to_string(columns->sample_bytes) + "-byte samples, to");
            for (int32_t destination = 1; destination <= 2 * source; ++destination) {
                fill_columns(*columns, source, destination);
                table.row(destination, describe());
            }
        }
    };
    for (const int32_t n : {1, 2, 4}) {
        columns->sample_bytes = n;
        for (const int32_t to_right : {0, 1}) {
            columns->to_right = to_right;
            list(to_right == 1 ? "Bilinear" : "Bilinear, last column", [&] {
                const BilinearKernels kernels = set.plan_bilinear(*plan, *columns);
                return names().of(kernels.across) + ", " + names().of(kernels.down);
            });
        }
        list("Bilinear copies",
             [&] { return names().of(set.plan_bilinear_copy(*plan, *columns)); });
    }
}

// ---- Lanczos ----------------------------------------------------------------------------------

struct LanczosShape {
    int32_t src_components;
    int32_t dst_components;
    int32_t count;
    double weights;  // of a column, its largest; the others are 0
};

// Columns `step` pixels apart.
std::string lanczos_plan(const Kernels& set, const LanczosShape& shape, int32_t step) {
    const auto columns = std::make_unique<LanczosColumns>();
    const auto plan = std::make_unique<LanczosStripPlan>();
    std::vector<double> weights(static_cast<size_t>(shape.count) * kLanczosTaps, 0.0);
    // The last column has the largest.
    weights.back() = shape.weights;
    columns->weights = weights.data();
    columns->src_components = shape.src_components;
    columns->dst_components = shape.dst_components;
    columns->count = shape.count;
    for (int32_t i = 0; i < shape.count; ++i) columns->index[i] = i * step;
    return names().of(set.plan_lanczos(*plan, *columns));
}

void list_lanczos(std::ostream& out, const Kernels& set) {
    Table table(out);
    const auto list = [&](const char* title, const LanczosShape& shape) {
        std::ostringstream text;
        text << "Lanczos, " << title << ": " << shape.count << " columns, " << shape.src_components
             << " components to " << shape.dst_components << ", pixels apart";
        table.title(text.str());
        for (int32_t step = 0; step <= 300; ++step) table.row(step, lanczos_plan(set, shape, step));
    };
    for (const int32_t n : {1, 2, 3, 4, 5}) {
        list("any weights", {n, n, kLanczosColumns, 1.0});
        list("few columns", {n, n, 5, 1.0});
    }
    list("unlike components", {4, 3, kLanczosColumns, 1.0});
    list("the largest weights", {4, 4, kLanczosColumns, 1.9});
    list("weights too large", {4, 4, kLanczosColumns, 1.9001});
    list("negative weights too large", {1, 1, kLanczosColumns, -1.9001});
}

std::string table_of(const Kernels& set) {
    std::ostringstream out;
    out << "Which kernels this set takes; written by tests/kernels/plans_test.cpp\n";
    list_quarters(out, set);
    list_bilinear(out, set);
    list_lanczos(out, set);
    out << "\nEvery step-th word\n  " << names().of(set.copy_every) << '\n';
    return out.str();
}

std::string contents_of(const std::string& path) {
    std::ifstream file(path);
    std::ostringstream text;
    text << file.rdbuf();
    return text.str();
}

// The first lines that differ say more than two whole tables.
::testing::AssertionResult same_lines(const std::string& actual, const std::string& expected) {
    std::istringstream actual_lines(actual);
    std::istringstream expected_lines(expected);
    std::string title;
    std::string is;
    std::string should_be;
    while (std::getline(expected_lines, should_be)) {
        std::getline(actual_lines, is);
        if (is != should_be) {
            return ::testing::AssertionFailure()
                   << title << "\nis:        " << is << "\nshould be: " << should_be;
        }
        if (!is.empty() && is[0] != ' ') title = is;
    }
    if (std::getline(actual_lines, is)) return ::testing::AssertionFailure() << "more: " << is;
    return ::testing::AssertionSuccess();
}

}  // namespace

TEST(KernelPlans, AreThoseOfTheTables) {
    NamedKernels sets[kMaxSets];
    const int32_t count = available_kernels(sets);
    for (int32_t i = 0; i < count; ++i) {
        const std::string path = std::string(OVRIN_PLANS) + '/' + sets[i].name + ".txt";
        const std::string table = table_of(*sets[i].kernels);
        if (std::getenv("OVRIN_WRITE_PLANS") != nullptr) std::ofstream(path) << table;
        EXPECT_TRUE(same_lines(table, contents_of(path))) << path;
    }
}

// What vectors read begins at an offset of 32 bits. Ratios that are none of the simple ones.
TEST(KernelPlans, RowsBeyondTwoGibibytesAreSampledOneByOne) {
    NamedKernels sets[kMaxSets];
    const int32_t count = available_kernels(sets);
    constexpr int32_t kMostColumns = INT32_MAX / 4;  // of four bytes
    const auto kernel_of = [](const Kernels& set, int32_t source, int32_t destination) {
        const std::string plan = quarter_plan(set, {4, source, destination});
        return plan.substr(0, plan.find(','));
    };
    for (int32_t i = 0; i < count; ++i) {
        for (const int32_t destination : {kMostColumns / 5 * 4, kMostColumns / 9 * 4}) {
            const std::string plain = kernel_of(scalar_kernels, kMostColumns, destination);
            EXPECT_EQ(kernel_of(*sets[i].kernels, kMostColumns + 1, destination), plain)
                << sets[i].name;
            if (i == 0) continue;
            EXPECT_NE(kernel_of(*sets[i].kernels, kMostColumns, destination), plain)
                << sets[i].name;
        }
    }
}
