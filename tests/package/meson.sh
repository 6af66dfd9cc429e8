#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# meson.sh FOLDER: the library as a subproject of a project that Meson builds, shared and static,
# with flags of the project's own that it must not mind.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
source "$here/skip.sh"
folder=$1
[[ ! $TOOLCHAIN ]] || { echo "skipped: Meson would want a file of its own for another machine" && exit 77; }
command -v meson >/dev/null || { echo "skipped: no Meson here" && exit 77; }

rm -rf "$folder"
mkdir -p "$folder"
cp -R "$here/consumer" "$folder/project"
mkdir "$folder/project/subprojects"
ln -s "$SOURCE_DIR" "$folder/project/subprojects/ovrinresize"
cp "$SOURCE_DIR/packaging/meson/ovrinresize.wrap" "$folder/project/subprojects"

build=$folder/build
CC=$CC meson setup "$build" "$folder/project" -Dovrinresize:default_library=both -Dbuildtype=debug \
    -Dcpp_args=-ffast-math --wrap-mode=forcefallback >"$folder/log"
meson compile -C "$build" >>"$folder/log"
"$build/consumer"
"$CC" "$here/consumer/consumer.c" -o "$folder/consumer" -I "$SOURCE_DIR/include" \
    "$build/subprojects/ovrinresize/libovrinresize.a" -pthread -lm
"$folder/consumer"

bash "$here/exports.sh" "$build/subprojects/ovrinresize/libovrinresize.so"
bash "$here/elf.sh" "$build/subprojects/ovrinresize/libovrinresize.so"

# Code for newer processors is in their kernels alone.
if misplaced=$(grep -E '"command": .* -mavx' "$build/compile_commands.json" | grep -vE '_avx(2|512)\.cpp'); then
    echo "FAIL: compiled for newer processors: $misplaced"
    exit 1
fi
