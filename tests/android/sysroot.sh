#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# sysroot.sh DIRECTORY: makes the stand-in for the NDK there. Its libc.so and libm.so hold empty
# functions with the names of imports.txt: enough to link against, useless to run.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
ndk=$1

rm -rf "$ndk"
mkdir -p "$ndk/build/cmake"
cp -r "$here/ndk/sysroot" "$ndk"
cp "$here/ndk/android.toolchain.cmake" "$ndk/build/cmake"
libraries=$ndk/sysroot/lib
mkdir -p "$libraries"
# Android's libraries give all their names one version.
echo 'LIBC { global: *; };' >"$libraries/version.map"
for library in libc.so libm.so; do
    awk -v library="$library" '$1 == library { print "void " $2 "(void) {}" }' \
        "$here/imports.txt" >"$libraries/$library.c"
    # The compiler knows that these names have other types.
    clang --target=aarch64-linux-android21 -ffreestanding -fno-builtin -w -nostdlib -shared -fPIC \
        -fuse-ld=lld -Wl,-soname,"$library" -Wl,--version-script="$libraries/version.map" \
        -o "$libraries/$library" "$libraries/$library.c"
done
