// SPDX-License-Identifier: Apache-2.0
#include "output_file.h"

#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "error.h"

namespace tool {

namespace {

// The name that a signal handler has to remove; null when there is none.
const char* volatile doomed_file = nullptr;

// The handler is taken away when it is called, so the second signal ends the program.
void remove_and_die(int signal_number) {
    if (doomed_file != nullptr) unlink(doomed_file);
    static_cast<void>(raise(signal_number));
}

void remove_on_signals(const char* name) {
    doomed_file = name;
    struct sigaction removing = {};
    removing.sa_handler = remove_and_die;
    removing.sa_flags = static_cast<int>(SA_RESETHAND);
    for (const int number : {SIGHUP, SIGINT, SIGTERM}) {
        struct sigaction previous = {};
        sigaction(number, nullptr, &previous);
        // What was ignored from the start, as under nohup, stays ignored.
        if (previous.sa_handler != SIG_IGN) sigaction(number, &removing, nullptr);
    }
    // A file past its size limit is an error to report like any other.
    struct sigaction ignoring = {};
    ignoring.sa_handler = SIG_IGN;
    sigaction(SIGXFSZ, &ignoring, nullptr);
}

// A link's own name shall survive, so the file is replaced where it really lies.
std::string real_path(const std::string& path) {
    std::error_code none;
    if (!std::filesystem::is_symlink(path, none)) return path;
    const std::filesystem::path real = std::filesystem::canonical(path, none);
    return none ? path : real.string();
}

mode_t default_mode() {
    const mode_t mask = umask(0);
    umask(mask);
    return 0666 & ~mask;
}

}  // namespace

OutputFile::OutputFile(const std::string& path) : name_(path), path_(real_path(path)) {
    concerning(name_, [this] { open(); });
}

void OutputFile::open() {
    if (path_ == "-") {
        if (isatty(STDOUT_FILENO) == 1) throw Error("standard output is a terminal");
        stream_ = stdout;
        return;
    }
    struct stat existing = {};
    const bool exists = stat(path_.c_str(), &existing) == 0;
    if (exists && S_ISDIR(existing.st_mode)) throw Error(strerror(EISDIR));
    if (exists && !S_ISREG(existing.st_mode)) {
        stream_ = fopen(path_.c_str(), "wb");
        if (stream_ == nullptr) throw Error(strerror(errno));
        return;
    }

    temporary_ = std::filesystem::path(path_).parent_path() / ".ovrinresize.XXXXXX";
    const int descriptor = mkstemp(temporary_.data());
    if (descriptor < 0) throw Error(std::string("cannot be written: ") + strerror(errno));
    remove_on_signals(temporary_.c_str());
    // Best effort: some file systems know no permissions.
    static_cast<void>(fchmod(descriptor, exists ? existing.st_mode & 07777 : default_mode()));
    stream_ = fdopen(descriptor, "wb");
    if (stream_ == nullptr) {
        close(descriptor);
        unlink(temporary_.c_str());
        doomed_file = nullptr;
        throw Error(strerror(errno));
    }
}

OutputFile::~OutputFile() {
    if (stream_ == nullptr) return;
    static_cast<void>(fclose(stream_));
    if (!temporary_.empty()) {
        unlink(temporary_.c_str());
        doomed_file = nullptr;
    }
}

void OutputFile::commit() {
    concerning(name_, [this] {
        if (fflush(stream_) != 0 || ferror(stream_) != 0) throw Error(strerror(errno));
        if (!temporary_.empty() && rename(temporary_.c_str(), path_.c_str()) != 0) {
            throw Error(strerror(errno));
        }
    });
    doomed_file = nullptr;
    static_cast<void>(fclose(stream_));
    stream_ = nullptr;
}

}  // namespace tool
