// SPDX-License-Identifier: Apache-2.0
// EXIF, what cameras record, as JPEG holds it: "Exif", two zeros, and a TIFF structure.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "size.h"

namespace tool {

constexpr char kExifHead[] = "Exif\0";  // and the string's own zero
constexpr size_t kExifHeadBytes = sizeof(kExifHead);

// The orientation's value as it stands there, 0 where there is none.
int exif_orientation(const std::vector<uint8_t>& exif);

// Whether it says that colours are sRGB.
bool exif_claims_srgb(const std::vector<uint8_t>& exif);

// The same for a picture of another size: without the thumbnail, and upright if so asked. Empty
// where the structure is damaged.
std::vector<uint8_t> resized_exif(const std::vector<uint8_t>& exif, Size size, bool is_upright);

}  // namespace tool
