// SPDX-License-Identifier: Apache-2.0
// How native methods become known to the virtual machine.
#pragma once

#include <jni.h>
#include <stddef.h>

#define OVRIN_BUFFER "Ljava/nio/ByteBuffer;"

namespace ovrin_jni {

struct Method {
    const char* name;
    const char* signature;
    void* function;
};

template <class Function>
Method method(const char* name, const char* signature, Function* function) {
    return {name, signature, reinterpret_cast<void*>(function)};
}

// False with an exception pending.
bool register_methods(JNIEnv* env, const char* type, const Method* methods, size_t count);

}  // namespace ovrin_jni
