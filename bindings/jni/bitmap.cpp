// SPDX-License-Identifier: Apache-2.0
#include "bitmap.h"

#include <android/bitmap.h>

#include "checks.h"
#include "methods.h"

namespace ovrin_jni {

namespace {

constexpr int kWord = 4;  // alignment of 32-bit pixels

// The pixels of a bitmap, which stay where they are while this exists.
class LockedPixels {
public:
    LockedPixels(JNIEnv* env, Checks& checks, jobject bitmap, const char* name)
        : env_(env), bitmap_(bitmap) {
        if (!checks.ok()) return;
        AndroidBitmapInfo info = {};
        if (bitmap == nullptr) {
            checks.fail("%s is null", name);
        } else if (const int result = AndroidBitmap_getInfo(env, bitmap, &info); result != 0) {
            env->ExceptionClear();
            checks.fail("%s: AndroidBitmap_getInfo gives %d", name, result);
        } else if (info.format != ANDROID_BITMAP_FORMAT_RGBA_8888) {
            checks.fail("%s has pixels of format %d, must be ARGB_8888", name, info.format);
        } else {
            lock(checks, info, name);
        }
    }

    ~LockedPixels() {
        if (pixels_ != nullptr) AndroidBitmap_unlockPixels(env_, bitmap_);
    }

    LockedPixels(const LockedPixels&) = delete;
    LockedPixels& operator=(const LockedPixels&) = delete;

    ovrin::View view() const {
        const auto bytes =
            static_cast<size_t>(strided(4 * int64_t{size_.width}, size_.height, row_stride_));
        return ovrin::rgba_view(pixels_, bytes, size_.width, size_.height, row_stride_);
    }

private:
    void lock(Checks& checks, const AndroidBitmapInfo& info, const char* name) {
        size_ = {static_cast<int32_t>(info.width), static_cast<int32_t>(info.height)};
        row_stride_ = static_cast<int32_t>(info.stride);
        checks.size(name, size_);
        if (!checks.ok()) return;
        void* pixels = nullptr;
        const int result = AndroidBitmap_lockPixels(env_, bitmap_, &pixels);
        if (result == ANDROID_BITMAP_RESULT_ALLOCATION_FAILED) {
            checks.outcome({ovrin::ErrorCode::kNoMemory, "no memory for a bitmap's pixels"});
        } else if (result != ANDROID_BITMAP_RESULT_SUCCESS || pixels == nullptr) {
            // Another bitmap may have to be unlocked.
            env_->ExceptionClear();
            checks.fail("%s: AndroidBitmap_lockPixels gives %d", name, result);
        } else {
            pixels_ = static_cast<uint8_t*>(pixels);
        }
    }

    JNIEnv* env_;
    jobject bitmap_;
    uint8_t* pixels_ = nullptr;
    Size size_ = {};
    int32_t row_stride_ = 0;
};

// By their numbers on the Kotlin side.
constexpr ovrin::Filter kFilters[] = {ovrin::Filter::kQuarter, ovrin::Filter::kNearest,
                                      ovrin::Filter::kBilinear, ovrin::Filter::kLanczos};
constexpr int32_t kLastFilter = sizeof kFilters / sizeof *kFilters - 1;

void JNICALL resize(JNIEnv* env, jclass, jobject src, jobject dst, jint filter) {
    Checks checks(env);
    checks.number("filter", filter, 0, kLastFilter);
    const LockedPixels from(env, checks, src, "source");
    const LockedPixels to(env, checks, dst, "destination");
    if (!checks.ok()) return;
    checks.outcome(ovrin::resize(from.view(), to.view(), kFilters[filter]));
}

void JNICALL resize_from(JNIEnv* env, jclass, jobject src, jint src_w, jint src_h, jobject dst,
                         jint filter) {
    Checks checks(env);
    checks.number("filter", filter, 0, kLastFilter);
    checks.size("source size", {src_w, src_h});
    if (!checks.ok()) return;
    const int64_t bytes = 4 * Size{src_w, src_h}.pixels();
    const uint8_t* first = checks.source(src, "source", bytes);
    const LockedPixels to(env, checks, dst, "destination");
    if (!checks.ok()) return;
    const auto from = ovrin::rgba_view(first, static_cast<size_t>(bytes), src_w, src_h);
    checks.outcome(ovrin::resize(from, to.view(), kFilters[filter]));
}

void JNICALL resize_into(JNIEnv* env, jclass, jobject src, jobject dst, jint dst_w, jint dst_h,
                         jint filter) {
    Checks checks(env);
    checks.number("filter", filter, 0, kLastFilter);
    checks.size("destination size", {dst_w, dst_h});
    if (!checks.ok()) return;
    const int64_t bytes = 4 * Size{dst_w, dst_h}.pixels();
    uint8_t* first = checks.destination(dst, bytes, kWord);
    const LockedPixels from(env, checks, src, "source");
    if (!checks.ok()) return;
    const auto to = ovrin::rgba_view(first, static_cast<size_t>(bytes), dst_w, dst_h);
    checks.outcome(ovrin::resize(from.view(), to, kFilters[filter]));
}

}  // namespace

#define OVRIN_BITMAP "Landroid/graphics/Bitmap;"

bool register_bitmap_methods(JNIEnv* env) {
    const Method methods[] = {
        method("resize", "(" OVRIN_BITMAP OVRIN_BITMAP "I)V", resize),
        method("resizeFrom", "(" OVRIN_BUFFER "II" OVRIN_BITMAP "I)V", resize_from),
        method("resizeInto", "(" OVRIN_BITMAP OVRIN_BUFFER "III)V", resize_into),
    };
    return register_methods(env, "ovrin/resize/NativeBitmaps", methods,
                            sizeof methods / sizeof *methods);
}

}  // namespace ovrin_jni
