// SPDX-License-Identifier: Apache-2.0
#include "engine.h"

#include <ovrinresize.h>

#include "convert.h"
#include "error.h"

namespace tool {

namespace {

void resize_whole(const Picture& source, Picture* result) {
    const auto call = [&](auto function, auto* dst) {
        function(source.bytes(), dst, source.size.width, source.size.height, result->size.width,
                 result->size.height);
    };
    switch (source.format) {
        case PixelFormat::kRgba:
            return call(ovrin_resize_rgba8888, result->words.data());
        case PixelFormat::kRgb:
            return call(ovrin_resize_rgb888, result->bytes());
        case PixelFormat::kI420:
            return call(ovrin_resize_yuv420, result->bytes());
        case PixelFormat::kNv21:
            return call(ovrin_resize_nv21, result->bytes());
    }
}

void resize_on_canvas(const Picture& source, const Placement& placement, Picture* result) {
    const Size size = source.size;
    const uint8_t* const luma = source.bytes();
    const uint8_t* const chroma = luma + size.pixels();
    const size_t u_bytes = Size{(size.width + 1) / 2, (size.height + 1) / 2}.pixels();

    ovrin_resize_target target = {};
    target.src_width = target.src_stride = size.width;
    target.src_height = target.src_buffer_height = size.height;
    target.dst = result->words.data();
    target.dst_width = placement.picture.width;
    target.dst_height = placement.picture.height;
    target.canvas_width = placement.result.width;
    target.canvas_height = placement.result.height;
    target.dst_x = placement.x;
    target.dst_y = placement.y;
    switch (source.format) {
        case PixelFormat::kRgba:
            return ovrin_resize_rgba8888_keep_ratio(luma, size.width, size.height, &target);
        case PixelFormat::kI420:
            return ovrin_resize_y_u_v_keep_ratio(luma, chroma, chroma + u_bytes, size.width,
                                                 size.height, &target);
        case PixelFormat::kNv21:
            return ovrin_resize_y_nv21_keep_ratio(luma, chroma, size.width, size.height, &target);
        case PixelFormat::kRgb: {
            // The library places no RGB; RGBA gives the same bytes.
            Picture canvas(placement.result);
            resize_on_canvas(converted(source, PixelFormat::kRgba), placement, &canvas);
            *result = converted(canvas, PixelFormat::kRgb);
        }
    }
}

}  // namespace

void check_engine(Engine engine, PixelFormat format, const Placement& placement) {
    if (engine != Engine::kNearest) return;
    if (format != PixelFormat::kRgba) {
        throw Error(std::string("the nearest engine handles rgba, not ") + name_of(format));
    }
    if (placement.on_canvas) throw Error("the nearest engine knows no canvas");
}

void resize(Engine engine, const Picture& source, const Placement& placement, Picture* result) {
    result->has_alpha = source.has_alpha;
    if (engine == Engine::kNearest) {
        return ovrin_resize_nearest_rgba8888(source.words.data(), result->words.data(),
                                             source.size.width, source.size.height,
                                             result->size.width, result->size.height);
    }
    if (placement.on_canvas) return resize_on_canvas(source, placement, result);
    resize_whole(source, result);
}

}  // namespace tool
