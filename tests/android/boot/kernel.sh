#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# kernel.sh DIRECTORY: makes DIRECTORY/vmlinuz, Debian's newest kernel for arm64 with 16 KB pages,
# unless it is there. The package comes from wherever this machine gets its packages, but the
# machine's own lists of packages stay as they are: these ones, for arm64, lie in DIRECTORY. It
# has some 90 MB.
set -euo pipefail
directory=$(realpath -m "$1")
[[ ! -s $directory/vmlinuz ]] || exit 0

mkdir -p "$directory/state/lists/partial" "$directory/cache/archives/partial"
: >"$directory/status"
cat >"$directory/apt.conf" <<END
APT::Architecture "arm64";
APT::Architectures { "arm64"; };
Dir::State "$directory/state";
Dir::State::status "$directory/status";
Dir::Cache "$directory/cache";
END
export APT_CONFIG=$directory/apt.conf
cd "$directory"
apt-get update
package=$(apt-cache pkgnames linux-image-6 | grep -E -- '-arm64-16k-unsigned$' | sort -V |
    tail -n 1)
if [[ ! $package ]]; then
    echo "the package sources of this machine have no kernel for arm64 with 16 KB pages"
    exit 1
fi
apt-get download "$package"
dpkg-deb --fsys-tarfile "$package"_*_arm64.deb |
    tar -xO --wildcards './boot/vmlinuz-*' >"$directory/vmlinuz.part"
mv "$directory/vmlinuz.part" "$directory/vmlinuz"
rm -rf "$package"_*_arm64.deb state cache
