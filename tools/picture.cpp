// SPDX-License-Identifier: Apache-2.0
#include "picture.h"

namespace tool {

const char* name_of(PixelFormat format) {
    switch (format) {
        case PixelFormat::kRgba:
            return "rgba";
        case PixelFormat::kRgb:
            return "rgb";
        case PixelFormat::kI420:
            return "i420";
        case PixelFormat::kNv21:
            return "nv21";
    }
    return "";
}

bool has_chroma_planes(PixelFormat format) {
    return format == PixelFormat::kI420 || format == PixelFormat::kNv21;
}

size_t picture_bytes(PixelFormat format, Size size) {
    const Size chroma = {(size.width + 1) / 2, (size.height + 1) / 2};
    if (has_chroma_planes(format)) return size.pixels() + 2 * chroma.pixels();
    return size.pixels() * (format == PixelFormat::kRgb ? 3 : 4);
}

Picture::Picture(Size the_size, PixelFormat the_format) : format(the_format), size(the_size) {
    const size_t count = (picture_bytes(format, size) + 3) / 4;
    words.reserve(count + static_cast<size_t>(size.width) + 1);
    words.resize(count);
}

}  // namespace tool
