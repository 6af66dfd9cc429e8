// SPDX-License-Identifier: Apache-2.0
// The ovrinresize command: reads pictures, resizes them with the library, writes them.
#include <exception>
#include <iostream>
#include <new>

#include "batch.h"
#include "job.h"
#include "message.h"
#include "options.h"

namespace {

using namespace tool;

enum ExitCode { kDone = 0, kFailed = 1, kWrongUsage = 2 };

ExitCode fail(ExitCode code, const char* message) {
    say(message);
    return code;
}

// Whether standard output has taken all that was printed.
ExitCode checked_output() {
    if (std::cout.flush()) return kDone;
    return fail(kFailed, "standard output cannot be written");
}

int command(int argc, char** argv) {
    CLI::App app("Resize pictures and video frames.", "ovrinresize");
    Options options;
    try {
        parse(argc, argv, &app, &options);
    } catch (const CLI::Success& success) {
        app.exit(success);
        return checked_output();
    } catch (const CLI::Error& error) {
        return fail(kWrongUsage, error.what());
    }
    set_most_pixels(options.most_pixels);
    if (options.output) {
        const bool all_done = run_batch(options) == 0;
        return all_done ? checked_output() : kFailed;
    }
    run(options);
    return checked_output();
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
