// SPDX-License-Identifier: Apache-2.0
// RGBA8888 and RGB888 on the calling thread; empty pictures, too.
#include "reference/quarter.h"
#include "support.h"

using namespace fuzz;

namespace {

// What a resize of packed pictures gives.
std::vector<uint8_t> definition(const uint8_t* src, const Sizes& s, int32_t bytes) {
    if (s.dst_w < 1 || s.dst_h < 1) return {};
    if (s.src_w < 1 || s.src_h < 1) {
        return std::vector<uint8_t>(static_cast<size_t>(s.dst_w * s.dst_h * bytes));
    }
    return reference::quarter_packed(src, s.src_w, s.src_h, s.dst_w, s.dst_h, bytes);
}

void resize(const Sizes& s, int32_t bytes, uint8_t entry, const uint8_t* src, const Buffer& dst) {
    if (bytes == 3) {
        ovrin_resize_rgb888(src, dst.data(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    } else if (entry == 0) {
        ovrin_resize_rgba8888(src, dst.words(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    } else if (entry == 1) {
        ovrin_resize_rgba8888_sg(src, dst.words(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    } else {
        ovrin_resize_rgba8888_tps(src, dst.words(), s.src_w, s.src_h, s.dst_w, s.dst_h);
    }
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    const int32_t bytes = in.flag() ? 4 : 3;
    const uint8_t entry = in.byte() % 3;
    Sizes s = sizes(in);
    empty_some(in, s);
    if (s.src_h > kMostRowsWithoutThreads) s.src_h = kMostRowsWithoutThreads;

    Pixels pixels(in);
    const Flush where = flush(in);
    const Plane src(pixels, int64_t{s.src_w} * bytes, s.src_h, int64_t{s.src_w} * bytes, where);
    check_drawing(definition(src.first(), s, bytes), where, in.byte(),
                  [&](const Buffer& dst, const char* set) {
                      resize(s, bytes, entry, src.first(), dst);
                      src.check_unchanged(set);
                  });
    return 0;
}
