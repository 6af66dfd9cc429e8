// SPDX-License-Identifier: Apache-2.0
#include "resizer.h"

namespace tool {

Resizer::Resizer(Engine engine, const Placement& placement, PixelFormat format,
                 Orientation orientation)
    : engine_(engine), placement_(placement), orientation_(orientation) {
    check_engine(engine, format, placement);
}

void Resizer::operator()(Picture* frame, Picture* result) const {
    if (orientation_ != Orientation::kUpright) return turn_and_resize(frame, result);
    resize_into(*frame, placement_, result);
}

// Turns the smaller of the two, and drops what it no longer needs: memory for two of them is
// enough.
void Resizer::turn_and_resize(Picture* frame, Picture* result) const {
    if (frame->size.pixels() < placement_.result.pixels()) {
        *frame = turned(*frame, orientation_);
        return resize_into(*frame, placement_, result);
    }
    Picture stored;
    resize_into(*frame, stored_placement(placement_, orientation_), &stored);
    *frame = Picture();
    *result = turned(stored, orientation_);
}

void Resizer::resize_into(const Picture& frame, const Placement& placement, Picture* result) const {
    if (result->words.empty()) *result = Picture(placement.result, frame.format);
    resize(engine_, frame, placement, result);
}

}  // namespace tool
