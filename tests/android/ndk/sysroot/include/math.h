/* SPDX-License-Identifier: Apache-2.0 */
/* Stub: some of what is in Android's header. */
#pragma once

#ifdef __cplusplus
extern "C" {
#endif

double sin(double x);
double fma(double x, double y, double z);
float fmaf(float x, float y, float z);
double fabs(double x);
float fabsf(float x);
double ceil(double x);
float ceilf(float x);
double floor(double x);
float floorf(float x);

#ifdef __cplusplus
}
#endif
