// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdio>
#include <string>

namespace tool {

// A file that comes into being whole or not at all. It has no name until commit() gives it the
// final one, so whatever ends the program before leaves nothing behind, and what stood under that
// name stays as it was. Where the file system knows no files without a name, a temporary one in the
// same folder stands in, which is removed when a signal that can be caught ends the program.
//
// What exists and is no regular file (a pipe, /dev/null) is written to directly, and so is standard
// output, "-".
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
    int open_new();
    void publish();
    void discard();

    std::string name_;  // as the user gave it
    std::string path_;
    std::string temporary_;  // the stand-in's name; empty when there is none
    bool is_nameless_ = false;
    FILE* stream_ = nullptr;
};

}  // namespace tool
