// SPDX-License-Identifier: Apache-2.0
// What native methods demand of their arguments. The first demand that is not met throws
// IllegalArgumentException; the others then pass unlooked at, and ok() says not to go on. It is
// thrown at the end of the object's life: what is released before that may call Java without it
// pending.
#pragma once

#include <jni.h>
#include <stdint.h>

#include <ovrinresize.hpp>

#include "extents.h"

namespace ovrin_jni {

// A rectangle of a canvas.
struct Placement {
    Size canvas;
    Size picture;
    int32_t x;
    int32_t y;
};

class Checks {
public:
    explicit Checks(JNIEnv* env) : env_(env) {}
    ~Checks();

    Checks(const Checks&) = delete;
    Checks& operator=(const Checks&) = delete;

    bool ok() const { return ok_; }

    void side(const char* name, int32_t value) { number(name, value, 1, kLargestSide); }
    void size(const char* name, Size size);
    void number(const char* name, int32_t value, int32_t least, int32_t most);
    // The picture lies inside the canvas.
    void placement(const Placement& placement);

    // The address of a direct buffer that holds at least `bytes` bytes, and starts at a multiple of
    // `alignment`; null when it is not one. Destinations come last: they must not be read-only, nor
    // share a byte with the sources.
    const uint8_t* source(jobject buffer, const char* name, int64_t bytes, int alignment = 1);
    uint8_t* destination(jobject buffer, int64_t bytes, int alignment = 1);

    // Takes a message as printf does.
    void fail(const char* format, ...) __attribute__((format(printf, 2, 3)));

    // What a call of the C++ layer has come to: missing memory throws OutOfMemoryError.
    void outcome(const ovrin::Status& status);

    // Runs call(), which stores every byte of dst unless the library lacks memory; then
    // OutOfMemoryError is thrown, and dst is as it was.
    template <class Call>
    void write(uint8_t* dst, int64_t bytes, const Call& call) {
        if (!ok_ || ovrin::has_written(dst, static_cast<size_t>(bytes), call)) return;
        outcome({ovrin::ErrorCode::kNoMemory, "the library has no memory for its work"});
    }

private:
    struct Range {
        uintptr_t begin;
        uintptr_t end;
    };

    uint8_t* address(jobject buffer, const char* name, int64_t bytes, int alignment);
    bool is_read_only(jobject buffer);

    JNIEnv* env_;
    bool ok_ = true;
    // The class to throw, or null, and what it says.
    const char* exception_ = nullptr;
    char message_[256] = "";
    Range sources_[3] = {};
    int source_count_ = 0;
};

}  // namespace ovrin_jni
