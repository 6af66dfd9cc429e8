// SPDX-License-Identifier: Apache-2.0
// In place of the C library's, which would import a clock. No thread runs that one could wait for.
#include <errno.h>
#include <unistd.h>

int usleep(useconds_t /*useconds*/) {
    errno = ENOSYS;
    return -1;
}
