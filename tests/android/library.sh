#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# library.sh DIRECTORY: configures and builds the android-arm64 preset with the stand-in for the
# NDK, the binding's library with it, and checks what the preset said. The libraries are
# DIRECTORY/lib/libovrinresize.so and libovrinresize_jni.so.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
directory=$(realpath -m "$1")
build=$directory/lib

bash "$here/sysroot.sh" "$directory/ndk"
export ANDROID_NDK_HOME=$directory/ndk
cd "$here/../.."
rm -rf "$build"
cmake --preset android-arm64 -B "$build" -DOVRINRESIZE_WERROR=ON -DOVRINRESIZE_BUILD_JNI=ON
cmake --build "$build"

expected='ANDROID_ABI=arm64-v8a
ANDROID_PLATFORM=android-21
ANDROID_STL=none'
diff <(echo "$expected") "$build/ndk-settings.txt"
[[ $(find "$build" -maxdepth 1 -name 'libovrinresize*.so*' | sort | xargs) == \
    "$build/libovrinresize.so $build/libovrinresize_jni.so" ]]
DESTDIR=$directory/installed cmake --install "$build" --prefix /
[[ $(cd "$directory/installed" && find . -name '*.so*') == ./lib/libovrinresize.so ]]
