#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# folders.sh BUILD_DIR: the pkg-config file names absolute folders as they were given, and all that a
# static library needs when there is no other.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
source "$here/skip.sh"
build=$1

# configure ARGS...
configure() {
    rm -rf "$build"
    "$CMAKE" -S "$SOURCE_DIR" -B "$build" ${TOOLCHAIN:+-DCMAKE_TOOLCHAIN_FILE="$TOOLCHAIN"} \
        "$@" >"$build.log"
}

# same EXPECTED ARGS...: what pkg-config says.
same() {
    local found
    found=$(PKG_CONFIG_LIBDIR=$build PKG_CONFIG_SYSTEM_LIBRARY_PATH=/none \
        pkg-config "${@:2}" ovrinresize | sed 's/ *$//')
    if [[ $found != "$1" ]]; then
        echo "FAIL: pkg-config ${*:2} says '$found', not '$1'"
        exit 1
    fi
}

configure -DCMAKE_INSTALL_PREFIX=/prefix -DCMAKE_INSTALL_LIBDIR=/libraries/here \
    -DCMAKE_INSTALL_INCLUDEDIR=/headers/there -DBUILD_SHARED_LIBS=OFF
same /libraries/here --variable=libdir
same /headers/there --variable=includedir
same "-I/headers/there" --cflags
same "-L/libraries/here -lovrinresize -pthread -lm" --libs

configure -DCMAKE_INSTALL_PREFIX=/prefix -DCMAKE_INSTALL_LIBDIR=/libraries/here \
    -DCMAKE_INSTALL_INCLUDEDIR=include -DBUILD_SHARED_LIBS=ON
same /prefix/include --variable=includedir
same "-L/libraries/here -lovrinresize" --libs
same "-L/libraries/here -lovrinresize -pthread -lm" --libs --static
