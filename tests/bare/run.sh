#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# run.sh FOLDER PACKAGES: what users do, in a Debian 12 that has nothing but its base. The system is made
# in FOLDER/root, which takes root's rights and a network, with the apt sources of this one. PACKAGES
# holds our Debian packages: they are installed, used, and purged. Then docs/first-programs.md is followed.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
folder=$1
packages=$2
root=$folder/root

leave() {
    ! mountpoint -q "$root/proc" || umount "$root/proc"
}
trap leave EXIT

inside() {
    env -i PATH=/usr/sbin:/usr/bin:/sbin:/bin HOME=/root LC_ALL=C.UTF-8 DEBIAN_FRONTEND=noninteractive \
        chroot "$root" bash -c "cd /root && $1"
}

make_system() {
    local base=$folder/base.tar
    leave
    rm -rf "$root"
    mkdir -p "$root"
    if [[ ! -e $base ]]; then
        echo "Fetching a Debian"
        debootstrap --variant=minbase bookworm "$root" >"$folder/debootstrap.log"
        tar -C "$root" -cf "$base.tmp" .
        mv "$base.tmp" "$base"
    else
        tar -C "$root" -xf "$base"
    fi
    rm -rf "$root/etc/apt"
    cp -R /etc/apt "$root/etc/apt"
    cp -L /etc/resolv.conf "$root/etc/"
    # Sources may name keys and certificates that the base has not.
    mkdir -p "$root/usr/share/keyrings" "$root/etc/ssl/certs"
    cp -RL /usr/share/keyrings/. "$root/usr/share/keyrings/"
    cp -L /etc/ssl/certs/ca-certificates.crt "$root/etc/ssl/certs/"
    mount -t proc proc "$root/proc"
    inside "apt-get update" >"$folder/update.log"
}

make_system
cp -R "$packages" "$root/root/packages"
rm -rf "$root/root/packages/"{root,_CPack_Packages}
mkdir "$root/root/consumer"
cp "$here/../package/consumer/consumer.c" "$here/packages.sh" "$root/root/consumer"
inside "bash consumer/packages.sh packages"

mkdir "$root/root/libovrinresize"
git -C "$here/../.." ls-files -z | (cd "$here/../.." && xargs -0 tar -cf -) | tar -xf - -C "$root/root/libovrinresize"
awk -f "$here/guide.awk" "$here/../../docs/first-programs.md" >"$root/root/guide.sh"
inside "bash -e guide.sh"
echo "The guide's programs print what it says"
