// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdio>
#include <string>

namespace tool {

// A file that comes into being whole or not at all: it is written under a temporary name in the
// same folder and renamed by commit(). Without commit(), or when a signal ends the program, the
// temporary file is removed and what stood under the final name stays as it was.
//
// What exists and is no regular file (a pipe, /dev/null) is written to directly, and so is standard
// output, "-". At most one object at a time.
class OutputFile {
public:
    // Throws Error.
    explicit OutputFile(const std::string& path);
    ~OutputFile();
    OutputFile(const OutputFile&) = delete;
    OutputFile& operator=(const OutputFile&) = delete;

    FILE* stream() { return stream_; }

    // Throws Error when something could not be written.
    void commit();

private:
    void open();

    std::string name_;  // as the user gave it
    std::string path_;
    std::string temporary_;  // empty when path_ itself is written to
    FILE* stream_ = nullptr;
};

}  // namespace tool
