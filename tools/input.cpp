// SPDX-License-Identifier: Apache-2.0
#include "input.h"

#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <cstring>

#include "error.h"

namespace tool {

namespace {

// Larger than any file of a picture that checked_size() lets through needs to be.
constexpr size_t kMaxWholeFile = size_t{1} << 31;

}  // namespace

Input::Input(const std::string& path)
    : file_(path == "-" ? fdopen(0, "rb") : fopen(path.c_str(), "rb")) {
    if (file_ == nullptr) throw Error(strerror(errno));
    struct stat status = {};  // as it stays should the system not tell
    static_cast<void>(fstat(fileno(file_.get()), &status));
    if (S_ISREG(status.st_mode)) size_ = status.st_size;
}

const std::vector<uint8_t>& Input::peek(size_t count) {
    head_.resize(count);
    head_.resize(fread(head_.data(), 1, count, file_.get()));
    if (ferror(file_.get()) != 0) throw Error(strerror(errno));
    return head_;
}

size_t Input::read(uint8_t* buffer, size_t count) {
    const size_t from_head = std::min(count, head_.size());
    std::copy_n(head_.begin(), from_head, buffer);
    head_.erase(head_.begin(), head_.begin() + static_cast<ptrdiff_t>(from_head));
    const size_t total = from_head + fread(buffer + from_head, 1, count - from_head, file_.get());
    if (ferror(file_.get()) != 0) throw Error(strerror(errno));
    taken_ += static_cast<int64_t>(total);
    return total;
}

bool Input::read_line(std::string* line, size_t limit) {
    line->clear();
    for (uint8_t byte = 0; line->size() <= limit && read(&byte, 1) == 1;) {
        if (byte == '\n') return true;
        *line += static_cast<char>(byte);
    }
    return false;
}

std::vector<uint8_t> Input::read_all() {
    std::vector<uint8_t> content;
    size_t filled = 0;
    do {
        if (filled > kMaxWholeFile) throw Error("the file is too large");
        content.resize(filled + filled / 2 + (size_t{1} << 16));
        filled += read(content.data() + filled, content.size() - filled);
    } while (filled == content.size());
    content.resize(filled);
    return content;
}

double Input::part_read() const {
    return size_ > 0 ? static_cast<double>(taken_) / static_cast<double>(size_) : -1;
}

}  // namespace tool
