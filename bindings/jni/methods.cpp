// SPDX-License-Identifier: Apache-2.0
// The native methods of ovrin.resize.Native. Each checks everything itself, whatever the Kotlin
// side has checked: from here on nothing stands between a wrong number and memory that is not ours.
#include "methods.h"

#include <ovrinresize.h>

#include "bitmap.h"
#include "camera.h"
#include "checks.h"

namespace ovrin_jni {

namespace {

constexpr const char kSource[] = "source";
constexpr const char kSourceSize[] = "source size";
constexpr const char kDestinationSize[] = "destination size";
constexpr int kWord = 4;  // alignment of 32-bit pixels

// ---- Plain resizing ----------------------------------------------------------------------------

struct Buffers {
    const uint8_t* src;
    uint8_t* dst;
};

// The two buffers of a call whose pictures take bytes_of(size) bytes.
template <class BytesOf>
Buffers checked_buffers(Checks& checks, jobject src, Size src_size, jobject dst, Size dst_size,
                        const BytesOf& bytes_of, int src_alignment, int dst_alignment) {
    checks.size(kSourceSize, src_size);
    checks.size(kDestinationSize, dst_size);
    // Of other sizes, even 64 bits may not hold the bytes.
    if (!checks.ok()) return {};
    const uint8_t* from = checks.source(src, kSource, bytes_of(src_size), src_alignment);
    return {from, checks.destination(dst, bytes_of(dst_size), dst_alignment)};
}

int64_t rgba_bytes(Size size) {
    return 4 * size.pixels();
}

int64_t rgb_bytes(Size size) {
    return 3 * size.pixels();
}

// One byte of Y and a VU pair for every pixel.
int64_t full_chroma_bytes(Size size) {
    return 3 * size.pixels();
}

uint32_t* words(uint8_t* bytes) {
    return reinterpret_cast<uint32_t*>(bytes);
}

void JNICALL rgba(JNIEnv* env, jclass, jobject src, jint src_w, jint src_h, jobject dst, jint dst_w,
                  jint dst_h) {
    Checks checks(env);
    const Buffers buffers =
        checked_buffers(checks, src, {src_w, src_h}, dst, {dst_w, dst_h}, rgba_bytes, 1, kWord);
    if (!checks.ok()) return;
    ovrin_resize_rgba8888(buffers.src, words(buffers.dst), src_w, src_h, dst_w, dst_h);
}

void JNICALL rgb(JNIEnv* env, jclass, jobject src, jint src_w, jint src_h, jobject dst, jint dst_w,
                 jint dst_h) {
    Checks checks(env);
    const Buffers buffers =
        checked_buffers(checks, src, {src_w, src_h}, dst, {dst_w, dst_h}, rgb_bytes, 1, 1);
    if (!checks.ok()) return;
    ovrin_resize_rgb888(buffers.src, buffers.dst, src_w, src_h, dst_w, dst_h);
}

void JNICALL nearest(JNIEnv* env, jclass, jobject src, jint src_w, jint src_h, jobject dst,
                     jint dst_w, jint dst_h) {
    Checks checks(env);
    const Buffers buffers =
        checked_buffers(checks, src, {src_w, src_h}, dst, {dst_w, dst_h}, rgba_bytes, kWord, kWord);
    if (!checks.ok()) return;
    ovrin_resize_nearest_rgba8888(reinterpret_cast<const uint32_t*>(buffers.src),
                                  words(buffers.dst), src_w, src_h, dst_w, dst_h);
}

void JNICALL i420(JNIEnv* env, jclass, jobject src, jint src_w, jint src_h, jobject dst, jint dst_w,
                  jint dst_h) {
    Checks checks(env);
    const Buffers buffers =
        checked_buffers(checks, src, {src_w, src_h}, dst, {dst_w, dst_h}, yuv420_bytes, 1, 1);
    checks.write(buffers.dst, yuv420_bytes({dst_w, dst_h}), [&] {
        ovrin_resize_yuv420(buffers.src, buffers.dst, src_w, src_h, dst_w, dst_h);
    });
}

void JNICALL nv21(JNIEnv* env, jclass, jobject src, jint src_w, jint src_h, jobject dst, jint dst_w,
                  jint dst_h) {
    Checks checks(env);
    const Buffers buffers =
        checked_buffers(checks, src, {src_w, src_h}, dst, {dst_w, dst_h}, yuv420_bytes, 1, 1);
    checks.write(buffers.dst, yuv420_bytes({dst_w, dst_h}),
                 [&] { ovrin_resize_nv21(buffers.src, buffers.dst, src_w, src_h, dst_w, dst_h); });
}

// ---- Into a canvas -----------------------------------------------------------------------------

ovrin_resize_target target_of(const Placement& placement, Size src_size, int32_t src_stride,
                              uint8_t* canvas) {
    ovrin_resize_target target = {};
    target.src_width = src_size.width;
    target.src_height = src_size.height;
    target.src_stride = src_stride;
    target.src_buffer_height = src_size.height;
    target.dst = canvas;
    target.dst_width = placement.picture.width;
    target.dst_height = placement.picture.height;
    target.canvas_width = placement.canvas.width;
    target.canvas_height = placement.canvas.height;
    target.dst_x = placement.x;
    target.dst_y = placement.y;
    return target;
}

// The threaded functions for planes compare x with the canvas's height, and would draw nothing.
bool is_turned_down_by_threads(const Placement& placement) {
    return placement.canvas.height < placement.x;
}

// Everything but the buffers.
bool check_canvas_call(Checks& checks, Size src_size, int32_t src_stride,
                       const Placement& placement) {
    checks.size(kSourceSize, src_size);
    checks.number("source stride", src_stride, src_size.width, kLargestSide);
    checks.placement(placement);
    return checks.ok();
}

void JNICALL rgba_in_canvas(JNIEnv* env, jclass, jobject src, jint src_w, jint src_h,
                            jint src_stride, jobject dst, jint canvas_w, jint canvas_h, jint x,
                            jint y, jint width, jint height) {
    const Size size = {src_w, src_h};
    const Placement placement = {{canvas_w, canvas_h}, {width, height}, x, y};
    Checks checks(env);
    if (!check_canvas_call(checks, size, src_stride, placement)) return;
    const uint8_t* from = checks.source(src, kSource, 4 * strided(src_w, src_h, src_stride));
    uint8_t* canvas = checks.destination(dst, rgba_bytes(placement.canvas), kWord);
    if (!checks.ok()) return;
    ovrin_resize_target target = target_of(placement, size, src_stride, canvas);
    ovrin_resize_rgba8888_keep_ratio(from, src_w, src_h, &target);
}

void JNICALL i420_in_canvas(JNIEnv* env, jclass, jobject src_y, jobject src_u, jobject src_v,
                            jint src_w, jint src_h, jint src_stride, jobject dst, jint canvas_w,
                            jint canvas_h, jint x, jint y, jint width, jint height) {
    const Size size = {src_w, src_h};
    const Placement placement = {{canvas_w, canvas_h}, {width, height}, x, y};
    Checks checks(env);
    if (!check_canvas_call(checks, size, src_stride, placement)) return;
    const int64_t chroma_bytes = strided_chroma(size, src_stride);
    const uint8_t* from_y =
        checks.source(src_y, "source Y plane", strided(src_w, src_h, src_stride));
    const uint8_t* from_u = checks.source(src_u, "source U plane", chroma_bytes);
    const uint8_t* from_v = checks.source(src_v, "source V plane", chroma_bytes);
    uint8_t* canvas = checks.destination(dst, yuv420_bytes(placement.canvas));
    const ovrin_resize_target target = target_of(placement, size, src_stride, canvas);
    checks.write(canvas, yuv420_bytes(placement.canvas), [&] {
        if (is_turned_down_by_threads(placement)) {
            ovrin_resize_y_u_v_sg(from_y, from_u, from_v, nullptr, src_w, src_h, 0, 0, &target);
        } else {
            ovrin_resize_y_u_v_keep_ratio(from_y, from_u, from_v, src_w, src_h, &target);
        }
    });
}

void JNICALL nv21_in_canvas(JNIEnv* env, jclass, jobject src_y, jobject src_vu, jint src_w,
                            jint src_h, jint src_stride, jobject dst, jint canvas_w, jint canvas_h,
                            jint x, jint y, jint width, jint height) {
    const Size size = {src_w, src_h};
    const Placement placement = {{canvas_w, canvas_h}, {width, height}, x, y};
    Checks checks(env);
    if (!check_canvas_call(checks, size, src_stride, placement)) return;
    const uint8_t* from_y =
        checks.source(src_y, "source Y plane", strided(src_w, src_h, src_stride));
    const uint8_t* from_vu =
        checks.source(src_vu, "source VU plane", 2 * strided_chroma(size, src_stride));
    uint8_t* canvas = checks.destination(dst, yuv420_bytes(placement.canvas));
    const ovrin_resize_target target = target_of(placement, size, src_stride, canvas);
    checks.write(canvas, yuv420_bytes(placement.canvas), [&] {
        if (is_turned_down_by_threads(placement)) {
            ovrin_resize_y_nv_sg(from_y, from_vu, nullptr, src_w, src_h, 0, 0, &target);
        } else {
            ovrin_resize_y_nv21_keep_ratio(from_y, from_vu, src_w, src_h, &target);
        }
    });
}

// ---- Engines -----------------------------------------------------------------------------------

using Bilinear = void(const uint8_t*, uint8_t*, int32_t, int32_t, int32_t, int32_t, int32_t,
                      const ovrin_resize_target*);

struct BilinearMode {
    Bilinear* resize;
    int64_t (*source_bytes)(Size src, Size dst, BilinearFormat format);
};

// By their numbers on the Kotlin side.
constexpr BilinearMode kBilinearModes[] = {
    {ov_bilinear_sg, bilinear_source_bytes},
    {ov_bilinear, bilinear_source_bytes},
    {ov_bilinear_ex, bilinear_ex_source_bytes},
};
constexpr int32_t kLastBilinearMode = sizeof kBilinearModes / sizeof *kBilinearModes - 1;
constexpr BilinearFormat kBilinearFormats[] = {kPixels, kPlanar, kSemiPlanar};
constexpr int32_t kLastBilinearFormat = sizeof kBilinearFormats / sizeof *kBilinearFormats - 1;

void JNICALL bilinear(JNIEnv* env, jclass, jobject src, jint src_w, jint src_h, jobject dst,
                      jint dst_w, jint dst_h, jint format_number, jint mode_number) {
    const Size src_size = {src_w, src_h};
    const Size dst_size = {dst_w, dst_h};
    Checks checks(env);
    checks.size(kSourceSize, src_size);
    checks.size(kDestinationSize, dst_size);
    checks.number("format", format_number, 0, kLastBilinearFormat);
    checks.number("mode", mode_number, 0, kLastBilinearMode);
    if (!checks.ok()) return;
    const BilinearFormat format = kBilinearFormats[format_number];
    const BilinearMode& mode = kBilinearModes[mode_number];
    const uint8_t* from =
        checks.source(src, kSource, mode.source_bytes(src_size, dst_size, format));
    const int64_t bytes = format == kPixels ? rgba_bytes(dst_size) : yuv420_bytes(dst_size);
    uint8_t* to = checks.destination(dst, bytes);
    checks.write(to, bytes,
                 [&] { mode.resize(from, to, src_w, src_h, dst_w, dst_h, format, nullptr); });
}

void JNICALL lanczos(JNIEnv* env, jclass, jobject src, jint src_w, jint src_h, jobject dst,
                     jint dst_w, jint dst_h) {
    Checks checks(env);
    const Buffers buffers =
        checked_buffers(checks, src, {src_w, src_h}, dst, {dst_w, dst_h}, rgba_bytes, 1, 1);
    checks.write(buffers.dst, rgba_bytes({dst_w, dst_h}), [&] {
        ovrin_resize_lanczos(buffers.src, buffers.dst, src_w, src_h, dst_w, dst_h, 4);
    });
}

void JNICALL lanczos_components(JNIEnv* env, jclass, jobject src, jint src_w, jint src_h,
                                jobject dst, jint dst_w, jint dst_h, jint components) {
    Checks checks(env);
    checks.number("components", components, 1, 4);
    const Buffers buffers = checked_buffers(
        checks, src, {src_w, src_h}, dst, {dst_w, dst_h},
        [&](Size size) { return components * size.pixels(); }, 1, 1);
    checks.write(buffers.dst, components * Size{dst_w, dst_h}.pixels(), [&] {
        ov_lanczos(buffers.src, src_w, src_h, buffers.dst, dst_w, dst_h, components);
    });
}

void JNICALL lanczos_full_chroma(JNIEnv* env, jclass, jobject src, jint src_w, jint src_h,
                                 jobject dst, jint dst_w, jint dst_h) {
    Checks checks(env);
    const Buffers buffers =
        checked_buffers(checks, src, {src_w, src_h}, dst, {dst_w, dst_h}, full_chroma_bytes, 1, 1);
    checks.write(buffers.dst, full_chroma_bytes({dst_w, dst_h}),
                 [&] { ov_lanczos_nv(buffers.src, src_w, src_h, buffers.dst, dst_w, dst_h); });
}

// ---- Registration ------------------------------------------------------------------------------

#define OVRIN_PICTURE OVRIN_BUFFER "II"
#define OVRIN_PLACEMENT "IIIIII"
#define OVRIN_FRAME OVRIN_BUFFER OVRIN_BUFFER OVRIN_BUFFER "IIIII"

bool register_resizer_methods(JNIEnv* env) {
    const char* const plain = "(" OVRIN_PICTURE OVRIN_PICTURE ")V";
    const Method methods[] = {
        method("rgba", plain, rgba),
        method("rgb", plain, rgb),
        method("nearest", plain, nearest),
        method("i420", plain, i420),
        method("nv21", plain, nv21),
        method("rgbaInCanvas", "(" OVRIN_PICTURE "I" OVRIN_BUFFER OVRIN_PLACEMENT ")V",
               rgba_in_canvas),
        method("i420InCanvas",
               "(" OVRIN_BUFFER OVRIN_BUFFER OVRIN_PICTURE "I" OVRIN_BUFFER OVRIN_PLACEMENT ")V",
               i420_in_canvas),
        method("nv21InCanvas", "(" OVRIN_BUFFER OVRIN_PICTURE "I" OVRIN_BUFFER OVRIN_PLACEMENT ")V",
               nv21_in_canvas),
        method("bilinear", "(" OVRIN_PICTURE OVRIN_PICTURE "II)V", bilinear),
        method("lanczos", plain, lanczos),
        method("lanczosComponents", "(" OVRIN_PICTURE OVRIN_PICTURE "I)V", lanczos_components),
        method("lanczosFullChroma", plain, lanczos_full_chroma),
        method("resizeYuv420", "(" OVRIN_FRAME OVRIN_PICTURE "I)V", resize_yuv420),
        method("copyYuv420", "(" OVRIN_FRAME OVRIN_BUFFER "I)V", copy_yuv420),
    };
    return ovrin_jni::register_methods(env, "ovrin/resize/Native", methods,
                                       sizeof methods / sizeof *methods);
}

}  // namespace

bool register_methods(JNIEnv* env, const char* type, const Method* methods, size_t count) {
    jclass found = env->FindClass(type);
    if (found == nullptr) return false;
    for (size_t i = 0; i < count; ++i) {
        // The record's fields are not const, though nothing writes to them.
        const JNINativeMethod native = {const_cast<char*>(methods[i].name),
                                        const_cast<char*>(methods[i].signature),
                                        methods[i].function};
        if (env->RegisterNatives(found, &native, 1) != JNI_OK) return false;
    }
    return true;
}

}  // namespace ovrin_jni

JNIEXPORT jint JNICALL JNI_OnLoad(JavaVM* vm, void* /*reserved*/) {
    void* env = nullptr;
    if (vm->GetEnv(&env, JNI_VERSION_1_6) != JNI_OK) return JNI_ERR;
    auto* jni = static_cast<JNIEnv*>(env);
    if (!ovrin_jni::register_resizer_methods(jni)) return JNI_ERR;
#if defined(OVRINRESIZE_JNI_BITMAPS)
    if (!ovrin_jni::register_bitmap_methods(jni)) return JNI_ERR;
#endif
    return JNI_VERSION_1_6;
}
