#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# install.sh BUILD_DIR LIBDIR TREE: programs find, link and run the library in an installed tree,
# shared and static, through the CMake package, through pkg-config and Meson, by the compiler alone and by the
# dynamic loader, also after the tree has been moved; then all of it is removed again.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
source "$here/skip.sh"
build_dir=$1
libdir=$2
tree=$3
compile=("$CC" -std=c99 -Wall -Wextra -Werror)

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
    run "$build/static_consumer"
    needs_library "$build/consumer"
    needs_none "$build/static_consumer"
}

# through_pkg_config PREFIX
through_pkg_config() {
    local prefix=$1 program=$tree/pkg-config-consumer flags
    export PKG_CONFIG_LIBDIR=$prefix/$libdir/pkgconfig
    # It puts a backslash before a space, as a shell would read it.
    eval "flags=($(pkg-config --cflags --libs ovrinresize))"
    "${compile[@]}" "$here/consumer/consumer.c" -o "$program" "${flags[@]}" -Wl,-rpath,"$prefix/$libdir"
    run "$program"
    eval "flags=($(pkg-config --static --cflags --libs ovrinresize))"
    "${compile[@]}" -static "$here/consumer/consumer.c" -o "$program" "${flags[@]}"
    run "$program"
    needs_none "$program"
}

# Meson would want a file of its own to compile for another machine.
through_meson() {
    local prefix=$1 build=$tree/meson-consumer kind
    [[ ! $TOOLCHAIN ]] || return 0
    if ! command -v meson >/dev/null; then
        echo "not tested: no Meson here"
        return 0
    fi
    for kind in shared static; do
        rm -rf "$build"
        PKG_CONFIG_LIBDIR=$prefix/$libdir/pkgconfig CC=$CC \
            meson setup "$build" "$here/consumer" -Dkind="$kind" >"$tree/meson.log"
        meson compile -C "$build" >>"$tree/meson.log"
        run "$build/consumer"
        if [[ $kind == shared ]]; then needs_library "$build/consumer"; else needs_none "$build/consumer"; fi
    done
}

by_compiler() {
    local prefix=$1 program=$tree/compiler-consumer
    "${compile[@]}" "$here/consumer/consumer.c" -o "$program" -I "$prefix/include" \
        -L "$prefix/$libdir" -lovrinresize -Wl,-rpath,"$prefix/$libdir"
    run "$program"
}

by_loader() {
    local names
    names=$("$CC" -E "$1/include/ovrinresize.h" | awk -f "$here/declared.awk")
    "${compile[@]}" "$here/load.c" -o "$tree/load" -ldl
    # shellcheck disable=SC2086 # a list of names
    run "$tree/load" "$1/$libdir/libovrinresize.so" $names
}

needs_library() { grep -q 'NEEDED.*libovrinresize' <<<"$("$READELF" -dW "$1")"; }
needs_none() { ! "$READELF" -dW "$1" | grep -E 'NEEDED.*(libovrinresize|libstdc)'; }

# Cross builds have no tool.
installed_tool() {
    local tool=$1/bin/ovrinresize
    if [[ -x $tool ]]; then run "$tool" --version; fi
}

check() {
    echo "in $1"
    through_cmake "$1"
    through_pkg_config "$1"
    through_meson "$1"
    by_compiler "$1"
    by_loader "$1"
    installed_tool "$1"
}

rm -rf "$tree"
mkdir -p "$tree"
"$CMAKE" --install "$build_dir" --prefix "$tree/first" >"$tree/install.log"
for file in LICENSE README.md docs/testing.md examples/shrink.c; do
    cmp "$SOURCE_DIR/$file" "$tree/first/share/doc/ovrinresize/$file"
done
check "$tree/first"
mv "$tree/first" "$tree/moved"
check "$tree/moved"

mv "$tree/moved" "$tree/first"
"$CMAKE" --build "$build_dir" --target uninstall >"$tree/uninstall.log"
left=$(find "$tree/first" -type f -o -type l -o -name '*ovrinresize*')
if [[ $left ]]; then
    printf 'FAIL: left after uninstalling:\n%s\n' "$left"
    exit 1
fi
