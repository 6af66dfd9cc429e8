// SPDX-License-Identifier: Apache-2.0
// What the samples of YUV pictures mean beside RGB.
#pragma once

namespace tool {

// ITU-R BT.601 or BT.709: which colours count how much.
enum class Matrix { k601, k709 };

// Full: luma and chroma from 0 to 255. Limited: luma from 16 to 235, chroma from 16 to 240.
enum class Range { kFull, kLimited };

struct YuvMeaning {
    Matrix matrix = Matrix::k601;
    Range range = Range::kFull;

    // As in JPEG files.
    bool is_that_of_jpeg() const { return matrix == Matrix::k601 && range == Range::kFull; }
};

// The same of every YUV picture of a run; that of JPEG unless set, before any threads start.
void set_yuv_meaning(YuvMeaning meaning);
YuvMeaning yuv_meaning();

// Factors with 16 fractional bits. Those of a chroma sample add up to 0, so that grey stays grey.
struct YuvFactors {
    int black;                           // luma, whole
    int y_of_r, y_of_g, y_of_b;          // to be added to black
    int u_of_r, u_of_g, v_of_g, v_of_b;  // to be taken away
    int chroma;                          // U of B, V of R
    int luma;                            // R, G and B of what luma is above black
    int r_of_v, g_of_u, g_of_v, b_of_u;  // those of G to be taken away
};

const YuvFactors& yuv_factors(YuvMeaning meaning);

}  // namespace tool
