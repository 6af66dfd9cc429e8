// SPDX-License-Identifier: Apache-2.0
#include "metadata.h"

#include <cstring>
#include <utility>

#include "exif.h"

namespace tool {

namespace {

bool is_gray_profile(const Bytes& icc) {
    constexpr size_t kColorSpaceOffset = 16;
    return icc.size() >= kColorSpaceOffset + 4 &&
           memcmp(icc.data() + kColorSpaceOffset, "GRAY", 4) == 0;
}

}  // namespace

Metadata resized_metadata(const Metadata& source, Size size, bool is_turned) {
    Metadata metadata = source;
    if (!source.exif.empty()) metadata.exif = resized_exif(source.exif, size, is_turned);
    if (is_turned && metadata.density && lies_on_its_side(orientation_of(source))) {
        std::swap(metadata.density->x, metadata.density->y);
    }
    return metadata;
}

Orientation orientation_of(const Metadata& metadata) {
    const int value = metadata.exif.empty() ? 0 : exif_orientation(metadata.exif);
    return value >= 1 && value <= 8 ? static_cast<Orientation>(value) : Orientation::kUpright;
}

bool fits_gray(const Metadata& metadata) {
    return metadata.icc.empty() || is_gray_profile(metadata.icc);
}

bool is_gray_file(const Picture& picture, const Metadata& metadata) {
    return picture.is_gray && fits_gray(metadata);
}

bool has_fitting_profile(const Picture& picture, const Metadata& metadata) {
    return !metadata.icc.empty() && (picture.is_gray || !is_gray_profile(metadata.icc));
}

}  // namespace tool
