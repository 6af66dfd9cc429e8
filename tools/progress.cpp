// SPDX-License-Identifier: Apache-2.0
#include "progress.h"

#include <unistd.h>

#include <algorithm>
#include <iomanip>
#include <iostream>
#include <sstream>
#include <string>

namespace tool {

namespace {

constexpr std::chrono::milliseconds kPatience(500);
constexpr std::chrono::milliseconds kInterval(100);
constexpr char kEraseToEnd[] = "\033[K";

std::string bar(double part) {
    if (part < 0) return "";
    constexpr int kCells = 30;
    const double done = std::min(part, 1.0);
    const auto cells = static_cast<size_t>(done * kCells);
    const std::string percent = std::to_string(static_cast<int>(done * 100));
    return "[" + std::string(cells, '#') + std::string(kCells - cells, '-') + "] " + percent +
           "%  ";
}

}  // namespace

Progress::Progress(bool is_wanted, const char* things)
    : is_wanted_(is_wanted && isatty(STDERR_FILENO) == 1),
      things_(things),
      start_(Clock::now()),
      next_update_(start_ + kPatience) {}

Progress::~Progress() {
    hide();
}

void Progress::hide() {
    if (is_visible_) std::cerr << '\r' << kEraseToEnd << std::flush;
    is_visible_ = false;
}

bool Progress::is_due() {
    if (!is_wanted_) return false;
    const Clock::time_point now = Clock::now();
    if (now < next_update_) return false;
    next_update_ = now + kInterval;
    return true;
}

void Progress::show(double part, const std::string& text) {
    is_visible_ = true;
    std::cerr << '\r' << bar(part) << text << kEraseToEnd << std::flush;
}

void Progress::update(int64_t count, double part) {
    if (!is_due()) return;
    const double seconds = std::chrono::duration<double>(Clock::now() - start_).count();
    std::ostringstream text;
    text << count << " " << things_ << ", " << std::fixed << std::setprecision(1)
         << static_cast<double>(count) / seconds << " per second";
    show(part, text.str());
}

void Progress::update_step(const char* step, double part) {
    if (is_due()) show(part, step);
}

}  // namespace tool
