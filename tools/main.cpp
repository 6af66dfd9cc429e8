// SPDX-License-Identifier: Apache-2.0
// The ovrinresize command: reads pictures, resizes them with the library, writes them; and what
// else there is to do with pictures and with the library.
#include <exception>
#include <iostream>
#include <new>

#include "batch.h"
#include "compare.h"
#include "info.h"
#include "job.h"
#include "message.h"
#include "options.h"
#include "selftest.h"

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

bool resize(const Options& options) {
    const int64_t jobs = options.output ? options.jobs : 1;
    if (options.threads && *options.threads < jobs * kThreadsOfPicture) keep_to_calling_thread();
    if (options.output) return run_batch(options) == 0;
    run(options);
    return true;
}

// False when something failed, or files or results differ; that has been said.
bool carry_out(const Options& options) {
    switch (options.command) {
        case Command::kResize:
            return resize(options);
        case Command::kInfo:
            return say_what_files_are(options);
        case Command::kCompare:
            return compare(options);
        case Command::kSelftest:
            break;
    }
    return selftest(options);
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
    set_yuv_meaning(options.yuv);
    return carry_out(options) ? checked_output() : kFailed;
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
