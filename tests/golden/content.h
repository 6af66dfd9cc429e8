// SPDX-License-Identifier: Apache-2.0
// Made-up pictures, buffers that notice writes beside them, and hashes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace golden {

// FNV-1a, 64 bits.
class Hash {
public:
    void add(const void* bytes, size_t count);
    void add(int32_t number) { add(&number, sizeof number); }
    uint64_t value() const { return value_; }

private:
    uint64_t value_ = 0xCBF29CE484222325U;
};

uint64_t hash_of(const std::string& text);

// Bytes that depend on the seed alone: noise, or only 0 and 255, or a ramp with some noise.
std::vector<uint8_t> content(uint64_t seed, size_t count);

// A destination. It holds noise at first, and so do the bytes on either side of it, so that the
// hash shows what was written and what was not.
class Destination {
public:
    explicit Destination(size_t bytes);
    Destination(size_t bytes, uint8_t mask);  // only these bits of the noise

    uint8_t* bytes() { return buffer_.data() + kGuard; }
    uint32_t* words() { return reinterpret_cast<uint32_t*>(bytes()); }
    void hash_into(Hash& hash) const { hash.add(buffer_.data(), buffer_.size()); }
    uint64_t hash() const;

private:
    static constexpr size_t kGuard = 64;

    std::vector<uint8_t> buffer_;
};

struct Size {
    int32_t src_w;
    int32_t src_h;
    int32_t dst_w;
    int32_t dst_h;
};

std::string text(const Size& size);

// Pictures on a canvas; see ovrin_resize_target.
struct Placement {
    int32_t src_w;
    int32_t src_h;
    int32_t stride;
    int32_t dst_w;
    int32_t dst_h;
    int32_t canvas_w;
    int32_t canvas_h;
    int32_t x;
    int32_t y;
};

std::string text(const Placement& placement);

// Sizes below the height from which wrappers use threads, and above it.
const std::vector<Size>& low_sizes();
const std::vector<Size>& tall_sizes();
const std::vector<Size>& empty_sizes();
const std::vector<Placement>& placements();

// A picture and the source rows of each of its bands.
struct BandedSize {
    Size size;
    int32_t band_rows;
};

std::string text(const BandedSize& banded);
const std::vector<BandedSize>& banded_sizes();

// Bytes of pictures; 0 where a size is 0 or less.
size_t packed_bytes(int32_t w, int32_t h, int32_t bytes_per_pixel);
size_t yuv420_bytes(int32_t w, int32_t h);

}  // namespace golden
