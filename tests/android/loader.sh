#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# loader.sh PROGRAM JNI_PROGRAM: builds the loader with the golden cases, and that with the checks of the
# binding's library, as programs for Linux that need no other file. shims.cpp comes first; it says why.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
tests=$here/..

# build PROGRAM ARGUMENT...
build() {
    aarch64-linux-gnu-g++ -std=c++17 -O2 -static -Wall -Wextra -Wconversion -Wshadow -Werror \
        -I "$tests/../include" -I "$tests" "$here/loader/shims.cpp" "$here/loader/image.cpp" \
        "${@:2}" -o "$1"
}

build "$1" "$here/loader/main.cpp" "$tests"/golden/*cases.cpp "$tests/golden/content.cpp" \
    "$tests/golden/file.cpp"

jdk=$(dirname "$(find /usr/lib/jvm/*/include "${JAVA_HOME:-/nonexistent}" -name jni.h 2>/dev/null |
    head -n 1)")
build "$2" -isystem "$jdk" -isystem "$jdk/linux" -isystem "$tests/../bindings/jni/stubs" \
    "$here/loader/jni_main.cpp"
