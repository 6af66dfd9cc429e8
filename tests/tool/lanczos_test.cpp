// SPDX-License-Identifier: Apache-2.0
// The Lanczos engine in bands of the tool's own gives the bytes of the library's call.
#include "lanczos.h"

#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <cstring>
#include <vector>

#include "support/random.h"

using ovrin_test::Random;
using ovrin_test::rounds;

TEST(LanczosInBands, GivesTheBytesOfOneCall) {
    Random random(1);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(100); ++i) {
        const tool::Size from = {random.between(1, 300), random.between(1, 300)};
        const tool::Size to = {random.between(1, 300), random.between(1, 300)};
        // Equal sizes copy, which bands do not.
        if (from.width == to.width && from.height == to.height) continue;
        const int32_t channels = random.between(1, 4);
        const std::vector<uint8_t> src =
            random.bytes(from.pixels() * static_cast<size_t>(channels));
        std::vector<uint8_t> whole(to.pixels() * static_cast<size_t>(channels));
        ov_lanczos(src.data(), from.width, from.height, whole.data(), to.width, to.height,
                   channels);

        std::vector<uint8_t> banded(whole.size());
        const size_t row_bytes = static_cast<size_t>(to.width) * static_cast<size_t>(channels);
        const int32_t threads = random.between(1, 5);
        tool::lanczos_in_bands(src.data(), from, to, channels, threads,
                               [&](int32_t first_row, int32_t rows, const uint8_t* samples) {
                                   memcpy(
                                       banded.data() + static_cast<size_t>(first_row) * row_bytes,
                                       samples, static_cast<size_t>(rows) * row_bytes);
                               });
        ASSERT_EQ(banded, whole) << to_string(from) << " to " << to_string(to) << ", " << channels;
    }
}
