#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# parent.sh BUILD_DIR: the library as a part of another project, which keeps its settings and installs
# only what is its own, unless it asks for more.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
source "$here/skip.sh"
build=$1

# configure FOLDER ARGS...
configure() {
    "$CMAKE" -S "$here/parent" -B "$build/$1" -DOVRINRESIZE_SOURCE="$SOURCE_DIR" \
        ${TOOLCHAIN:+-DCMAKE_TOOLCHAIN_FILE="$TOOLCHAIN"} "${@:2}" >"$build/$1.log"
}

rm -rf "$build"
mkdir -p "$build"
configure added
configure asked -DOVRINRESIZE_INSTALL=ON
configure fetched -DHOW=fetch -DBUILD_SHARED_LIBS=OFF -DCMAKE_CXX_FLAGS=-O1
"$CMAKE" --build "$build/fetched" --target consumer --parallel 2 >"$build/build.log"
# shellcheck disable=SC2086 # the emulator's own arguments
$EMULATOR "$build/fetched/consumer"

"$CMAKE" --install "$build/fetched" --prefix "$build/tree" >"$build/install.log"
installed=$(cd "$build/tree" && find . -type f)
if [[ $installed != ./bin/consumer ]]; then
    printf 'FAIL: installed are\n%s\n' "$installed"
    exit 1
fi
# What a project asks for, it gets.
if ! grep -q 'ovrinresize\.h' "$build/asked/ovrinresize/cmake_install.cmake"; then
    echo "FAIL: OVRINRESIZE_INSTALL has no effect"
    exit 1
fi
