// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <dirent.h>
#include <unistd.h>

#include "support/instrumented.h"

namespace ovrin_test {

// Of a folder in /proc: /proc/self/fd has one more than there are descriptors, for the reading.
inline int count_entries(const char* folder) {
    int count = 0;
    DIR* entries = opendir(folder);
    while (const dirent* entry = readdir(entries)) count += entry->d_name[0] != '.';
    closedir(entries);
    return count;
}

inline int thread_count() {
    return count_entries("/proc/self/task");
}

// Waits for threads that have been joined, or end by themselves, to leave the list.
inline bool only_threads(int expected) {
    for (int i = 0; i < 60000 && thread_count() > expected; ++i) usleep(1000);
    return thread_count() <= expected;
}

// The thread sanitizer and qemu-user have a thread of their own.
inline bool only_this_thread() {
    return only_threads(kInstrumented || kEmulated ? 2 : 1);
}

}  // namespace ovrin_test
