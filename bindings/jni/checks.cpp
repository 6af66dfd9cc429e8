// SPDX-License-Identifier: Apache-2.0
#include "checks.h"

#include <stdarg.h>
#include <stdio.h>

namespace ovrin_jni {

namespace {

constexpr const char kDestination[] = "destination";

long long printable(int64_t value) {
    return value;
}

}  // namespace

Checks::~Checks() {
    if (exception_ == nullptr) return;
    // Where the class is not found, that error is thrown instead.
    jclass found = env_->FindClass(exception_);
    if (found != nullptr) env_->ThrowNew(found, message_);
}

// C's variadic arguments: the compiler checks them against the format.
void Checks::fail(const char* format, ...) {  // NOLINT(cert-dcl50-cpp)
    if (!ok_) return;
    ok_ = false;
    exception_ = "java/lang/IllegalArgumentException";
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(message_, sizeof message_, format, arguments);
    va_end(arguments);
}

void Checks::outcome(const ovrin::Status& status) {
    if (status.ok()) return;
    fail("%s", status.text);
    if (status.code == ovrin::ErrorCode::kNoMemory) exception_ = "java/lang/OutOfMemoryError";
}

void Checks::number(const char* name, int32_t value, int32_t least, int32_t most) {
    if (value < least || value > most) {
        fail("%s is %d, must be %d to %d", name, value, least, most);
    }
}

void Checks::size(const char* name, Size size) {
    if (size.width < 1 || size.width > kLargestSide || size.height < 1 ||
        size.height > kLargestSide) {
        fail("%s is %d x %d, sides must be 1 to %d", name, size.width, size.height, kLargestSide);
    }
}

void Checks::placement(const Placement& p) {
    size("canvas", p.canvas);
    size("picture", p.picture);
    if (p.x < 0 || p.y < 0 || int64_t{p.x} + p.picture.width > p.canvas.width ||
        int64_t{p.y} + p.picture.height > p.canvas.height) {
        fail("picture of %d x %d at (%d, %d) does not lie inside the canvas of %d x %d",
             p.picture.width, p.picture.height, p.x, p.y, p.canvas.width, p.canvas.height);
    }
}

uint8_t* Checks::address(jobject buffer, const char* name, int64_t bytes, int alignment) {
    if (!ok_) return nullptr;
    if (buffer == nullptr) {
        fail("%s is null", name);
        return nullptr;
    }
    // An empty direct buffer may have no address; it is too small for any picture as well.
    void* address = env_->GetDirectBufferAddress(buffer);
    const int64_t capacity = env_->GetDirectBufferCapacity(buffer);
    if (capacity < 0 || (address == nullptr && capacity > 0)) {
        fail("%s is not a direct buffer", name);
    } else if (capacity < bytes) {
        fail("%s holds %lld bytes, %lld needed", name, printable(capacity), printable(bytes));
    } else if (reinterpret_cast<uintptr_t>(address) % static_cast<uintptr_t>(alignment) != 0) {
        fail("%s starts at an address that is no multiple of %d", name, alignment);
    }
    return ok_ ? static_cast<uint8_t*>(address) : nullptr;
}

const uint8_t* Checks::source(jobject buffer, const char* name, int64_t bytes, int alignment) {
    const uint8_t* first = address(buffer, name, bytes, alignment);
    if (first == nullptr) return nullptr;
    const auto begin = reinterpret_cast<uintptr_t>(first);
    sources_[source_count_++] = {begin, begin + static_cast<uintptr_t>(bytes)};
    return first;
}

// A read-only buffer may be a file that is mapped so: writing it would end the process.
bool Checks::is_read_only(jobject buffer) {
    jmethodID method = env_->GetMethodID(env_->GetObjectClass(buffer), "isReadOnly", "()Z");
    if (method == nullptr) return true;
    const jboolean result = env_->CallBooleanMethod(buffer, method);
    return env_->ExceptionCheck() || result;
}

uint8_t* Checks::destination(jobject buffer, int64_t bytes, int alignment) {
    uint8_t* first = address(buffer, kDestination, bytes, alignment);
    if (first == nullptr) return nullptr;
    if (is_read_only(buffer)) {
        if (env_->ExceptionCheck()) {
            ok_ = false;
        } else {
            fail("%s is read-only", kDestination);
        }
        return nullptr;
    }
    const auto begin = reinterpret_cast<uintptr_t>(first);
    const uintptr_t end = begin + static_cast<uintptr_t>(bytes);
    for (int i = 0; i < source_count_; ++i) {
        if (begin < sources_[i].end && sources_[i].begin < end) {
            fail("%s overlaps a source", kDestination);
        }
    }
    return first;
}

}  // namespace ovrin_jni
