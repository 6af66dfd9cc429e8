// SPDX-License-Identifier: Apache-2.0
// Source rows that the next destination row needs again are kept, not copied again: the bytes would
// be the same, only slower.
#include <gtest/gtest.h>

#include <vector>

#include "lanczos/rows.h"

using namespace ovrin;

namespace {

constexpr int32_t kSize = 20;

LanczosPicture picture_of(const std::vector<uint8_t>& src, int32_t dst_components) {
    LanczosPicture picture = {};
    picture.src = src.data();
    picture.src_w = picture.src_h = kSize;
    picture.src_pitch = kSize;
    picture.src_components = 1;
    picture.dst_w = picture.dst_h = kSize;
    picture.dst_components = dst_components;
    return picture;
}

}  // namespace

TEST(LanczosCache, CopiesEachRowOnce) {
    std::vector<uint8_t> src(kSize * kSize, 1);
    const LanczosPicture picture = picture_of(src, 1);
    LanczosCache cache(picture);
    ASSERT_TRUE(cache.ready());
    LanczosRow row;
    cache.load(picture, 10, row);
    src.assign(src.size(), 2);
    // Rows 7 to 13 are there; of rows 8 to 14 only the last is new.
    for (const int32_t middle : {10, 11}) {
        cache.load(picture, middle, row);
        for (int32_t k = 0; k < kLanczosTaps; ++k) {
            const bool is_new = middle == 11 && k == kLanczosTaps - 1;
            EXPECT_EQ(row.taps[k][kLanczosMargin], is_new ? 2 : 1) << middle << ", tap " << k;
            EXPECT_EQ(row.source_rows[k], middle - kLanczosMargin + k);
        }
    }
}

TEST(LanczosCache, KeepsNothingFromOneStripToTheNext) {
    std::vector<uint8_t> src(kSize * kSize, 1);
    const LanczosPicture picture = picture_of(src, 1);
    LanczosCache cache(picture);
    LanczosRow row;
    cache.load(picture, 10, row);
    src.assign(src.size(), 2);
    cache.narrow_to(picture, 4, 15);
    cache.load(picture, 10, row);
    for (const uint8_t* tap : row.taps) EXPECT_EQ(tap[8], 2);
}
