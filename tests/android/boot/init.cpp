// SPDX-License-Identifier: Apache-2.0
// The first and only process of the machine with 16 KB pages: runs the loader on the library and on
// its twin with 4 KB alignment, says how that went, and switches the machine off.
#include <sys/reboot.h>
#include <sys/utsname.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>

namespace {

int run(const char* library) {
    const pid_t child = fork();
    if (child == 0) {
        execl("/android_loader", "android_loader", library, "/golden.txt",
              static_cast<const char*>(nullptr));
        _exit(127);
    }
    int status = 0;
    if (child < 0 || waitpid(child, &status, 0) != child) return -1;
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

void show(const char* library) {
    printf("\n$ android_loader %s\n", library);
    printf("ends with %d: %s\n", run(library), library);
}

}  // namespace

int main() {
    setvbuf(stdout, nullptr, _IONBF, 0);
    utsname name;
    uname(&name);
    printf("%s %s on %s, %ld processors, pages of %ld bytes\n", name.sysname, name.release,
           name.machine, sysconf(_SC_NPROCESSORS_ONLN), sysconf(_SC_PAGESIZE));
    show("/libovrinresize.so");
    show("/small-pages/libovrinresize.so");
    reboot(RB_POWER_OFF);
}
