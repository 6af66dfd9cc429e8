// SPDX-License-Identifier: Apache-2.0
#include "output_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "doomed_file.h"
#include "error.h"

namespace tool {

namespace {

namespace fs = std::filesystem;

// A link's own name shall survive, so the file is replaced where it really lies.
std::string real_path(const std::string& path) {
    std::error_code none;
    if (!fs::is_symlink(path, none)) return path;
    const fs::path real = fs::canonical(path, none);
    return none ? path : real.string();
}

// Asking for the mask means to change it for a moment, in all threads: it is done once, before any
// of them makes a file.
mode_t default_mode() {
    static const mode_t mode = [] {
        const mode_t mask = umask(0);
        umask(mask);
        return 0666 & ~mask;
    }();
    return mode;
}

std::string in_folder_of(const std::string& path, const std::string& name) {
    return fs::path(path).parent_path() / name;
}

std::string folder_of(const std::string& path) {
    const fs::path folder = fs::path(path).parent_path();
    return folder.empty() ? "." : folder.string();
}

// The name by which the system knows what a descriptor refers to.
std::string path_of(int descriptor) {
    return "/proc/self/fd/" + std::to_string(descriptor);
}

// A file without a name, or -1: the file system, an old kernel or a system without /proc does not
// have them, or the folder cannot be written to.
int open_nameless(const std::string& folder) {
    const int descriptor = open(folder.c_str(), O_TMPFILE | O_WRONLY | O_CLOEXEC, 0666);
    if (descriptor < 0 || access(path_of(descriptor).c_str(), F_OK) == 0) return descriptor;
    close(descriptor);
    return -1;
}

bool link_to(const std::string& from, const char* to) {
    return linkat(AT_FDCWD, from.c_str(), AT_FDCWD, to, AT_SYMLINK_FOLLOW) == 0;
}

// Gives a file without a name one in place of an older file; returns an errno, EEXIST where the
// hidden name is taken. Linux can do that in two steps only: the file gets the hidden name, which
// then replaces the other one. A process of its own takes both, so that whatever ends this one, the
// hidden name does not stay; and in a session of its own, so that it is not ended along with a
// group of processes. What remains is a kill of just that process, or of the system, in the
// microseconds between the steps.
int replace(const std::string& from, const std::string& hidden, const std::string& to) {
    const SignalsBlocked blocked;
    // Were it ignored, the other process would end without a word.
    static_cast<void>(signal(SIGCHLD, SIG_DFL));
    const pid_t child = fork();
    if (child < 0) return errno;
    if (child == 0) {
        setsid();
        if (!link_to(from, hidden.c_str())) _exit(errno);
        if (rename(hidden.c_str(), to.c_str()) == 0) _exit(0);
        const int failure = errno;
        unlink(hidden.c_str());
        _exit(failure);
    }
    int status = 0;
    pid_t waited = -1;
    do {
        waited = waitpid(child, &status, 0);
    } while (waited < 0 && errno == EINTR);
    if (waited < 0) return errno;
    return WIFEXITED(status) ? WEXITSTATUS(status) : EINTR;
}

// Gives a file without a name one, whether that is taken or not. Throws Error.
void give_name(const std::string& from, const std::string& to) {
    if (link_to(from, to.c_str())) return;
    int failure = errno;
    for (int attempt = 0; failure == EEXIST; ++attempt) {
        const std::string hidden = in_folder_of(
            to, ".ovrinresize." + std::to_string(getpid()) + "." + std::to_string(attempt));
        failure = replace(from, hidden, to);
    }
    if (failure != 0) throw Error(strerror(failure));
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

    // A file past its size limit is an error to report like any other.
    static_cast<void>(signal(SIGXFSZ, SIG_IGN));
    const int descriptor = open_new();
    // Best effort: some file systems know no permissions.
    if (exists) static_cast<void>(fchmod(descriptor, existing.st_mode & 07777));
    stream_ = fdopen(descriptor, "wb");
    if (stream_ == nullptr) {
        const int failure = errno;
        close(descriptor);
        discard();
        throw Error(strerror(failure));
    }
}

int OutputFile::open_new() {
    const mode_t mode = default_mode();
    const int nameless = open_nameless(folder_of(path_));
    is_nameless_ = nameless >= 0;
    if (is_nameless_) return nameless;

    const SignalsBlocked blocked;
    temporary_ = in_folder_of(path_, ".ovrinresize.XXXXXX");
    const int descriptor = mkstemp(temporary_.data());
    if (descriptor < 0) throw Error(std::string("cannot be written: ") + strerror(errno));
    doom_file(temporary_);
    static_cast<void>(fchmod(descriptor, mode));
    return descriptor;
}

void OutputFile::discard() {
    if (temporary_.empty()) return;
    unlink(temporary_.c_str());
    spare_file(temporary_);
}

OutputFile::~OutputFile() {
    if (stream_ == nullptr) return;
    static_cast<void>(fclose(stream_));
    discard();
}

void OutputFile::publish() {
    if (is_nameless_) return give_name(path_of(fileno(stream_)), path_);
    if (temporary_.empty()) return;
    const SignalsBlocked blocked;
    if (rename(temporary_.c_str(), path_.c_str()) != 0) throw Error(strerror(errno));
    spare_file(temporary_);
}

void OutputFile::commit() {
    concerning(name_, [this] {
        if (fflush(stream_) != 0 || ferror(stream_) != 0) throw Error(strerror(errno));
        publish();
    });
    static_cast<void>(fclose(stream_));
    stream_ = nullptr;
}

}  // namespace tool
