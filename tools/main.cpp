// SPDX-License-Identifier: Apache-2.0
// The ovrinresize command: reads a picture, resizes it with the library, writes it.
#include <CLI/CLI.hpp>
#include <cstdio>
#include <exception>
#include <memory>
#include <new>
#include <string>

#include "engine.h"
#include "error.h"
#include "output_file.h"
#include "picture_file.h"
#include "size.h"

namespace {

using namespace tool;

enum ExitCode { kDone = 0, kFailed = 1, kWrongUsage = 2 };

struct Options {
    std::string in;
    std::string out;
    Size size = {};
    std::string engine = engine_names().front();
    int quality = 90;
};

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

CLI::Option* add_size(CLI::App* app, const std::string& name, Size* size, const std::string& help) {
    const auto parse = [size, name](const std::string& text) {
        try {
            *size = parse_size(text);
        } catch (const Error& error) {
            throw CLI::ValidationError(name.substr(name.find("--")), error.what());
        }
    };
    return app->add_option_function<std::string>(name, parse, help)->type_name("WxH");
}

void declare(CLI::App* app, Options* options) {
    app->formatter(std::make_shared<HelpFormatter>());
    app->set_help_flag("-h,--help", "Print this help and exit");
    app->set_version_flag("-V,--version", "ovrinresize " OVRINRESIZE_VERSION,
                          "Print the version and exit");
    app->add_option("IN", options->in, "Picture to read: PNG, JPEG or binary PPM")
        ->required()
        ->type_name("");
    app->add_option("OUT", options->out, "File to write: .png, .jpg, .jpeg or .ppm")
        ->required()
        ->type_name("");
    add_size(app, "-s,--size", &options->size, "Size of the result in pixels, like 640x480")
        ->required();
    app->add_option("-e,--engine", options->engine, "Resampler: quarter (the default)")
        ->type_name("NAME")
        ->check(CLI::IsMember(engine_names()).description(""));
    app->add_option("-q,--quality", options->quality, "JPEG quality, 1 to 100; 90 by default")
        ->type_name("N")
        ->check(CLI::Range(1, 100).description(""));
    app->footer(
        "IN is told apart by its content, OUT by its name. PNG keeps an alpha channel; JPEG and\n"
        "PPM drop it and keep the colours as they are.\n"
        "\n"
        "Examples:\n"
        "  ovrinresize photo.jpg small.jpg --size 1024x768\n"
        "  ovrinresize drawing.png icon.png -s 64x64");
}

void run(const Options& options) {
    const FileType type = concerning(options.out, [&] { return type_of_name(options.out); });
    const Picture result = resize(read_picture(options.in), options.size, options.engine);
    concerning(options.out, [&] {
        OutputFile file(options.out);
        write_picture(result, type, options.quality, file.stream());
        file.commit();
    });
}

// One line whatever the message holds: it may quote names and arguments.
ExitCode fail(ExitCode code, std::string message) {
    for (char& letter : message) {
        if (letter == '\n') letter = ' ';
        if (static_cast<unsigned char>(letter) < ' ' || letter == 127) letter = '?';
    }
    fprintf(stderr, "ovrinresize: %s\n", message.c_str());
    return code;
}

}  // namespace

int main(int argc, char** argv) {
    CLI::App app("Resize a picture.", "ovrinresize");
    Options options;
    try {
        declare(&app, &options);
        app.parse(argc, argv);
    } catch (const CLI::Success& success) {
        return app.exit(success);
    } catch (const CLI::Error& error) {
        return fail(kWrongUsage, error.what());
    }
    try {
        run(options);
    } catch (const std::bad_alloc&) {
        return fail(kFailed, "not enough memory");
    } catch (const std::exception& error) {
        return fail(kFailed, error.what());
    }
    return kDone;
}
