// SPDX-License-Identifier: Apache-2.0
#include "alpha.h"

#include <algorithm>

namespace tool {

namespace {

uint8_t over_255(int product) {
    return static_cast<uint8_t>((product + 127) / 255);
}

// Calls change(pixel) for each, whose four bytes are R, G, B and A.
template <class Change>
void for_each_pixel(Picture* picture, Change change) {
    uint8_t* const end = picture->bytes() + picture->byte_count();
    for (uint8_t* pixel = picture->bytes(); pixel != end; pixel += 4) change(pixel);
}

}  // namespace

bool is_opaque(const Picture& picture) {
    const uint8_t* const bytes = picture.bytes();
    const size_t count = picture.byte_count();
    for (size_t i = 3; i < count; i += 4) {
        if (bytes[i] != 255) return false;
    }
    return true;
}

void make_opaque(Picture* picture) {
    for_each_pixel(picture, [](uint8_t* pixel) { pixel[3] = 255; });
}

void flatten(Picture* picture, Color background) {
    const int behind[] = {background.red, background.green, background.blue};
    for_each_pixel(picture, [&](uint8_t* pixel) {
        const int alpha = pixel[3];
        for (int c = 0; c < 3; ++c) {
            pixel[c] = over_255(pixel[c] * alpha + behind[c] * (255 - alpha));
        }
        pixel[3] = 255;
    });
    picture->has_alpha = false;
    picture->is_gray = picture->is_gray && background.is_gray();
}

void premultiply(Picture* picture) {
    for_each_pixel(picture, [](uint8_t* pixel) {
        for (int c = 0; c < 3; ++c) pixel[c] = over_255(pixel[c] * pixel[3]);
    });
}

void unpremultiply(Picture* picture, int opaque) {
    for_each_pixel(picture, [opaque](uint8_t* pixel) {
        const int alpha = std::min(255, (pixel[3] * 255 + opaque / 2) / opaque);
        pixel[3] = static_cast<uint8_t>(alpha);
        if (alpha == 0 || alpha == 255) return;
        for (int c = 0; c < 3; ++c) {
            pixel[c] = static_cast<uint8_t>(std::min(255, (pixel[c] * 255 + alpha / 2) / alpha));
        }
    });
}

}  // namespace tool
