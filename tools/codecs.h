// SPDX-License-Identifier: Apache-2.0
// One pair of functions per file type. Decoders take a whole file in memory and look at nothing but
// its content; encoders write to a stream. Pictures are RGBA. All throw Error, without the name of
// the file.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>

#include "metadata.h"
#include "picture.h"

namespace tool {

bool is_png(const uint8_t* data, size_t size);
Picture decode_png(const uint8_t* data, size_t size, Metadata* metadata);
void encode_png(const Picture& picture, const Metadata& metadata, FILE* out);

bool is_jpeg(const uint8_t* data, size_t size);
// A file that ends early gives a picture all the same; the metadata says so.
Picture decode_jpeg(const uint8_t* data, size_t size, Metadata* metadata);
// quality: 1 to 100. Alpha is dropped.
void encode_jpeg(const Picture& picture, const Metadata& metadata, int quality, FILE* out);

// PBM, PGM, PPM (P1 to P6) and PAM (P7), which hold no metadata. Of several pictures the first.
bool is_pnm(const uint8_t* data, size_t size);
Picture decode_pnm(const uint8_t* data, size_t size, Metadata* metadata);
// P6, P5 and P7, binary. The first two drop alpha, and PGM colours.
void encode_ppm(const Picture& picture, FILE* out);
void encode_pgm(const Picture& picture, FILE* out);
void encode_pam(const Picture& picture, FILE* out);

}  // namespace tool
