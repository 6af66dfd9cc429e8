// SPDX-License-Identifier: Apache-2.0
// Results appear whole or not at all, whatever the system refuses and whoever is in the way.
#include "output_file.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <utility>
#include <vector>

#include "doomed_file.h"
#include "error.h"

namespace {

// What the system calls below do, once; linked with --wrap.
struct Faults {
    bool no_proc = false;  // of every call: no descriptor has a name
    bool no_stream = false;
    bool no_child = false;
    bool is_interrupted = false;  // the wait for a child
    bool is_unknown = false;      // how the child ended
    bool is_killed = false;       // the child
    int raised = 0;               // the last signal; written by handlers
};

Faults faults;

bool take(bool* fault) {
    return std::exchange(*fault, false);
}

}  // namespace

extern "C" {
int __real_access(const char* path, int mode);
FILE* __real_fdopen(int descriptor, const char* mode);
pid_t __real_fork();
pid_t __real_waitpid(pid_t child, int* status, int options);

int __wrap_access(const char* path, int mode) {
    return faults.no_proc ? -1 : __real_access(path, mode);
}

FILE* __wrap_fdopen(int descriptor, const char* mode) {
    if (!take(&faults.no_stream)) return __real_fdopen(descriptor, mode);
    errno = ENOMEM;
    return nullptr;
}

pid_t __wrap_fork() {
    if (!take(&faults.no_child)) return __real_fork();
    errno = EAGAIN;
    return -1;
}

pid_t __wrap_waitpid(pid_t child, int* status, int options) {
    if (take(&faults.is_interrupted)) {
        errno = EINTR;
        return -1;
    }
    const pid_t waited = __real_waitpid(child, status, options);
    if (take(&faults.is_killed)) *status = SIGKILL;
    if (!take(&faults.is_unknown)) return waited;
    errno = ECHILD;
    return -1;
}

// By exit(), so that what coverage has counted in the child is kept.
[[noreturn]] void __wrap__exit(int status) {
    exit(status);
}

// The program goes on.
int __wrap_raise(int number) {
    faults.raised = number;
    return 0;
}
}

namespace {

namespace fs = std::filesystem;

class OutputFiles : public ::testing::Test {
protected:
    OutputFiles() {
        faults = {};
        char name[] = "/tmp/ovrinresize_output_XXXXXX";
        folder_ = mkdtemp(name);
        out_ = folder_ + "/out";
    }
    ~OutputFiles() override { fs::remove_all(folder_); }

    void SetUp() override {
        const int descriptor = open(folder_.c_str(), O_TMPFILE | O_WRONLY, 0600);
        if (descriptor < 0) GTEST_SKIP() << "no files without a name in /tmp";
        close(descriptor);
    }

    void put(const std::string& content) const { std::ofstream(out_) << content; }

    std::string content() const {
        std::ifstream file(out_);
        return std::string(std::istreambuf_iterator<char>(file), {});
    }

    std::vector<std::string> files() const {
        std::vector<std::string> names;
        for (const auto& entry : fs::directory_iterator(folder_)) {
            names.push_back(entry.path().filename());
        }
        return names;
    }

    // What stands in the message of the Error that the action throws; empty when it throws none.
    template <class Action>
    static std::string failure_of(Action action) {
        try {
            action();
        } catch (const tool::Error& error) {
            return error.what();
        }
        return "";
    }

    std::string failure_to_write(const char* text) const {
        return failure_of([&] {
            tool::OutputFile file(out_);
            fputs(text, file.stream());
            file.commit();
        });
    }

    std::string folder_;
    std::string out_;
};

using Names = std::vector<std::string>;

// Both ways in turn: without a name, and under a temporary one.
const bool kWays[] = {false, true};

}  // namespace

TEST_F(OutputFiles, AreThereOnceTheyAreWhole) {
    for (const bool has_stand_in : kWays) {
        faults.no_proc = has_stand_in;
        put("older");
        {
            tool::OutputFile file(out_);
            fputs("new", file.stream());
            EXPECT_EQ(files().size(), has_stand_in ? 2u : 1u);
            EXPECT_EQ(content(), "older");
            file.commit();
            EXPECT_EQ(content(), "new");
        }
        EXPECT_EQ(files(), Names{"out"});
        EXPECT_EQ(content(), "new");
    }
}

TEST_F(OutputFiles, LeaveNothingWhenTheyAreGivenUp) {
    for (const bool has_stand_in : kWays) {
        faults.no_proc = has_stand_in;
        { const tool::OutputFile file(out_); }
        EXPECT_EQ(files(), Names{});
    }
}

TEST_F(OutputFiles, HaveThePermissionsOfNewFiles) {
    const mode_t mask = umask(0);
    umask(mask);
    for (const bool has_stand_in : kWays) {
        faults.no_proc = has_stand_in;
        EXPECT_EQ(failure_to_write("new"), "");
        EXPECT_EQ(fs::status(out_).permissions(), fs::perms(0666 & ~mask));
        fs::remove(out_);
    }
}

TEST_F(OutputFiles, NeedAFolder) {
    out_ = folder_ + "/absent/out";
    EXPECT_EQ(failure_to_write("new"), out_ + ": cannot be written: No such file or directory");
}

TEST_F(OutputFiles, ThatAreNoRegularFilesMustOpen) {
    const int descriptor = socket(AF_UNIX, SOCK_STREAM, 0);
    sockaddr_un address = {};
    address.sun_family = AF_UNIX;
    out_.copy(address.sun_path, sizeof address.sun_path - 1);
    ASSERT_EQ(bind(descriptor, reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
    EXPECT_EQ(failure_to_write("new"), out_ + ": No such device or address");
    close(descriptor);
}

TEST_F(OutputFiles, NeedAStream) {
    for (const bool has_stand_in : kWays) {
        faults.no_proc = has_stand_in;
        faults.no_stream = true;
        EXPECT_EQ(failure_to_write("new"), out_ + ": Cannot allocate memory");
        EXPECT_EQ(files(), Names{});
    }
}

TEST_F(OutputFiles, DoNotTakeThePlaceOfAFolder) {
    for (const bool has_stand_in : kWays) {
        faults.no_proc = has_stand_in;
        EXPECT_EQ(failure_of([&] {
                      tool::OutputFile file(out_);
                      fs::create_directory(out_);
                      file.commit();
                  }),
                  out_ + ": Is a directory");
        EXPECT_EQ(files(), Names{"out"});
        fs::remove(out_);
    }
}

TEST_F(OutputFiles, AreLostWithTheirFolder) {
    EXPECT_EQ(failure_of([&] {
                  tool::OutputFile file(out_);
                  fs::remove_all(folder_);
                  file.commit();
              }),
              out_ + ": No such file or directory");
}

// The name of the step between is another's.
TEST_F(OutputFiles, TakeTheNextHiddenNameThatIsFree) {
    put("older");
    const std::string taken = ".ovrinresize." + std::to_string(getpid()) + ".0";
    std::ofstream(folder_ + "/" + taken) << "another's";
    EXPECT_EQ(failure_to_write("new"), "");
    EXPECT_EQ(content(), "new");
    EXPECT_EQ(files().size(), 2u);
    EXPECT_TRUE(fs::exists(folder_ + "/" + taken));
}

TEST_F(OutputFiles, ReplaceNothingWithoutAProcessForIt) {
    put("older");
    faults.no_child = true;
    EXPECT_EQ(failure_to_write("new"), out_ + ": Resource temporarily unavailable");
    EXPECT_EQ(content(), "older");
    EXPECT_EQ(files(), Names{"out"});
}

TEST_F(OutputFiles, OutlastASignalWhileTheyAreReplaced) {
    put("older");
    faults.is_interrupted = true;
    EXPECT_EQ(failure_to_write("new"), "");
    EXPECT_EQ(content(), "new");
}

TEST_F(OutputFiles, AreNotTakenForWholeWithoutWordOfTheProcess) {
    put("older");
    faults.is_killed = true;
    EXPECT_EQ(failure_to_write("new"), out_ + ": Interrupted system call");
    faults.is_unknown = true;
    EXPECT_EQ(failure_to_write("new"), out_ + ": No child processes");
}

// The buffer is empty by then, and has nothing to fail with.
TEST_F(OutputFiles, RememberAWriteThatFailed) {
    tool::OutputFile file("/dev/full");
    setvbuf(file.stream(), nullptr, _IONBF, 0);
    EXPECT_EQ(fputs("lost", file.stream()), EOF);
    EXPECT_NE(failure_of([&] { file.commit(); }), "");
}

// ---- Signals ----

class DoomedFiles : public OutputFiles {
protected:
    ~DoomedFiles() override {
        for (const int number : kEnding) signal(number, SIG_DFL);
    }

    static constexpr int kEnding[] = {SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGPIPE};
};

TEST_F(DoomedFiles, AreRemovedBeforeASignalEndsTheProgram) {
    for (const int number : kEnding) {
        put("half");
        tool::doom_file(out_);
        kill(getpid(), number);
        EXPECT_EQ(files(), Names{}) << number;
        EXPECT_EQ(faults.raised, number);
        // What is raised again ends it.
        EXPECT_EQ(signal(number, SIG_IGN), SIG_DFL) << number;
        signal(number, SIG_DFL);
        faults.raised = 0;
        tool::spare_file(out_);
    }
}

TEST_F(DoomedFiles, StayOnceTheyAreSpared) {
    put("whole");
    tool::doom_file(out_);
    tool::spare_file(out_);
    kill(getpid(), SIGTERM);
    EXPECT_EQ(content(), "whole");
    EXPECT_EQ(faults.raised, SIGTERM);
}

TEST_F(DoomedFiles, StayWhereTheSignalWasIgnoredFromTheStart) {
    signal(SIGHUP, SIG_IGN);
    put("half");
    tool::doom_file(out_);
    kill(getpid(), SIGHUP);
    EXPECT_EQ(content(), "half");
    EXPECT_EQ(faults.raised, 0);
    tool::spare_file(out_);
}

TEST_F(DoomedFiles, AreAsManyAsThereArePlaces) {
    std::vector<std::string> paths;
    for (int i = 0; i <= tool::kMostDoomedFiles; ++i) {
        paths.push_back(out_ + std::to_string(i));
        std::ofstream(paths.back()) << "half";
    }
    for (const std::string& path : paths) tool::doom_file(path);
    kill(getpid(), SIGINT);
    EXPECT_EQ(files(), Names{"out" + std::to_string(tool::kMostDoomedFiles)});
    for (const std::string& path : paths) tool::spare_file(path);
    put("whole");
    kill(getpid(), SIGTERM);
    EXPECT_EQ(files().size(), 2u);
}
