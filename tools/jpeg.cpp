// SPDX-License-Identifier: Apache-2.0
// JPEG by libjpeg-turbo. The library reports errors by a callback that must not return, so each
// group of its calls stands in a function of its own that setjmp guards. Those functions hold plain
// data only: a long jump runs no destructors.
#include <csetjmp>
#include <cstdio>
// jpeglib.h needs size_t and FILE from the headers above.
#include <jerror.h>
#include <jpeglib.h>

#include "codecs.h"
#include "error.h"

namespace tool {

namespace {

struct ErrorState {
    jpeg_error_mgr manager;  // first: the library hands back a pointer to it
    jmp_buf jump;
    bool data_lost;  // some pixels were made up
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

// Warnings (level -1) that stand for lost pixels count as failures. Others, such as stray bytes
// between segments, occur in files of real cameras and harm nothing.
void on_message(j_common_ptr codec, int level) {
    if (level >= 0) return;
    switch (codec->err->msg_code) {
        case JWRN_JPEG_EOF:
        case JWRN_HIT_MARKER:
        case JWRN_HUFF_BAD_CODE:
        case JWRN_MUST_RESYNC:
            // Only the first: later ones are its consequences.
            if (!state_of(codec)->data_lost)
                codec->err->format_message(codec, state_of(codec)->message);
            state_of(codec)->data_lost = true;
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
    state->data_lost = false;
    state->message[0] = '\0';
    return &state->manager;
}

struct Decoder {
    Decoder() : codec() { codec.err = init_errors(&errors); }
    ~Decoder() { jpeg_destroy_decompress(&codec); }
    Decoder(const Decoder&) = delete;
    Decoder& operator=(const Decoder&) = delete;

    jpeg_decompress_struct codec;
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
    jpeg_read_header(codec, TRUE);
    return true;
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

bool write_rows(Encoder* encoder, const Picture& picture, int quality, FILE* out) {
    if (setjmp(encoder->errors.jump) != 0) return false;  // NOLINT(cert-err52-cpp)
    jpeg_compress_struct* const codec = &encoder->codec;
    jpeg_create_compress(codec);
    jpeg_stdio_dest(codec, out);
    codec->image_width = static_cast<JDIMENSION>(picture.size.width);
    codec->image_height = static_cast<JDIMENSION>(picture.size.height);
    codec->input_components = 4;
    codec->in_color_space = JCS_EXT_RGBX;
    jpeg_set_defaults(codec);
    jpeg_set_quality(codec, quality, TRUE);
    jpeg_start_compress(codec, TRUE);
    while (codec->next_scanline < codec->image_height) {
        // The library's type lacks const; it does not write to rows given to it.
        JSAMPROW row = const_cast<uint8_t*>(picture.bytes()) +
                       size_t{codec->next_scanline} * codec->image_width * 4;
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

Picture decode_jpeg(const uint8_t* data, size_t size) {
    Decoder decoder;
    if (!read_header(&decoder, data, size)) throw error("damaged JPEG", decoder.errors);
    const J_COLOR_SPACE colors = decoder.codec.jpeg_color_space;
    if (colors == JCS_CMYK || colors == JCS_YCCK) throw Error("CMYK JPEG is not supported");
    Picture picture(checked_size(decoder.codec.image_width, decoder.codec.image_height));
    if (!read_rows(&decoder, picture.bytes()) || decoder.errors.data_lost) {
        throw error("damaged JPEG", decoder.errors);
    }
    return picture;
}

void encode_jpeg(const Picture& picture, int quality, FILE* out) {
    Encoder encoder;
    if (!write_rows(&encoder, picture, quality, out)) {
        throw error("cannot write JPEG", encoder.errors);
    }
}

}  // namespace tool
