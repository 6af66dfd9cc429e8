// SPDX-License-Identifier: Apache-2.0
#include "options.h"

#include <algorithm>
#include <charconv>
#include <initializer_list>
#include <memory>
#include <thread>
#include <utility>
#include <vector>

#include "doomed_file.h"
#include "error.h"
#include "template.h"
#include "version.h"

namespace tool {

namespace {

// CLI11's help in the look of other command-line tools: "-s, --size WxH", and defaults in words.
class HelpFormatter : public CLI::Formatter {
public:
    explicit HelpFormatter(std::string usage) : usage_(std::move(usage)) {
        column_width(26);
        label("Positionals", "Arguments");
    }

    std::string make_usage(const CLI::App* /*app*/, std::string /*name*/) const override {
        return usage_;
    }

    std::string make_option_name(const CLI::Option* option, bool is_positional) const override {
        std::string name = Formatter::make_option_name(option, is_positional);
        const size_t comma = name.find(',');
        if (comma != std::string::npos) name.insert(comma + 1, " ");
        // What CLI11 adds to the name of a switch that is turned off.
        const size_t brace = name.find('{');
        if (brace != std::string::npos) name.erase(brace);
        return name;
    }

    std::string make_option_opts(const CLI::Option* option) const override {
        return option->get_type_name().empty() ? "" : " " + option->get_type_name();
    }

private:
    std::string usage_;
};

[[noreturn]] void reject(const std::string& names, const std::string& why) {
    throw CLI::ValidationError(names.substr(names.find("--")), why);
}

// An option whose value `read` makes of a word, or throws Error.
template <class Value, class Read>
void add_value(CLI::App* app, const std::string& names, const std::string& type_name,
               std::optional<Value>* value, Read read, const std::string& help) {
    const auto parse = [value, names, read](const std::string& text) {
        try {
            *value = read(text);
        } catch (const Error& error) {
            reject(names, error.what());
        }
    };
    app->add_option_function<std::string>(names, parse, help)->type_name(type_name);
}

Size read_size(const std::string& text) {
    const std::optional<Size> size = parse_size(text);
    if (!size) throw Error("'" + text + "' is not a size; write it like 640x480");
    return *size;
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

void add_switch_off(CLI::App* app, const std::string& name, bool* value, const std::string& help) {
    app->add_flag_callback(
        name, [value] { *value = false; }, help);
}

FileKind read_type(const std::string& text) {
    try {
        return kind_of_name("x." + text);
    } catch (const Error&) {
        throw Error("'" + text + "' is none of: png jpg ppm pgm pnm pam y4m nv21 i420 rgba rgb");
    }
}

// "A:B", "A:", ":B" or "A".
FrameRange read_frames(const std::string& text) {
    FrameRange range;
    const size_t colon = text.find(':');
    const auto read = [&](const std::string& digits, int64_t* number) {
        if (digits.empty()) return true;
        const char* const end = digits.data() + digits.size();
        const auto [stop, status] = std::from_chars(digits.data(), end, *number);
        return status == std::errc() && stop == end && *number >= 1;
    };
    bool is_right = text.size() > (colon == std::string::npos ? 0U : 1U);
    is_right = is_right && read(text.substr(0, colon), &range.first);
    if (colon == std::string::npos) {
        range.last = range.first;
    } else {
        is_right = is_right && read(text.substr(colon + 1), &range.last);
    }
    if (!is_right || range.first > range.last) {
        throw Error("'" + text + "' are no frames; write them like 10:20, 10: or :20");
    }
    return range;
}

void add_frames(CLI::App* app, Options* options) {
    const auto parse = [options](const std::string& text) {
        try {
            options->frames = read_frames(text);
        } catch (const Error& error) {
            reject("--frames", error.what());
        }
    };
    app->add_option_function<std::string>("--frames", parse,
                                          "Only these frames of IN, the first being 1")
        ->type_name("A:B");
}

void declare_raw(CLI::App* app, Options* options) {
    add_choice<std::optional<PixelFormat>, PixelFormat>(
        app, "--format", "FORMAT", &options->raw_format,
        {{"nv21", PixelFormat::kNv21},
         {"i420", PixelFormat::kI420},
         {"rgba", PixelFormat::kRgba},
         {"rgb", PixelFormat::kRgb}},
        "IN holds raw frames: nv21, i420, rgba or rgb");
    add_value(app, "--input-size", "WxH", &options->raw_size, read_size, "Size of the raw frames");
    app->get_option("--format")->needs("--input-size");
    app->get_option("--input-size")->needs("--format");
}

void declare_yuv(CLI::App* app, Options* options) {
    add_choice<Range, Range>(app, "--range", "RANGE", &options->yuv.range,
                             {{"full", Range::kFull}, {"limited", Range::kLimited}},
                             "Of YUV beside RGB: full, from 0 to 255, by default, or limited,\n"
                             "luma from 16 to 235");
    add_choice<Matrix, Matrix>(app, "--matrix", "NAME", &options->yuv.matrix,
                               {{"601", Matrix::k601}, {"709", Matrix::k709}},
                               "Of YUV beside RGB: that of BT.601, by default, or 709");
}

int64_t read_threads(const std::string& text) {
    int64_t threads = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, status] = std::from_chars(text.data(), end, threads);
    if (status != std::errc() || stop != end || threads < 1) {
        throw Error("'" + text + "' is neither auto nor a number from 1 on");
    }
    return threads;
}

void declare_threads(CLI::App* app, Options* options) {
    const auto parse = [options](const std::string& text) {
        options->threads.reset();
        if (text == "auto") return;
        try {
            options->threads = read_threads(text);
        } catch (const Error& error) {
            reject("--threads", error.what());
        }
    };
    app->add_option_function<std::string>(
           "--threads", parse,
           "At most so many threads at a time, for a picture or for all jobs;\n"
           "auto, as many as do good, by default")
        ->type_name("N");
}

void declare_limit(CLI::App* app, Options* options) {
    app->add_option("--max-pixels", options->most_pixels,
                    "Refuse larger pictures, before memory is taken for them;\n"
                    "268435456, which is the most, by default")
        ->type_name("N")
        ->check(CLI::Range(int64_t{1}, kMostPixels).description(""));
}

void declare_files(CLI::App* app, Options* options) {
    app->add_option("IN OUT", options->files,
                    "IN is PNG, JPEG, PBM, PGM, PPM, PAM, Y4M or, with --format, raw\n"
                    "frames; - is standard input. OUT ends in .png, .jpg, .jpeg, .ppm,\n"
                    ".pgm, .pnm, .pam, .y4m, or for raw frames in .nv21, .i420, .yuv,\n"
                    ".rgba, .rgb; - is standard output, with the type of IN. With\n"
                    "--output all are IN")
        ->type_name("");
    app->add_option_function<std::string>(
           "-o,--output", [options](const std::string& text) { options->output = text; },
           "Name of the results of many files, where %s is that of the source\n"
           "without folder and ending, like thumbs/%s.jpg")
        ->type_name("TEMPLATE");
    add_value(app, "-t,--output-type", "TYPE", &options->output_type, read_type,
              "Type of OUT whatever its name: png, jpg, ppm, pgm, pnm, pam, y4m,\n"
              "nv21, i420, rgba or rgb");
    app->add_flag("-r,--recursive", options->recursive, "Take pictures in folders, too")
        ->needs("--output");
    app->add_option("-j,--jobs", options->jobs,
                    "How many pictures at a time; as many as there are processors by\n"
                    "default")
        ->type_name("N")
        ->check(CLI::Range(1, kMostDoomedFiles).description(""))
        ->needs("--output");
    add_frames(app, options);
    declare_raw(app, options);
}

void declare_resizing(CLI::App* app, Options* options) {
    add_value(app, "-s,--size", "SIZE", &options->wish.size, parse_geometry,
              "640x480 fits inside and keeps the proportions; so do 640x, x480 and\n"
              "640 (a width). 640x480! is exact, 640x480^ covers and is cropped.\n"
              "50% is of both sides, 100000@ of pixels in all. With > behind it a\n"
              "picture only shrinks, with < it only grows");
    add_value(app, "-c,--canvas", "WxH", &options->wish.canvas, read_size,
              "Put it in the middle of a canvas of this size, which it fills\n"
              "unless there is a --size");
    add_choice<std::optional<Fit>, Fit>(
        app, "-f,--fit", "MODE", &options->wish.fit,
        {{"contain", Fit::kContain}, {"exact", Fit::kExact}, {"cover", Fit::kCover}},
        "Words for what the signs behind a size say: contain (the default),\n"
        "exact (!) or cover (^)");
    add_choice<Gravity, Gravity>(
        app, "-g,--gravity", "PLACE", &options->wish.gravity,
        {{"center", {1, 1}},
         {"north", {1, 0}},
         {"northeast", {2, 0}},
         {"east", {2, 1}},
         {"southeast", {2, 2}},
         {"south", {1, 2}},
         {"southwest", {0, 2}},
         {"west", {0, 1}},
         {"northwest", {0, 0}}},
        "Which end of the canvas the picture lies at, or which part of it is\n"
        "left when it is cropped: north, southeast and so on");
    add_choice<std::optional<Engine>, Engine>(
        app, "-e,--engine", "NAME", &options->engine,
        {{"quarter", Engine::kQuarter},
         {"thumbnail", Engine::kThumbnail},
         {"bilinear", Engine::kBilinear},
         {"bilinear-progressive", Engine::kBilinearProgressive},
         {"lanczos", Engine::kLanczos},
         {"nearest", Engine::kNearest}},
        "Resampler: quarter, thumbnail, bilinear, bilinear-progressive,\n"
        "lanczos or nearest. Without it thumbnail for pictures that shrink\n"
        "to half or less in both directions, and quarter for all others");
}

void declare_resize(CLI::App* app, Options* options) {
    app->formatter(std::make_shared<HelpFormatter>(
        "Usage: ovrinresize IN OUT --size SIZE [OPTION]...\n"
        "       ovrinresize IN... --output TEMPLATE --size SIZE [OPTION]...\n"
        "       ovrinresize info | compare | selftest, each with --help\n"));
    declare_resizing(app, options);
    declare_files(app, options);
    declare_yuv(app, options);
    declare_threads(app, options);
    app->add_option("-q,--quality", options->quality, "JPEG quality, 1 to 100; 90 by default")
        ->type_name("N")
        ->check(CLI::Range(1, 100).description(""));
    add_value(app, "--background", "COLOUR", &options->background, parse_color,
              "Colour behind what is transparent, and of the canvas: #rrggbb, #rgb\n"
              "or a name. Without it PNG stays transparent, JPEG and others get\n"
              "white, and the canvas is black");
    app->add_flag("--premultiply,!--no-premultiply", options->premultiply,
                  "Whether colours count as much as they are opaque, so that those of\n"
                  "transparent pixels do not show; they do unless told otherwise");
    add_switch_off(app, "--no-rotate", &options->rotate,
                   "Leave pixels and the orientation that a camera recorded as they are;\n"
                   "otherwise the result is upright");
    app->add_flag("--strip", options->strip,
                  "Drop colour profile, EXIF and all other metadata, which OUT keeps\n"
                  "where its type can hold them");
    app->add_flag("--strict", options->strict,
                  "Refuse a JPEG that ends early instead of showing what there is");
    app->add_flag("-v,--verbose", options->verbose,
                  "Say on standard error what was done and how long the resizing took");
    app->add_flag("--json", options->json,
                  "Say on standard output what was done, as one line of JSON");
    app->add_flag("--quiet", options->quiet, "Say nothing but what went wrong");
    app->get_option("--quiet")->excludes("--verbose");
    declare_limit(app, options);
    app->set_version_flag("-V,--version", version_text(),
                          "Print the versions and the kernels in use, and exit");
    app->footer(
        "The content of IN decides what it is, not its name. An older OUT is replaced.\n"
        "info says what files hold, compare how far two are apart, selftest whether the\n"
        "library works as it should on this machine. See ovrinresize(1) for the details.\n"
        "\n"
        "Examples:\n"
        "  ovrinresize photo.jpg small.jpg --size 1024x768\n"
        "  ovrinresize photo.jpg screen.png --canvas 1920x1080\n"
        "  ovrinresize *.jpg --size 200 --output thumbs/%s_small.jpg\n"
        "  ovrinresize camera.nv21 small.nv21 --format nv21 --input-size 4000x3000 -s 1000x750\n"
        "  ffmpeg -i film.mp4 -f yuv4mpegpipe - | ovrinresize - - -s 640x360 | ffplay -");
}

void declare_upright(CLI::App* app, Options* options) {
    add_switch_off(app, "--no-rotate", &options->rotate,
                   "Leave the orientation that a camera recorded out of account");
}

void declare_info(CLI::App* app, Options* options) {
    app->description("Say what pictures and video frames are, on standard output.");
    app->formatter(
        std::make_shared<HelpFormatter>("Usage: ovrinresize info FILE... [OPTION]...\n"));
    app->add_option("FILE", options->files, "As IN of ovrinresize; - is standard input")
        ->type_name("");
    declare_raw(app, options);
    declare_limit(app, options);
    app->add_flag("--json", options->json, "Say it as a line of JSON for each file");
}

void declare_compare(CLI::App* app, Options* options) {
    app->description(
        "Say how far two pictures, or the frames of two files, are apart. The exit status is 0 "
        "when\n"
        "they are equal, 1 when they are not or have different sizes.");
    app->formatter(std::make_shared<HelpFormatter>("Usage: ovrinresize compare A B [OPTION]...\n"));
    app->add_option("A B", options->files, "As IN of ovrinresize; - is standard input")
        ->type_name("");
    app->add_option("--max-diff", options->largest_difference,
                    "Samples that are so far apart count as equal; 0 by default")
        ->type_name("N")
        ->check(CLI::Range(0, 255).description(""));
    declare_raw(app, options);
    declare_yuv(app, options);
    declare_upright(app, options);
    declare_limit(app, options);
    app->add_flag("--json", options->json, "Say it as one line of JSON");
    app->add_flag("--quiet", options->quiet, "Say nothing but what went wrong");
    app->get_option("--quiet")->excludes("--json");
}

void declare_selftest(CLI::App* app, Options* options) {
    app->description(
        "Call the library with every set of kernels that this processor has, and compare the "
        "results\n"
        "with those that are the same everywhere. The exit status is 1 when any differs.");
    app->formatter(std::make_shared<HelpFormatter>("Usage: ovrinresize selftest [OPTION]...\n"));
    app->add_option("--library", options->library,
                    "Call this shared library instead, with the kernels that it chooses")
        ->type_name("FILE");
    app->add_flag("--json", options->json, "Say it as one line of JSON");
}

void declare(CLI::App* app, Options* options) {
    app->set_help_flag("-h,--help", "Print this help and exit");
    switch (options->command) {
        case Command::kResize:
            return declare_resize(app, options);
        case Command::kInfo:
            return declare_info(app, options);
        case Command::kCompare:
            return declare_compare(app, options);
        case Command::kSelftest:
            return declare_selftest(app, options);
    }
}

Command command_of(const std::string& word) {
    if (word == "info") return Command::kInfo;
    if (word == "compare") return Command::kCompare;
    return word == "selftest" ? Command::kSelftest : Command::kResize;
}

void check_template(const Options& options) {
    try {
        const bool tells_apart =
            filled_template(*options.output, "a") != filled_template(*options.output, "b");
        const bool are_many = options.files.size() > 1 || options.recursive;
        if (!options.output_type) kind_of_name(filled_template(*options.output, "a"));
        if (are_many && !tells_apart) throw Error("many results need a %s in their name");
    } catch (const Error& error) {
        reject("--output", error.what());
    }
}

// One job's files, unless there is a template for many.
void take_files(Options* options) {
    const size_t count = options->files.size();
    if (count == 0) throw CLI::RequiredError("IN");
    if (options->output) {
        check_template(*options);
        return;
    }
    if (count == 1) throw CLI::RequiredError("OUT");
    if (count > 2) {
        throw CLI::ValidationError("more than IN and OUT: " + options->files[2],
                                   "--output names the results of many");
    }
    options->in = options->files[0];
    options->out = options->files[1];
}

void check_resize(Options* options) {
    take_files(options);
    if (!options->wish.size && !options->wish.canvas) {
        throw CLI::RequiredError("--size or --canvas");
    }
    if (options->json && (options->out == "-" || options->output == "-")) {
        throw CLI::ValidationError("--json", "standard output is taken by OUT");
    }
    if (options->threads) options->jobs = std::min(options->jobs, *options->threads);
}

void check(Options* options) {
    const size_t count = options->files.size();
    if (options->command == Command::kResize) check_resize(options);
    if (options->command == Command::kInfo && count == 0) throw CLI::RequiredError("FILE");
    if (options->command == Command::kCompare && count != 2) {
        throw CLI::ValidationError("compare", "takes two files, A and B");
    }
}

}  // namespace

std::optional<RawLayout> raw_layout(const Options& options) {
    if (!options.raw_format) return std::nullopt;
    return RawLayout{*options.raw_format, *options.raw_size};
}

void parse(int argc, char** argv, CLI::App* app, Options* options) {
    options->command = command_of(argc > 1 ? argv[1] : "");
    const int words = options->command == Command::kResize ? 0 : 1;
    declare(app, options);
    options->jobs = std::clamp<int64_t>(std::thread::hardware_concurrency(), 1, kMostDoomedFiles);
    app->parse(argc - words, argv + words);
    check(options);
}

}  // namespace tool
