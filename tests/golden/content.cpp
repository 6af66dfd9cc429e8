// SPDX-License-Identifier: Apache-2.0
#include "golden/content.h"

namespace golden {

namespace {

// The splitmix64 sequence.
class Numbers {
public:
    explicit Numbers(uint64_t seed) : state_(seed) {}

    uint64_t next() {
        uint64_t z = state_ += 0x9E3779B97F4A7C15U;
        z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9U;
        z = (z ^ (z >> 27)) * 0x94D049BB133111EBU;
        return z ^ (z >> 31);
    }

private:
    uint64_t state_;
};

std::vector<uint8_t> noise(uint64_t seed, size_t count) {
    Numbers numbers(seed);
    std::vector<uint8_t> bytes;
    bytes.reserve(count + 7);
    while (bytes.size() < count) {
        const uint64_t number = numbers.next();
        for (int i = 0; i < 8; ++i) bytes.push_back(static_cast<uint8_t>(number >> (8 * i)));
    }
    bytes.resize(count);
    return bytes;
}

std::string by(int32_t w, int32_t h) {
    return std::to_string(w) + "x" + std::to_string(h);
}

}  // namespace

void Hash::add(const void* bytes, size_t count) {
    const uint8_t* byte = static_cast<const uint8_t*>(bytes);
    for (size_t i = 0; i < count; ++i) value_ = (value_ ^ byte[i]) * 0x100000001B3U;
}

uint64_t hash_of(const std::string& text) {
    Hash hash;
    hash.add(text.data(), text.size());
    return hash.value();
}

std::vector<uint8_t> content(uint64_t seed, size_t count) {
    std::vector<uint8_t> bytes = noise(seed, count);
    const uint64_t kind = seed % 3;
    for (size_t i = 0; i < count; ++i) {
        if (kind == 1) bytes[i] = bytes[i] < 128 ? 0 : 255;
        if (kind == 2) bytes[i] = static_cast<uint8_t>(i / 5 + bytes[i] % 16);
    }
    return bytes;
}

Destination::Destination(size_t bytes) : Destination(bytes, 0xFF) {}

Destination::Destination(size_t bytes, uint8_t mask) : buffer_(noise(bytes, bytes + 2 * kGuard)) {
    for (size_t i = 0; i < bytes; ++i) buffer_[kGuard + i] &= mask;
}

uint64_t Destination::hash() const {
    Hash hash;
    hash_into(hash);
    return hash.value();
}

std::string text(const Size& size) {
    return by(size.src_w, size.src_h) + "-" + by(size.dst_w, size.dst_h);
}

std::string text(const Placement& p) {
    return by(p.src_w, p.src_h) + "/" + std::to_string(p.stride) + "-" + by(p.dst_w, p.dst_h) +
           "@" + std::to_string(p.x) + "," + std::to_string(p.y) + "of" +
           by(p.canvas_w, p.canvas_h);
}

const std::vector<Size>& low_sizes() {
    static const std::vector<Size> sizes = {
        {1, 1, 1, 1},      {2, 2, 1, 1},       {7, 5, 7, 5},        {64, 48, 32, 24},
        {96, 60, 32, 20},  {128, 64, 32, 16},  {100, 75, 64, 48},   {67, 41, 33, 19},
        {33, 17, 66, 35},  {5, 9, 40, 31},     {257, 33, 63, 16},   {320, 24, 319, 23},
        {48, 48, 48, 48},  {640, 40, 16, 4},   {130, 70, 129, 69},  {1000, 12, 333, 5},
        {3000, 6, 700, 3}, {9000, 3, 5000, 2}, {31, 1023, 15, 300}, {17, 64, 18, 63},
    };
    return sizes;
}

const std::vector<Size>& tall_sizes() {
    static const std::vector<Size> sizes = {
        {16, 1024, 8, 512},   {13, 1100, 7, 100},  {9, 3000, 5, 50},    {31, 1025, 29, 700},
        {33, 1040, 16, 1040}, {8, 1030, 12, 2000}, {20, 2048, 20, 511},
    };
    return sizes;
}

const std::vector<Size>& empty_sizes() {
    static const std::vector<Size> sizes = {
        {0, 5, 4, 4}, {5, 0, 8, 6}, {6, 6, 0, 3}, {6, 6, 5, 0}, {-1, 4, 3, 3}, {4, 4, 3, -2},
    };
    return sizes;
}

const std::vector<Placement>& placements() {
    static const std::vector<Placement> all = {
        {40, 30, 40, 20, 15, 32, 24, 6, 4},       // inside the canvas
        {40, 30, 47, 20, 15, 20, 15, 0, 0},       // all of it, rows apart
        {33, 21, 36, 17, 11, 25, 20, 5, 3},       // at an odd position
        {64, 48, 64, 32, 16, 24, 20, 2, 9},       // across the right and the lower edge
        {64, 48, 70, 32, 24, 60, 26, 28, 2},      // across the right edge
        {30, 30, 30, 45, 45, 50, 60, 3, 10},      // enlarged
        {16, 16, 16, 8, 8, 10, 12, 11, 0},        // right of the canvas
        {16, 16, 16, 8, 8, 20, 20, 2, 25},        // below the canvas
        {16, 16, 16, 8, 0, 10, 12, 0, 0},         // no height
        {24, 1100, 24, 12, 550, 20, 600, 3, 20},  // tall
        {17, 1500, 19, 9, 333, 16, 360, 1, 2},    // tall, not whole ratios
        {21, 1031, 21, 20, 700, 15, 705, 2, 10},  // tall, across both edges
        {8, 1024, 8, 12, 1400, 16, 1500, 1, 7},   // tall, enlarged
        // What the calling thread and the bands treat differently, on either side of 1024 rows.
        {30, 1023, 30, 20, 40, 30, 50, 3, 50},  // height cut to nothing
        {30, 1024, 30, 20, 40, 30, 50, 3, 50},
        {30, 1023, 30, 20, 40, 30, 50, 30, 4},  // width cut to nothing
        {30, 1024, 30, 20, 40, 30, 50, 30, 4},
        {30, 1023, 30, 20, 40, 30, 50, 3, 51},  // below the canvas
        {30, 1024, 30, 20, 40, 30, 50, 3, 51},
        {30, 1023, 30, 20, 40, 80, 50, 55, 4},  // further right than the canvas is high
        {30, 1024, 30, 20, 40, 80, 50, 55, 4},
        {30, 1023, 30, 20, 40, 80, 50, 55, 52},  // both
        {30, 1024, 30, 20, 40, 80, 50, 55, 52},
    };
    return all;
}

std::string text(const BandedSize& banded) {
    return text(banded.size) + "by" + std::to_string(banded.band_rows);
}

const std::vector<BandedSize>& banded_sizes() {
    static const std::vector<BandedSize> sizes = {
        {{40, 64, 20, 32}, 32},  {{40, 64, 20, 32}, 7},    {{33, 100, 16, 40}, 32},
        {{21, 75, 13, 31}, 10},  {{17, 40, 24, 60}, 9},    {{64, 31, 32, 16}, 1},
        {{130, 90, 64, 28}, 48}, {{19, 1024, 9, 300}, 48}, {{5, 20, 5, 20}, 20},
    };
    return sizes;
}

size_t packed_bytes(int32_t w, int32_t h, int32_t bytes_per_pixel) {
    if (w <= 0 || h <= 0) return 0;
    return static_cast<size_t>(w) * static_cast<size_t>(h) * static_cast<size_t>(bytes_per_pixel);
}

size_t yuv420_bytes(int32_t w, int32_t h) {
    return packed_bytes(w, h, 1) + packed_bytes((w + 1) / 2, (h + 1) / 2, 2);
}

}  // namespace golden
