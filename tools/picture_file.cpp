// SPDX-License-Identifier: Apache-2.0
#include "picture_file.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <memory>
#include <vector>

#include "codecs.h"
#include "error.h"

namespace tool {

namespace {

// Larger than any file of a picture that checked_size() lets through needs to be.
constexpr size_t kMaxFileBytes = size_t{1} << 31;

struct CloseFile {
    void operator()(FILE* file) const { fclose(file); }
};

std::vector<uint8_t> read_file(const std::string& path) {
    const std::unique_ptr<FILE, CloseFile> file(fopen(path.c_str(), "rb"));
    if (file == nullptr) throw Error(strerror(errno));
    std::vector<uint8_t> content;
    size_t filled = 0;
    do {
        if (filled > kMaxFileBytes) throw Error("the file is too large");
        content.resize(filled + filled / 2 + (size_t{1} << 16));
        filled += fread(content.data() + filled, 1, content.size() - filled, file.get());
    } while (filled == content.size());
    if (ferror(file.get()) != 0) throw Error(strerror(errno));
    content.resize(filled);
    return content;
}

Picture decode(const std::vector<uint8_t>& file) {
    if (is_png(file.data(), file.size())) return decode_png(file.data(), file.size());
    if (is_jpeg(file.data(), file.size())) return decode_jpeg(file.data(), file.size());
    if (is_ppm(file.data(), file.size())) return decode_ppm(file.data(), file.size());
    throw Error("neither PNG nor JPEG nor binary PPM (P6)");
}

}  // namespace

FileType type_of_name(const std::string& path) {
    std::string extension = std::filesystem::path(path).extension();
    for (char& letter : extension) {
        if (letter >= 'A' && letter <= 'Z') letter = static_cast<char>(letter - 'A' + 'a');
    }
    if (extension == ".png") return FileType::kPng;
    if (extension == ".jpg" || extension == ".jpeg") return FileType::kJpeg;
    if (extension == ".ppm") return FileType::kPpm;
    throw Error("the name must end in .png, .jpg, .jpeg or .ppm");
}

Picture read_picture(const std::string& path) {
    return concerning(path, [&] { return decode(read_file(path)); });
}

void write_picture(const Picture& picture, FileType type, int quality, FILE* out) {
    switch (type) {
        case FileType::kPng:
            return encode_png(picture, out);
        case FileType::kJpeg:
            return encode_jpeg(picture, quality, out);
        case FileType::kPpm:
            return encode_ppm(picture, out);
    }
}

}  // namespace tool
