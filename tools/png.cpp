// SPDX-License-Identifier: Apache-2.0
// PNG by libpng's simplified interface, which keeps its long jumps to itself.
#include <png.h>

#include <string>

#include "codecs.h"
#include "convert.h"
#include "error.h"

namespace tool {

namespace {

struct PngImage : png_image {
    PngImage() : png_image() { version = PNG_IMAGE_VERSION; }
    ~PngImage() { png_image_free(this); }
    PngImage(const PngImage&) = delete;
    PngImage& operator=(const PngImage&) = delete;

    Error error(const char* what) const { return Error(std::string(what) + ": " + message); }
};

}  // namespace

bool is_png(const uint8_t* data, size_t size) {
    return size >= 8 && png_sig_cmp(data, 0, 8) == 0;
}

Picture decode_png(const uint8_t* data, size_t size) {
    PngImage image;
    if (png_image_begin_read_from_memory(&image, data, size) == 0) {
        throw image.error("damaged PNG");
    }
    Picture picture(checked_size(image.width, image.height));
    picture.has_alpha = (image.format & PNG_FORMAT_FLAG_ALPHA) != 0;
    image.format = PNG_FORMAT_RGBA;
    // Without it 16-bit files that do not state their gamma are taken for linear light.
    image.flags |= PNG_IMAGE_FLAG_16BIT_sRGB;
    if (png_image_finish_read(&image, nullptr, picture.bytes(), 0, nullptr) == 0) {
        throw image.error("damaged PNG");
    }
    return picture;
}

void encode_png(const Picture& picture, FILE* out) {
    PngImage image;
    image.width = static_cast<png_uint_32>(picture.size.width);
    image.height = static_cast<png_uint_32>(picture.size.height);
    int written = 0;
    if (picture.has_alpha) {
        image.format = PNG_FORMAT_RGBA;
        written = png_image_write_to_stdio(&image, out, 0, picture.bytes(), 0, nullptr);
    } else {
        image.format = PNG_FORMAT_RGB;
        written = png_image_write_to_stdio(
            &image, out, 0, converted(picture, PixelFormat::kRgb).bytes(), 0, nullptr);
    }
    if (written == 0) throw image.error("cannot write PNG");
}

}  // namespace tool
