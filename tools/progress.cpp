// SPDX-License-Identifier: Apache-2.0
#include "progress.h"

#include <unistd.h>

#include <algorithm>
#include <iomanip>
#include <iostream>
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

void Progress::update(int64_t count, double part) {
    const Clock::time_point now = Clock::now();
    if (!is_wanted_ || now < next_update_) return;
    next_update_ = now + kInterval;
    is_visible_ = true;
    const double seconds = std::chrono::duration<double>(now - start_).count();
    std::cerr << '\r' << bar(part) << count << " " << things_ << ", " << std::fixed
              << std::setprecision(1) << static_cast<double>(count) / seconds << " per second"
              << kEraseToEnd << std::flush;
}

}  // namespace tool
