// SPDX-License-Identifier: Apache-2.0
#include "progress.h"

#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <string>

namespace tool {

namespace {

constexpr std::chrono::milliseconds kPatience(500);
constexpr std::chrono::milliseconds kInterval(100);

std::string bar(double part) {
    if (part < 0) return "";
    constexpr int kCells = 30;
    const double done = std::min(part, 1.0);
    const auto cells = static_cast<size_t>(done * kCells);
    char percent[16];
    snprintf(percent, sizeof(percent), "%3d%%  ", static_cast<int>(done * 100));
    return "[" + std::string(cells, '#') + std::string(kCells - cells, '-') + "] " + percent;
}

}  // namespace

Progress::Progress()
    : is_terminal_(isatty(STDERR_FILENO) == 1),
      start_(Clock::now()),
      next_update_(start_ + kPatience) {}

Progress::~Progress() {
    if (is_visible_) fputs("\r\033[K", stderr);
}

void Progress::update(int64_t frames, double part) {
    const Clock::time_point now = Clock::now();
    if (!is_terminal_ || now < next_update_) return;
    next_update_ = now + kInterval;
    is_visible_ = true;
    const double seconds = std::chrono::duration<double>(now - start_).count();
    fprintf(stderr, "\r%s%lld frames, %.1f per second\033[K", bar(part).c_str(),
            static_cast<long long>(frames), static_cast<double>(frames) / seconds);
}

}  // namespace tool
