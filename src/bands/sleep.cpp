// SPDX-License-Identifier: Apache-2.0
#include <ovrinresize.h>
#include <unistd.h>

int32_t ov_sleep(uint32_t useconds) {
    return usleep(useconds);
}
