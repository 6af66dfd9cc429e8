// SPDX-License-Identifier: Apache-2.0
// android_jni_loader CORE JNI: loads the binding's library for Android, bound to the core, into
// this Linux program, whose virtual machine is a table of functions; and makes its native methods
// work and refuse. Ends with 3 when it refuses to load a library.
#include <android/bitmap.h>
#include <jni.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "image.h"
#include "shims.h"

namespace {

constexpr int kRefused = 3;
constexpr size_t kMethods = 17;

loader::Image core;

// ---- What the library sees of a virtual machine -------------------------------------------------

// Behind every jobject.
struct Object {
    std::vector<uint8_t> bytes;
    bool is_direct = true;
    bool is_read_only = false;
    AndroidBitmapInfo bitmap = {};
    int locks = 0;
};

std::map<std::string, void*> methods;
std::string thrown;

Object& object_of(jobject object) {
    return *reinterpret_cast<Object*>(object);
}

jobject handle(Object& object) {
    return reinterpret_cast<jobject>(&object);
}

jclass JNICALL find_class(JNIEnv*, const char* name) {
    return reinterpret_cast<jclass>(const_cast<char*>(name));
}

jclass JNICALL get_object_class(JNIEnv*, jobject object) {
    return reinterpret_cast<jclass>(object);
}

jmethodID JNICALL get_method_id(JNIEnv*, jclass, const char* name, const char*) {
    return reinterpret_cast<jmethodID>(const_cast<char*>(name));
}

jint JNICALL register_natives(JNIEnv*, jclass type, const JNINativeMethod* method, jint count) {
    for (jint i = 0; i < count; ++i) {
        methods[std::string(reinterpret_cast<char*>(type)) + "." + method[i].name] =
            method[i].fnPtr;
    }
    return JNI_OK;
}

jint JNICALL throw_new(JNIEnv*, jclass type, const char* message) {
    thrown = std::string(reinterpret_cast<char*>(type)) + ": " + message;
    return JNI_OK;
}

void* JNICALL buffer_address(JNIEnv*, jobject buffer) {
    return object_of(buffer).is_direct ? object_of(buffer).bytes.data() : nullptr;
}

jlong JNICALL buffer_capacity(JNIEnv*, jobject buffer) {
    return object_of(buffer).is_direct ? static_cast<jlong>(object_of(buffer).bytes.size()) : -1;
}

jboolean JNICALL call_boolean(JNIEnv*, jobject buffer, jmethodID, va_list) {
    return object_of(buffer).is_read_only ? JNI_TRUE : JNI_FALSE;
}

jboolean JNICALL exception_check(JNIEnv*) {
    return JNI_FALSE;
}

void JNICALL exception_clear(JNIEnv*) {}

JNIEnv* environment() {
    static JNINativeInterface_ table = {};
    static JNIEnv env = {};
    table.FindClass = find_class;
    table.GetObjectClass = get_object_class;
    table.GetMethodID = get_method_id;
    table.RegisterNatives = register_natives;
    table.ThrowNew = throw_new;
    table.GetDirectBufferAddress = buffer_address;
    table.GetDirectBufferCapacity = buffer_capacity;
    table.CallBooleanMethodV = call_boolean;
    table.ExceptionCheck = exception_check;
    table.ExceptionClear = exception_clear;
    env.functions = &table;
    return &env;
}

jint JNICALL get_env(JavaVM*, void** env, jint) {
    *env = environment();
    return JNI_OK;
}

int bitmap_info(JNIEnv*, jobject bitmap, AndroidBitmapInfo* info) {
    *info = object_of(bitmap).bitmap;
    return 0;
}

int lock_pixels(JNIEnv*, jobject bitmap, void** pixels) {
    ++object_of(bitmap).locks;
    *pixels = object_of(bitmap).bytes.data();
    return 0;
}

int unlock_pixels(JNIEnv*, jobject bitmap) {
    --object_of(bitmap).locks;
    return 0;
}

void* find_import(const char* name) {
    if (void* function = core.find(name)) return function;
    const std::map<std::string, void*> of_bitmaps = {
        {"AndroidBitmap_getInfo", reinterpret_cast<void*>(bitmap_info)},
        {"AndroidBitmap_lockPixels", reinterpret_cast<void*>(lock_pixels)},
        {"AndroidBitmap_unlockPixels", reinterpret_cast<void*>(unlock_pixels)}};
    const auto found = of_bitmaps.find(name);
    return found == of_bitmaps.end() ? loader::find_shim(name) : found->second;
}

// ---- Checks -------------------------------------------------------------------------------------

int checks = 0;
int failures = 0;

void check(bool holds, const std::string& what) {
    ++checks;
    if (holds) return;
    ++failures;
    printf("FAIL: %s (thrown: %s)\n", what.c_str(), thrown.c_str());
}

// Calls a native method, and gives what it threw.
template <class... Arguments>
std::string call(const char* name, Arguments... arguments) {
    thrown.clear();
    const auto found = methods.find(std::string("ovrin/resize/") + name);
    if (found == methods.end()) return std::string("no method ") + name;
    using Function = void JNICALL(JNIEnv*, jclass, Arguments...);
    reinterpret_cast<Function*>(found->second)(environment(), nullptr, arguments...);
    return thrown;
}

std::vector<uint8_t> noise(size_t bytes) {
    std::vector<uint8_t> result(bytes);
    uint32_t state = 1;
    for (uint8_t& byte : result) {
        state = state * 1664525 + 1013904223;
        byte = static_cast<uint8_t>(state >> 24);
    }
    return result;
}

Object buffer(std::vector<uint8_t> bytes) {
    Object object;
    object.bytes = std::move(bytes);
    return object;
}

Object bitmap(int32_t width, int32_t height, int32_t format = ANDROID_BITMAP_FORMAT_RGBA_8888) {
    Object object = buffer(noise(static_cast<size_t>(width * height * 4)));
    object.bitmap = {static_cast<uint32_t>(width), static_cast<uint32_t>(height),
                     static_cast<uint32_t>(4 * width), format, 0};
    return object;
}

template <class Function>
Function* of_core(const char* name, Function*) {
    return reinterpret_cast<Function*>(core.find(name));
}

using Resize = void(const uint8_t*, uint8_t*, int32_t, int32_t, int32_t, int32_t);

std::vector<uint8_t> resized(const char* name, const std::vector<uint8_t>& src, int32_t w,
                             int32_t h, int32_t to_w, int32_t to_h, size_t bytes) {
    std::vector<uint8_t> dst(bytes);
    of_core<Resize>(name, nullptr)(src.data(), dst.data(), w, h, to_w, to_h);
    return dst;
}

void check_pictures() {
    Object rgba = buffer(noise(40 * 30 * 4));
    Object small = buffer(std::vector<uint8_t>(10 * 7 * 4));
    check(call("Native.rgba", handle(rgba), 40, 30, handle(small), 10, 7).empty(), "rgba");
    check(small.bytes == resized("ovrin_resize_rgba8888", rgba.bytes, 40, 30, 10, 7, 280),
          "rgba's bytes");
    Object yuv = buffer(noise(33 * 1100 + 2 * 17 * 550));
    Object smaller = buffer(std::vector<uint8_t>(9 * 100 + 2 * 5 * 50));
    for (const char* name : {"i420", "nv21"}) {
        const std::string method = std::string("Native.") + name;
        const std::string function = name[0] == 'i' ? "ovrin_resize_yuv420" : "ovrin_resize_nv21";
        check(call(method.c_str(), handle(yuv), 33, 1100, handle(smaller), 9, 100).empty(), name);
        check(smaller.bytes == resized(function.c_str(), yuv.bytes, 33, 1100, 9, 100, 1400),
              method + "'s bytes");
    }
}

// U and V in turn, U first; rows as far apart as a record can say, and as it cannot.
void check_frames() {
    const int32_t w = 32, h = 1024;
    const std::vector<uint8_t> packed = noise(static_cast<size_t>(w * h * 3 / 2));
    for (const int32_t uv_row : {40, 64}) {
        Object y = buffer(std::vector<uint8_t>(static_cast<size_t>(40 * (h - 1) + w)));
        Object u = buffer(std::vector<uint8_t>(static_cast<size_t>(uv_row * (h / 2 - 1) + w - 1)));
        Object v = u;
        for (int32_t row = 0; row < h; ++row)
            memcpy(&y.bytes[size_t(40 * row)], &packed[size_t(w * row)], size_t(w));
        for (int32_t i = 0; i < w / 2 * (h / 2); ++i) {
            const auto at = static_cast<size_t>(i / (w / 2) * uv_row + i % (w / 2) * 2);
            u.bytes[at] = packed[static_cast<size_t>(w * h + i)];
            v.bytes[at] = packed[static_cast<size_t>(w * h * 5 / 4 + i)];
        }
        Object small = buffer(std::vector<uint8_t>(10 * 90 + 2 * 5 * 45));
        check(call("Native.resizeYuv420", handle(y), handle(u), handle(v), 40, uv_row, 2, w, h,
                   handle(small), 10, 90, 1)
                  .empty(),
              "a frame");
        check(small.bytes == resized("ovrin_resize_yuv420", packed, w, h, 10, 90, 1350),
              "a frame's bytes");
        Object copy = buffer(std::vector<uint8_t>(packed.size()));
        check(call("Native.copyYuv420", handle(y), handle(u), handle(v), 40, uv_row, 2, w, h,
                   handle(copy), 1)
                  .empty(),
              "a frame's copy");
        check(copy.bytes == packed, "the copy's bytes");
    }
}

void check_bitmaps() {
    Object src = bitmap(40, 30);
    Object dst = bitmap(10, 7);
    check(call("NativeBitmaps.resize", handle(src), handle(dst), 0).empty(), "a bitmap");
    check(dst.bytes == resized("ovrin_resize_rgba8888", src.bytes, 40, 30, 10, 7, 280),
          "a bitmap's bytes");
    Object other = bitmap(10, 7, 4);
    check(call("NativeBitmaps.resize", handle(src), handle(other), 0) ==
              "java/lang/IllegalArgumentException: destination has pixels of format 4, must be "
              "ARGB_8888",
          "another format");
    check(src.locks == 0 && dst.locks == 0 && other.locks == 0, "locks are given back");
}

void refused(const std::string& text, const std::string& said) {
    check(said == "java/lang/IllegalArgumentException: " + text, text);
}

void check_refusals() {
    Object src = buffer(noise(8 * 6 * 4));
    Object dst = buffer(std::vector<uint8_t>(4 * 3 * 4));
    Object shorter = buffer(std::vector<uint8_t>(47));
    Object on_heap = dst;
    on_heap.is_direct = false;
    Object read_only = dst;
    read_only.is_read_only = true;
    const auto rgba = [&](Object& from, int32_t w, Object& to) {
        return call("Native.rgba", handle(from), w, 6, handle(to), 4, 3);
    };
    refused("destination holds 47 bytes, 48 needed", rgba(src, 8, shorter));
    refused("source holds 47 bytes, 192 needed", rgba(shorter, 8, dst));
    refused("destination is not a direct buffer", rgba(src, 8, on_heap));
    refused("destination is read-only", rgba(src, 8, read_only));
    refused("destination overlaps a source", rgba(src, 8, src));
    refused("source size is 32768 x 6, sides must be 1 to 32767", rgba(src, 32768, dst));
    refused("source size is -1 x 6, sides must be 1 to 32767", rgba(src, -1, dst));
    refused("source is null",
            call("Native.rgba", static_cast<jobject>(nullptr), 8, 6, handle(dst), 4, 3));
    refused("components is 5, must be 1 to 4",
            call("Native.lanczosComponents", handle(src), 8, 6, handle(dst), 4, 3, 5));
    refused("pixel stride of U and V is 3, must be 1 to 2",
            call("Native.copyYuv420", handle(src), handle(src), handle(src), 8, 8, 3, 8, 6,
                 handle(dst), 1));
    refused("row stride of Y is 7, must be 8 to 2147483647",
            call("Native.copyYuv420", handle(src), handle(src), handle(src), 7, 8, 2, 8, 6,
                 handle(dst), 1));
    check(dst.bytes == std::vector<uint8_t>(48), "nothing was written");
}

bool load(loader::Image& image, const char* path, loader::FindImport* find) {
    if (image.load(path, static_cast<size_t>(sysconf(_SC_PAGESIZE)), find)) return true;
    printf("refused: %s: %s\n", path, image.refusal().c_str());
    return false;
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 3) {
        fprintf(stderr, "usage: %s CORE JNI\n", argv[0]);
        return 2;
    }
    if (!loader::has_room_for_canary()) {
        printf("this program was linked without room for Android's canary\n");
        return 2;
    }
    loader::Image binding;
    if (!load(core, argv[1], loader::find_shim) || !load(binding, argv[2], find_import)) {
        return kRefused;
    }
    JNIInvokeInterface_ invoke = {};
    invoke.GetEnv = get_env;
    JavaVM vm = {};
    vm.functions = &invoke;
    const auto on_load = reinterpret_cast<jint (*)(JavaVM*, void*)>(binding.find("JNI_OnLoad"));
    check(on_load != nullptr && on_load(&vm, nullptr) == JNI_VERSION_1_6, "JNI_OnLoad");
    check(methods.size() == kMethods, std::to_string(methods.size()) + " methods");
    check_pictures();
    check_frames();
    check_bitmaps();
    check_refusals();
    printf("page size %ld: %zu native methods, %d checks, %d failed\n", sysconf(_SC_PAGESIZE),
           methods.size(), checks, failures);
    return failures == 0 ? 0 : 1;
}
