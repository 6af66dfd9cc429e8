// SPDX-License-Identifier: Apache-2.0
#include "thumbnail.h"

#include <algorithm>
#include <cstring>
#include <utility>

#include "engine.h"

namespace tool {

namespace {

constexpr uint32_t kInEachByte = 0x01010101;

bool is_at_least(Size size, int32_t times, Size other) {
    return size.width / times >= other.width && size.height / times >= other.height;
}

// Of frames in 4:2:0 the library lays chroma exactly under the luma where sizes are multiples of 4.
int32_t half_side(int32_t side, PixelFormat format) {
    const int32_t unit = has_chroma_planes(format) ? 4 : 1;
    return side / 2 / unit * unit;
}

// The mean of each 2 x 2 samples, rounded. The quarter engine takes just these four when it halves,
// and drops their two low bits; a second pass, over the low bits, says what that has cost.
Picture halved(Picture source, Size size) {
    Picture result(size, source.format);
    resize(Engine::kQuarter, &source, &result);
    for (uint32_t& word : source.words) word = (word & 3 * kInEachByte) << 2;
    Picture low_bits(size, source.format);
    resize(Engine::kQuarter, &source, &low_bits);
    for (size_t i = 0; i < result.words.size(); ++i) {
        // At most 252 + 3, and 12 + 2: no byte carries into the next.
        result.words[i] += ((low_bits.words[i] + 2 * kInEachByte) >> 2) & 3 * kInEachByte;
    }
    return result;
}

// Strip by strip, each into the room of those before it, so that a large picture needs no second
// one beside it, and strips stay in the cache. RGBA and RGB.
void halve_in_strips(Picture* picture, Size half) {
    constexpr int32_t kStripRows = 16;  // of the result
    const Size size = picture->size;
    const size_t row_bytes = picture_bytes(picture->format, {size.width, 1});
    const size_t half_row_bytes = picture_bytes(picture->format, {half.width, 1});
    uint8_t* const bytes = picture->bytes();
    int32_t rows = 0;
    for (int32_t done = 0; done < half.height; done += rows) {
        rows = std::min(kStripRows, half.height - done);
        // The last takes the row that an odd height leaves.
        const bool is_last = done + rows == half.height;
        Picture strip({size.width, is_last ? size.height - 2 * done : 2 * rows}, picture->format);
        memcpy(strip.bytes(), bytes + static_cast<size_t>(2 * done) * row_bytes,
               strip.byte_count());
        const Picture half_strip = halved(std::move(strip), {half.width, rows});
        memcpy(bytes + static_cast<size_t>(done) * half_row_bytes, half_strip.bytes(),
               half_strip.byte_count());
    }
    picture->size = half;
    picture->words.resize((picture->byte_count() + 3) / 4);
}

void halve(Picture* picture, Size half) {
    if (!has_chroma_planes(picture->format)) return halve_in_strips(picture, half);
    *picture = halved(std::move(*picture), half);
}

}  // namespace

void resize_thumbnail(Picture* source, Picture* result) {
    const Size target = result->size;
    Size half = source->size;
    for (;;) {
        half = {half_side(half.width, source->format), half_side(half.height, source->format)};
        if (!is_at_least(half, 2, target)) break;
        halve(source, half);
    }
    if (!is_at_least(source->size, 2, target)) return resize(Engine::kLanczos, source, result);

    const Size twice = {2 * target.width, 2 * target.height};
    if (source->size.width != twice.width || source->size.height != twice.height) {
        Picture rest(twice, source->format);
        resize(Engine::kLanczos, source, &rest);
        *source = std::move(rest);
    }
    halve(source, target);
    *result = *source;
}

}  // namespace tool
