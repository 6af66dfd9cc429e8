// SPDX-License-Identifier: Apache-2.0
// Nearest neighbour.
#include "reference/nearest.h"

#include <cstring>

#include "support.h"

using namespace fuzz;

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    Sizes s = sizes(in);
    const uint8_t strange = in.byte();
    if (strange > 250) s.src_w = in.nothing();
    if (strange % 64 == 1) s.dst_w = 1 + in.between(0, 2500);  // more than a strip of columns
    Pixels pixels(in);
    const Flush where = flush(in);
    const Plane src(pixels, int64_t{s.src_w} * 4, s.src_h, int64_t{s.src_w} * 4, where);
    const uint8_t fill = in.byte();
    std::vector<uint32_t> expected(static_cast<size_t>(s.dst_w * s.dst_h), fill * 0x01010101U);
    std::vector<uint32_t> words;
    if (s.src_w > 0) {
        words.resize(static_cast<size_t>(s.src_w * s.src_h));
        memcpy(words.data(), src.first(), bytes_of(words));
        reference::nearest(words.data(), expected, s.src_w, s.src_h, s.dst_w, s.dst_h);
    }
    const auto* bytes = reinterpret_cast<const uint8_t*>(expected.data());
    check_drawing(
        {bytes, bytes + bytes_of(expected)}, where, fill, [&](const Buffer& dst, const char* set) {
            ovrin_resize_nearest_rgba8888(reinterpret_cast<const uint32_t*>(src.first()),
                                          dst.words(), s.src_w, s.src_h, s.dst_w, s.dst_h);
            src.check_unchanged(set);
        });
    return 0;
}
