#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# release.sh VERSION [--unchecked] [NDK CORE [JNI]]: everything that a release consists of, in build/dist.
# The sources of the last commit are packed, alike whenever the same commit is packed; all else is
# built from that archive, which is checked first unless told otherwise.
# An Android archive needs libraries built by an NDK; without them there is none.
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/.."
name=ovrinresize-$1
shift
checked=yes
if [[ ${1:-} == --unchecked ]]; then
    checked=
    shift
fi
dist=$PWD/build/dist
libraries=()
for file in "${@:2}"; do libraries+=("$(realpath "$file")"); done

# Outside this repository's own folder, as whoever gets the archive has it.
work=$(mktemp -d)
trap 'rm -rf "$work"' EXIT
tree=$work/$name

pack() {
    git archive --prefix="$name/" HEAD | gzip -9n
}

# of_archive COMMAND...: runs ./dev COMMAND of the archive's sources.
of_archive() {
    echo "$name: ./dev $*"
    (cd "$tree" && ./dev "$@")
}

rm -rf "$dist"
mkdir -p "$dist"
pack >"$dist/$name.tar.gz"
pack | cmp - "$dist/$name.tar.gz"
tar -xzf "$dist/$name.tar.gz" -C "$work"
packaging/sbom.sh "$tree" "${name#*-}" \
    "$(TZ=UTC0 git log -1 --date=format-local:%Y-%m-%dT%H:%M:%SZ --format=%cd)" >"$dist/$name.spdx"

[[ ! $checked ]] || of_archive check
of_archive deb
of_archive python
of_archive wasm
of_archive docs
cp "$tree"/build/deb/packages/*.deb "$tree"/build/python/*.whl "$dist"
npm pack --silent --pack-destination "$work" "$tree/build/js"
mv "$work/$name.tgz" "$dist/$name-npm.tgz"
tar -czf "$dist/$name-docs.tar.gz" --transform "s,^html,$name-docs," -C "$tree/build/docs" html
if (($#)); then
    of_archive aar "$1" "${libraries[@]}"
    cp "$tree"/build/*.aar "$dist"
fi

cd "$dist"
sha256sum -- * >"$work/SHA256SUMS"
cp "$work/SHA256SUMS" .
ls -l
(($#)) || echo "Without an Android archive: its libraries come from an NDK, see docs/android-archive.md"
[[ $checked ]] || echo "The archive has not been checked"
