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

SinkSettings settings_of(const Options& options, const Source& source, const Placement& placement) {
    SinkSettings settings = {resized_header(source, placement), {}, options.quality};
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

void judge_damage(const Options& options, const std::string& damage) {
    if (damage.empty()) return;
    if (options.strict) throw Error(options.in + ": " + damage);
    if (!options.quiet) say((options.in + ": warning: " + damage).c_str());
}

}  // namespace

void run(const Options& options) {
    const auto source =
        concerning(options.in, [&] { return open_source(options.in, raw_layout(options)); });
    judge_damage(options, source->metadata().damage);
    if (!options.quiet && !source->remark().empty()) {
        say((options.in + ": " + source->remark()).c_str());
    }
    const PixelFormat format = source->kind().format;
    const FileKind out_kind =
        concerning(options.out, [&] { return kind_of_out(options, *source); });
    const PixelFormat format_of_result = result_format(format, out_kind);
    const Orientation orientation =
        options.rotate ? orientation_of(source->metadata()) : Orientation::kUpright;
    const Size upright = turned(source->size(), orientation);
    const Placement placement = place(options.wish, upright, format_of_result);
    const Engine engine = engine_for(options, *source, upright, placement.picture);
    check_engine(engine, format);
    const Resizing how = {engine,
                          placement,
                          format_of_result,
                          orientation,
                          background_of(options, out_kind),
                          canvas_of(options, format),
                          options.premultiply,
                          is_image_file(source->kind())};

    OutputFile file(options.out);
    Sink sink(out_kind, settings_of(options, *source, placement), file.stream());
    Picture frame;
    Picture result;
    Stopwatch resizing;
    int64_t frames = 0;
    {
        Progress progress(options.shows_progress && !options.quiet, "frames");
        const auto next = [&] { return source->next(&frame); };
        for (int64_t number = 1; number <= options.frames.last && concerning(options.in, next);
             ++number) {
            if (number < options.frames.first) continue;
            concerning(options.in, [&] { resizing.time([&] { resize(how, &frame, &result); }); });
            concerning(options.out, [&] { sink.write(result); });
            progress.update(++frames, source->part_read());
        }
    }
    if (frames == 0) {
        throw Error(options.in +
                    (options.frames.first > 1 ? ": holds no such frame" : ": holds no frame"));
    }
    file.commit();
    const Report report = {options.in, options.out, format, upright,
                           placement,  engine,      frames, resizing.milliseconds()};
    if (options.verbose) std::cerr << in_words(report);
    if (options.json) std::cout << as_json(report);
}

}  // namespace tool
