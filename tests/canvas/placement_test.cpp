// SPDX-License-Identifier: Apache-2.0
// Where pictures may lie in their canvas, up to its very edges. What lies inside is drawn without
// painting the canvas first: the bytes are the same either way, so only this tells.
#include "canvas/placement.h"

#include <gtest/gtest.h>

#include "support/letterbox.h"
#include "yuv420/grid.h"

using namespace ovrin;
using ovrin_test::letterbox;

namespace {

struct Place {
    int32_t w, h, x, y;
    bool inside;
};

// In a canvas of 20 x 10.
constexpr Place kPlaces[] = {
    {20, 10, 0, 0, true},  {18, 10, 2, 0, true},         {20, 8, 0, 2, true},
    {2, 2, 18, 8, true},   {4, 4, 0, 0, true},           {20, 10, 2, 0, false},
    {20, 10, 0, 2, false}, {21, 10, 0, 0, false},        {20, 11, 0, 0, false},
    {4, 4, -2, 0, false},  {4, 4, 0, -2, false},         {3, 3, 18, 0, false},
    {3, 3, 0, 8, false},   {4, 4, 2147483646, 0, false},
};

bool rgba_inside(const Place& place) {
    return rgba_lies_inside(letterbox(20, 10, place.w, place.h, place.x, place.y));
}

bool planes_inside(const Place& place) {
    return planes_lie_inside({kI420, place.w, place.h},
                             letterbox(20, 10, place.w, place.h, place.x, place.y));
}

}  // namespace

TEST(Placement, InsideUpToTheEdges) {
    for (const Place& p : kPlaces) {
        const auto place = ::testing::Message()
                           << p.w << 'x' << p.h << " at " << p.x << ", " << p.y;
        EXPECT_EQ(rgba_inside(p), p.inside) << place;
        EXPECT_EQ(planes_inside(p), p.inside) << place;
    }
}

TEST(Placement, PlanesLieAtEvenPositionsOnly) {
    EXPECT_FALSE(planes_inside({4, 4, 1, 0, false}));
    EXPECT_FALSE(planes_inside({4, 4, 0, 1, false}));
    EXPECT_TRUE(rgba_inside({4, 4, 1, 1, true}));
}

TEST(Placement, EmptyPicturesLieNowhere) {
    EXPECT_FALSE(rgba_inside({0, 4, 0, 0, false}));
    EXPECT_FALSE(rgba_inside({4, 0, 0, 0, false}));
    EXPECT_TRUE(rgba_inside({1, 1, 0, 0, true}));
}

TEST(Placement, RowsThatRunOnLieInMemoryAllTheSame) {
    const auto in_memory = [](const Place& p) {
        return rgba_lies_in_memory(letterbox(20, 10, p.w, p.h, p.x, p.y));
    };
    EXPECT_TRUE(in_memory({20, 9, 5, 0, true}));
    EXPECT_FALSE(in_memory({20, 10, 1, 0, false}));
    EXPECT_TRUE(in_memory({20, 10, 0, 0, true}));
    EXPECT_FALSE(in_memory({21, 5, 0, 0, false}));
    EXPECT_TRUE(in_memory({4, 4, -1, 1, true}));
    EXPECT_FALSE(in_memory({4, 4, -1, 0, false}));
}

TEST(Grid, TheThreeLargestSizesHaveNone) {
    EXPECT_TRUE(has_grid({kI420, INT32_MAX - 3, 4}));
    EXPECT_TRUE(has_grid({kI420, 4, INT32_MAX - 3}));
    EXPECT_FALSE(has_grid({kI420, INT32_MAX - 2, 4}));
    EXPECT_FALSE(has_grid({kI420, 4, INT32_MAX - 2}));
    EXPECT_FALSE(has_grid({kI420, 0, 4}));
}
