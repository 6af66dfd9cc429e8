// SPDX-License-Identifier: Apache-2.0
// To be preloaded: plays a file system that knows no files without a name.
#include <dlfcn.h>
#include <fcntl.h>

#include <cerrno>
#include <cstdarg>

// The system's declaration is variadic.
extern "C" int open(const char* path, int flags, ...) {  // NOLINT(cert-dcl50-cpp)
    if ((flags & O_TMPFILE) == O_TMPFILE) {
        errno = EOPNOTSUPP;
        return -1;
    }
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = (flags & O_CREAT) != 0 ? va_arg(arguments, mode_t) : 0;
    va_end(arguments);
    using Open = int (*)(const char*, int, ...);
    return reinterpret_cast<Open>(dlsym(RTLD_NEXT, "open"))(path, flags, mode);
}
