// SPDX-License-Identifier: Apache-2.0
// The header line of Y4M, uncompressed video for pipes: "YUV4MPEG2", then tags of a letter and a
// value. Each frame follows as a line that starts with "FRAME" and the planes of a picture, of
// which samples of more than 8 bits take two bytes, little end first.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>

#include "picture.h"

namespace tool {

struct Y4mHeader {
    Size size;
    // Width to height of a pixel; 0:0 when not known.
    int64_t aspect_width = 0;
    int64_t aspect_height = 0;
    PixelFormat format = PixelFormat::kI420;
    int bits = 8;            // of a sample, as it was read; what is written has 8
    std::string other_tags;  // as they came, but for what says the bits; each with a space in front
};

constexpr size_t kMaxY4mLine = 4096;

// The line comes without its line feed. Throws Error when it is damaged, or when it announces
// anything but progressive pictures in 4:2:0, 4:2:2, 4:4:4 or mono, of 8 to 16 bits.
Y4mHeader parse_y4m_header(const std::string& line);

// Ends with a line feed.
std::string y4m_header_line(const Y4mHeader& header);

// The header of the video scaled to `picture` and put on a canvas of size `result`. A changed shape
// of the picture is a changed shape of its pixels; with keep_aspect it is just rounding.
Y4mHeader resized_y4m_header(const Y4mHeader& header, Size picture, Size result, bool keep_aspect);

}  // namespace tool
