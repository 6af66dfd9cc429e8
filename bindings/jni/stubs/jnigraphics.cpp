// SPDX-License-Identifier: Apache-2.0
// Stub: stands in for Android's libjnigraphics.so in tests on other systems. Its bitmaps are those
// of the stub class in bindings/kotlin/stubs, which counts locks, and says what each call has to
// answer.
#include <android/bitmap.h>

namespace {

jint call_int(JNIEnv* env, jobject bitmap, const char* name) {
    jmethodID method = env->GetMethodID(env->GetObjectClass(bitmap), name, "()I");
    const jint result = env->CallIntMethod(bitmap, method);
    return env->ExceptionCheck() ? ANDROID_BITMAP_RESULT_JNI_EXCEPTION : result;
}

}  // namespace

int AndroidBitmap_getInfo(JNIEnv* env, jobject bitmap, AndroidBitmapInfo* info) {
    const jint result = call_int(env, bitmap, "infoResult");
    if (result != ANDROID_BITMAP_RESULT_SUCCESS) return result;
    info->width = static_cast<uint32_t>(call_int(env, bitmap, "getWidth"));
    info->height = static_cast<uint32_t>(call_int(env, bitmap, "getHeight"));
    info->stride = static_cast<uint32_t>(call_int(env, bitmap, "getRowBytes"));
    info->format = call_int(env, bitmap, "format");
    info->flags = 0;
    return result;
}

int AndroidBitmap_lockPixels(JNIEnv* env, jobject bitmap, void** pixels) {
    const jint result = call_int(env, bitmap, "lock");
    if (result != ANDROID_BITMAP_RESULT_SUCCESS) return result;
    jmethodID method =
        env->GetMethodID(env->GetObjectClass(bitmap), "pixels", "()Ljava/nio/ByteBuffer;");
    jobject buffer = env->CallObjectMethod(bitmap, method);
    if (env->ExceptionCheck()) return ANDROID_BITMAP_RESULT_JNI_EXCEPTION;
    *pixels = env->GetDirectBufferAddress(buffer);
    return result;
}

int AndroidBitmap_unlockPixels(JNIEnv* env, jobject bitmap) {
    return call_int(env, bitmap, "unlock");
}
