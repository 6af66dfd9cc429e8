// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <cstdint>
#include <string>

namespace tool {

// A line on standard error that says how far a long job has come. It appears after half a second,
// only when standard error is a terminal, and is wiped at the end.
class Progress {
public:
    // is_wanted: otherwise nothing appears. things: what is counted.
    Progress(bool is_wanted, const char* things);
    ~Progress();
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

    // part: of the work that is done, 0 to 1; negative when not known.
    void update(int64_t count, double part);
    // The same for a step of the work on a single thing, such as "reading".
    void update_step(const char* step, double part);

    // Until the next update, to make room for a message.
    void hide();

private:
    bool is_due();
    void show(double part, const std::string& text);

    using Clock = std::chrono::steady_clock;

    bool is_wanted_;
    const char* things_;
    bool is_visible_ = false;
    Clock::time_point start_;
    Clock::time_point next_update_;
};

}  // namespace tool
