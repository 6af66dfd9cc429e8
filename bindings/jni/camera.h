// SPDX-License-Identifier: Apache-2.0
// Native methods for frames in planes with strides, as Android's YUV_420_888 has them.
#pragma once

#include <jni.h>

namespace ovrin_jni {

// Formats by their numbers on the Kotlin side: 1 I420, 2 NV21.
void JNICALL resize_yuv420(JNIEnv* env, jclass, jobject y, jobject u, jobject v, jint y_row_stride,
                           jint uv_row_stride, jint uv_pixel_stride, jint width, jint height,
                           jobject dst, jint dst_w, jint dst_h, jint format);

void JNICALL copy_yuv420(JNIEnv* env, jclass, jobject y, jobject u, jobject v, jint y_row_stride,
                         jint uv_row_stride, jint uv_pixel_stride, jint width, jint height,
                         jobject dst, jint format);

}  // namespace ovrin_jni
