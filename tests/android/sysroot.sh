#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# sysroot.sh DIRECTORY: makes the stand-in for the NDK there. Its libraries hold empty functions with
# the names of imports.txt and imports_jni.txt: enough to link against, useless to run. jni.h is the
# JDK's: types and tables are the same everywhere.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
ndk=$1

rm -rf "$ndk"
mkdir -p "$ndk/build/cmake"
cp -r "$here/ndk/sysroot" "$ndk"
cp "$here/ndk/android.toolchain.cmake" "$ndk/build/cmake"
jdk=$(dirname "$(find /usr/lib/jvm/*/include "${JAVA_HOME:-/nonexistent}" -name jni.h 2>/dev/null |
    head -n 1)")
cp "$jdk/jni.h" "$jdk/linux/jni_md.h" "$ndk/sysroot/include"
cp -r "$here/../../bindings/jni/stubs/android" "$ndk/sysroot/include"
libraries=$ndk/sysroot/lib
mkdir -p "$libraries"
# Android's libraries give all their names one version.
echo 'LIBC { global: *; };' >"$libraries/version.map"
for library in libc.so libm.so libjnigraphics.so; do
    awk -v library="$library" '$1 == library && !seen[$2]++ { print "void " $2 "(void) {}" }' \
        "$here/imports.txt" "$here/imports_jni.txt" >"$libraries/$library.c"
    # The compiler knows that these names have other types.
    clang --target=aarch64-linux-android21 -ffreestanding -fno-builtin -w -nostdlib -shared -fPIC \
        -fuse-ld=lld -Wl,-soname,"$library" -Wl,--version-script="$libraries/version.map" \
        -o "$libraries/$library" "$libraries/$library.c"
done
