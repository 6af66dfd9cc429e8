// SPDX-License-Identifier: Apache-2.0
// JPEG by libjpeg-turbo. The library reports errors by a callback that must not return, so each
// group of its calls stands in a function of its own that setjmp guards. Those functions hold plain
// data only: a long jump runs no destructors.
#include <csetjmp>
#include <cstdio>
#include <cstdlib>
#include <cstring>
// jpeglib.h needs size_t and FILE from the headers above.
#include <jerror.h>
#include <jpeglib.h>

#include "codecs.h"
#include "error.h"
#include "exif.h"

namespace tool {

namespace {

constexpr int kExifMarker = JPEG_APP0 + 1;
constexpr int kIccMarker = JPEG_APP0 + 2;
constexpr unsigned kMaxMarker = 65535;
constexpr size_t kMaxMarkerContent = kMaxMarker - 2;

// Units of density.
constexpr UINT8 kPerInch = 1;
constexpr UINT8 kPerCentimeter = 2;
constexpr double kInchesPerMeter = 1 / 0.0254;

struct ErrorState {
    jpeg_error_mgr manager;  // first: the library hands back a pointer to it
    jmp_buf jump;
    int lost;  // the message of what made the first pixels up; 0: none were
    char message[JMSG_LENGTH_MAX];
};

ErrorState* state_of(j_common_ptr codec) {
    return reinterpret_cast<ErrorState*>(codec->err);
}

[[noreturn]] void on_error(j_common_ptr codec) {
    ErrorState* const state = state_of(codec);
    codec->err->format_message(codec, state->message);
    longjmp(state->jump, 1);  // NOLINT(cert-err52-cpp): the only way out of libjpeg
}

// Warnings (level -1) that stand for lost pixels are kept. Others, such as stray bytes
// between segments, occur in files of real cameras and harm nothing.
void on_message(j_common_ptr codec, int level) {
    if (level >= 0) return;
    switch (codec->err->msg_code) {
        case JWRN_JPEG_EOF:
        case JWRN_HIT_MARKER:
        case JWRN_HUFF_BAD_CODE:
        case JWRN_MUST_RESYNC:
            // Only the first: later ones are its consequences.
            if (state_of(codec)->lost != 0) break;
            codec->err->format_message(codec, state_of(codec)->message);
            state_of(codec)->lost = codec->err->msg_code;
            break;
        default:
            break;
    }
}

void ignore_output(j_common_ptr) {}

jpeg_error_mgr* init_errors(ErrorState* state) {
    jpeg_std_error(&state->manager);
    state->manager.error_exit = on_error;
    state->manager.emit_message = on_message;
    state->manager.output_message = ignore_output;
    state->lost = 0;
    state->message[0] = '\0';
    return &state->manager;
}

struct Decoder {
    Decoder() : codec() { codec.err = init_errors(&errors); }
    ~Decoder() {
        jpeg_destroy_decompress(&codec);
        free(icc);
    }
    Decoder(const Decoder&) = delete;
    Decoder& operator=(const Decoder&) = delete;

    jpeg_decompress_struct codec;
    JOCTET* icc = nullptr;
    unsigned icc_bytes = 0;
    ErrorState errors;
};

struct Encoder {
    Encoder() : codec() { codec.err = init_errors(&errors); }
    ~Encoder() { jpeg_destroy_compress(&codec); }
    Encoder(const Encoder&) = delete;
    Encoder& operator=(const Encoder&) = delete;

    jpeg_compress_struct codec;
    ErrorState errors;
};

bool read_header(Decoder* decoder, const uint8_t* data, size_t size) {
    if (setjmp(decoder->errors.jump) != 0) return false;  // NOLINT(cert-err52-cpp)
    jpeg_decompress_struct* const codec = &decoder->codec;
    jpeg_create_decompress(codec);
    jpeg_mem_src(codec, data, size);
    jpeg_save_markers(codec, kExifMarker, kMaxMarker);
    jpeg_save_markers(codec, kIccMarker, kMaxMarker);
    jpeg_read_header(codec, TRUE);
    jpeg_read_icc_profile(codec, &decoder->icc, &decoder->icc_bytes);
    return true;
}

Bytes read_exif(const Decoder& decoder) {
    for (auto marker = decoder.codec.marker_list; marker != nullptr; marker = marker->next) {
        if (marker->marker == kExifMarker && marker->data_length > kExifHeadBytes &&
            memcmp(marker->data, kExifHead, kExifHeadBytes) == 0) {
            return Bytes(marker->data, marker->data + marker->data_length);
        }
    }
    return {};
}

// 1:1 without a unit is what JPEG says when it does not know.
std::optional<Density> read_density(const jpeg_decompress_struct& codec) {
    const double x = codec.X_density;
    const double y = codec.Y_density;
    if (codec.saw_JFIF_marker == FALSE || x == 0 || y == 0) return {};
    if (codec.density_unit == kPerInch)
        return Density{true, x * kInchesPerMeter, y * kInchesPerMeter};
    if (codec.density_unit == kPerCentimeter) return Density{true, x * 100, y * 100};
    if (x == y) return {};
    return Density{false, x, y};
}

Metadata read_metadata(const Decoder& decoder) {
    Metadata metadata;
    metadata.exif = read_exif(decoder);
    metadata.icc = Bytes(decoder.icc, decoder.icc + decoder.icc_bytes);
    metadata.density = read_density(decoder.codec);
    if (!metadata.exif.empty() && metadata.icc.empty() && exif_claims_srgb(metadata.exif)) {
        metadata.srgb_intent = 0;
    }
    return metadata;
}

bool read_rows(Decoder* decoder, uint8_t* rgba) {
    if (setjmp(decoder->errors.jump) != 0) return false;  // NOLINT(cert-err52-cpp)
    jpeg_decompress_struct* const codec = &decoder->codec;
    codec->out_color_space = JCS_EXT_RGBA;
    jpeg_start_decompress(codec);
    while (codec->output_scanline < codec->output_height) {
        JSAMPROW row = rgba + size_t{codec->output_scanline} * codec->output_width * 4;
        jpeg_read_scanlines(codec, &row, 1);
    }
    jpeg_finish_decompress(codec);
    return true;
}

void set_density(jpeg_compress_struct* codec, const Density& density) {
    const double unit = density.is_absolute ? kInchesPerMeter : 1;
    const double x = density.x / unit + 0.5;
    const double y = density.y / unit + 0.5;
    if (x < 1 || y < 1 || x > UINT16_MAX || y > UINT16_MAX) return;
    codec->density_unit = density.is_absolute ? kPerInch : 0;
    codec->X_density = static_cast<UINT16>(x);
    codec->Y_density = static_cast<UINT16>(y);
}

void write_metadata(jpeg_compress_struct* codec, const Picture& picture, const Metadata& metadata) {
    if (!metadata.exif.empty() && metadata.exif.size() <= kMaxMarkerContent) {
        jpeg_write_marker(codec, kExifMarker, metadata.exif.data(),
                          static_cast<unsigned>(metadata.exif.size()));
    }
    if (has_fitting_profile(picture, metadata)) {
        jpeg_write_icc_profile(codec, metadata.icc.data(),
                               static_cast<unsigned>(metadata.icc.size()));
    }
}

struct Encoding {
    const Picture& picture;
    const Metadata& metadata;
    int quality;
    uint8_t* gray_row;  // room for one; null where colours are written
};

JSAMPROW row_of(const Encoding& encoding, size_t y) {
    const auto width = static_cast<size_t>(encoding.picture.size.width);
    const uint8_t* const rgba = encoding.picture.bytes() + y * width * 4;
    // The library's type lacks const; it does not write to rows given to it.
    if (encoding.gray_row == nullptr) return const_cast<uint8_t*>(rgba);
    for (size_t x = 0; x < width; ++x) encoding.gray_row[x] = rgba[4 * x];
    return encoding.gray_row;
}

bool write_picture(Encoder* encoder, const Encoding& encoding, FILE* out) {
    if (setjmp(encoder->errors.jump) != 0) return false;  // NOLINT(cert-err52-cpp)
    jpeg_compress_struct* const codec = &encoder->codec;
    const bool is_gray = encoding.gray_row != nullptr;
    jpeg_create_compress(codec);
    jpeg_stdio_dest(codec, out);
    codec->image_width = static_cast<JDIMENSION>(encoding.picture.size.width);
    codec->image_height = static_cast<JDIMENSION>(encoding.picture.size.height);
    codec->input_components = is_gray ? 1 : 4;
    codec->in_color_space = is_gray ? JCS_GRAYSCALE : JCS_EXT_RGBX;
    jpeg_set_defaults(codec);
    jpeg_set_quality(codec, encoding.quality, TRUE);
    if (encoding.metadata.density) set_density(codec, *encoding.metadata.density);
    jpeg_start_compress(codec, TRUE);
    write_metadata(codec, encoding.picture, encoding.metadata);
    while (codec->next_scanline < codec->image_height) {
        JSAMPROW row = row_of(encoding, codec->next_scanline);
        jpeg_write_scanlines(codec, &row, 1);
    }
    jpeg_finish_compress(codec);
    return true;
}

Error error(const char* what, const ErrorState& state) {
    return Error(std::string(what) + ": " + state.message);
}

}  // namespace

bool is_jpeg(const uint8_t* data, size_t size) {
    return size >= 3 && data[0] == 0xFF && data[1] == 0xD8 && data[2] == 0xFF;
}

Picture decode_jpeg(const uint8_t* data, size_t size, Metadata* metadata) {
    Decoder decoder;
    if (!read_header(&decoder, data, size)) throw error("damaged JPEG", decoder.errors);
    const J_COLOR_SPACE colors = decoder.codec.jpeg_color_space;
    if (colors == JCS_CMYK || colors == JCS_YCCK) throw Error("CMYK JPEG is not supported");
    Picture picture(checked_size(decoder.codec.image_width, decoder.codec.image_height));
    picture.is_gray = colors == JCS_GRAYSCALE;
    *metadata = read_metadata(decoder);
    const bool is_read = read_rows(&decoder, picture.bytes());
    const int lost = decoder.errors.lost;
    if (!is_read || (lost != 0 && lost != JWRN_JPEG_EOF))
        throw error("damaged JPEG", decoder.errors);
    if (lost == JWRN_JPEG_EOF) metadata->damage = "the JPEG ends early, and the rest is made up";
    return picture;
}

void encode_jpeg(const Picture& picture, const Metadata& metadata, int quality, FILE* out) {
    Encoder encoder;
    Bytes gray_row;
    if (is_gray_file(picture, metadata)) gray_row.resize(static_cast<size_t>(picture.size.width));
    const Encoding encoding = {picture, metadata, quality,
                               gray_row.empty() ? nullptr : gray_row.data()};
    if (!write_picture(&encoder, encoding, out)) throw error("cannot write JPEG", encoder.errors);
}

}  // namespace tool
