#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# count.sh DIRECTORY [PART OF A CASE'S NAME]: what the library executes on aarch64 beside its peers.
# No Arm processor is needed: qemu-user's plugin counts instructions and bytes exactly, and llvm-mca
# models how long they take. The table is DIRECTORY/table.txt. The peers' packages for arm64, the
# library of each compiler and what was counted lie there too; packages are fetched once.
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/../.."
directory=$(realpath -m "$1")
part=${2:-}

sysroot=$directory/sysroot
libraries=$sysroot/usr/lib/aarch64-linux-gnu

# Unpacks the peers and all that they need. Nothing of the system's own packages changes: apt keeps
# its records of arm64 in a directory that is thrown away.
make_sysroot() {
    local apt deb
    apt=$(mktemp -d)
    # shellcheck disable=SC2064 # now
    trap "rm -r '$apt'" RETURN
    mkdir -p "$apt"/{state/lists,cache/archives}/partial
    : >"$apt/status"
    local arm64=(apt-get --quiet --quiet --yes -o Dir::State="$apt/state" -o Dir::State::status="$apt/status"
        -o Dir::Cache="$apt/cache" -o APT::Architecture=arm64 -o APT::Architectures=arm64
        -o APT::Sandbox::User=root -o APT::Install-Recommends=false)
    "${arm64[@]}" update
    "${arm64[@]}" --download-only install libyuv-dev libopencv-imgproc-dev
    rm -rf "$sysroot.new"
    mkdir -p "$sysroot.new"
    for deb in "$apt"/cache/archives/*.deb; do dpkg-deb -x "$deb" "$sysroot.new"; done
    mv "$sysroot.new" "$sysroot"
}

# build_library DIRECTORY COMPILER [OPTION...]
build_library() {
    cmake -G Ninja -S . -B "$1" -DCMAKE_SYSTEM_NAME=Linux -DCMAKE_SYSTEM_PROCESSOR=aarch64 \
        -DCMAKE_BUILD_TYPE=Release -DCMAKE_CXX_COMPILER="$2" "${@:3}"
    cmake --build "$1"
}

build_plugin() {
    g++ -std=c++17 -O2 -Wall -Wextra -Wconversion -Wshadow -Werror -fPIC -shared \
        -o "$directory/plugin.so" bench/neon/plugin.cpp
}

build_calls() {
    # The peers' libraries find each other when they run.
    aarch64-linux-gnu-g++ -std=c++17 -O2 -Wall -Wextra -Wconversion -Wshadow -Werror -Iinclude -Ibench \
        -idirafter "$sysroot/usr/include" -idirafter "$sysroot/usr/include/opencv4" \
        bench/neon/calls.cpp bench/{picture,ours,libyuv,opencv}.cpp -o "$directory/calls" \
        "$directory/${names[0]}/libovrinresize.so" "$libraries"/lib{yuv,opencv_imgproc,opencv_core}.so \
        -Wl,--allow-shlib-undefined
}

# count ours|peers NAME LIBRARY: with the library that this compiler has built.
count() {
    local counted=$directory/counted/$2 path=$directory/$3 folder
    rm -rf "$counted"
    mkdir -p "$counted"
    for folder in blas lapack; do path+=:/usr/lib/aarch64-linux-gnu/$folder; done
    # The processor decides which string functions libc takes.
    qemu-aarch64 -cpu neoverse-n1 -L "$sysroot" -E LD_LIBRARY_PATH="$path" \
        -plugin "$directory/plugin.so,out=$counted/count" \
        "$directory/calls" "$1" "$part" >"$counted/calls.txt"
}

[[ -d $sysroot ]] || make_sysroot
build_plugin
names=()
for compiler in clang++-19 clang++ aarch64-linux-gnu-g++; do
    name=g++ options=()
    if [[ $compiler == clang* ]]; then
        name=clang
        options=(-DCMAKE_CXX_COMPILER_TARGET=aarch64-linux-gnu)
    fi
    name+=-$("$compiler" -dumpversion | cut -d. -f1)
    build_library "$directory/$name" "$compiler" "${options[@]}"
    names+=("$name")
done
build_calls
for name in "${names[@]}"; do count ours "$name" "$name"; done
count peers peers "${names[0]}"
bench/neon/table.py "$directory/counted/peers" "${names[@]/#/$directory/counted/}" >"$directory/table.txt"
