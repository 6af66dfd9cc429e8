#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# aarch64_runtime.sh DIRECTORY: makes there what clang calls its resource directory, with the fuzzing engine
# and the sanitizers for aarch64. They come from Debian's package for that architecture, which is unpacked and
# not installed; apt keeps its lists for it in that folder, so that the system's stay as they are.
set -euo pipefail
mkdir -p "$1"
cd "$1"

version=$(clang -dumpversion)
package=libclang-rt-${version%%.*}-dev
installed=$(clang --print-resource-dir)
[[ ! -e lib/linux/libclang_rt.fuzzer-aarch64.a || $(cat version) != "$version" ]] || exit 0

rm -rf ./*
mkdir -p apt/lists/partial apt/archives/partial
: >apt/status
apt=(apt-get -qq -o APT::Architecture=arm64 -o APT::Architectures=arm64 -o Dir::State="$PWD/apt"
    -o Dir::State::status="$PWD/apt/status" -o Dir::Cache="$PWD/apt" -o APT::Sandbox::User=root -o Acquire::Retries=5)
"${apt[@]}" update
"${apt[@]}" download "$package"
dpkg-deb -x "$package"_*_arm64.deb .
rm -r apt "$package"_*_arm64.deb
ln -s "$(find usr/lib -path "*/lib/linux" -printf '%h')" lib
ln -s "$installed/include" include
echo "$version" >version
