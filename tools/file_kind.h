// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

#include "picture.h"

namespace tool {

// kPnm: PGM where the picture is gray, PPM elsewhere.
enum class Container { kPng, kJpeg, kPnm, kPpm, kPgm, kPam, kY4m, kRaw };

struct FileKind {
    Container container;
    PixelFormat format;  // of frames in kRaw and kY4m; image files hold RGBA as far as we see
};

// PNG and the like, which hold one picture; not frames.
bool is_image_file(FileKind kind);

// Whether such a file can hold transparent pixels.
bool holds_alpha(FileKind kind);

// What the ending of a file's name stands for. Throws Error when it stands for nothing.
FileKind kind_of_name(const std::string& path);

}  // namespace tool
