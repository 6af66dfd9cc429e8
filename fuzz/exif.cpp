// SPDX-License-Identifier: Apache-2.0
// What cameras record beside a picture.
#include "exif.h"

#include <vector>

#include "tool_support.h"

using namespace fuzz;

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    constexpr tool::Size kSize = {40, 30};
    std::vector<uint8_t> exif(tool::kExifHead, tool::kExifHead + tool::kExifHeadBytes);
    exif.insert(exif.end(), data, data + size);
    const int orientation = tool::exif_orientation(exif);
    const bool is_srgb = tool::exif_claims_srgb(exif);
    for (const bool is_upright : {false, true}) {
        const std::vector<uint8_t> resized = tool::resized_exif(exif, kSize, is_upright);
        if (resized.empty()) continue;
        const int kept = tool::exif_orientation(resized);
        require(is_upright ? kept == 0 || kept == 1 : kept == orientation,
                "the orientation is not what it should be");
        require(tool::exif_claims_srgb(resized) == is_srgb, "the colour space has changed");
    }
    return 0;
}
