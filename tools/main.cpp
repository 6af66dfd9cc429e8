// SPDX-License-Identifier: Apache-2.0
// The ovrinresize command: reads pictures, resizes them with the library, writes them.
#include <CLI/CLI.hpp>
#include <chrono>
#include <cstdio>
#include <exception>
#include <initializer_list>
#include <iomanip>
#include <iostream>
#include <memory>
#include <new>
#include <optional>
#include <string>
#include <utility>

#include "engine.h"
#include "error.h"
#include "file_kind.h"
#include "output_file.h"
#include "placement.h"
#include "progress.h"
#include "sink.h"
#include "source.h"

namespace {

using namespace tool;

enum ExitCode { kDone = 0, kFailed = 1, kWrongUsage = 2 };

struct Options {
    std::string in;
    std::string out;
    Wish wish;
    Engine engine = Engine::kQuarter;
    int quality = 90;
    std::optional<PixelFormat> raw_format;
    std::optional<Size> raw_size;
    bool verbose = false;
};

// ---- Command line ----

// CLI11's help in the look of other command-line tools: "-s, --size WxH", and defaults in words.
class HelpFormatter : public CLI::Formatter {
public:
    HelpFormatter() {
        column_width(26);
        label("Positionals", "Arguments");
    }

    std::string make_usage(const CLI::App* /*app*/, std::string /*name*/) const override {
        return "Usage: ovrinresize IN OUT --size WxH [OPTION]...\n";
    }

    std::string make_option_name(const CLI::Option* option, bool is_positional) const override {
        std::string name = Formatter::make_option_name(option, is_positional);
        const size_t comma = name.find(',');
        if (comma != std::string::npos) name.insert(comma + 1, " ");
        return name;
    }

    std::string make_option_opts(const CLI::Option* option) const override {
        return option->get_type_name().empty() ? "" : " " + option->get_type_name();
    }
};

[[noreturn]] void reject(const std::string& names, const std::string& why) {
    throw CLI::ValidationError(names.substr(names.find("--")), why);
}

void add_size(CLI::App* app, const std::string& names, std::optional<Size>* size,
              const std::string& help) {
    const auto parse = [size, names](const std::string& text) {
        try {
            *size = parse_size(text);
        } catch (const Error& error) {
            reject(names, error.what());
        }
    };
    app->add_option_function<std::string>(names, parse, help)->type_name("WxH");
}

// An option whose value is one of a few words. Target: a Value, or an optional one.
template <class Target, class Value>
void add_choice(CLI::App* app, const std::string& names, const std::string& type_name,
                Target* target, std::initializer_list<std::pair<const char*, Value>> choices,
                const std::string& help) {
    const std::vector<std::pair<const char*, Value>> known(choices);
    const auto parse = [target, names, known](const std::string& text) {
        std::string words;
        for (const auto& [word, value] : known) {
            if (text == word) {
                *target = value;
                return;
            }
            words += std::string(" ") + word;
        }
        reject(names, "'" + text + "' is none of:" + words);
    };
    app->add_option_function<std::string>(names, parse, help)->type_name(type_name);
}

void declare_files(CLI::App* app, Options* options) {
    app->add_option(
           "IN", options->in,
           "PNG, JPEG, binary PPM, Y4M or, with --format, raw frames;\n- is standard input")
        ->required()
        ->type_name("");
    app->add_option("OUT", options->out,
                    "Its name ends in .png, .jpg, .jpeg, .ppm, .y4m, or for raw frames\n"
                    "in .nv21, .i420, .yuv, .rgba, .rgb; - is standard output, with\n"
                    "the type of IN")
        ->required()
        ->type_name("");
    add_choice<std::optional<PixelFormat>, PixelFormat>(
        app, "--format", "FORMAT", &options->raw_format,
        {{"nv21", PixelFormat::kNv21},
         {"i420", PixelFormat::kI420},
         {"rgba", PixelFormat::kRgba},
         {"rgb", PixelFormat::kRgb}},
        "IN holds raw frames: nv21, i420, rgba or rgb");
    add_size(app, "--input-size", &options->raw_size, "Size of the raw frames");
    app->get_option("--format")->needs("--input-size");
    app->get_option("--input-size")->needs("--format");
}

void declare_resizing(CLI::App* app, Options* options) {
    add_size(app, "-s,--size", &options->wish.size, "Size of the scaled picture, like 640x480");
    add_size(app, "-c,--canvas", &options->wish.canvas,
             "Put it in the middle of a black canvas of this size, which it\n"
             "fills unless there is a --size");
    add_choice<std::optional<Fit>, Fit>(
        app, "-f,--fit", "MODE", &options->wish.fit,
        {{"exact", Fit::kExact}, {"contain", Fit::kContain}},
        "exact: stretch to the size (the default without --canvas);\n"
        "contain: the largest picture that fits into the size and keeps\n"
        "its proportions (the default with --canvas)");
    add_choice<Engine, Engine>(app, "-e,--engine", "NAME", &options->engine,
                               {{"quarter", Engine::kQuarter},
                                {"bilinear", Engine::kBilinear},
                                {"lanczos", Engine::kLanczos},
                                {"nearest", Engine::kNearest}},
                               "Resampler: quarter (the default), bilinear, lanczos or nearest");
}

void declare(CLI::App* app, Options* options) {
    app->formatter(std::make_shared<HelpFormatter>());
    declare_resizing(app, options);
    declare_files(app, options);
    app->add_option("-q,--quality", options->quality, "JPEG quality, 1 to 100; 90 by default")
        ->type_name("N")
        ->check(CLI::Range(1, 100).description(""));
    app->add_flag("-v,--verbose", options->verbose,
                  "Say on standard error what was done and how long the resizing took");
    app->set_help_flag("-h,--help", "Print this help and exit");
    app->set_version_flag("-V,--version", "ovrinresize " OVRINRESIZE_VERSION,
                          "Print the version and exit");
    app->footer(
        "The content of IN decides what it is, not its name. PNG keeps an alpha channel; JPEG and\n"
        "PPM drop it and keep the colours as they are. See ovrinresize(1) for the details.\n"
        "\n"
        "Examples:\n"
        "  ovrinresize photo.jpg small.jpg --size 1024x768\n"
        "  ovrinresize photo.jpg screen.png --canvas 1920x1080\n"
        "  ovrinresize camera.nv21 small.nv21 --format nv21 --input-size 4000x3000 -s 1000x750\n"
        "  ffmpeg -i film.mp4 -f yuv4mpegpipe - | ovrinresize - - -s 640x360 | ffplay -");
}

void parse(int argc, char** argv, CLI::App* app, Options* options) {
    declare(app, options);
    app->parse(argc, argv);
    if (!options->wish.size && !options->wish.canvas) {
        throw CLI::RequiredError("--size or --canvas");
    }
}

// ---- Work ----

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

void report(const Source& source, const Placement& placement, int64_t frames, double milliseconds) {
    std::cerr << name_of(source.kind().format) << " " << to_string(source.size()) << " to "
              << to_string(placement.picture);
    if (placement.on_canvas) std::cerr << " on " << to_string(placement.result);
    std::cerr << ": " << std::fixed << std::setprecision(3);
    if (frames == 1) {
        std::cerr << "resized in " << milliseconds << " ms\n";
    } else {
        std::cerr << frames << " frames resized in " << milliseconds / static_cast<double>(frames)
                  << " ms each\n";
    }
}

std::optional<Y4mHeader> resized_header(const Source& source, const Placement& placement) {
    if (!source.y4m_header()) return std::nullopt;
    return resized_y4m_header(*source.y4m_header(), placement.picture, placement.result,
                              placement.keeps_aspect);
}

void run(const Options& options) {
    std::optional<RawLayout> raw;
    if (options.raw_format) raw = RawLayout{*options.raw_format, *options.raw_size};
    const auto source = concerning(options.in, [&] { return open_source(options.in, raw); });
    const PixelFormat format = source->kind().format;
    const FileKind out_kind = concerning(options.out, [&] {
        return options.out == "-" ? source->kind() : kind_of_name(options.out);
    });
    check_conversion(source->kind(), out_kind);
    const Placement placement = place(options.wish, source->size(), format);
    check_engine(options.engine, format, placement);

    OutputFile file(options.out);
    Sink sink(out_kind, resized_header(*source, placement), options.quality, file.stream());
    Picture frame;
    Picture result(placement.result, format);
    Stopwatch resizing;
    int64_t frames = 0;
    {
        Progress progress;
        while (concerning(options.in, [&] { return source->next(&frame); })) {
            resizing.time([&] { resize(options.engine, frame, placement, &result); });
            concerning(options.out, [&] { sink.write(result); });
            progress.update(++frames, source->part_read());
        }
    }
    if (frames == 0) throw Error(options.in + ": holds no frame");
    file.commit();
    if (options.verbose) report(*source, placement, frames, resizing.milliseconds());
}

// One line whatever the message holds: it may quote names and arguments.
ExitCode fail(ExitCode code, const char* message) {
    static_cast<void>(fputs("ovrinresize: ", stderr));
    for (; *message != '\0'; ++message) {
        const auto letter = static_cast<unsigned char>(*message);
        const bool is_control = letter < ' ' || letter == 127;
        static_cast<void>(fputc(is_control ? ' ' : letter, stderr));
    }
    static_cast<void>(fputc('\n', stderr));
    return code;
}

int command(int argc, char** argv) {
    CLI::App app("Resize pictures and video frames.", "ovrinresize");
    Options options;
    try {
        parse(argc, argv, &app, &options);
    } catch (const CLI::Success& success) {
        return app.exit(success);
    } catch (const CLI::Error& error) {
        return fail(kWrongUsage, error.what());
    }
    run(options);
    return kDone;
}

}  // namespace

int main(int argc, char** argv) {
    try {
        return command(argc, argv);
    } catch (const std::bad_alloc&) {
        return fail(kFailed, "not enough memory");
    } catch (const std::exception& error) {
        return fail(kFailed, error.what());
    }
}
