// SPDX-License-Identifier: Apache-2.0
#include "job.h"

#include <chrono>
#include <iostream>
#include <memory>

#include "error.h"
#include "file_kind.h"
#include "message.h"
#include "metadata.h"
#include "output_file.h"
#include "progress.h"
#include "report.h"
#include "resizer.h"
#include "sink.h"
#include "source.h"

namespace tool {

namespace {

class Stopwatch {
public:
    template <class Action>
    void time(Action action) {
        const auto start = std::chrono::steady_clock::now();
        action();
        elapsed_ += std::chrono::steady_clock::now() - start;
    }

    double milliseconds() const { return elapsed_.count(); }

private:
    std::chrono::duration<double, std::milli> elapsed_ = {};
};

std::optional<Y4mHeader> resized_header(const Source& source, const Placement& placement) {
    if (!source.y4m_header()) return std::nullopt;
    return resized_y4m_header(*source.y4m_header(), placement.picture, placement.result,
                              placement.keeps_aspect);
}

// Of still pictures that shrink a lot every pixel should count; frames come in numbers, and
// quickly.
Engine engine_for(const Options& options, const Source& source, Size upright, Size picture) {
    if (options.engine) return *options.engine;
    if (!is_image_file(source.kind())) return Engine::kQuarter;
    // Lanczos copies.
    const bool is_copy = upright.width == picture.width && upright.height == picture.height;
    if (is_copy) return Engine::kLanczos;
    const bool shrinks_a_lot =
        upright.width / 2 >= picture.width && upright.height / 2 >= picture.height;
    return shrinks_a_lot ? Engine::kThumbnail : Engine::kQuarter;
}

std::optional<Color> background_of(const Options& options, FileKind out) {
    if (options.background || holds_alpha(out)) return options.background;
    return kWhite;
}

// The library's black is that of the full range.
std::optional<Color> canvas_of(const Options& options, PixelFormat format) {
    const bool is_limited = is_yuv(format) && options.yuv.range == Range::kLimited;
    return is_limited ? options.background.value_or(kBlack) : options.background;
}

SinkSettings settings_of(const Options& options, const Source& source, const Placement& placement,
                         const Listener& listener) {
    SinkSettings settings = {resized_header(source, placement), {}, options.quality, listener};
    if (!options.strip) {
        settings.metadata = resized_metadata(source.metadata(), placement.result, options.rotate);
    }
    return settings;
}

// Planes of frames stay as they are, unless OUT is to be 4:2:0.
PixelFormat result_format(PixelFormat format, FileKind out) {
    const bool becomes_420 = is_yuv(format) && !is_420(format) && is_420(out.format);
    return becomes_420 ? PixelFormat::kI420 : format;
}

FileKind kind_of_out(const Options& options, const Source& source) {
    FileKind kind = source.kind();
    if (options.output_type) {
        kind = *options.output_type;
    } else if (options.out != "-") {
        kind = kind_of_name(options.out);
    }
    check_conversion(source.kind(), kind);
    // Y4M holds whatever it held before.
    if (kind.container == Container::kY4m) kind.format = source.kind().format;
    return kind;
}

// How much of a picture's detail its decoder may leave out: no more than the first halvings of the
// thumbnail engine would.
int32_t reduction_for(const Source& source, Engine engine, Size picture) {
    constexpr int32_t kMost = 8;
    int32_t reduction = 1;
    if (engine != Engine::kThumbnail || !source.is_reducible()) return reduction;
    for (int32_t n = 2; n <= kMost; n *= 2) {
        const Size size = {source.size().width / n, source.size().height / n};
        const bool is_all = size.width == picture.width && size.height == picture.height;
        const bool is_left_to_halve =
            size.width / 2 >= picture.width && size.height / 2 >= picture.height;
        if (is_all || is_left_to_halve) reduction = n;
    }
    return reduction;
}

bool has_whole_chroma(PixelFormat format, Size size) {
    const Plane chroma = planes_of(format, size).back();
    return size.width % chroma.across == 0 && size.height % chroma.down == 0;
}

// The format of the result where the planes of a file are resized one by one and written as they
// are; nothing where the way leads through RGB. Planes of pictures with odd sides would not lie
// exactly on each other.
std::optional<PixelFormat> format_in_planes(const Options& options, const Source& source,
                                            const Resizing& how, int32_t reduction, FileKind out,
                                            const Metadata& metadata) {
    const std::optional<PixelFormat> planes = source.planes(reduction);
    const bool is_jpeg = out.container == Container::kJpeg;
    if (!planes || (!is_jpeg && !is_420(out.format))) return {};
    if (how.engine != Engine::kThumbnail && how.engine != Engine::kLanczos) return {};
    if (how.placement.on_canvas && options.background) return {};
    if (!options.yuv.is_that_of_jpeg()) return {};

    const bool stays_gray = *planes == PixelFormat::kGray && is_jpeg && fits_gray(metadata);
    const PixelFormat format = stays_gray ? PixelFormat::kGray : PixelFormat::kI420;
    const Size reduced = {source.size().width / reduction, source.size().height / reduction};
    const Placement& placement = how.placement;
    const bool is_even = has_whole_chroma(*planes, reduced) &&
                         has_whole_chroma(format, placement.picture) &&
                         has_whole_chroma(format, placement.result) &&
                         has_whole_chroma(format, {placement.x, placement.y});
    if (!is_even) return {};
    return format;
}

// Lets the source decode no more than is needed.
void choose_decoding(const Options& options, const Metadata& metadata, Source* source,
                     Resizing* how, FileKind* out) {
    const Placement stored = stored_placement(how->placement, how->orientation);
    const int32_t reduction = reduction_for(*source, how->engine, stored.picture);
    const std::optional<PixelFormat> format =
        format_in_planes(options, *source, *how, reduction, *out, metadata);
    source->decode_as({format.has_value(), reduction});
    if (!format) return;
    how->format = *format;
    how->fills_alpha = false;
    if (out->container == Container::kJpeg) out->format = *format;
}

void judge_damage(const Options& options, const std::string& damage) {
    if (damage.empty()) return;
    if (options.strict) throw Error(options.in + ": " + damage);
    if (!options.quiet) say((options.in + ": warning: " + damage).c_str());
}

}  // namespace

void run(const Options& options) {
    Progress progress(options.shows_progress && !options.quiet, "frames");
    const auto step = [&progress](const char* name) {
        return [&progress, name](double part) { progress.update_step(name, part); };
    };
    const auto source = concerning(
        options.in, [&] { return open_source(options.in, raw_layout(options), step("reading")); });
    progress.hide();
    if (!options.quiet && !source->remark().empty()) {
        say((options.in + ": " + source->remark()).c_str());
    }
    const PixelFormat format = source->kind().format;
    FileKind out_kind = concerning(options.out, [&] { return kind_of_out(options, *source); });
    const PixelFormat format_of_result = result_format(format, out_kind);
    const Orientation orientation =
        options.rotate ? orientation_of(source->metadata()) : Orientation::kUpright;
    const Size upright = turned(source->size(), orientation);
    const Placement placement = place(options.wish, upright, format_of_result);
    const Engine engine = engine_for(options, *source, upright, placement.picture);
    check_engine(engine, format);
    Resizing how = {engine,
                    placement,
                    format_of_result,
                    orientation,
                    background_of(options, out_kind),
                    canvas_of(options, format),
                    options.premultiply,
                    is_image_file(source->kind())};
    const SinkSettings settings = settings_of(options, *source, placement, step("writing"));
    choose_decoding(options, settings.metadata, source.get(), &how, &out_kind);

    OutputFile file(options.out);
    Sink sink(out_kind, settings, file.stream());
    Picture frame;
    Picture result;
    Stopwatch resizing;
    int64_t frames = 0;
    const auto next = [&] { return source->next(&frame); };
    for (int64_t number = 1; number <= options.frames.last && concerning(options.in, next);
         ++number) {
        const std::string& damage = source->metadata().damage;
        if (!damage.empty()) progress.hide();
        judge_damage(options, damage);
        if (number < options.frames.first) continue;
        concerning(options.in, [&] { resizing.time([&] { resize(how, &frame, &result); }); });
        concerning(options.out, [&] { sink.write(result); });
        ++frames;
        if (!is_image_file(source->kind())) progress.update(frames, source->part_read());
    }
    progress.hide();
    if (frames == 0) {
        throw Error(options.in +
                    (options.frames.first > 1 ? ": holds no such frame" : ": holds no frame"));
    }
    file.commit();
    const Report report = {options.in, options.out, how.format, upright,
                           placement,  engine,      frames,     resizing.milliseconds()};
    if (options.verbose) std::cerr << in_words(report);
    if (options.json) std::cout << as_json(report);
}

}  // namespace tool
