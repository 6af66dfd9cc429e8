#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# check.sh BUILD_DIR [--update]: the library's functions, their parameters and the layouts of its
# records are those that x86-64.abi describes. --update writes the description anew: a change that
# is meant is committed together with it.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
source_dir=$(cd "$here/../.." && pwd)
build=$1
baseline=$here/x86-64.abi

if [[ $(uname -m) != x86_64 ]]; then
    echo "skipped: the description is of x86-64, where the C library's types have other sizes"
    exit 0
fi

# describe SOURCE_DIR NAME: builds the library with debug information and describes its interface.
# Neither the folder nor the compiler's optimisation shows in the description.
describe() {
    local folder=$build/$2
    cmake -S "$1" -B "$folder" -G Ninja -DCMAKE_CXX_COMPILER=g++ -DCMAKE_BUILD_TYPE=Debug >"$folder.log"
    cmake --build "$folder" --target ovrinresize --parallel "$(nproc)" >>"$folder.log"
    abidw --headers-dir "$1/include" --drop-private-types --exported-interfaces-only \
        --no-show-locs --no-comp-dir-path --no-corpus-path --no-architecture --no-elf-needed \
        --type-id-style hash --out-file "$build/$2.abi" "$folder/libovrinresize.so"
    # -ffile-prefix-map among CMake's flags would leave the folder out, too, but ends at a space.
    sed -i "s|path='$(cd "$1" && pwd)/|path='|" "$build/$2.abi"
}

# change FILE EXPRESSION: a sed command that must have an effect.
change() {
    sed "$2" "$1" >"$1.changed"
    if cmp -s "$1" "$1.changed"; then
        echo "nothing to change in $1: $2"
        exit 1
    fi
    mv "$1.changed" "$1"
}

# A copy of the library with another parameter and two fields of a record in the other order.
make_twin() {
    rm -rf "$build/twin-source"
    mkdir "$build/twin-source"
    cp -R "$source_dir/CMakeLists.txt" "$source_dir/cmake" "$source_dir/include" \
        "$source_dir/src" "$build/twin-source"
    cd "$build/twin-source"
    change include/ovrinresize.h 's/ src_buffer_height; / HELD; /
        s/ int32_t format;  / int32_t src_buffer_height;  /
        s/ HELD; / format; /'
    change include/ovrinresize.h 's/ov_sleep(uint32_t/ov_sleep(uint64_t/'
    change src/bands/sleep.cpp 's/ov_sleep(uint32_t/ov_sleep(uint64_t/'
    change src/bands/sleep.cpp 's/usleep(useconds)/usleep(static_cast<uint32_t>(useconds))/'
    # Its assertions would refuse the record before anything is compared.
    change src/dispatch/records.cpp "/^static_assert/,\$d"
    cd - >/dev/null
}

mkdir -p "$build"
build=$(cd "$build" && pwd)
describe "$source_dir" library
if [[ ${2:-} == --update ]]; then
    cp "$build/library.abi" "$baseline"
    echo "written: ${baseline#"$source_dir"/}"
    exit 0
fi
abidiff "$baseline" "$build/library.abi" || {
    echo "FAIL: the interface has changed; if that is meant: tests/abi/check.sh BUILD_DIR --update"
    exit 1
}
if grep -q "$source_dir" "$baseline"; then
    echo "FAIL: the description names a folder of one machine"
    exit 1
fi
echo "$(grep -c '<function-decl' "$baseline") functions as described"

make_twin
describe "$build/twin-source" twin
report=$(abidiff "$baseline" "$build/twin.abi") && status=0 || status=$?
for finding in ovrin_resize_target src_buffer_height ov_sleep; do
    if ((status == 0)) || ! grep -q "$finding" <<<"$report"; then
        echo "$report"
        echo "FAIL: a changed $finding was not noticed"
        exit 1
    fi
done
echo "a changed twin is refused"
