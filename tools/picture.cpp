// SPDX-License-Identifier: Apache-2.0
#include "picture.h"

namespace tool {

std::vector<uint8_t> rgb_bytes(const Picture& picture) {
    std::vector<uint8_t> rgb(picture.size.pixels() * 3);
    const uint8_t* from = picture.bytes();
    for (size_t i = 0; i < rgb.size(); i += 3, from += 4) {
        rgb[i] = from[0];
        rgb[i + 1] = from[1];
        rgb[i + 2] = from[2];
    }
    return rgb;
}

}  // namespace tool
