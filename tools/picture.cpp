// SPDX-License-Identifier: Apache-2.0
#include "picture.h"

namespace tool {

namespace {

struct Chroma {
    int32_t across, down;  // pixels of a sample
};

Chroma chroma_of(PixelFormat format) {
    if (format == PixelFormat::kI444) return {1, 1};
    if (format == PixelFormat::kI422) return {2, 1};
    return {2, 2};
}

}  // namespace

const char* name_of(PixelFormat format) {
    switch (format) {
        case PixelFormat::kRgba:
            return "rgba";
        case PixelFormat::kRgb:
            return "rgb";
        case PixelFormat::kGray:
            return "gray";
        case PixelFormat::kI420:
            return "i420";
        case PixelFormat::kNv21:
            return "nv21";
        case PixelFormat::kI422:
            return "i422";
        case PixelFormat::kI444:
            break;
    }
    return "i444";
}

bool is_420(PixelFormat format) {
    return format == PixelFormat::kI420 || format == PixelFormat::kNv21;
}

bool is_yuv(PixelFormat format) {
    return format != PixelFormat::kRgba && format != PixelFormat::kRgb;
}

std::vector<Plane> planes_of(PixelFormat format, Size size) {
    if (format == PixelFormat::kRgba) return {{0, size, 4, 1, 1}};
    if (format == PixelFormat::kRgb) return {{0, size, 3, 1, 1}};
    const Plane luma = {0, size, 1, 1, 1};
    if (format == PixelFormat::kGray) return {luma};
    const auto [across, down] = chroma_of(format);
    const Size half = {(size.width + across - 1) / across, (size.height + down - 1) / down};
    if (format == PixelFormat::kNv21) return {luma, {luma.bytes(), half, 2, across, down}};
    const Plane u = {luma.bytes(), half, 1, across, down};
    return {luma, u, {u.offset + u.bytes(), half, 1, across, down}};
}

size_t picture_bytes(PixelFormat format, Size size) {
    const Plane last = planes_of(format, size).back();
    return last.offset + last.bytes();
}

Picture::Picture(Size the_size, PixelFormat the_format) : format(the_format), size(the_size) {
    const size_t count = (picture_bytes(format, size) + 3) / 4;
    words.reserve(count + static_cast<size_t>(size.width) + 1);
    words.resize(count);
}

}  // namespace tool
