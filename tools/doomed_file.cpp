// SPDX-License-Identifier: Apache-2.0
#include "doomed_file.h"

#include <unistd.h>

#include <atomic>

namespace tool {

namespace {

// Signals come on any thread.
std::atomic<const char*> doomed[kMostDoomedFiles];
static_assert(std::atomic<const char*>::is_always_lock_free);

// Two signals may be handled at once, on two threads: each removes the files before it lets the
// program end, so none can end it too early.
void remove_and_die(int signal_number) {
    for (const std::atomic<const char*>& file : doomed) {
        const char* const path = file;
        if (path != nullptr) unlink(path);
    }
    static_cast<void>(signal(signal_number, SIG_DFL));
    static_cast<void>(raise(signal_number));
}

}  // namespace

SignalsBlocked::SignalsBlocked() : previous_() {
    sigset_t all;
    sigfillset(&all);
    pthread_sigmask(SIG_SETMASK, &all, &previous_);
}

SignalsBlocked::~SignalsBlocked() {
    pthread_sigmask(SIG_SETMASK, &previous_, nullptr);
}

void doom_file(const std::string& path) {
    for (std::atomic<const char*>& file : doomed) {
        const char* none = nullptr;
        if (file.compare_exchange_strong(none, path.c_str())) break;
    }
    struct sigaction removing = {};
    removing.sa_handler = remove_and_die;
    for (const int number : {SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGPIPE}) {
        struct sigaction previous = {};
        sigaction(number, nullptr, &previous);
        // What was ignored from the start, as under nohup, stays ignored.
        if (previous.sa_handler != SIG_IGN) sigaction(number, &removing, nullptr);
    }
}

void spare_file(const std::string& path) {
    for (std::atomic<const char*>& file : doomed) {
        const char* own = path.c_str();
        if (file.compare_exchange_strong(own, nullptr)) return;
    }
}

}  // namespace tool
