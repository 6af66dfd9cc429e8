// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdio>
#include <string>

#include "picture.h"

namespace tool {

enum class FileType { kPng, kJpeg, kPpm };

// All of these throw Error; only read_picture() states the name of the file.

// The type that the ending of a file's name stands for.
FileType type_of_name(const std::string& path);

// Reads a picture of any of these types, told apart by content.
Picture read_picture(const std::string& path);

// quality: of JPEG, 1 to 100.
void write_picture(const Picture& picture, FileType type, int quality, FILE* out);

}  // namespace tool
