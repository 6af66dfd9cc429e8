// SPDX-License-Identifier: Apache-2.0
// Native methods of ovrin.resize.NativeBitmaps: bitmaps of Android.
#pragma once

#include <jni.h>

namespace ovrin_jni {

// False with an exception pending.
bool register_bitmap_methods(JNIEnv* env);

}  // namespace ovrin_jni
