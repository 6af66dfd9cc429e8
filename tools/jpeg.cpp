// SPDX-License-Identifier: Apache-2.0
// JPEG by libjpeg-turbo. The library reports errors by a callback that must not return, so each
// group of its calls stands in a function of its own that setjmp guards. Those functions hold plain
// data only: a long jump runs no destructors.
#include <algorithm>
#include <array>
#include <csetjmp>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <utility>
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

jpeg_error_mgr* init_errors(ErrorState* state) {
    jpeg_std_error(&state->manager);
    state->manager.error_exit = on_error;
    state->manager.emit_message = on_message;
    state->lost = 0;
    state->message[0] = '\0';
    return &state->manager;
}

struct ProgressState {
    jpeg_progress_mgr manager;  // first: the library hands back a pointer to it
    const Listener* listener;
};

void on_progress(j_common_ptr codec) {
    const jpeg_progress_mgr& at = *codec->progress;
    const double pass = static_cast<double>(at.pass_counter) / static_cast<double>(at.pass_limit);
    (*reinterpret_cast<ProgressState*>(codec->progress)->listener)((at.completed_passes + pass) /
                                                                   at.total_passes);
}

// The state lives as long as the codec; nothing is told where nobody listens.
jpeg_progress_mgr* init_progress(ProgressState* state, const Listener& listener) {
    if (!listener) return nullptr;
    *state = {};
    state->manager.progress_monitor = on_progress;
    state->listener = &listener;
    return &state->manager;
}

struct Decompressor {
    Decompressor() : codec() { codec.err = init_errors(&errors); }
    ~Decompressor() {
        jpeg_destroy_decompress(&codec);
        free(icc);
    }
    Decompressor(const Decompressor&) = delete;
    Decompressor& operator=(const Decompressor&) = delete;

    jpeg_decompress_struct codec;
    JOCTET* icc = nullptr;
    unsigned icc_bytes = 0;
    ErrorState errors;
    ProgressState progress = {};
};

struct Encoder {
    Encoder() : codec() { codec.err = init_errors(&errors); }
    ~Encoder() { jpeg_destroy_compress(&codec); }
    Encoder(const Encoder&) = delete;
    Encoder& operator=(const Encoder&) = delete;

    jpeg_compress_struct codec;
    ErrorState errors;
    ProgressState progress = {};
};

Error error(const char* what, const ErrorState& state) {
    return Error(std::string(what) + ": " + state.message);
}

bool read_header(Decompressor* decoder, const uint8_t* data, size_t size) {
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

Bytes read_exif(const Decompressor& decoder) {
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

bool is_cmyk(const jpeg_decompress_struct& codec) {
    return codec.jpeg_color_space == JCS_CMYK || codec.jpeg_color_space == JCS_YCCK;
}

Metadata read_metadata(const Decompressor& decoder) {
    Metadata metadata;
    metadata.exif = read_exif(decoder);
    // One for inks fits no result.
    if (!is_cmyk(decoder.codec)) metadata.icc = Bytes(decoder.icc, decoder.icc + decoder.icc_bytes);
    metadata.density = read_density(decoder.codec);
    if (!metadata.exif.empty() && metadata.icc.empty() && exif_claims_srgb(metadata.exif)) {
        metadata.srgb_intent = 0;
    }
    return metadata;
}

// ---- Reading ----

bool start(Decompressor* decoder, const Decoding& decoding) {
    if (setjmp(decoder->errors.jump) != 0) return false;  // NOLINT(cert-err52-cpp)
    jpeg_decompress_struct* const codec = &decoder->codec;
    codec->scale_num = 1;
    codec->scale_denom = static_cast<unsigned>(decoding.reduction);
    if (decoding.in_planes) {
        codec->raw_data_out = TRUE;
        codec->do_fancy_upsampling = FALSE;
        codec->out_color_space = codec->jpeg_color_space;
    } else {
        codec->out_color_space = is_cmyk(*codec) ? JCS_CMYK : JCS_EXT_RGBA;
    }
    jpeg_start_decompress(codec);
    return true;
}

// Four bytes a pixel. spare: room for one of the codec's rows, which may be longer and more.
bool read_rows(Decompressor* decoder, Size size, uint8_t* pixels, uint8_t* spare) {
    if (setjmp(decoder->errors.jump) != 0) return false;  // NOLINT(cert-err52-cpp)
    jpeg_decompress_struct* const codec = &decoder->codec;
    const size_t row_bytes = static_cast<size_t>(size.width) * 4;
    const auto rows = static_cast<JDIMENSION>(size.height);
    const bool fits = codec->output_width == static_cast<JDIMENSION>(size.width);
    while (codec->output_scanline < codec->output_height) {
        const JDIMENSION y = codec->output_scanline;
        uint8_t* const to = pixels + y * row_bytes;
        JSAMPROW row = fits && y < rows ? to : spare;
        jpeg_read_scanlines(codec, &row, 1);
        if (!fits && y < rows) memcpy(to, spare, row_bytes);
    }
    jpeg_finish_decompress(codec);
    return true;
}

// Ink covers what is behind it. Programs that leave Adobe's marker store paper as 255, others as 0.
void cmyk_to_rgba(Picture* picture, bool is_inverted) {
    uint8_t* const end = picture->bytes() + picture->byte_count();
    for (uint8_t* pixel = picture->bytes(); pixel != end; pixel += 4) {
        const auto paper = [&](int i) { return is_inverted ? pixel[i] : 255 - pixel[i]; };
        const int black = paper(3);
        for (int i = 0; i < 3; ++i) {
            pixel[i] = static_cast<uint8_t>((paper(i) * black + 127) / 255);
        }
        pixel[3] = 255;
    }
}

// ---- Planes ----

constexpr int kMostRows = 2 * DCTSIZE;

// What the library reads or writes at once: a few rows of each plane, in whole blocks.
struct Strip {
    // the_rows: of the first plane. the_widths: of each, in samples.
    Strip(const std::vector<Plane>& planes, int32_t the_rows,
          const std::array<size_t, 3>& the_widths)
        : rows(the_rows), widths(the_widths) {
        size_t bytes = 0;
        for (size_t i = 0; i < planes.size(); ++i) {
            bytes += widths[i] * static_cast<size_t>(rows / planes[i].down);
        }
        samples.resize(bytes);
        uint8_t* at = samples.data();
        for (size_t i = 0; i < planes.size(); ++i) {
            for (int y = 0; y < rows / planes[i].down; ++y, at += widths[i]) lines[i][y] = at;
            arrays[i] = lines[i];
        }
    }

    int32_t rows;
    std::array<size_t, 3> widths;
    Bytes samples;
    JSAMPROW lines[3][kMostRows] = {};
    JSAMPARRAY arrays[3] = {};
};

// The layout of the planes; nothing where ours are others.
std::optional<PixelFormat> planes_of(const jpeg_decompress_struct& codec, int32_t reduction) {
    const auto has_sampling = [&](int i, int across, int down) {
        return codec.comp_info[i].h_samp_factor == across &&
               codec.comp_info[i].v_samp_factor == down;
    };
    const bool has_square_luma = has_sampling(0, 1, 1) || has_sampling(0, 2, 2);
    if (!has_square_luma && !has_sampling(0, 2, 1)) return {};
    if (codec.jpeg_color_space == JCS_GRAYSCALE) return PixelFormat::kGray;
    if (codec.jpeg_color_space != JCS_YCbCr || !has_sampling(1, 1, 1) || !has_sampling(2, 1, 1)) {
        return {};
    }
    if (!has_square_luma) return PixelFormat::kI422;
    // The codec reduces chroma by as much less as it has been before.
    const bool is_full = has_sampling(0, 1, 1) || reduction > 1;
    return is_full ? PixelFormat::kI444 : PixelFormat::kI420;
}

Strip strip_for(const jpeg_decompress_struct& codec, const std::vector<Plane>& planes,
                int32_t reduction) {
    const int block = DCTSIZE / reduction;
    std::array<size_t, 3> widths = {};
    for (size_t i = 0; i < planes.size(); ++i) {
        const jpeg_component_info& component = codec.comp_info[i];
        const int samples =
            codec.max_h_samp_factor * block / (component.h_samp_factor * planes[i].across);
        widths[i] = size_t{component.width_in_blocks} * static_cast<size_t>(samples);
    }
    return Strip(planes, codec.max_v_samp_factor * block, widths);
}

// Copies what of the strip's rows lies in the picture; `top`: of its first plane.
void take_strip(const Strip& strip, const Plane* planes, size_t count, int32_t top,
                uint8_t* picture) {
    for (size_t i = 0; i < count; ++i) {
        const Plane& plane = planes[i];
        const auto width = static_cast<size_t>(plane.size.width);
        const int32_t first = top / plane.down;
        const int32_t rows = std::min(strip.rows / plane.down, plane.size.height - first);
        for (int32_t y = 0; y < rows; ++y) {
            memcpy(picture + plane.offset + static_cast<size_t>(first + y) * width,
                   strip.lines[i][y], width);
        }
    }
}

bool read_planes(Decompressor* decoder, Strip* strip, const Plane* planes, size_t count,
                 uint8_t* picture) {
    if (setjmp(decoder->errors.jump) != 0) return false;  // NOLINT(cert-err52-cpp)
    jpeg_decompress_struct* const codec = &decoder->codec;
    while (codec->output_scanline < codec->output_height) {
        const auto top = static_cast<int32_t>(codec->output_scanline);
        jpeg_read_raw_data(codec, strip->arrays, static_cast<JDIMENSION>(strip->rows));
        take_strip(*strip, planes, count, top, picture);
    }
    jpeg_finish_decompress(codec);
    return true;
}

// ---- Writing ----

void set_density(jpeg_compress_struct* codec, const Density& density) {
    const double unit = density.is_absolute ? kInchesPerMeter : 1;
    const double x = density.x / unit + 0.5;
    const double y = density.y / unit + 0.5;
    constexpr double kPast = UINT16_MAX + 1.0;
    if (x < 1 || y < 1 || x >= kPast || y >= kPast) return;
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
    bool is_gray;
    uint8_t* gray_row;    // of a gray RGBA picture: room for one
    Strip* strip;         // of planes
    const Plane* planes;  // of planes
    size_t plane_count;
    const Listener& listener;
};

JSAMPROW row_of(const Encoding& encoding, size_t y) {
    const auto width = static_cast<size_t>(encoding.picture.size.width);
    const uint8_t* const rgba = encoding.picture.bytes() + y * width * 4;
    // The library's type lacks const; it does not write to rows given to it.
    if (!encoding.is_gray) return const_cast<uint8_t*>(rgba);
    for (size_t x = 0; x < width; ++x) encoding.gray_row[x] = rgba[4 * x];
    return encoding.gray_row;
}

// Blocks that the picture does not fill repeat its last samples.
void fill_strip(const Encoding& encoding, int32_t top) {
    const Strip& strip = *encoding.strip;
    for (size_t i = 0; i < encoding.plane_count; ++i) {
        const Plane& plane = encoding.planes[i];
        const auto width = static_cast<size_t>(plane.size.width);
        for (int32_t y = 0; y < strip.rows / plane.down; ++y) {
            const int32_t from = std::min(top / plane.down + y, plane.size.height - 1);
            uint8_t* const to = strip.lines[i][y];
            memcpy(to, encoding.picture.bytes() + plane.offset + static_cast<size_t>(from) * width,
                   width);
            memset(to + width, to[width - 1], strip.widths[i] - width);
        }
    }
}

void write_pixels(jpeg_compress_struct* codec, const Encoding& encoding) {
    while (codec->next_scanline < codec->image_height) {
        if (encoding.strip != nullptr) {
            fill_strip(encoding, static_cast<int32_t>(codec->next_scanline));
            jpeg_write_raw_data(codec, encoding.strip->arrays,
                                static_cast<JDIMENSION>(encoding.strip->rows));
        } else {
            JSAMPROW row = row_of(encoding, codec->next_scanline);
            jpeg_write_scanlines(codec, &row, 1);
        }
    }
}

bool write_picture(Encoder* encoder, const Encoding& encoding, FILE* out) {
    if (setjmp(encoder->errors.jump) != 0) return false;  // NOLINT(cert-err52-cpp)
    jpeg_compress_struct* const codec = &encoder->codec;
    const bool has_planes = encoding.strip != nullptr;
    jpeg_create_compress(codec);
    codec->progress = init_progress(&encoder->progress, encoding.listener);
    jpeg_stdio_dest(codec, out);
    codec->image_width = static_cast<JDIMENSION>(encoding.picture.size.width);
    codec->image_height = static_cast<JDIMENSION>(encoding.picture.size.height);
    if (encoding.is_gray) {
        codec->input_components = 1;
        codec->in_color_space = JCS_GRAYSCALE;
    } else {
        codec->input_components = has_planes ? 3 : 4;
        codec->in_color_space = has_planes ? JCS_YCbCr : JCS_EXT_RGBX;
    }
    jpeg_set_defaults(codec);  // 4:2:0
    jpeg_set_quality(codec, encoding.quality, TRUE);
    codec->raw_data_in = has_planes ? TRUE : FALSE;
    if (encoding.metadata.density) set_density(codec, *encoding.metadata.density);
    jpeg_start_compress(codec, TRUE);
    write_metadata(codec, encoding.picture, encoding.metadata);
    write_pixels(codec, encoding);
    jpeg_finish_compress(codec);
    return true;
}

void encode(const Encoding& encoding, FILE* out) {
    Encoder encoder;
    if (!write_picture(&encoder, encoding, out)) throw error("cannot write JPEG", encoder.errors);
}

void encode_planes(const Picture& picture, const Metadata& metadata, int quality, FILE* out,
                   const Listener& listener) {
    const std::vector<Plane> planes = tool::planes_of(picture.format, picture.size);
    const bool is_gray = picture.format == PixelFormat::kGray;
    std::array<size_t, 3> widths = {};
    for (size_t i = 0; i < planes.size(); ++i) {
        const auto width = static_cast<size_t>(planes[i].size.width);
        widths[i] = (width + DCTSIZE - 1) / DCTSIZE * DCTSIZE;
    }
    Strip strip(planes, is_gray ? DCTSIZE : 2 * DCTSIZE, widths);
    encode({picture, metadata, quality, is_gray, nullptr, &strip, planes.data(), planes.size(),
            listener},
           out);
}

}  // namespace

bool is_jpeg(const uint8_t* data, size_t size) {
    return size >= 3 && data[0] == 0xFF && data[1] == 0xD8 && data[2] == 0xFF;
}

struct JpegReader::Decoder : Decompressor {};

JpegReader::JpegReader(Bytes file)
    : file_(std::move(file)), decoder_(std::make_unique<Decoder>()), size_() {
    if (!read_header(decoder_.get(), file_.data(), file_.size())) {
        throw error("damaged JPEG", decoder_->errors);
    }
    const jpeg_decompress_struct& codec = decoder_->codec;
    size_ = checked_size(codec.image_width, codec.image_height);
    metadata_ = read_metadata(*decoder_);
}

JpegReader::~JpegReader() = default;

std::optional<PixelFormat> JpegReader::planes(int32_t reduction) const {
    return planes_of(decoder_->codec, reduction);
}

Picture JpegReader::read(const Decoding& decoding, const Listener& listener) {
    jpeg_decompress_struct& codec = decoder_->codec;
    codec.progress = init_progress(&decoder_->progress, listener);
    const PixelFormat format =
        decoding.in_planes ? planes(decoding.reduction).value() : PixelFormat::kRgba;
    Picture picture({size_.width / decoding.reduction, size_.height / decoding.reduction}, format);
    picture.is_gray = codec.jpeg_color_space == JCS_GRAYSCALE;
    bool is_read = start(decoder_.get(), decoding);
    if (is_read && decoding.in_planes) {
        const std::vector<Plane> planes = tool::planes_of(format, picture.size);
        Strip strip = strip_for(codec, planes, decoding.reduction);
        is_read =
            read_planes(decoder_.get(), &strip, planes.data(), planes.size(), picture.bytes());
    } else if (is_read) {
        Bytes spare(size_t{codec.output_width} * 4);
        is_read = read_rows(decoder_.get(), picture.size, picture.bytes(), spare.data());
        if (is_cmyk(codec)) cmyk_to_rgba(&picture, codec.saw_Adobe_marker != FALSE);
    }
    const int lost = decoder_->errors.lost;
    if (!is_read || (lost != 0 && lost != JWRN_JPEG_EOF)) {
        throw error("damaged JPEG", decoder_->errors);
    }
    if (lost == JWRN_JPEG_EOF) metadata_.damage = "the JPEG ends early, and the rest is made up";
    return picture;
}

Picture decode_jpeg(const uint8_t* data, size_t size, Metadata* metadata) {
    JpegReader reader(Bytes(data, data + size));
    Picture picture = reader.read({});
    *metadata = reader.metadata();
    return picture;
}

void encode_jpeg(const Picture& picture, const Metadata& metadata, int quality, FILE* out,
                 const Listener& listener) {
    if (picture.format != PixelFormat::kRgba) {
        return encode_planes(picture, metadata, quality, out, listener);
    }
    const bool is_gray = is_gray_file(picture, metadata);
    Bytes gray_row(is_gray ? static_cast<size_t>(picture.size.width) : 0);
    encode({picture, metadata, quality, is_gray, gray_row.data(), nullptr, nullptr, 0, listener},
           out);
}

}  // namespace tool
