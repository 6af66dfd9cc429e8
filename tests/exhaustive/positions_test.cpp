// SPDX-License-Identifier: Apache-2.0
// Positions alone, in the library's own code: tables equal to the definition's for every pair of
// lengths up to 256, and no sample beyond the source for any pair up to 16384.
//
// Nearest neighbour and Lanczos have no such limit to prove: the one drops samples beyond the
// source, the other takes those on its border.
#include <gtest/gtest.h>

#include <cstring>

#include "bilinear/plan.h"
#include "exhaustive/every.h"
#include "kernels/quarter_points.h"
#include "lanczos/weights.h"
#include "reference/bilinear.h"
#include "reference/lanczos.h"
#include "reference/quarter.h"

using namespace ovrin_test;

namespace {

constexpr int32_t kTables = 256;
constexpr int32_t kLast = 16384;

template <class Check>
void every_pair(Check check) {
    const int32_t step = one_in();
    int32_t number = 0;
    for (int32_t from = 1; from <= kTables; ++from) {
        for (int32_t to = 1; to <= kTables; ++to) {
            if (++number % step == 0) check(from, to);
            if (::testing::Test::HasFatalFailure()) return;
        }
    }
}

// The cell of target `k`'s point, by one division of the library's.
int64_t cell_of(int64_t k, int32_t first, int32_t source, int32_t target) {
    return ovrin::QuarterPoints(first + k * source, source, target).cell();
}

// Both points of the last target on an axis of `cells` source cells. The target's extent may be
// counted in other units than its samples, of which there are `samples`.
bool last_is_inside(int32_t source, int32_t target, int32_t samples, int32_t cells) {
    return cell_of(samples - 1, ovrin::three_quarter_point(source), source, target) < cells &&
           cell_of(samples - 1, ovrin::quarter_point(source), source, target) < cells;
}

// Lengths of a source, thinned out where the divisor says so; all destinations of each.
template <class Inside>
void every_long_pair(Inside inside) {
    const int32_t step = one_in();
    for (int32_t source = 1; source <= kLast; ++source) {
        if (source % step != 0 && source < kLast) continue;
        for (int32_t target = 1; target <= kLast; ++target) {
            ASSERT_TRUE(inside(source, target)) << source << " to " << target;
        }
    }
}

int32_t grid(int32_t length) {
    return (length + 3) & ~3;
}

}  // namespace

TEST(ExhaustivePositions, QuarterPointsEqualTheDefinition) {
    every_pair([](int32_t from, int32_t to) {
        ovrin::QuarterPoints near(ovrin::quarter_point(from), from, to);
        ovrin::QuarterPoints far(ovrin::three_quarter_point(from), from, to);
        for (int32_t k = 0; k < to; ++k, near.next(), far.next()) {
            ASSERT_EQ(near.cell(), reference::near_cell(k, from, to)) << from << " to " << to;
            ASSERT_EQ(far.cell(), reference::far_cell(k, from, to)) << from << " to " << to;
        }
    });
}

TEST(ExhaustivePositions, BilinearTablesEqualTheDefinition) {
    every_pair([](int32_t from, int32_t to) {
        ovrin::BilinearTables tables(to, 1);
        ASSERT_TRUE(tables.ready());
        ovrin::BilinearGeometry geometry = {};
        geometry.src_width = from;
        geometry.src_height = 1;
        geometry.canvas_width = to;
        geometry.canvas_height = 1;
        tables.fill(geometry);
        const auto expected = reference::bilinear_table(from, to);
        const size_t bytes = static_cast<size_t>(to) * sizeof(int32_t);
        ASSERT_EQ(memcmp(tables.col_index, expected.index.data(), bytes), 0)
            << from << " to " << to;
        ASSERT_EQ(memcmp(tables.col_weight, expected.weight.data(), bytes), 0)
            << from << " to " << to;
        ASSERT_EQ(ovrin::extent_of(geometry, tables).edge_cols, expected.edge)
            << from << " to " << to;
    });
}

TEST(ExhaustivePositions, LanczosWeightsEqualTheDefinition) {
    const std::vector<float> table = reference::lanczos_table();
    every_pair([&](int32_t from, int32_t to) {
        ovrin::LanczosPlan plan(to, to);
        ASSERT_TRUE(plan.ready());
        plan.fill(from, from);
        const size_t bytes = static_cast<size_t>(to) * sizeof(reference::LanczosTaps);
        const auto across = reference::lanczos_columns(table, from, to);
        const auto down = reference::lanczos_rows(table, from, to);
        ASSERT_EQ(memcmp(plan.columns.data(), across.taps.data(), bytes), 0)
            << from << " to " << to;
        ASSERT_EQ(memcmp(plan.rows.data(), down.taps.data(), bytes), 0) << from << " to " << to;
    });
}

TEST(ExhaustivePositions, NoQuarterPointLiesBeyondTheSource) {
    every_long_pair([](int32_t source, int32_t target) {
        return last_is_inside(source, target, target, source);
    });
}

// Planes of chroma: half of the source onto half of the grid.
TEST(ExhaustivePositions, NoChromaPointLiesBeyondTheSource) {
    every_long_pair([](int32_t source, int32_t target) {
        const int32_t cells = (source + 1) >> 1;
        const int32_t targets = grid(target) >> 1;
        return last_is_inside(cells, targets, targets, cells);
    });
}

// Pairs: the extents count bytes, cells and samples count pairs.
TEST(ExhaustivePositions, NoChromaPairLiesBeyondTheSource) {
    every_long_pair([](int32_t source, int32_t target) {
        const int32_t bytes = (source + 1) & ~1;
        return last_is_inside(bytes, grid(target), grid(target) >> 1, bytes >> 1);
    });
}

// The library fills whole tables only. Their entries equal the definition's (above, and here for
// lengths around powers of two), so that the definition's last entry speaks for the library's: it
// is the largest, and its right neighbour lies at most one beyond the source, which callers
// provide.
TEST(ExhaustivePositions, NoBilinearIndexLiesBeyondTheSource) {
    every_long_pair([](int32_t source, int32_t target) {
        const float scale = static_cast<float>(source) / static_cast<float>(target);
        return static_cast<int32_t>(static_cast<float>(target - 1) * scale) < source;
    });
    for (int32_t from = 512; from <= kLast; from *= 2) {
        for (int32_t to = 512; to <= kLast; to *= 2) {
            for (int32_t i = -1; i <= 1; ++i) {
                for (int32_t j = -1; j <= 1; ++j) {
                    ovrin::BilinearTables tables(to + j, 1);
                    ASSERT_TRUE(tables.ready());
                    ovrin::BilinearGeometry geometry = {};
                    geometry.src_width = from + i;
                    geometry.src_height = 1;
                    tables.fill(geometry);
                    const auto expected = reference::bilinear_table(from + i, to + j);
                    ASSERT_EQ(memcmp(tables.col_index, expected.index.data(),
                                     expected.index.size() * sizeof(int32_t)),
                              0)
                        << from + i << " to " << to + j;
                }
            }
        }
    }
}
