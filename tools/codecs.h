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

// Binary PPM (P6), which holds no metadata.
bool is_ppm(const uint8_t* data, size_t size);
Picture decode_ppm(const uint8_t* data, size_t size, Metadata* metadata);
// Alpha is dropped.
void encode_ppm(const Picture& picture, FILE* out);

}  // namespace tool
