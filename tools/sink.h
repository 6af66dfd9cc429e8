// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdio>
#include <optional>

#include "codecs.h"
#include "file_kind.h"
#include "metadata.h"
#include "picture.h"
#include "y4m.h"

namespace tool {

struct SinkSettings {
    std::optional<Y4mHeader> y4m_header;  // of Y4M
    Metadata metadata;                    // of image files
    int quality;                          // of JPEG, 1 to 100
    Listener listener;                    // of PNG and JPEG
};

// Writes frames to a stream as the kind of file asked for, converting them where need be.
// Everything throws Error.
class Sink {
public:
    Sink(FileKind kind, const SinkSettings& settings, FILE* stream)
        : kind_(kind), settings_(settings), stream_(stream) {}

    void write(const Picture& frame);

private:
    void write_in_format(const Picture& frame);
    void write_bytes(const void* bytes, size_t count);

    FileKind kind_;
    SinkSettings settings_;
    FILE* stream_;
    bool is_first_ = true;
};

// Whether frames of one kind of file can be written as another; Error when not.
void check_conversion(FileKind from, FileKind to);

}  // namespace tool
