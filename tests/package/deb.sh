#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# deb.sh FOLDER: the Debian packages in it satisfy lintian, hold what they should, and in a root folder
# of their own install, serve a program and a shell, and go away again. tests/bare tries them in a whole
# system.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
packages=$1
multiarch=$(dpkg-architecture -q DEB_HOST_MULTIARCH)
version=$(dpkg-deb -f "$packages"/libovrinresize-dev_*.deb Version)
version=${version%-*}
names=("libovrinresize${version%%.*}" libovrinresize-dev ovrinresize python3-ovrinresize)

fail() {
    echo "FAIL: $*"
    exit 1
}

# The root has nothing but these packages, and so nothing that their scripts could run in it.
dpkg_in_root() {
    fakeroot dpkg --root="$root" --log=/dev/null --force-depends --force-bad-path --force-script-chrootless "$@"
}

# holds PACKAGE FILE...
holds() {
    local file files
    files=$(dpkg-deb --fsys-tarfile "$packages/$1"_*.deb | tar -t)
    for file in "${@:2}"; do
        grep -qx ".$file" <<<"$files" || fail "$1 has no $file"
    done
}

count=$(find "$packages" -maxdepth 1 -name '*.deb' | wc -l)
((count == ${#names[@]})) || fail "$count packages, not ${#names[@]}"
lintian --fail-on error,warning "$packages"/*.deb || fail "lintian has complaints"

holds "${names[0]}" "/usr/lib/$multiarch/libovrinresize.so.$version"
holds libovrinresize-dev /usr/include/ovrinresize.h{,pp} \
    "/usr/lib/$multiarch/"{libovrinresize.a,libovrinresize.so,pkgconfig/ovrinresize.pc}
holds ovrinresize /usr/bin/ovrinresize /usr/share/man/man1/ovrinresize.1.gz \
    /usr/share/{bash-completion/completions/ovrinresize,zsh/vendor-completions/_ovrinresize} \
    /usr/share/fish/vendor_completions.d/ovrinresize.fish
holds python3-ovrinresize /usr/lib/python3/dist-packages/ovrinresize/{__init__.py,_native.pyi,py.typed}

root=$(realpath "$packages")/root
rm -rf "$root"
mkdir -p "$root/var/lib/dpkg/"{info,updates}
touch "$root/var/lib/dpkg/"{status,available}
dpkg_in_root --install "$packages"/*.deb >"$packages/install.log" 2>&1 ||
    fail "dpkg: $(<"$packages/install.log")"

export LD_LIBRARY_PATH=$root/usr/lib/$multiarch
flags=$(PKG_CONFIG_SYSROOT_DIR=$root PKG_CONFIG_LIBDIR=$LD_LIBRARY_PATH/pkgconfig \
    PKG_CONFIG_SYSTEM_INCLUDE_PATH=/none PKG_CONFIG_SYSTEM_LIBRARY_PATH=/none \
    pkg-config --cflags --libs ovrinresize)
# shellcheck disable=SC2086 # a list of flags
gcc -Wall -Wextra -Werror "$here/consumer/consumer.c" -o "$packages/consumer" $flags
grep -q "$root" <<<"$(ldd "$packages/consumer")" || fail "the program takes another library"
"$packages/consumer"
"$root/usr/bin/ovrinresize" --version
PYTHONDONTWRITEBYTECODE=1 PYTHONPATH=$root/usr/lib/python3/dist-packages /usr/bin/python3 -c "
import numpy, ovrinresize
print('Python:', ovrinresize.resize(numpy.zeros((4, 8, 4), numpy.uint8), (4, 2)).shape, ovrinresize.__file__)"

dpkg_in_root --purge "${names[@]}" >"$packages/purge.log" 2>&1 || fail "dpkg: $(<"$packages/purge.log")"
left=$(find "$root" -path '*/var/lib/dpkg' -prune -o -name '*ovrinresize*' -print)
[[ ! $left ]] || fail "left after purging: $left"
left=$(grep -l ovrinresize "$root/var/lib/dpkg/status" "$root"/var/lib/dpkg/info/* 2>/dev/null || true)
[[ ! $left ]] || fail "dpkg still knows them: $left"
echo "${#names[@]} packages install, work and purge"
