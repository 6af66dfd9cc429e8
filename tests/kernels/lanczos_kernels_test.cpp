// SPDX-License-Identifier: Apache-2.0
// Every instruction set's Lanczos kernels against the scalar ones, which other tests compare with
// the definition.
#include <gtest/gtest.h>

#include <algorithm>
#include <deque>
#include <memory>

#include "reference/lanczos.h"
#include "support/compare.h"
#include "support/guarded_buffer.h"
#include "support/vector_sets.h"

using namespace ovrin;
using namespace ovrin_test;

namespace {

using LanczosKernelsTest = VectorSets;

// Strips of pictures, with the weights of the axes.
struct Strip {
    int32_t src_w, src_h, dst_w, dst_h;
    int32_t src_components, dst_components;
    reference::LanczosAxis across, down;
};

Strip any_strip(Random& random) {
    static const std::vector<float> table = reference::lanczos_table();
    Strip s;
    s.dst_w = random.pick({random.between(1, 70), random.between(1, kLanczosColumns),
                           kLanczosColumns - 1, kLanczosColumns});
    s.src_w = std::max(1, s.dst_w * random.between(1, 60) / 10);
    s.src_h = random.between(1, 20);
    s.dst_h = random.between(1, 20);
    s.src_components = random.pick({4, 4, 4, 1, 2, 3, 5});
    s.dst_components = random.pick({s.src_components, random.between(1, s.src_components)});
    s.across = reference::lanczos_columns(table, s.src_w, s.dst_w);
    s.down = reference::lanczos_rows(table, s.src_h, s.dst_h);
    return s;
}

// Weights that no axis has: a caller's own, up to sizes that leave no room for shortcuts.
void replace_weights(reference::LanczosAxis& axis, double limit, Random& random) {
    for (reference::LanczosTaps& taps : axis.taps) {
        for (double& tap : taps) tap = limit * random.between(-100, 100) / 100;
    }
}

// The same from either end, as those of whole ratios are; or all but one of them.
void mirror_weights(reference::LanczosAxis& axis, Random& random) {
    for (reference::LanczosTaps& taps : axis.taps) {
        std::reverse_copy(taps.begin(), taps.begin() + kLanczosTaps / 2,
                          taps.end() - kLanczosTaps / 2);
    }
    if (random.between(0, 1) == 0) return;
    const int32_t last = static_cast<int32_t>(axis.taps.size()) - 1;
    const int32_t column = random.pick({0, last, random.between(0, last)});
    const int32_t tap = random.between(0, kLanczosTaps - 1);
    axis.taps[static_cast<size_t>(column)][static_cast<size_t>(tap)] += 0.0625;
}

void fill_columns(LanczosColumns& columns, const Strip& s) {
    columns.weights = s.across.taps[0].data();
    columns.src_components = s.src_components;
    columns.dst_components = s.dst_components;
    columns.count = s.dst_w;
    std::copy(s.across.at.begin(), s.across.at.end(), columns.index);
}

// All source rows, each as long as the columns read.
std::deque<GuardedBuffer<uint8_t>> source_rows(const Strip& s, Random& random) {
    const auto bytes = static_cast<size_t>(s.across.at.back() * s.src_components +
                                           kLanczosTaps * s.dst_components);
    const Content kind = kContents[random.between(0, 3)];
    const Flush flush = random.pick({Flush::kEnd, Flush::kStart});
    std::deque<GuardedBuffer<uint8_t>> rows;
    for (int32_t i = 0; i < s.src_h; ++i) rows.emplace_back(content(random, kind, bytes), flush);
    return rows;
}

LanczosRow row_of(const Strip& s, const std::deque<GuardedBuffer<uint8_t>>& rows, size_t y) {
    LanczosRow row;
    row.weights = s.down.taps[y].data();
    for (int32_t k = 0; k < kLanczosTaps; ++k) {
        const int32_t source = std::clamp(s.down.at[y] - 3 + k, 0, s.src_h - 1);
        row.source_rows[k] = source;
        row.taps[k] = rows[static_cast<size_t>(source)].data();
    }
    return row;
}

// Destination rows from top to bottom, or in any order.
std::vector<size_t> order_of_rows(const Strip& s, Random& random) {
    const bool ascending = random.between(0, 1) == 0;
    std::vector<size_t> order;
    for (int32_t i = 0; i < s.dst_h; ++i) {
        order.push_back(static_cast<size_t>(ascending ? i : random.between(0, s.dst_h - 1)));
    }
    return order;
}

}  // namespace

TEST_F(LanczosKernelsTest, FilterEqualsTheScalarOne) {
    const auto columns = std::make_unique<LanczosColumns>();
    const auto plan = std::make_unique<LanczosStripPlan>();
    const auto scalar_plan = std::make_unique<LanczosStripPlan>();
    const auto sums = std::make_unique<LanczosSums>();
    const auto scalar_sums = std::make_unique<LanczosSums>();
    for (const NamedKernels& set : vector_sets_) {
        Random random(61);
        SCOPED_TRACE(random.trace());
        int own = 0;
        const int count = rounds(400);
        for (int i = 0; i < count && !HasFailure(); ++i) {
            Strip s = any_strip(random);
            const double limit = random.pick({0.0, 0.0, 0.0, 0.3, 3.0, 1e6});
            if (limit > 0 && random.between(0, 1) == 0) replace_weights(s.down, limit, random);
            if (limit > 0) replace_weights(s.across, limit, random);
            if (random.between(0, 2) == 0) mirror_weights(s.across, random);
            fill_columns(*columns, s);
            const auto rows = source_rows(s, random);
            FilterLanczos* scalar = scalar_kernels.plan_lanczos(*scalar_plan, *columns);
            FilterLanczos* tested = set.kernels->plan_lanczos(*plan, *columns);
            own += tested != scalar;
            sums->clear();
            scalar_sums->clear();
            std::vector<uint8_t> expected(static_cast<size_t>(s.dst_w * s.dst_components));
            GuardedBuffer<uint8_t> actual(expected.size(),
                                          random.pick({Flush::kEnd, Flush::kStart}));
            for (const size_t y : order_of_rows(s, random)) {
                LanczosRow row = row_of(s, rows, y);
                row.dst = expected.data();
                scalar(row, *scalar_plan, *scalar_sums);
                row.dst = actual.data();
                tested(row, *plan, *sums);
                ASSERT_TRUE(same_bytes(actual.data(), expected.data(), expected.size()))
                    << set.name << ", Lanczos filter: row " << y << ", " << s.src_w << "x"
                    << s.src_h << " to " << s.dst_w << "x" << s.dst_h << ", " << s.src_components
                    << " to " << s.dst_components << " components, weights up to " << limit;
                ASSERT_TRUE(actual.intact());
            }
        }
        // Otherwise only scalar kernels would have been compared with themselves.
        EXPECT_GT(own, count / 4) << set.name;
    }
}
