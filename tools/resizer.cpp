// SPDX-License-Identifier: Apache-2.0
#include "resizer.h"

#include "alpha.h"
#include "canvas.h"

namespace tool {

namespace {

// Whether the canvas is ours to draw: the library draws black ones, with one engine, in some
// formats, and crops nothing.
bool draws_canvas(const Resizing& resizing, const Placement& placement, PixelFormat format) {
    const bool is_cropped = placement.x < 0 || placement.y < 0;
    const bool is_known = resizing.format == format && (is_420(format) || !is_yuv(format));
    return resizing.engine != Engine::kQuarter || resizing.canvas || is_cropped || !is_known;
}

void resize_and_place(const Resizing& resizing, const Placement& placement, Picture* frame,
                      Picture* result) {
    if (placement.on_canvas && draws_canvas(resizing, placement, frame->format)) {
        Picture picture(placement.picture, resizing.format);
        resize(resizing.engine, frame, &picture);
        *result = on_canvas(picture, placement, resizing.canvas);
        return;
    }
    if (result->words.empty()) *result = Picture(placement.result, resizing.format);
    if (placement.on_canvas) return resize_onto_canvas(*frame, placement, result);
    resize(resizing.engine, frame, result);
}

// Turns the smaller of the two, and drops what is no longer needed: memory for two is enough.
void resize_and_turn(const Resizing& resizing, Picture* frame, Picture* result) {
    // Planes of another format than the result's may not fit the turned picture.
    if (frame->format == resizing.format &&
        frame->size.pixels() < resizing.placement.result.pixels()) {
        *frame = turned(*frame, resizing.orientation);
        return resize_and_place(resizing, resizing.placement, frame, result);
    }
    Picture stored;
    resize_and_place(resizing, stored_placement(resizing.placement, resizing.orientation), frame,
                     &stored);
    *frame = Picture();
    *result = turned(stored, resizing.orientation);
}

}  // namespace

void resize(const Resizing& resizing, Picture* frame, Picture* result) {
    if (frame->has_alpha && resizing.background) flatten(frame, *resizing.background);
    const bool weighs_colors = frame->has_alpha && resizing.premultiply;
    if (weighs_colors) premultiply(frame);
    if (resizing.orientation == Orientation::kUpright) {
        resize_and_place(resizing, resizing.placement, frame, result);
    } else {
        resize_and_turn(resizing, frame, result);
    }
    if (weighs_colors) unpremultiply(result, white_of(resizing.engine));
    if (!result->has_alpha && resizing.fills_alpha) make_opaque(result);
}

}  // namespace tool
