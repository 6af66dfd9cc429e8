// SPDX-License-Identifier: Apache-2.0
// One pair of functions per file type. Decoders take a whole file in memory and look at nothing but
// its content; encoders write to a stream. Pictures are RGBA. All throw Error, without the name of
// the file.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <functional>
#include <memory>
#include <optional>

#include "metadata.h"
#include "picture.h"

namespace tool {

// Hears from PNG and JPEG which part of a picture they have read or written, 0 to 1. It must not
// throw: it is called from C.
using Listener = std::function<void(double part)>;

bool is_png(const uint8_t* data, size_t size);
Picture decode_png(const uint8_t* data, size_t size, Metadata* metadata,
                   const Listener& listener = {});
void encode_png(const Picture& picture, const Metadata& metadata, FILE* out,
                const Listener& listener = {});

bool is_jpeg(const uint8_t* data, size_t size);

// How to decode a picture.
struct Decoding {
    bool in_planes = false;  // as the file holds them, otherwise RGBA
    // 1, 2, 4 or 8: each sample is about the mean of so many in both directions; what an uneven
    // size leaves at the right and at the bottom is left out.
    int32_t reduction = 1;
};

// A JPEG whose header has been read.
class JpegReader {
public:
    explicit JpegReader(Bytes file);
    ~JpegReader();

    Size size() const { return size_; }
    const Metadata& metadata() const { return metadata_; }

    // The format of the picture in planes; nothing where there is none for it.
    std::optional<PixelFormat> planes(int32_t reduction) const;

    // Once. A file that ends early gives a picture all the same; the metadata says so then.
    Picture read(const Decoding& decoding, const Listener& listener = {});

private:
    struct Decoder;

    Bytes file_;
    std::unique_ptr<Decoder> decoder_;
    Size size_;
    Metadata metadata_;
};

Picture decode_jpeg(const uint8_t* data, size_t size, Metadata* metadata);
// A picture in I420 or gray is written without a trip through RGB. quality: 1 to 100. Alpha is
// dropped.
void encode_jpeg(const Picture& picture, const Metadata& metadata, int quality, FILE* out,
                 const Listener& listener = {});

// PBM, PGM, PPM (P1 to P6) and PAM (P7), which hold no metadata. Of several pictures the first.
bool is_pnm(const uint8_t* data, size_t size);
Picture decode_pnm(const uint8_t* data, size_t size, Metadata* metadata);
// P6, P5 and P7, binary. The first two drop alpha, and PGM colours.
void encode_ppm(const Picture& picture, FILE* out);
void encode_pgm(const Picture& picture, FILE* out);
void encode_pam(const Picture& picture, FILE* out);

}  // namespace tool
