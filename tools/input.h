// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <memory>
#include <string>
#include <vector>

namespace tool {

// A file, or standard input for "-", read once from front to back. Everything throws Error.
class Input {
public:
    explicit Input(const std::string& path);

    // The first bytes, without taking them: up to `count`, fewer when the file is shorter. Before
    // the first read only.
    const std::vector<uint8_t>& peek(size_t count);

    // Fills the buffer. Returns how many bytes that took: fewer than `count` at the end.
    size_t read(uint8_t* buffer, size_t count);

    // Reads to and including the next line feed, which is dropped. False at the end of the file,
    // also when bytes without a line feed stand before it, and when there are more than `limit`.
    bool read_line(std::string* line, size_t limit);

    std::vector<uint8_t> read_all();

    // How much has been read, 0 to 1; negative when the whole is not known.
    double part_read() const;

private:
    struct Close {
        void operator()(FILE* file) const { static_cast<void>(fclose(file)); }
    };

    std::unique_ptr<FILE, Close> file_;
    std::vector<uint8_t> head_;  // peeked and not yet read
    int64_t size_ = 0;           // 0: not known
    int64_t taken_ = 0;
};

}  // namespace tool
