// SPDX-License-Identifier: Apache-2.0
#include "engine.h"

#include <ovrinresize.h>

#include <cstring>
#include <vector>

#include "convert.h"
#include "error.h"
#include "thumbnail.h"

namespace tool {

namespace {

bool may_start_threads = true;

// Not for planes of other formats.
void resize_quarter(const Picture& source, Picture* result) {
    const auto call = [&](auto function, auto* dst) {
        function(source.bytes(), dst, source.size.width, source.size.height, result->size.width,
                 result->size.height);
    };
    if (source.format == PixelFormat::kRgba) {
        return call(may_start_threads ? ovrin_resize_rgba8888 : ovrin_resize_rgba8888_sg,
                    result->words.data());
    }
    if (source.format == PixelFormat::kRgb) return call(ovrin_resize_rgb888, result->bytes());
    if (source.format == PixelFormat::kI420) {
        return call(may_start_threads ? ovrin_resize_yuv420 : ovrin_resize_yuv420_sg,
                    result->bytes());
    }
    call(may_start_threads ? ovrin_resize_nv21 : ovrin_resize_nv21_sg, result->bytes());
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
    const auto function =
        may_start_threads ? ovrin_resize_rgba8888_keep_ratio : ovrin_resize_rgba_keep_ratio_sg;
    function(source.bytes(), source.size.width, source.size.height, &target);
}

void place_yuv(const Picture& source, const Placement& placement, Picture* canvas) {
    const ovrin_resize_target target = target_of(source.size, placement, canvas->bytes());
    const auto [width, height] = source.size;
    const uint8_t* const luma = source.bytes();
    const uint8_t* const chroma = luma + source.size.pixels();
    // In bands the library draws nothing that lies further right than the canvas is high.
    const bool in_bands = may_start_threads && placement.x <= placement.result.height;
    if (source.format == PixelFormat::kNv21) {
        const auto function = in_bands ? ovrin_resize_y_nv_tps : ovrin_resize_y_nv_sg;
        return function(luma, chroma, nullptr, width, height, 0, 0, &target);
    }
    const uint8_t* const v = chroma + Size{(width + 1) / 2, (height + 1) / 2}.pixels();
    const auto function = in_bands ? ovrin_resize_y_u_v_tps : ovrin_resize_y_u_v_sg;
    function(luma, chroma, v, nullptr, width, height, 0, 0, &target);
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

// Formats that the library itself resizes, by its engines that know them: neither Lanczos nor
// thumbnail, which take planes.
void resize_whole(Engine engine, Picture* source, Picture* result) {
    if (engine == Engine::kQuarter) return resize_quarter(*source, result);
    if (engine == Engine::kNearest) return resize_nearest(*source, result);
    // On the calling thread at any height: in bands the engine would not interpolate.
    const bool is_one_pass = engine == Engine::kBilinear;
    resize_any_bilinear(is_one_pass ? ov_bilinear_sg : ov_bilinear_ex, source, result);
}

// A plane of single bytes by an engine that knows none: as the luma of a picture in 4:2:0 whose
// chroma nobody looks at.
void resize_as_luma(Engine engine, const uint8_t* from, Size size, uint8_t* to, Size target) {
    Picture picture(size, PixelFormat::kI420);
    const auto width = static_cast<size_t>(size.width);
    memcpy(picture.bytes(), from, size.pixels());
    // The bilinear engine may read a row past the end, which then counts; it repeats the last one.
    memcpy(picture.bytes() + size.pixels(), from + size.pixels() - width, width);
    Picture result(target, PixelFormat::kI420);
    resize_whole(engine, &picture, &result);
    memcpy(to, result.bytes(), target.pixels());
}

// Each plane for itself, so that those of source and result need not cover the same pixels. What
// a gray picture lacks is neutral.
void resize_planes(Engine engine, Picture* source, Picture* result) {
    constexpr uint8_t kNeutral = 128;
    const std::vector<Plane> from = planes_of(source->format, source->size);
    const std::vector<Plane> to = planes_of(result->format, result->size);
    for (size_t i = 0; i < to.size(); ++i) {
        uint8_t* const dst = result->bytes() + to[i].offset;
        if (i >= from.size()) {
            memset(dst, kNeutral, to[i].bytes());
            continue;
        }
        uint8_t* const src = source->bytes() + from[i].offset;
        if (engine == Engine::kLanczos) {
            resize_lanczos(src, from[i].size, dst, to[i].size, from[i].channels);
        } else if (engine == Engine::kThumbnail) {
            resize_thumbnail(src, from[i].size, dst, to[i].size, from[i].channels);
        } else {
            resize_as_luma(engine, src, from[i].size, dst, to[i].size);
        }
    }
}

bool is_resized_whole(Engine engine, PixelFormat from, PixelFormat to) {
    if (engine == Engine::kLanczos || engine == Engine::kThumbnail) return false;
    return from == to && (is_420(from) || !is_yuv(from));
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
            break;
    }
    return "nearest";
}

void check_engine(Engine engine, PixelFormat format) {
    if (engine == Engine::kNearest && format != PixelFormat::kRgba) {
        throw Error(std::string("the nearest engine handles rgba, not ") + name_of(format));
    }
}

void resize_lanczos(const uint8_t* src, Size from, uint8_t* dst, Size to, int32_t channels) {
    if (channels < 4 || !may_start_threads) {
        return ov_lanczos(src, from.width, from.height, dst, to.width, to.height, channels);
    }
    ovrin_resize_lanczos(src, dst, from.width, from.height, to.width, to.height, channels);
}

void resize(Engine engine, Picture* source, Picture* result) {
    result->has_alpha = source->has_alpha;
    result->is_gray = source->is_gray;
    if (!is_resized_whole(engine, source->format, result->format)) {
        return resize_planes(engine, source, result);
    }
    resize_whole(engine, source, result);
}

void resize_onto_canvas(const Picture& source, const Placement& placement, Picture* canvas) {
    canvas->has_alpha = source.has_alpha;
    canvas->is_gray = source.is_gray;
    if (is_420(source.format)) return place_yuv(source, placement, canvas);
    if (source.format == PixelFormat::kRgba) return place_rgba(source, placement, canvas);
    // The library places no RGB; RGBA gives the same bytes.
    Picture rgba(placement.result);
    place_rgba(converted(source, PixelFormat::kRgba), placement, &rgba);
    *canvas = converted(rgba, PixelFormat::kRgb);
}

void keep_to_calling_thread() {
    may_start_threads = false;
}

int32_t threads_of_picture() {
    return may_start_threads ? int32_t{kThreadsOfPicture} : 1;
}

int white_of(Engine engine) {
    return engine == Engine::kQuarter ? 252 : 255;
}

}  // namespace tool
