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

ovrin_resize_target target_of(Size source, const Placement& placement, void* canvas) {
    ovrin_resize_target target = {};
    target.src_width = target.src_stride = source.width;
    target.src_height = target.src_buffer_height = source.height;
    target.dst = canvas;
    target.dst_width = placement.picture.width;
    target.dst_height = placement.picture.height;
    target.canvas_width = placement.result.width;
    target.canvas_height = placement.result.height;
    target.dst_x = placement.x;
    target.dst_y = placement.y;
    return target;
}

void place_rgba(const Picture& source, const Placement& placement, Picture* canvas) {
    ovrin_resize_target target = target_of(source.size, placement, canvas->words.data());
    ovrin_resize_rgba8888_keep_ratio(source.bytes(), source.size.width, source.size.height,
                                     &target);
}

void place_yuv(const Picture& source, const Placement& placement, Picture* canvas) {
    const ovrin_resize_target target = target_of(source.size, placement, canvas->bytes());
    const auto [width, height] = source.size;
    const uint8_t* const luma = source.bytes();
    const uint8_t* const chroma = luma + source.size.pixels();
    if (source.format == PixelFormat::kNv21) {
        return ovrin_resize_y_nv21_keep_ratio(luma, chroma, width, height, &target);
    }
    const uint8_t* const v = chroma + Size{(width + 1) / 2, (height + 1) / 2}.pixels();
    ovrin_resize_y_u_v_keep_ratio(luma, chroma, v, width, height, &target);
}

void resize_on_canvas(const Picture& source, const Placement& placement, Picture* canvas) {
    if (has_chroma_planes(source.format)) return place_yuv(source, placement, canvas);
    if (source.format == PixelFormat::kRgba) return place_rgba(source, placement, canvas);
    // The library places no RGB; RGBA gives the same bytes.
    Picture rgba(placement.result);
    place_rgba(converted(source, PixelFormat::kRgba), placement, &rgba);
    *canvas = converted(rgba, PixelFormat::kRgb);
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
