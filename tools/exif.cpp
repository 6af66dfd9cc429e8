// SPDX-License-Identifier: Apache-2.0
#include "exif.h"

#include <libexif/exif-data.h>

#include <cstdlib>
#include <memory>
#include <new>

namespace tool {

namespace {

struct Unref {
    void operator()(ExifData* data) const { exif_data_unref(data); }
};

using Data = std::unique_ptr<ExifData, Unref>;

Data parse(const std::vector<uint8_t>& exif) {
    Data data(exif_data_new());
    if (data == nullptr) throw std::bad_alloc();
    // What a camera has written is kept as it is.
    exif_data_unset_option(data.get(), EXIF_DATA_OPTION_IGNORE_UNKNOWN_TAGS);
    exif_data_unset_option(data.get(), EXIF_DATA_OPTION_FOLLOW_SPECIFICATION);
    exif_data_set_option(data.get(), EXIF_DATA_OPTION_DONT_CHANGE_MAKER_NOTE);
    exif_data_load_data(data.get(), exif.data(), static_cast<unsigned>(exif.size()));
    return data;
}

// The single number of an entry; 0 where there is no such entry.
uint32_t number_of(const Data& data, ExifIfd directory, ExifTag tag) {
    const ExifEntry* const entry = exif_content_get_entry(data->ifd[directory], tag);
    if (entry == nullptr || entry->components != 1) return 0;
    const ExifByteOrder order = exif_data_get_byte_order(data.get());
    if (entry->format == EXIF_FORMAT_SHORT) return exif_get_short(entry->data, order);
    if (entry->format == EXIF_FORMAT_LONG) return exif_get_long(entry->data, order);
    return 0;
}

// Changes a number that is there.
void set_number(const Data& data, ExifIfd directory, ExifTag tag, int32_t value) {
    const ExifEntry* const entry = exif_content_get_entry(data->ifd[directory], tag);
    if (entry == nullptr || entry->components != 1) return;
    const ExifByteOrder order = exif_data_get_byte_order(data.get());
    if (entry->format == EXIF_FORMAT_SHORT) {
        exif_set_short(entry->data, order, static_cast<ExifShort>(value));
    } else if (entry->format == EXIF_FORMAT_LONG) {
        exif_set_long(entry->data, order, static_cast<ExifLong>(value));
    }
}

void remove_thumbnail(const Data& data) {
    free(data->data);
    data->data = nullptr;
    data->size = 0;
    ExifContent* const directory = data->ifd[EXIF_IFD_1];
    while (directory->count > 0) exif_content_remove_entry(directory, directory->entries[0]);
}

}  // namespace

int exif_orientation(const std::vector<uint8_t>& exif) {
    return static_cast<int>(number_of(parse(exif), EXIF_IFD_0, EXIF_TAG_ORIENTATION));
}

bool exif_claims_srgb(const std::vector<uint8_t>& exif) {
    return number_of(parse(exif), EXIF_IFD_EXIF, EXIF_TAG_COLOR_SPACE) == 1;
}

std::vector<uint8_t> resized_exif(const std::vector<uint8_t>& exif, Size size, bool is_upright) {
    const Data data = parse(exif);
    remove_thumbnail(data);
    set_number(data, EXIF_IFD_EXIF, EXIF_TAG_PIXEL_X_DIMENSION, size.width);
    set_number(data, EXIF_IFD_EXIF, EXIF_TAG_PIXEL_Y_DIMENSION, size.height);
    set_number(data, EXIF_IFD_0, EXIF_TAG_IMAGE_WIDTH, size.width);
    set_number(data, EXIF_IFD_0, EXIF_TAG_IMAGE_LENGTH, size.height);
    if (is_upright) set_number(data, EXIF_IFD_0, EXIF_TAG_ORIENTATION, 1);

    unsigned entries = 0;
    for (const ExifContent* directory : data->ifd) entries += directory->count;
    if (entries == 0) return {};
    unsigned char* bytes = nullptr;
    unsigned count = 0;
    exif_data_save_data(data.get(), &bytes, &count);
    const std::unique_ptr<unsigned char, decltype(&free)> owner(bytes, free);
    return std::vector<uint8_t>(bytes, bytes + count);
}

}  // namespace tool
