// SPDX-License-Identifier: Apache-2.0
// PNG by libpng. The library reports errors by a callback that must not return, so each group of
// its calls stands in a function of its own that setjmp guards. Those functions hold plain data
// only: a long jump runs no destructors.
#include <png.h>

#include <algorithm>
#include <csetjmp>
#include <cstring>
#include <string>

#include "codecs.h"
#include "error.h"
#include "exif.h"

namespace tool {

namespace {

constexpr png_fixed_point kGammaOfSrgb = 45455;  // as files state it

struct ErrorState {
    jmp_buf jump;
    char message[200];
};

[[noreturn]] void on_error(png_structp png, png_const_charp message) {
    auto* const state = static_cast<ErrorState*>(png_get_error_ptr(png));
    snprintf(state->message, sizeof(state->message), "%s", message);
    longjmp(state->jump, 1);  // NOLINT(cert-err52-cpp): the only way out of libpng
}

void on_warning(png_structp, png_const_charp) {}

// Bytes in memory that libpng has not yet read.
struct Unread {
    const uint8_t* at;
    size_t count;
};

void read_bytes(png_structp png, png_bytep to, size_t count) {
    auto* const unread = static_cast<Unread*>(png_get_io_ptr(png));
    if (unread->count < count) png_error(png, "the file ends too early");
    memcpy(to, unread->at, count);
    unread->at += count;
    unread->count -= count;
}

struct Decoder {
    Decoder(const uint8_t* data, size_t size) : errors(), unread{data, size} {
        png = png_create_read_struct(PNG_LIBPNG_VER_STRING, &errors, on_error, on_warning);
        if (png != nullptr) info = png_create_info_struct(png);
        if (info != nullptr) return;
        png_destroy_read_struct(&png, nullptr, nullptr);
        throw std::bad_alloc();
    }
    ~Decoder() { png_destroy_read_struct(&png, &info, nullptr); }
    Decoder(const Decoder&) = delete;
    Decoder& operator=(const Decoder&) = delete;

    ErrorState errors;
    Unread unread;
    png_structp png = nullptr;
    png_infop info = nullptr;
};

struct Encoder {
    Encoder() : errors() {
        png = png_create_write_struct(PNG_LIBPNG_VER_STRING, &errors, on_error, on_warning);
        if (png != nullptr) info = png_create_info_struct(png);
        if (info != nullptr) return;
        png_destroy_write_struct(&png, nullptr);
        throw std::bad_alloc();
    }
    ~Encoder() { png_destroy_write_struct(&png, &info); }
    Encoder(const Encoder&) = delete;
    Encoder& operator=(const Encoder&) = delete;

    ErrorState errors;
    png_structp png = nullptr;
    png_infop info = nullptr;
};

Error error(const char* what, const ErrorState& state) {
    return Error(std::string(what) + ": " + state.message);
}

bool has_chunk(const Decoder& decoder, png_uint_32 chunk) {
    return png_get_valid(decoder.png, decoder.info, chunk) != 0;
}

// Samples of gamma other than that of sRGB are converted, unless a profile says what they mean.
bool is_converted(const Decoder& decoder) {
    return has_chunk(decoder, PNG_INFO_gAMA) && !has_chunk(decoder, PNG_INFO_sRGB) &&
           !has_chunk(decoder, PNG_INFO_iCCP);
}

// ---- Reading ----

// Bytes up to the end of the last chunk that is whole: libpng takes memory for a chunk before it
// sees how much of it there is.
size_t whole_chunks(const uint8_t* data, size_t size) {
    constexpr size_t kSignature = 8;
    constexpr size_t kAround = 12;  // length, type and checksum
    size_t end = std::min(size, kSignature);
    while (size - end >= kAround) {
        const size_t content = png_get_uint_32(data + end);
        if (content > size - end - kAround) break;
        end += content + kAround;
    }
    return end;
}

bool read_header(Decoder* decoder) {
    if (setjmp(decoder->errors.jump) != 0) return false;  // NOLINT(cert-err52-cpp)
    png_set_read_fn(decoder->png, &decoder->unread, read_bytes);
    png_read_info(decoder->png, decoder->info);
    return true;
}

bool read_rows(Decoder* decoder, uint8_t* rgba, const Listener& listener) {
    if (setjmp(decoder->errors.jump) != 0) return false;  // NOLINT(cert-err52-cpp)
    png_structp png = decoder->png;
    if (is_converted(*decoder)) {
        png_fixed_point gamma = 0;
        png_get_gAMA_fixed(png, decoder->info, &gamma);
        png_set_gamma_fixed(png, PNG_DEFAULT_sRGB, gamma);
    }
    png_set_expand(png);
    png_set_scale_16(png);
    png_set_gray_to_rgb(png);
    png_set_add_alpha(png, 255, PNG_FILLER_AFTER);
    const int passes = png_set_interlace_handling(png);
    png_read_update_info(png, decoder->info);
    const size_t row_bytes = png_get_rowbytes(png, decoder->info);
    const png_uint_32 height = png_get_image_height(png, decoder->info);
    for (int pass = 0; pass < passes; ++pass) {
        for (png_uint_32 y = 0; y < height; ++y) {
            png_read_row(png, rgba + y * row_bytes, nullptr);
            if (listener) listener((pass + (y + 1.0) / height) / passes);
        }
    }
    return true;
}

// Chunks behind the pixels, which may hold EXIF. Nothing is lost where there are none.
void read_end(Decoder* decoder) {
    if (setjmp(decoder->errors.jump) != 0) return;  // NOLINT(cert-err52-cpp)
    png_read_end(decoder->png, decoder->info);
}

Bytes read_exif(const Decoder& decoder) {
    png_uint_32 count = 0;
    png_bytep bytes = nullptr;
    if (png_get_eXIf_1(decoder.png, decoder.info, &count, &bytes) == 0) return {};
    Bytes exif(kExifHead, kExifHead + kExifHeadBytes);
    exif.insert(exif.end(), bytes, bytes + count);
    return exif;
}

Bytes read_icc(const Decoder& decoder) {
    png_charp name = nullptr;
    int compression = 0;
    png_bytep bytes = nullptr;
    png_uint_32 count = 0;
    if (png_get_iCCP(decoder.png, decoder.info, &name, &compression, &bytes, &count) == 0)
        return {};
    return Bytes(bytes, bytes + count);
}

std::optional<Density> read_density(const Decoder& decoder) {
    png_uint_32 x = 0;
    png_uint_32 y = 0;
    int unit = 0;
    if (png_get_pHYs(decoder.png, decoder.info, &x, &y, &unit) == 0 || x == 0 || y == 0) return {};
    return Density{unit == PNG_RESOLUTION_METER, static_cast<double>(x), static_cast<double>(y)};
}

PngColors read_colors(const Decoder& decoder) {
    PngColors colors;
    if (!is_converted(decoder)) return colors;
    colors.has_gamma = true;
    std::array<int32_t, 8> xy = {};
    if (png_get_cHRM_fixed(decoder.png, decoder.info, &xy[0], &xy[1], &xy[2], &xy[3], &xy[4],
                           &xy[5], &xy[6], &xy[7]) != 0) {
        colors.chromaticities = xy;
    }
    return colors;
}

Metadata read_metadata(const Decoder& decoder) {
    Metadata metadata;
    metadata.exif = read_exif(decoder);
    metadata.icc = read_icc(decoder);
    metadata.density = read_density(decoder);
    metadata.png_colors = read_colors(decoder);
    int intent = 0;
    if (metadata.icc.empty() && png_get_sRGB(decoder.png, decoder.info, &intent) != 0) {
        metadata.srgb_intent = intent;
    }
    return metadata;
}

// ---- Writing ----

void write_colors(const Encoder& encoder, const Picture& picture, const Metadata& metadata) {
    png_structp png = encoder.png;
    if (has_fitting_profile(picture, metadata)) {
        png_set_iCCP(png, encoder.info, "ICC profile", PNG_COMPRESSION_TYPE_BASE,
                     metadata.icc.data(), static_cast<png_uint_32>(metadata.icc.size()));
    } else if (metadata.srgb_intent) {
        png_set_sRGB(png, encoder.info, *metadata.srgb_intent);
    } else if (metadata.png_colors.has_gamma) {
        png_set_gAMA_fixed(png, encoder.info, kGammaOfSrgb);
        if (metadata.png_colors.chromaticities) {
            const auto& xy = *metadata.png_colors.chromaticities;
            png_set_cHRM_fixed(png, encoder.info, xy[0], xy[1], xy[2], xy[3], xy[4], xy[5], xy[6],
                               xy[7]);
        }
    }
}

void write_metadata(const Encoder& encoder, const Picture& picture, const Metadata& metadata) {
    write_colors(encoder, picture, metadata);
    if (metadata.density) {
        const auto rounded = [](double value) { return static_cast<png_uint_32>(value + 0.5); };
        png_set_pHYs(encoder.png, encoder.info, rounded(metadata.density->x),
                     rounded(metadata.density->y),
                     metadata.density->is_absolute ? PNG_RESOLUTION_METER : PNG_RESOLUTION_UNKNOWN);
    }
    if (metadata.exif.size() > kExifHeadBytes) {
        // The library's type lacks const; it copies the bytes.
        png_set_eXIf_1(encoder.png, encoder.info,
                       static_cast<png_uint_32>(metadata.exif.size() - kExifHeadBytes),
                       const_cast<uint8_t*>(metadata.exif.data()) + kExifHeadBytes);
    }
}

// The channels of an RGBA row that the file has: one or three of colour, and alpha or not.
void pack_row(const uint8_t* rgba, size_t width, int colors, uint8_t* packed) {
    const bool is_gray = (colors & PNG_COLOR_MASK_COLOR) == 0;
    const bool has_alpha = (colors & PNG_COLOR_MASK_ALPHA) != 0;
    for (const uint8_t* const end = rgba + width * 4; rgba != end; rgba += 4) {
        *packed++ = rgba[0];
        if (!is_gray) {
            *packed++ = rgba[1];
            *packed++ = rgba[2];
        }
        if (has_alpha) *packed++ = rgba[3];
    }
}

bool write_picture(Encoder* encoder, const Picture& picture, const Metadata& metadata, uint8_t* row,
                   FILE* out, const Listener& listener) {
    if (setjmp(encoder->errors.jump) != 0) return false;  // NOLINT(cert-err52-cpp)
    png_structp png = encoder->png;
    png_init_io(png, out);
    // A profile that libpng finds fault with is left out.
    png_set_benign_errors(png, 1);
    const int colors = (is_gray_file(picture, metadata) ? 0 : PNG_COLOR_MASK_COLOR) |
                       (picture.has_alpha ? PNG_COLOR_MASK_ALPHA : 0);
    const auto width = static_cast<png_uint_32>(picture.size.width);
    const auto height = static_cast<png_uint_32>(picture.size.height);
    png_set_IHDR(png, encoder->info, width, height, 8, colors, PNG_INTERLACE_NONE,
                 PNG_COMPRESSION_TYPE_BASE, PNG_FILTER_TYPE_BASE);
    write_metadata(*encoder, picture, metadata);
    png_write_info(png, encoder->info);
    for (png_uint_32 y = 0; y < height; ++y) {
        pack_row(picture.bytes() + size_t{y} * width * 4, width, colors, row);
        png_write_row(png, row);
        if (listener) listener((y + 1.0) / height);
    }
    png_write_end(png, nullptr);
    return true;
}

}  // namespace

bool is_png(const uint8_t* data, size_t size) {
    return size >= 8 && png_sig_cmp(data, 0, 8) == 0;
}

Picture decode_png(const uint8_t* data, size_t size, Metadata* metadata, const Listener& listener) {
    Decoder decoder(data, whole_chunks(data, size));
    if (!read_header(&decoder)) throw error("damaged PNG", decoder.errors);
    Picture picture(checked_size(png_get_image_width(decoder.png, decoder.info),
                                 png_get_image_height(decoder.png, decoder.info)));
    const int colors = png_get_color_type(decoder.png, decoder.info);
    picture.is_gray = (colors & PNG_COLOR_MASK_COLOR) == 0;
    picture.has_alpha = (colors & PNG_COLOR_MASK_ALPHA) != 0 || has_chunk(decoder, PNG_INFO_tRNS);
    if (!read_rows(&decoder, picture.bytes(), listener)) throw error("damaged PNG", decoder.errors);
    read_end(&decoder);
    *metadata = read_metadata(decoder);
    return picture;
}

void encode_png(const Picture& picture, const Metadata& metadata, FILE* out,
                const Listener& listener) {
    Encoder encoder;
    Bytes row(static_cast<size_t>(picture.size.width) * 4);
    if (!write_picture(&encoder, picture, metadata, row.data(), out, listener)) {
        throw error("cannot write PNG", encoder.errors);
    }
}

}  // namespace tool
