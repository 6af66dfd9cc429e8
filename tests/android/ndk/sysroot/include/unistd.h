/* SPDX-License-Identifier: Apache-2.0 */
/* Stub: some of what is in Android's header. */
#pragma once

#ifdef __cplusplus
extern "C" {
#endif

int usleep(unsigned int microseconds);

#ifdef __cplusplus
}
#endif
