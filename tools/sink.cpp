// SPDX-License-Identifier: Apache-2.0
#include "sink.h"

#include <cerrno>
#include <cstring>
#include <string>

#include "convert.h"
#include "error.h"

namespace tool {

void Sink::write(const Picture& frame) {
    if (!is_first_ && is_image_file(kind_)) {
        throw Error("an image file holds one picture, but there are more");
    }
    if (frame.format == kind_.format) {
        write_in_format(frame);
    } else {
        write_in_format(converted(frame, kind_.format));
    }
    is_first_ = false;
}

void Sink::write_in_format(const Picture& frame) {
    switch (kind_.container) {
        case Container::kPng:
            return encode_png(frame, settings_.metadata, stream_, settings_.listener);
        case Container::kJpeg:
            return encode_jpeg(frame, settings_.metadata, settings_.quality, stream_,
                               settings_.listener);
        case Container::kPpm:
            return encode_ppm(frame, stream_);
        case Container::kPgm:
            return encode_pgm(frame, stream_);
        case Container::kPnm:
            return frame.is_gray ? encode_pgm(frame, stream_) : encode_ppm(frame, stream_);
        case Container::kPam:
            return encode_pam(frame, stream_);
        case Container::kY4m: {
            const std::string head =
                (is_first_ ? y4m_header_line(*settings_.y4m_header) : "") + "FRAME\n";
            write_bytes(head.data(), head.size());
            return write_bytes(frame.bytes(), frame.byte_count());
        }
        case Container::kRaw:
            return write_bytes(frame.bytes(), frame.byte_count());
    }
}

void Sink::write_bytes(const void* bytes, size_t count) {
    if (fwrite(bytes, 1, count, stream_) != count) throw Error(strerror(errno));
}

void check_conversion(FileKind from, FileKind to) {
    const bool from_y4m = from.container == Container::kY4m;
    if (to.container == Container::kY4m && !from_y4m) {
        throw Error("only Y4M can be written as Y4M");
    }
    if (from_y4m && to.container != Container::kY4m && !is_420(to.format)) {
        throw Error("Y4M can be written as .y4m, .i420, .yuv or .nv21 only");
    }
}

}  // namespace tool
