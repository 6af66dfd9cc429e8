// SPDX-License-Identifier: Apache-2.0
// What the JNI library demands of a source is enough for the bilinear engine: given just so many
// bytes in front of an inaccessible page, every instruction set gets through, and to the same
// result.
#include "../bindings/jni/extents.h"

#include "support.h"

using namespace fuzz;
using namespace ovrin_jni;

namespace {

// Now and then as long as pictures may be, where single precision moves positions.
Size picture(Input& in) {
    const uint8_t kind = in.byte();
    if (kind >= 8) return {in.width(), in.height()};
    const Size size = {in.between(1, kLargestSide), in.between(1, 2)};
    return kind % 2 == 0 ? size : Size{size.height, size.width};
}

int64_t picture_bytes(Size size, BilinearFormat format) {
    return format == kPixels ? 4 * size.pixels() : yuv420_bytes(size);
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    const auto format = in.pick({kPlanar, kPixels, kSemiPlanar});
    const auto resize = in.pick({ov_bilinear_sg, ov_bilinear, ov_bilinear_ex});
    const Size src = picture(in);
    const Size dst = picture(in);
    if (dst.pixels() > int64_t{1} << 16) return 0;
    const int64_t bytes = (resize == ov_bilinear_ex ? bilinear_ex_source_bytes
                                                    : bilinear_source_bytes)(src, dst, format);
    require(bytes >= picture_bytes(src, format), "fewer bytes than the picture has", "any");

    Pixels pixels(in);
    const Buffer from(static_cast<size_t>(bytes), Flush::kEnd);
    pixels.fill(from.data(), from.size());
    const Buffer to(static_cast<size_t>(picture_bytes(dst, format)), flush(in));
    std::vector<uint8_t> first;
    under_every_set([&](const char* set) {
        resize(from.data(), to.data(), src.width, src.height, dst.width, dst.height, format,
               nullptr);
        if (first.empty()) first.assign(to.data(), to.data() + to.size());
        to.check(first.data(), set);
    });
    return 0;
}
