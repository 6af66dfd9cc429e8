#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# reproducible.sh BUILD_DIR: two builds in folders of different names and depths, at different times,
# with different numbers of jobs, locales and time zones, install the same bytes, with debug
# information and without.
set -euo pipefail
source_dir=$(cd "$(dirname "${BASH_SOURCE[0]}")/../.." && pwd)
build=$1

# copy TREE: the sources in a folder of their own.
copy() {
    mkdir -p "$1"
    cp -R "$source_dir"/{*.md,CMakeLists.txt,LICENSE,cmake,docs,examples,include,src} "$1"
}

# make TREE FOLDER JOBS: builds and installs, as it is and stripped.
make() {
    {
        cmake -S "$1" -B "$2" -G Ninja -DCMAKE_CXX_COMPILER=g++ \
            -DCMAKE_BUILD_TYPE=RelWithDebInfo -DCMAKE_INSTALL_PREFIX=/usr
        cmake --build "$2" --parallel "$3"
        DESTDIR=$2/whole cmake --install "$2"
        DESTDIR=$2/stripped cmake --install "$2" --strip
    } >"$2.log"
}

# same KIND: the installed trees hold the same files with the same bytes.
same() {
    local first=$build/one/out/$1 second=$build/two/much/deeper/out/$1 count
    count=$(find "$first" -type f | wc -l)
    if ! diff -r "$first" "$second" || ((count < 5)); then
        echo "FAIL: two builds install different files ($1)"
        exit 1
    fi
    echo "$1: $count files alike"
}

rm -rf "$build"
mkdir -p "$build/one" "$build/two/much/deeper"
build=$(cd "$build" && pwd)
copy "$build/one/source"
make "$build/one/source" "$build/one/out" 1
sleep 1 # so that a time in seconds would differ
copy "$build/two/much/deeper/source"
(
    export TZ=Asia/Kathmandu LC_ALL=C
    make "$build/two/much/deeper/source" "$build/two/much/deeper/out" 7
)
same whole
same stripped

# The comparison can fail: one byte of a comment in the header is enough.
printf ' ' >>"$build/two/much/deeper/out/whole/usr/include/ovrinresize.h"
if diff -rq "$build/one/out/whole" "$build/two/much/deeper/out/whole" >/dev/null; then
    echo "FAIL: a changed file was not noticed"
    exit 1
fi
