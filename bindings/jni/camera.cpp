// SPDX-License-Identifier: Apache-2.0
#include "camera.h"

#include "checks.h"

namespace ovrin_jni {

namespace {

constexpr int32_t kI420 = 1;
constexpr int32_t kNv21 = 2;

// A frame as the Kotlin side names it.
struct Frame {
    jobject y;
    jobject u;
    jobject v;
    int32_t y_row_stride;
    int32_t uv_row_stride;
    int32_t uv_pixel_stride;
    Size size;
};

void check_numbers(Checks& checks, const Frame& frame, Size dst_size, int32_t format) {
    checks.size("source size", frame.size);
    checks.size("destination size", dst_size);
    checks.number("format", format, kI420, kNv21);
    checks.number("pixel stride of U and V", frame.uv_pixel_stride, 1, 2);
    if (!checks.ok()) return;
    checks.number("row stride of Y", frame.y_row_stride, frame.size.width, INT32_MAX);
    const auto row = static_cast<int32_t>(chroma_row(frame.size, frame.uv_pixel_stride));
    checks.number("row stride of U and V", frame.uv_row_stride, row, INT32_MAX);
}

ovrin::ConstPlane plane_of(Checks& checks, jobject buffer, const char* name, int64_t bytes,
                           int32_t row_stride, int32_t pixel_stride) {
    const uint8_t* first = checks.source(buffer, name, bytes);
    return {first, static_cast<size_t>(bytes), row_stride, pixel_stride};
}

ovrin::ConstView source_of(Checks& checks, const Frame& frame) {
    const Size size = frame.size;
    const int64_t luma = strided(size.width, size.height, frame.y_row_stride);
    const int64_t chroma = strided(chroma_row(size, frame.uv_pixel_stride),
                                   half_rounded_up(size.height), frame.uv_row_stride);
    const auto chroma_plane = [&](jobject buffer, const char* name) {
        return plane_of(checks, buffer, name, chroma, frame.uv_row_stride, frame.uv_pixel_stride);
    };
    const ovrin::ConstPlane y =
        plane_of(checks, frame.y, "source Y plane", luma, frame.y_row_stride, 1);
    const ovrin::ConstPlane u = chroma_plane(frame.u, "source U plane");
    const ovrin::ConstPlane v = chroma_plane(frame.v, "source V plane");
    return ovrin::i420_view(y, u, v, size.width, size.height);
}

// Runs use(source, destination), both as I420, when all is as it should be.
template <class Use>
void with_pictures(JNIEnv* env, const Frame& frame, jobject dst, Size dst_size, int32_t format,
                   const Use& use) {
    Checks checks(env);
    check_numbers(checks, frame, dst_size, format);
    if (!checks.ok()) return;
    const ovrin::ConstView source = source_of(checks, frame);
    const int64_t bytes = yuv420_bytes(dst_size);
    uint8_t* first = checks.destination(dst, bytes);
    if (!checks.ok()) return;
    const auto length = static_cast<size_t>(bytes);
    checks.outcome(
        use(source, format == kNv21
                        ? ovrin::nv21_as_i420_view(first, length, dst_size.width, dst_size.height)
                        : ovrin::i420_view(first, length, dst_size.width, dst_size.height)));
}

}  // namespace

void JNICALL resize_yuv420(JNIEnv* env, jclass, jobject y, jobject u, jobject v, jint y_row_stride,
                           jint uv_row_stride, jint uv_pixel_stride, jint width, jint height,
                           jobject dst, jint dst_w, jint dst_h, jint format) {
    const Frame frame = {y, u, v, y_row_stride, uv_row_stride, uv_pixel_stride, {width, height}};
    with_pictures(env, frame, dst, {dst_w, dst_h}, format,
                  [](const ovrin::ConstView& from, const ovrin::View& to) {
                      return ovrin::resize(from, to);
                  });
}

void JNICALL copy_yuv420(JNIEnv* env, jclass, jobject y, jobject u, jobject v, jint y_row_stride,
                         jint uv_row_stride, jint uv_pixel_stride, jint width, jint height,
                         jobject dst, jint format) {
    const Frame frame = {y, u, v, y_row_stride, uv_row_stride, uv_pixel_stride, {width, height}};
    with_pictures(env, frame, dst, frame.size, format, ovrin::copy);
}

}  // namespace ovrin_jni
