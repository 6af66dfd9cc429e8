#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# install.sh BUILD_DIR LIBDIR TREE: programs find, link and run the library in an installed tree,
# through the CMake package and through pkg-config, also after the tree has been moved.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
source "$here/skip.sh"
build_dir=$1
libdir=$2
tree=$3

run() {
    # shellcheck disable=SC2086 # the emulator's own arguments
    $EMULATOR "$@"
}

through_cmake() {
    local prefix=$1 build=$tree/cmake-consumer
    rm -rf "$build"
    "$CMAKE" -S "$here/consumer" -B "$build" -DCMAKE_PREFIX_PATH="$prefix" \
        ${TOOLCHAIN:+-DCMAKE_TOOLCHAIN_FILE="$TOOLCHAIN"} >"$tree/configure.log"
    "$CMAKE" --build "$build" >"$tree/build.log"
    run "$build/consumer"
}

# through_pkg_config PREFIX SOURCE
through_pkg_config() {
    local prefix=$1 flags
    export PKG_CONFIG_LIBDIR=$prefix/$libdir/pkgconfig
    flags=$(pkg-config --cflags --libs ovrinresize)
    # shellcheck disable=SC2086 # a list of flags
    "$CC" -std=c99 -Wall -Wextra -Werror "$2" -o "$tree/pkg-config-consumer" \
        $flags -Wl,-rpath,"$prefix/$libdir"
    run "$tree/pkg-config-consumer"
}

# Cross builds have no tool.
installed_tool() {
    local tool=$1/bin/ovrinresize
    if [[ -x $tool ]]; then run "$tool" --version; fi
}

check() {
    echo "in $1"
    through_cmake "$1"
    through_pkg_config "$1" "$here/consumer/consumer.c"
    through_pkg_config "$1" "$SOURCE_DIR/examples/shrink.c"
    installed_tool "$1"
}

rm -rf "$tree"
mkdir -p "$tree"
"$CMAKE" --install "$build_dir" --prefix "$tree/first" >"$tree/install.log"
check "$tree/first"
mv "$tree/first" "$tree/moved"
check "$tree/moved"
