// SPDX-License-Identifier: Apache-2.0
#include "yuv.h"

namespace tool {

namespace {

YuvMeaning chosen = {};

// Rounded from the definitions, where luma is Kr R + (1 - Kr - Kb) G + Kb B with Kr 0.299 and Kb
// 0.114 in BT.601, 0.2126 and 0.0722 in BT.709. JPEG's are customary: U of R and of G, and G of U,
// are those of libjpeg, one off the nearest.
constexpr YuvFactors kFull601 = {0,    19595, 38470, 7471,  11059, 21709, 27439,
                                 5329, 32768, 65536, 91881, 22554, 46802, 116130};
constexpr YuvFactors kLimited601 = {16,   16829, 33039, 6416,   9713,  19071, 24103,
                                    4681, 28784, 76309, 104597, 25675, 53279, 132201};
constexpr YuvFactors kFull709 = {0,    13933, 46871, 4732,   7509,  25259, 29763,
                                 3005, 32768, 65536, 103206, 12276, 30679, 121609};
constexpr YuvFactors kLimited709 = {16,   11966, 40254, 4064,   6595,  22189, 26145,
                                    2639, 28784, 76309, 117489, 13975, 34925, 138438};

}  // namespace

void set_yuv_meaning(YuvMeaning meaning) {
    chosen = meaning;
}

YuvMeaning yuv_meaning() {
    return chosen;
}

const YuvFactors& yuv_factors(YuvMeaning meaning) {
    const bool is_full = meaning.range == Range::kFull;
    if (meaning.matrix == Matrix::k601) return is_full ? kFull601 : kLimited601;
    return is_full ? kFull709 : kLimited709;
}

}  // namespace tool
