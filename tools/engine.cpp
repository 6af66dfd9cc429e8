// SPDX-License-Identifier: Apache-2.0
#include "engine.h"

#include <ovrinresize.h>

#include <vector>

#include "convert.h"
#include "error.h"
#include "thumbnail.h"

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

void resize_nearest(const Picture& source, Picture* result) {
    ovrin_resize_nearest_rgba8888(source.words.data(), result->words.data(), source.size.width,
                                  source.size.height, result->size.width, result->size.height);
}

int32_t bilinear_format(PixelFormat format) {
    switch (format) {
        case PixelFormat::kI420:
            return 2;
        case PixelFormat::kNv21:
            return 18;
        default:
            return 7;
    }
}

using Bilinear = void(const uint8_t*, uint8_t*, int32_t, int32_t, int32_t, int32_t, int32_t,
                      const ovrin_resize_target*);

// Not for RGB.
void resize_bilinear(Bilinear* bilinear, Picture* source, Picture* result) {
    // The engine may read a row and a sample past the end, which then count; they repeat the end.
    std::vector<uint32_t>& words = source->words;
    const size_t count = words.size();
    words.resize(count + static_cast<size_t>(source->size.width) + 1, words.back());
    bilinear(source->bytes(), result->bytes(), source->size.width, source->size.height,
             result->size.width, result->size.height, bilinear_format(source->format), nullptr);
    words.resize(count);
}

// The engine knows no RGB; RGBA gives the same bytes.
void resize_any_bilinear(Bilinear* bilinear, Picture* source, Picture* result) {
    if (source->format != PixelFormat::kRgb) return resize_bilinear(bilinear, source, result);
    Picture rgba(result->size);
    Picture rgba_source = converted(*source, PixelFormat::kRgba);
    resize_bilinear(bilinear, &rgba_source, &rgba);
    *result = converted(rgba, PixelFormat::kRgb);
}

// Planes one by one: the library's own function for Y and VU wants more chroma than a frame has.
void resize_planes_lanczos(const Picture& source, Picture* result) {
    const bool planar = source.format == PixelFormat::kI420;
    const auto half = [](Size size) { return Size{(size.width + 1) / 2, (size.height + 1) / 2}; };
    const auto plane = [](const uint8_t* src, Size from, uint8_t* dst, Size to, int32_t samples) {
        ov_lanczos(src, from.width, from.height, dst, to.width, to.height, samples);
    };
    const Size from = half(source.size);
    const Size to = half(result->size);
    const uint8_t* src = source.bytes() + source.size.pixels();
    uint8_t* dst = result->bytes() + result->size.pixels();
    plane(source.bytes(), source.size, result->bytes(), result->size, 1);
    if (!planar) return plane(src, from, dst, to, 2);
    plane(src, from, dst, to, 1);
    plane(src + from.pixels(), from, dst + to.pixels(), to, 1);
}

void resize_lanczos(const Picture& source, Picture* result) {
    if (has_chroma_planes(source.format)) return resize_planes_lanczos(source, result);
    if (source.format == PixelFormat::kRgb) {
        return ov_lanczos(source.bytes(), source.size.width, source.size.height, result->bytes(),
                          result->size.width, result->size.height, 3);
    }
    ovrin_resize_lanczos(source.bytes(), result->bytes(), source.size.width, source.size.height,
                         result->size.width, result->size.height, 4);
}

}  // namespace

const char* name_of(Engine engine) {
    switch (engine) {
        case Engine::kQuarter:
            return "quarter";
        case Engine::kThumbnail:
            return "thumbnail";
        case Engine::kBilinear:
            return "bilinear";
        case Engine::kBilinearProgressive:
            return "bilinear-progressive";
        case Engine::kLanczos:
            return "lanczos";
        case Engine::kNearest:
            return "nearest";
    }
    return "";
}

void check_engine(Engine engine, PixelFormat format) {
    if (engine == Engine::kNearest && format != PixelFormat::kRgba) {
        throw Error(std::string("the nearest engine handles rgba, not ") + name_of(format));
    }
}

void resize(Engine engine, Picture* source, Picture* result) {
    result->has_alpha = source->has_alpha;
    result->is_gray = source->is_gray;
    switch (engine) {
        case Engine::kQuarter:
            return resize_whole(*source, result);
        case Engine::kThumbnail:
            return resize_thumbnail(source, result);
        case Engine::kBilinear:
            // On the calling thread at any height: in bands the engine would not interpolate.
            return resize_any_bilinear(ov_bilinear_sg, source, result);
        case Engine::kBilinearProgressive:
            return resize_any_bilinear(ov_bilinear_ex, source, result);
        case Engine::kLanczos:
            return resize_lanczos(*source, result);
        case Engine::kNearest:
            return resize_nearest(*source, result);
    }
}

void resize_onto_canvas(const Picture& source, const Placement& placement, Picture* canvas) {
    canvas->has_alpha = source.has_alpha;
    canvas->is_gray = source.is_gray;
    if (has_chroma_planes(source.format)) return place_yuv(source, placement, canvas);
    if (source.format == PixelFormat::kRgba) return place_rgba(source, placement, canvas);
    // The library places no RGB; RGBA gives the same bytes.
    Picture rgba(placement.result);
    place_rgba(converted(source, PixelFormat::kRgba), placement, &rgba);
    *canvas = converted(rgba, PixelFormat::kRgb);
}

int white_of(Engine engine) {
    return engine == Engine::kQuarter ? 252 : 255;
}

}  // namespace tool
