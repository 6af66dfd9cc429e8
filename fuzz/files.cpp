// SPDX-License-Identifier: Apache-2.0
// Files of one kind, by way of the door through which the tool reads all of them: the picture or
// the frames, and what is said beside them. FUZZ_MAGIC is what such files begin with.
#include <sys/mman.h>
#include <unistd.h>
#include <zlib.h>

#include <algorithm>
#include <cstring>
#include <vector>

#include "metadata.h"
#include "source.h"
#include "tool_support.h"

using namespace fuzz;

namespace {

constexpr char kMagic[] = FUZZ_MAGIC;
constexpr size_t kMagicBytes = sizeof(kMagic) - 1;
constexpr char kPngMagic[] = "\x89PNG\r\n\x1A\n";

// A file without a folder, rewritten for each run.
class MemoryFile {
public:
    MemoryFile() : file_(memfd_create("fuzz", MFD_CLOEXEC)) {
        require(file_ >= 0, "no file in memory");
        path_ = "/proc/self/fd/" + std::to_string(file_);
    }
    ~MemoryFile() { close(file_); }
    MemoryFile(const MemoryFile&) = delete;
    MemoryFile& operator=(const MemoryFile&) = delete;

    const std::string& holding(const std::vector<uint8_t>& content) {
        const auto size = static_cast<off_t>(content.size());
        require(
            ftruncate(file_, size) == 0 && pwrite(file_, content.data(), content.size(), 0) == size,
            "the file in memory cannot be written");
        return path_;
    }

private:
    int file_;
    std::string path_;
};

uint32_t big_endian(const uint8_t* bytes) {
    return uint32_t{bytes[0]} << 24 | uint32_t{bytes[1]} << 16 | uint32_t{bytes[2]} << 8 | bytes[3];
}

// Gives each chunk of a PNG the checksum that it should have: hardly any change of its content
// would get past the wrong one.
void mend_checksums(std::vector<uint8_t>* png) {
    constexpr size_t kHead = 8;  // length and type
    constexpr size_t kChecksum = 4;
    for (size_t at = kMagicBytes; png->size() - at >= kHead + kChecksum;) {
        uint8_t* const chunk = png->data() + at;
        const size_t content = big_endian(chunk);
        if (content > png->size() - at - kHead - kChecksum) return;
        const auto checksum =
            static_cast<uint32_t>(crc32(0, chunk + 4, static_cast<uInt>(content + 4)));
        for (size_t i = 0; i < kChecksum; ++i) {
            chunk[kHead + content + i] = static_cast<uint8_t>(checksum >> (24 - 8 * i));
        }
        at += kHead + content + kChecksum;
    }
}

void check_metadata(const tool::Metadata& metadata, tool::Size size) {
    for (const bool is_turned : {false, true}) {
        const tool::Metadata resized = tool::resized_metadata(metadata, size, is_turned);
        require(resized.icc == metadata.icc, "a profile has changed");
        require(!is_turned || orientation_of(resized) == tool::Orientation::kUpright,
                "a picture that was turned is said not to be");
    }
}

// Lets the source decode as the tool may ask it to, and returns the size that the frames then have.
tool::Size choose_decoding(uint8_t choice, tool::Source* source) {
    const tool::Size size = source->size();
    tool::Decoding decoding;
    if (source->is_reducible()) decoding.reduction = 1 << (choice >> 1 & 3);
    const tool::Size reduced = {size.width / decoding.reduction, size.height / decoding.reduction};
    if (reduced.width == 0 || reduced.height == 0) return size;
    const bool is_even = reduced.width % 2 == 0 && reduced.height % 2 == 0;
    decoding.in_planes = (choice & 1) != 0 && is_even && source->planes(decoding.reduction);
    source->decode_as(decoding);
    return reduced;
}

void read(const std::string& path, uint8_t choice) {
    const auto source = tool::open_source(path, {});
    require(source->size().width > 0 && source->size().height > 0 &&
                int64_t(source->size().pixels()) <= kMostPixels,
            "a size out of bounds");
    check_metadata(source->metadata(), source->size());
    const tool::Size size = choose_decoding(choice, source.get());
    tool::Picture frame;
    while (source->next(&frame)) {
        require(frame.size.width == size.width && frame.size.height == size.height,
                "a frame of another size");
        require(frame.words.size() * sizeof(uint32_t) >= frame.byte_count(),
                "a frame with too few pixels");
    }
    if (!source->y4m_header()) return;
    const std::string line = y4m_header_line(*source->y4m_header());
    const tool::Y4mHeader again = tool::parse_y4m_header(line.substr(0, line.size() - 1));
    require(y4m_header_line(again) == line, "a Y4M header is not read as it is written");
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static MemoryFile file;
    tool::set_most_pixels(kMostPixels);
    std::vector<uint8_t> content(data, data + size);
    content.resize(std::max(size, kMagicBytes));
    memcpy(content.data(), kMagic, kMagicBytes);
    if (memcmp(kMagic, kPngMagic, kMagicBytes) == 0) mend_checksums(&content);
    const std::string& path = file.holding(content);
    succeeds([&] { read(path, content.back()); });
    return 0;
}
