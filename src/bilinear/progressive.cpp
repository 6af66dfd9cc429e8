// SPDX-License-Identifier: Apache-2.0
// Large bilinear reductions by repeated halving.
#include <stdlib.h>

#include "bilinear/plan.h"

namespace ovrin {

namespace {

int64_t quotient(int32_t a, int32_t b) {
    return b == 0 ? 0 : int64_t{a} / b;
}

// Words for one intermediate picture: it takes src_w * src_h bytes at most. With a target each pass
// fills the target's canvas and the next one reads the target's source geometry from it, however
// they fit.
int64_t scratch_words(int32_t src_w, int32_t src_h, const ovrin_resize_target* target) {
    int64_t words = (int64_t{src_w} * src_h + 3) / 4;
    if (target == nullptr) return words;
    const int64_t canvas = int64_t{target->canvas_width} * target->canvas_height;
    const int64_t source = int64_t{target->src_stride} * (int64_t{target->src_height} + 2) + 2;
    if (words < canvas) words = canvas;
    return words < source ? source : words;
}

// The two pictures that passes write in turn.
class Scratch {
public:
    explicit Scratch(int64_t words)
        : pictures_{static_cast<uint8_t*>(calloc(static_cast<size_t>(words), 4)),
                    static_cast<uint8_t*>(calloc(static_cast<size_t>(words), 4))} {}
    ~Scratch() {
        free(pictures_[0]);
        free(pictures_[1]);
    }
    Scratch(const Scratch&) = delete;
    Scratch& operator=(const Scratch&) = delete;

    bool ready() const { return pictures_[0] != nullptr && pictures_[1] != nullptr; }
    uint8_t* next() {
        turn_ = 1 - turn_;
        return pictures_[turn_];
    }

private:
    uint8_t* pictures_[2];
    int turn_ = 1;
};

}  // namespace

}  // namespace ovrin

using namespace ovrin;

void ov_bilinear_ex(const uint8_t* src, uint8_t* dst, int32_t src_w, int32_t src_h, int32_t dst_w,
                    int32_t dst_h, int32_t format, const ovrin_resize_target* target) {
    const int64_t by_width = quotient(src_w, dst_w);
    const int64_t by_height = quotient(src_h, dst_h);
    const int64_t ratio = by_width < by_height ? by_width : by_height;
    const bool halves = ratio >= 4 && int64_t{dst_w} * dst_h <= int64_t{src_w} * src_h;
    Scratch scratch(halves ? scratch_words(src_w, src_h, target) : 0);
    const uint8_t* current = src;
    int32_t width = src_w;
    int32_t height = src_h;
    for (int64_t k = 1; halves && scratch.ready() && k < ratio / 2; k *= 2) {
        uint8_t* half = scratch.next();
        const int32_t half_width = static_cast<int32_t>(src_w / (2 * k));
        const int32_t half_height = static_cast<int32_t>(src_h / (2 * k));
        ov_bilinear(current, half, width, height, half_width, half_height, format, target);
        current = half;
        width = half_width;
        height = half_height;
    }
    ov_bilinear(current, dst, width, height, dst_w, dst_h, format, target);
}
