// SPDX-License-Identifier: Apache-2.0
#include "batch.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <filesystem>
#include <iomanip>
#include <iostream>
#include <mutex>
#include <sstream>
#include <thread>
#include <vector>

#include "error.h"
#include "job.h"
#include "message.h"
#include "progress.h"
#include "template.h"

namespace tool {

namespace {

using Clock = std::chrono::steady_clock;

// What the jobs share.
class Batch {
public:
    Batch(const Options& options, std::vector<InAndOut> files)
        : options_(options), files_(std::move(files)), progress_(!options.quiet, "pictures") {}

    // Takes one file after the other until there are none. On any number of threads.
    void work() {
        for (size_t i = next_++; i < files_.size(); i = next_++) {
            const std::string failure = resize(files_[i]);
            const std::lock_guard<std::mutex> lock(mutex_);
            if (!failure.empty()) {
                ++failures_;
                progress_.hide();
                say(failure.c_str());
            }
            ++done_;
            progress_.update(done_,
                             static_cast<double>(done_) / static_cast<double>(files_.size()));
        }
    }

    int64_t failures() const { return failures_; }

private:
    // What went wrong; empty when nothing did.
    std::string resize(const InAndOut& file) const {
        Options options = options_;
        options.in = file.in;
        options.out = file.out;
        // A bar for each would be too many.
        options.shows_progress = false;
        try {
            const std::filesystem::path folder = std::filesystem::path(file.out).parent_path();
            std::error_code ignored;  // the file itself will tell
            if (!folder.empty()) std::filesystem::create_directories(folder, ignored);
            run(options);
        } catch (const std::bad_alloc&) {
            return file.in + ": not enough memory";
        } catch (const std::exception& error) {
            return error.what();
        }
        return "";
    }

    const Options& options_;
    const std::vector<InAndOut> files_;
    std::atomic<size_t> next_ = 0;
    std::mutex mutex_;  // of all below
    Progress progress_;
    int64_t done_ = 0;
    int64_t failures_ = 0;
};

std::string summary(int64_t resized, int64_t all, Clock::duration time) {
    std::ostringstream words;
    words << resized << " of " << all << " pictures resized in " << std::fixed
          << std::setprecision(2) << std::chrono::duration<double>(time).count() << " s\n";
    return words.str();
}

}  // namespace

int64_t run_batch(const Options& options) {
    std::vector<InAndOut> files = in_and_out(options.files, *options.output, options.recursive);
    if (files.empty()) throw Error("no picture to resize");
    const auto all = static_cast<int64_t>(files.size());
    const auto start = Clock::now();
    int64_t failures = 0;
    {
        Batch batch(options, std::move(files));
        std::vector<std::thread> threads;
        const int64_t wanted = std::min<int64_t>(options.jobs, all);
        try {
            while (static_cast<int64_t>(threads.size()) + 1 < wanted) {
                threads.emplace_back([&batch] { batch.work(); });
            }
        } catch (const std::system_error&) {
            // Those that there are do the work.
        }
        batch.work();
        for (std::thread& thread : threads) thread.join();
        failures = batch.failures();
    }
    if (!options.quiet) std::cerr << summary(all - failures, all, Clock::now() - start);
    return failures;
}

}  // namespace tool
