// SPDX-License-Identifier: Apache-2.0
// Every instruction set's row kernels against the scalar ones, which other tests compare with the
// definition.
#include <gtest/gtest.h>

#include <algorithm>
#include <iterator>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/vector_sets.h"

using namespace ovrin;
using namespace ovrin_test;

namespace {

struct Row {
    int32_t sample_bytes;
    int32_t src_columns;
    int32_t dst_columns;
};

// The columns from sample `first` on.
QuarterColumns columns_of(const Row& row, int32_t first) {
    const int32_t source = row.src_columns;
    QuarterColumns columns = {{quarter_point(source), source, row.dst_columns},
                              {three_quarter_point(source), source, row.dst_columns}};
    for (int32_t i = 0; i < first; ++i) columns.next();
    return columns;
}

// One strip of a row, planned by one set.
struct Planned {
    QuarterPlan plan;
    const QuarterKernels* kernels;
};

std::unique_ptr<Planned> plan_with(const Kernels& set, const Row& row, int32_t first,
                                   int32_t count) {
    auto planned = std::make_unique<Planned>();
    QuarterColumns columns = columns_of(row, first);
    const QuarterRowShape shape = {row.sample_bytes, row.src_columns, row.dst_columns};
    planned->kernels = &set.plan_quarters(planned->plan, shape, columns, count);
    return planned;
}

enum class Kernel { kStorePair, kAddPair, kAddRow };

const char* name_of(Kernel kernel) {
    constexpr const char* kNames[] = {"store_pair", "add_pair", "add_row"};
    return kNames[static_cast<int>(kernel)];
}

void run(const Planned& planned, Kernel kernel, uint8_t* dst, const uint8_t* top,
         const uint8_t* bottom) {
    switch (kernel) {
        case Kernel::kStorePair:
            return planned.kernels->store_pair(dst, {top, bottom, bottom, top}, planned.plan);
        case Kernel::kAddPair:
            return planned.kernels->add_pair(dst, {top, bottom, bottom, top}, planned.plan);
        case Kernel::kAddRow:
            return planned.kernels->add_row(dst, {top, nullptr, bottom, nullptr}, planned.plan);
    }
}

// Compares the strips of columns `first` to `end` of a row; returns whether the set has kernels of
// its own for them.
bool check_columns(const NamedKernels& set, const Row& row, int32_t first, int32_t end,
                   Random& random) {
    const size_t row_bytes =
        static_cast<size_t>(row.src_columns) * static_cast<size_t>(row.sample_bytes);
    bool differs = false;
    for (int32_t done = first; done < end;) {
        const auto tested = plan_with(*set.kernels, row, done, end - done);
        const int32_t strip = tested->plan.samples;
        for (const Kernel kernel : {Kernel::kStorePair, Kernel::kAddPair, Kernel::kAddRow}) {
            const Flush flush = random.pick({Flush::kEnd, Flush::kStart});
            const GuardedBuffer<uint8_t> top(random.bytes(row_bytes), flush);
            const GuardedBuffer<uint8_t> other(random.bytes(row_bytes), flush);
            // Enlarging, one row is often both.
            const uint8_t* const bottom = random.pick({top.data(), other.data()});
            const auto before = random.bytes(static_cast<size_t>(strip * row.sample_bytes));
            GuardedBuffer<uint8_t> actual(before, flush);
            run(*tested, kernel, actual.data(), top.data(), bottom);
            std::vector<uint8_t> expected(before);
            for (int32_t at = 0; at < strip;) {
                const auto scalar = plan_with(scalar_kernels, row, done + at, strip - at);
                run(*scalar, kernel, expected.data() + at * row.sample_bytes, top.data(), bottom);
                at += scalar->plan.samples;
                differs |= scalar->kernels != tested->kernels;
            }
            EXPECT_TRUE(same_bytes(actual.data(), expected.data(), expected.size()))
                << set.name << ", " << name_of(kernel) << ": " << row.src_columns << " to "
                << row.dst_columns << " samples of " << row.sample_bytes << " bytes, strip at "
                << done;
            EXPECT_TRUE(actual.intact());
        }
        done += strip;
    }
    return differs;
}

bool check_row(const NamedKernels& set, const Row& row, Random& random) {
    return check_columns(set, row, 0, row.dst_columns, random);
}

struct Ratio {
    int32_t src;
    int32_t dst;
};

// What each set does with kernels made for the ratio.
struct SimpleRatio {
    std::string_view set;
    int32_t sample_bytes;
    Ratio ratio;
};

std::vector<SimpleRatio> simple_ratios(const NamedKernels& set) {
    std::vector<SimpleRatio> all;
    for (const int32_t n : {1, 2, 3, 4}) {
        for (const Ratio ratio :
             {Ratio{2, 1}, Ratio{3, 1}, Ratio{4, 1}, Ratio{3, 2}, Ratio{2, 3}}) {
            all.push_back({"avx2", n, ratio});
            if (n != 3) all.push_back({"neon", n, ratio});
        }
        if (n != 3) all.push_back({"neon", n, {4, 3}});
    }
    std::vector<SimpleRatio> of_set;
    std::copy_if(all.begin(), all.end(), std::back_inserter(of_set),
                 [&](const SimpleRatio& simple) { return simple.set == set.name; });
    return of_set;
}

Row row_of(const SimpleRatio& simple, int32_t groups) {
    return {simple.sample_bytes, simple.ratio.src * groups, simple.ratio.dst * groups};
}

std::string describe(const SimpleRatio& simple) {
    return std::string(simple.set) + ' ' + std::to_string(simple.ratio.src) + ':' +
           std::to_string(simple.ratio.dst) + ", samples of " +
           std::to_string(simple.sample_bytes) + " bytes";
}

using VectorQuarterKernels = VectorSets;

}  // namespace

TEST_F(VectorQuarterKernels, RandomRowsEqualTheScalarOnes) {
    for (const NamedKernels& set : vector_sets_) {
        Random random(31);
        SCOPED_TRACE(random.trace());
        int own = 0;
        const int count = rounds(3000);
        for (int i = 0; i < count && !HasFailure(); ++i) {
            const int32_t n = random.between(1, 4);
            own += check_row(set, {n, random.awkward_size(), random.awkward_size()}, random);
        }
        // Otherwise only scalar kernels would have been compared with themselves.
        EXPECT_GT(own, count / 4) << set.name;
    }
}

TEST_F(VectorQuarterKernels, EveryRatioUpToTenOfLongRows) {
    for (const NamedKernels& set : vector_sets_) {
        Random random(32);
        SCOPED_TRACE(random.trace());
        for (int32_t tenths = 1; tenths <= 100 && !HasFailure(); ++tenths) {
            for (const int32_t n : {1, 2, 3, 4}) {
                const int32_t samples = random.between(257, 700);
                const int32_t source = std::max(1, samples * tenths / 10 + random.between(-3, 3));
                check_row(set, {n, source, samples}, random);
            }
        }
    }
}

// A ratio that is just missed takes the kernels for any ratio; were they to take the simple ones
// too, the two would be the same.
TEST_F(VectorQuarterKernels, SimpleRatiosHaveKernelsOfTheirOwn) {
    for (const NamedKernels& set : vector_sets_) {
        for (const SimpleRatio& simple : simple_ratios(set)) {
            SCOPED_TRACE(describe(simple));
            const auto kernels_of = [](const Kernels& kernels, const Row& row) {
                return plan_with(kernels, row, 0, row.dst_columns)->kernels;
            };
            const Row row = row_of(simple, 100);
            Row missed = row;
            ++missed.src_columns;
            const QuarterKernels* own = kernels_of(*set.kernels, row);
            EXPECT_NE(own, kernels_of(*set.kernels, missed));
            EXPECT_NE(own, kernels_of(scalar_kernels, row));
            EXPECT_EQ(own, kernels_of(*set.kernels, row_of(simple, 131)));
            EXPECT_EQ(plan_with(*set.kernels, row, 0, row.dst_columns)->plan.samples,
                      row.dst_columns);
        }
    }
}

// Pixels that lie far apart are loaded one by one.
TEST_F(VectorQuarterKernels, StrongReductionsHaveKernelsOfTheirOwn) {
    for (const NamedKernels& set : vector_sets_) {
        const std::string_view name = set.name;
        if (name != "avx2" && name != "neon") continue;
        Random random(36);
        const auto kernels_of = [](const Kernels& kernels, const Row& row) {
            return plan_with(kernels, row, 0, row.dst_columns)->kernels;
        };
        const QuarterKernels* own = kernels_of(*set.kernels, {4, 4000, 224});
        EXPECT_EQ(own, kernels_of(*set.kernels, {4, 1400, 200}));
        EXPECT_NE(own, kernels_of(*set.kernels, {4, 1399, 200}));
        EXPECT_NE(own, kernels_of(*set.kernels, {1, 4000, 224}));
        EXPECT_NE(own, kernels_of(scalar_kernels, {4, 4000, 224}));
        for (int32_t samples = 1; samples <= 70; ++samples) {
            check_row(set, {4, samples * random.between(7, 40), samples}, random);
        }
    }
}

TEST_F(VectorQuarterKernels, SimpleRatiosOfAllLengths) {
    for (const NamedKernels& set : vector_sets_) {
        Random random(34);
        SCOPED_TRACE(random.trace());
        for (const SimpleRatio& simple : simple_ratios(set)) {
            SCOPED_TRACE(describe(simple));
            for (int32_t groups = 1; groups <= 200 && !HasFailure(); ++groups) {
                check_row(set, row_of(simple, groups), random);
            }
        }
    }
}

// Strips that begin inside a row, and inside a group of columns that repeats, or end before it.
TEST_F(VectorQuarterKernels, PartsOfRowsWithSimpleRatios) {
    for (const NamedKernels& set : vector_sets_) {
        Random random(35);
        SCOPED_TRACE(random.trace());
        for (const SimpleRatio& simple : simple_ratios(set)) {
            SCOPED_TRACE(describe(simple));
            for (int i = 0; i < rounds(100) && !HasFailure(); ++i) {
                const Row row = row_of(simple, random.between(1, 200));
                const int32_t first = random.between(0, row.dst_columns - 1);
                const int32_t end = random.between(first + 1, row.dst_columns);
                check_columns(set, row, first, end, random);
            }
        }
    }
}

// Vectors of such ratios share shuffles, which kernels may keep from the first vector to the last
// whose windows lie inside the row.
TEST_F(VectorQuarterKernels, RatiosThatRepeatFromVectorToVector) {
    constexpr Ratio kRatios[] = {{8, 3}, {5, 2},   {12, 5}, {25, 8}, {64, 15}, {6, 1},
                                 {9, 4}, {21, 10}, {5, 3},  {3, 2},  {7, 8},   {1, 2}};
    for (const NamedKernels& set : vector_sets_) {
        Random random(37);
        SCOPED_TRACE(random.trace());
        for (const Ratio ratio : kRatios) {
            for (const int32_t n : {1, 2, 3, 4}) {
                for (int32_t groups = 1; groups * ratio.dst <= 200 && !HasFailure(); ++groups) {
                    const Row row = {n, ratio.src * groups, ratio.dst * groups};
                    check_row(set, row, random);
                    const int32_t first = random.between(0, row.dst_columns - 1);
                    const int32_t end = random.between(first + 1, row.dst_columns);
                    check_columns(set, row, first, end, random);
                }
            }
        }
    }
}

TEST_F(VectorQuarterKernels, RowsOfSeveralStrips) {
    for (const NamedKernels& set : vector_sets_) {
        Random random(33);
        for (const int32_t n : {1, 2, 3, 4}) {
            for (const int32_t source : {7000, 21013, 60001}) {
                EXPECT_TRUE(check_row(set, {n, source, 20011}, random)) << set.name;
            }
        }
    }
}

TEST_F(VectorQuarterKernels, ExtremeSamples) {
    for (const NamedKernels& set : vector_sets_) {
        for (const int value : {0x00, 0xFF, 0x03, 0xFC}) {
            const Row row = {1, 301, 200};
            const auto planned = plan_with(*set.kernels, row, 0, row.dst_columns);
            const std::vector<uint8_t> source(301, static_cast<uint8_t>(value));
            std::vector<uint8_t> dst(200, 1);
            run(*planned, Kernel::kStorePair, dst.data(), source.data(), source.data());
            EXPECT_EQ(dst, std::vector<uint8_t>(200, static_cast<uint8_t>(value / 4 * 4)));
            // Bytes wrap on their own.
            run(*planned, Kernel::kAddPair, dst.data(), source.data(), source.data());
            EXPECT_EQ(dst, std::vector<uint8_t>(200, static_cast<uint8_t>(value / 4 * 8)));
        }
    }
}
