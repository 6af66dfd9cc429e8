// SPDX-License-Identifier: Apache-2.0
// Every instruction set's bilinear kernels, each by itself, against the scalar ones, which other
// tests compare with the definition.
#include <gtest/gtest.h>

#include <algorithm>
#include <memory>

#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/vector_sets.h"

using namespace ovrin;
using namespace ovrin_test;

namespace {

using BilinearKernelsTest = VectorSets;

constexpr int32_t kLeastWeight = 1024;
constexpr int32_t kMostWeight = 5119;

// Ratios up to 12, which is beyond what any window takes; every other one up to 2.
int32_t quarters_of(int round) {
    return 1 + round / 2 % (round % 2 == 0 ? 8 : 48);
}

// Weights anywhere in their range, or only at its ends.
int32_t any_weight(Random& random) {
    return random.pick({kLeastWeight, kBilinearOne, kMostWeight,
                        random.between(kLeastWeight, kMostWeight),
                        random.between(kLeastWeight, kMostWeight)});
}

// Columns of samples `quarters` / 4 apart on average: evenly, or as they come.
void fill_columns(BilinearColumns& columns, int32_t sample_bytes, int32_t quarters,
                  Random& random) {
    columns.sample_bytes = sample_bytes;
    columns.count = random.pick({random.between(1, 70), random.between(1, kBilinearColumns),
                                 kBilinearColumns - 1, kBilinearColumns});
    columns.to_right = random.between(0, 1);
    const bool even = random.between(0, 1) == 0;
    int32_t index = 0;
    for (int32_t i = 0; i < columns.count; ++i) {
        columns.index[i] = even ? i * quarters / 4 : index;
        columns.weight[i] = any_weight(random);
        index += random.between(0, quarters / 2);
    }
}

::testing::Message describe(const NamedKernels& set, const char* kernel,
                            const BilinearColumns& columns, int32_t quarters) {
    return ::testing::Message() << set.name << ", bilinear " << kernel << ": " << columns.count
                                << " columns of " << columns.sample_bytes << " bytes, ratio "
                                << quarters << "/4, to the right " << columns.to_right;
}

// The row that the columns name samples of, and no more.
size_t row_bytes(const BilinearColumns& columns) {
    const int32_t last = *std::max_element(columns.index, columns.index + columns.count);
    return static_cast<size_t>((last + columns.to_right + 1) * columns.sample_bytes);
}

// The sums of a row as columns may give them.
void fill_sums(BilinearSums& sums, Random& random) {
    for (uint32_t& value : sums.values) {
        const int32_t left = random.pick({0, 255, random.between(0, 255)});
        const int32_t right = random.pick({0, 255, random.between(0, 255)});
        const int32_t weight = any_weight(random);
        value = static_cast<uint32_t>(left * (kBilinearOne - weight) + right * weight);
    }
}

// The same as a set shifts them.
std::unique_ptr<BilinearSums> shifted(const BilinearSums& sums, int32_t shift) {
    auto result = std::make_unique<BilinearSums>(sums);
    for (uint32_t& value : result->values) value <<= shift;
    return result;
}

::testing::AssertionResult same_sums(const BilinearSums& actual, const BilinearSums& expected,
                                     int32_t count, int32_t shift) {
    for (int32_t i = 0; i < count; ++i) {
        const uint32_t sum = expected.values[i] << shift;
        if (actual.values[i] != sum) {
            return ::testing::AssertionFailure() << "sum " << i << " of " << count << " is "
                                                 << actual.values[i] << ", not " << sum;
        }
    }
    return ::testing::AssertionSuccess();
}

}  // namespace

TEST_F(BilinearKernelsTest, AcrossEqualsTheScalarOne) {
    const auto columns = std::make_unique<BilinearColumns>();
    const auto plan = std::make_unique<BilinearPlan>();
    const auto scalar_plan = std::make_unique<BilinearPlan>();
    const auto actual = std::make_unique<BilinearSums>();
    const auto expected = std::make_unique<BilinearSums>();
    for (const NamedKernels& set : vector_sets_) {
        Random random(51);
        SCOPED_TRACE(random.trace());
        int own = 0;
        const int count = rounds(3000);
        for (int i = 0; i < count && !HasFailure(); ++i) {
            const int32_t quarters = quarters_of(i);
            fill_columns(*columns, random.pick({1, 2, 4}), quarters, random);
            SCOPED_TRACE(describe(set, "across", *columns, quarters));
            BilinearAcross* scalar = scalar_kernels.plan_bilinear(*scalar_plan, *columns).across;
            const BilinearKernels tested = set.kernels->plan_bilinear(*plan, *columns);
            own += tested.across != scalar;
            const GuardedBuffer<uint8_t> row(
                content(random, kContents[random.between(0, 3)], row_bytes(*columns)),
                random.pick({Flush::kEnd, Flush::kStart}));
            scalar(*expected, row.data(), *scalar_plan);
            tested.across(*actual, row.data(), *plan);
            EXPECT_TRUE(same_sums(*actual, *expected, plan->bytes(), tested.sum_shift));
        }
        // Otherwise only scalar kernels would have been compared with themselves.
        EXPECT_GT(own, count / 8) << set.name;
    }
}

// Columns out of order, which no axis has, share no window; rows of more than 2 GB have none at
// all.
TEST_F(BilinearKernelsTest, ColumnsThatNoWindowHoldsAreLeftToOtherKernels) {
    const auto columns = std::make_unique<BilinearColumns>();
    const auto plan = std::make_unique<BilinearPlan>();
    const auto fill = [&](int32_t sample_bytes, int32_t first) {
        columns->sample_bytes = sample_bytes;
        columns->count = 100;
        columns->to_right = 1;
        for (int32_t i = 0; i < columns->count; ++i) {
            columns->index[i] = first + i;
            columns->weight[i] = kBilinearOne;
        }
    };
    for (const NamedKernels& set : vector_sets_) {
        for (const int32_t n : {1, 2, 4}) {
            SCOPED_TRACE(::testing::Message() << set.name << ", samples of " << n << " bytes");
            const auto across_of = [&](const Kernels& kernels) {
                return kernels.plan_bilinear(*plan, *columns).across;
            };
            const auto copy_of = [&](const Kernels& kernels) {
                return kernels.plan_bilinear_copy(*plan, *columns);
            };
            fill(n, 100);
            BilinearAcross* const across = across_of(*set.kernels);
            BilinearCopy* const copy = copy_of(*set.kernels);
            EXPECT_NE(across, across_of(scalar_kernels));
            EXPECT_NE(copy, copy_of(scalar_kernels));
            columns->index[2] = 0;
            EXPECT_NE(across_of(*set.kernels), across);
            EXPECT_EQ(copy_of(*set.kernels), copy_of(scalar_kernels));
            if (n == 1) continue;  // 32 bits count the bytes of any row
            fill(n, INT32_MAX / n + 1);
            EXPECT_EQ(across_of(*set.kernels), across_of(scalar_kernels));
            EXPECT_EQ(copy_of(*set.kernels), copy_of(scalar_kernels));
        }
    }
}

TEST_F(BilinearKernelsTest, DownEqualsTheScalarOne) {
    const auto columns = std::make_unique<BilinearColumns>();
    const auto plan = std::make_unique<BilinearPlan>();
    const auto scalar_plan = std::make_unique<BilinearPlan>();
    const auto upper = std::make_unique<BilinearSums>();
    const auto lower = std::make_unique<BilinearSums>();
    for (const NamedKernels& set : vector_sets_) {
        Random random(52);
        SCOPED_TRACE(random.trace());
        int own = 0;
        const int count = rounds(2000);
        for (int i = 0; i < count && !HasFailure(); ++i) {
            const int32_t quarters = quarters_of(i);
            fill_columns(*columns, random.pick({1, 2, 4}), quarters, random);
            const int32_t weight = any_weight(random);
            SCOPED_TRACE(describe(set, "down", *columns, quarters) << ", weight " << weight);
            BilinearDown* scalar = scalar_kernels.plan_bilinear(*scalar_plan, *columns).down;
            const BilinearKernels tested = set.kernels->plan_bilinear(*plan, *columns);
            own += tested.down != scalar;
            fill_sums(*upper, random);
            fill_sums(*lower, random);
            std::vector<uint8_t> expected(static_cast<size_t>(plan->bytes()));
            GuardedBuffer<uint8_t> actual(expected.size(),
                                          random.pick({Flush::kEnd, Flush::kStart}), 0xEE);
            const BilinearNext next = {{actual.data(), expected.data()}, random.between(0, 5000)};
            scalar(expected.data(), *upper, *lower, weight, *scalar_plan, next);
            tested.down(actual.data(), *shifted(*upper, tested.sum_shift),
                        *shifted(*lower, tested.sum_shift), weight, *plan, next);
            EXPECT_TRUE(same_bytes(actual.data(), expected.data(), expected.size()));
            EXPECT_TRUE(actual.intact());
        }
        EXPECT_GT(own, count / 8) << set.name;
    }
}

// Copied columns may come in any order: ascending, descending, swapped in pairs, at random.
TEST_F(BilinearKernelsTest, CopyEqualsTheScalarOne) {
    const auto columns = std::make_unique<BilinearColumns>();
    const auto plan = std::make_unique<BilinearPlan>();
    const auto scalar_plan = std::make_unique<BilinearPlan>();
    for (const NamedKernels& set : vector_sets_) {
        Random random(53);
        SCOPED_TRACE(random.trace());
        int own = 0;
        const int count = rounds(3000);
        for (int i = 0; i < count && !HasFailure(); ++i) {
            const int32_t quarters = quarters_of(i);
            fill_columns(*columns, random.pick({1, 2, 4}), quarters, random);
            columns->to_right = 0;
            const int32_t order = random.pick({0, 0, 0, 1, 2, 3});
            int32_t* const index = columns->index;
            if (order == 1) std::reverse(index, index + columns->count);
            if (order == 2) {
                for (int32_t k = 1; k < columns->count; k += 2) std::swap(index[k - 1], index[k]);
            }
            if (order == 3) {
                const int32_t last = index[columns->count - 1];
                for (int32_t k = 0; k < columns->count; ++k) index[k] = random.between(0, last);
            }
            SCOPED_TRACE(describe(set, "copy", *columns, quarters) << ", order " << order);
            BilinearCopy* scalar = scalar_kernels.plan_bilinear_copy(*scalar_plan, *columns);
            BilinearCopy* tested = set.kernels->plan_bilinear_copy(*plan, *columns);
            own += tested != scalar;
            const Flush flush = random.pick({Flush::kEnd, Flush::kStart});
            const GuardedBuffer<uint8_t> row(
                content(random, kContents[random.between(0, 3)], row_bytes(*columns)), flush);
            std::vector<uint8_t> expected(static_cast<size_t>(plan->bytes()));
            GuardedBuffer<uint8_t> actual(expected.size(), flush, 0xEE);
            scalar(expected.data(), row.data(), *scalar_plan);
            tested(actual.data(), row.data(), *plan);
            EXPECT_TRUE(same_bytes(actual.data(), expected.data(), expected.size()));
            EXPECT_TRUE(actual.intact());
        }
        EXPECT_GT(own, count / 8) << set.name;
    }
}
