// SPDX-License-Identifier: Apache-2.0
#include "thumbnail.h"

#include "engine.h"
#include "lanczos.h"

namespace tool {

namespace {

bool is_at_least(Size size, int32_t times, Size other) {
    return size.width / times >= other.width && size.height / times >= other.height;
}

// A row of the mean of each 2 x 2 samples of two rows, rounded.
template <size_t kChannels>
void halve_rows(const uint8_t* top, const uint8_t* bottom, uint8_t* to, size_t samples) {
    for (size_t x = 0; x < samples; ++x) {
        for (size_t c = 0; c < kChannels; ++c) {
            const size_t left = 2 * x * kChannels + c;
            const size_t right = left + kChannels;
            to[x * kChannels + c] = static_cast<uint8_t>(
                (top[left] + top[right] + bottom[left] + bottom[right] + 2) / 4);
        }
    }
}

// An odd last row or column is left out. The result may lie where the source lies: no sample is
// written before those that follow it have been read.
template <size_t kChannels>
void halve(const uint8_t* from, Size size, uint8_t* to) {
    const size_t row_bytes = static_cast<size_t>(size.width) * kChannels;
    const auto half_width = static_cast<size_t>(size.width / 2);
    for (int32_t y = 0; y < size.height / 2; ++y) {
        halve_rows<kChannels>(from, from + row_bytes, to, half_width);
        from += 2 * row_bytes;
        to += half_width * kChannels;
    }
}

void halve(const uint8_t* from, Size size, uint8_t* to, int32_t channels) {
    switch (channels) {
        case 1:
            return halve<1>(from, size, to);
        case 2:
            return halve<2>(from, size, to);
        case 3:
            return halve<3>(from, size, to);
        default:
            return halve<4>(from, size, to);
    }
}

}  // namespace

void resize_thumbnail(uint8_t* src, Size from, uint8_t* dst, Size to, int32_t channels) {
    while (is_at_least(from, 4, to)) {
        halve(src, from, src, channels);
        from = {from.width / 2, from.height / 2};
    }
    if (!is_at_least(from, 2, to)) return resize_lanczos(src, from, dst, to, channels);

    const Size twice = {2 * to.width, 2 * to.height};
    if (from.width == twice.width && from.height == twice.height) {
        return halve(src, from, dst, channels);
    }
    const size_t row_bytes = static_cast<size_t>(to.width) * static_cast<size_t>(channels);
    lanczos_in_bands(src, from, twice, channels, threads_of_picture(),
                     [=](int32_t first_row, int32_t rows, const uint8_t* samples) {
                         uint8_t* const result =
                             dst + static_cast<size_t>(first_row / 2) * row_bytes;
                         halve(samples, {twice.width, rows}, result, channels);
                     });
}

}  // namespace tool
