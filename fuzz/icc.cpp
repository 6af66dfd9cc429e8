// SPDX-License-Identifier: Apache-2.0
// Colour profiles, on their way into a JPEG and a PNG and back.
#include <cstring>
#include <memory>

#include "codecs.h"
#include "tool_support.h"

using namespace fuzz;

namespace {

using Encode = void(const tool::Picture&, const tool::Metadata&, FILE*);
using Decode = tool::Picture(const uint8_t*, size_t, tool::Metadata*);

tool::Metadata there_and_back(const tool::Picture& picture, const tool::Metadata& metadata,
                              Encode* encode, Decode* decode) {
    char* bytes = nullptr;
    size_t count = 0;
    FILE* const file = open_memstream(&bytes, &count);
    require(file != nullptr, "no stream in memory");
    encode(picture, metadata, file);
    require(fclose(file) == 0, "the stream in memory cannot be closed");
    const std::unique_ptr<char, decltype(&free)> owner(bytes, free);
    tool::Metadata result;
    decode(reinterpret_cast<const uint8_t*>(bytes), count, &result);
    return result;
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    if (size == 0) return 0;
    tool::set_most_pixels(kMostPixels);
    tool::Picture picture({1, 1});
    picture.is_gray = data[0] % 2 != 0;
    tool::Metadata metadata;
    // Long ones take several segments of a JPEG.
    const size_t repeats = data[0] / 2 == 77 ? 300 : 1;
    for (size_t i = 0; i < repeats; ++i) {
        metadata.icc.insert(metadata.icc.end(), data + 1, data + size);
    }
    const bool fits = tool::has_fitting_profile(picture, metadata);
    const auto encode_jpeg = [](const tool::Picture& its, const tool::Metadata& with, FILE* out) {
        tool::encode_jpeg(its, with, 90, out);
    };
    const tool::Bytes by_jpeg =
        there_and_back(picture, metadata, encode_jpeg, tool::decode_jpeg).icc;
    require(by_jpeg == (fits ? metadata.icc : tool::Bytes()), "JPEG has changed a profile");
    // Packing takes long.
    if (data[0] % 16 > 1) return 0;
    const auto encode_png = [](const tool::Picture& its, const tool::Metadata& with, FILE* out) {
        tool::encode_png(its, with, out);
    };
    const auto decode_png = [](const uint8_t* file, size_t bytes, tool::Metadata* its) {
        return tool::decode_png(file, bytes, its);
    };
    const tool::Bytes by_png = there_and_back(picture, metadata, encode_png, decode_png).icc;
    // libpng leaves out those that it finds fault with.
    require(by_png.empty() || (fits && by_png == metadata.icc), "PNG has changed a profile");
    return 0;
}
