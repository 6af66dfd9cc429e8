// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "codecs.h"
#include "file_kind.h"
#include "input.h"
#include "metadata.h"
#include "picture.h"
#include "y4m.h"

namespace tool {

// How raw frames are to be read; files of frames do not say so themselves.
struct RawLayout {
    PixelFormat format;
    Size size;
};

// Frames of one size and format, one after the other. Everything throws Error.
class Source {
public:
    virtual ~Source() = default;

    // What decode_as() can ask for: the format of planes, at a reduction.
    virtual std::optional<PixelFormat> planes(int32_t /*reduction*/) const { return {}; }
    virtual bool is_reducible() const { return false; }
    // Before the first frame is read.
    virtual void decode_as(const Decoding& /*decoding*/) {}

    // Reads the next frame into *frame, which is empty or holds the one before; false at the end.
    virtual bool next(Picture* frame) = 0;

    FileKind kind() const { return kind_; }
    Size size() const { return size_; }
    // Of Y4M only.
    const std::optional<Y4mHeader>& y4m_header() const { return y4m_header_; }
    // The damage of a picture is known when it has been read.
    const Metadata& metadata() const { return metadata_; }
    // What the user should know of how frames are read; empty: nothing.
    const std::string& remark() const { return remark_; }
    double part_read() const { return input_.part_read(); }

protected:
    Source(Input input, FileKind kind) : input_(std::move(input)), kind_(kind), size_() {}

    // Reads one frame's bytes; false at the end of the file. A frame that is cut short is an Error.
    bool read_frame(uint8_t* to, size_t bytes);

    Input input_;
    FileKind kind_;
    Size size_;
    std::optional<Y4mHeader> y4m_header_;
    Metadata metadata_;
    std::string remark_;

private:
    int64_t frames_read_ = 0;
};

// Opens a file, or standard input for "-". With a layout it holds raw frames, otherwise its content
// decides what it is.
std::unique_ptr<Source> open_source(const std::string& path, const std::optional<RawLayout>& raw,
                                    const Listener& listener = {});

}  // namespace tool
