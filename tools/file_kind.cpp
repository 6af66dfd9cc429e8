// SPDX-License-Identifier: Apache-2.0
#include "file_kind.h"

#include <filesystem>

#include "error.h"

namespace tool {

namespace {

struct Ending {
    const char* text;
    FileKind kind;
};

constexpr Ending kEndings[] = {
    {".png", {Container::kPng, PixelFormat::kRgba}},
    {".jpg", {Container::kJpeg, PixelFormat::kRgba}},
    {".jpeg", {Container::kJpeg, PixelFormat::kRgba}},
    {".ppm", {Container::kPpm, PixelFormat::kRgba}},
    {".pgm", {Container::kPgm, PixelFormat::kRgba}},
    {".pnm", {Container::kPnm, PixelFormat::kRgba}},
    {".pam", {Container::kPam, PixelFormat::kRgba}},
    {".y4m", {Container::kY4m, PixelFormat::kI420}},
    {".nv21", {Container::kRaw, PixelFormat::kNv21}},
    {".i420", {Container::kRaw, PixelFormat::kI420}},
    {".yuv", {Container::kRaw, PixelFormat::kI420}},
    {".rgba", {Container::kRaw, PixelFormat::kRgba}},
    {".rgb", {Container::kRaw, PixelFormat::kRgb}},
};

}  // namespace

bool is_image_file(FileKind kind) {
    return kind.container != Container::kRaw && kind.container != Container::kY4m;
}

bool holds_alpha(FileKind kind) {
    return kind.container == Container::kPng || kind.container == Container::kPam ||
           (kind.container == Container::kRaw && kind.format == PixelFormat::kRgba);
}

FileKind kind_of_name(const std::string& path) {
    std::string extension = std::filesystem::path(path).extension();
    for (char& letter : extension) {
        if (letter >= 'A' && letter <= 'Z') letter = static_cast<char>(letter - 'A' + 'a');
    }
    std::string known;
    for (const Ending& ending : kEndings) {
        if (extension == ending.text) return ending.kind;
        known += (known.empty() ? "" : " ") + std::string(ending.text);
    }
    throw Error("the name must end in one of: " + known);
}

}  // namespace tool
