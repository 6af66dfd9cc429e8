#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# boot.sh DIRECTORY: boots a kernel with 16 KB pages on an emulated machine and runs there what
# verify.sh has left in DIRECTORY: the library for Android, in its loader, and its twin with 4 KB
# alignment.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
directory=$(realpath -m "$1")
root=$directory/root
seconds=600

bash "$here/kernel.sh" "$directory/kernel"

rm -rf "$root"
mkdir -p "$root/small-pages"
cp "$directory/lib/libovrinresize.so" "$root/"
cp "$directory/twins/small-pages/libovrinresize.so" "$root/small-pages/"
cp "$directory/android_loader" "$here/../../golden/golden.txt" "$root/"
aarch64-linux-gnu-g++ -std=c++17 -O2 -static -Wall -Wextra -Werror "$here/init.cpp" -o "$root/init"
(cd "$root" && find . | cpio --quiet -o -H newc | gzip -1) >"$directory/root.gz"

log=$directory/boot.log
timeout "$seconds" qemu-system-aarch64 -M virt -cpu max -smp 2 -m 1024 -nographic -no-reboot \
    -nic none -kernel "$directory/kernel/vmlinuz" -initrd "$directory/root.gz" \
    -append "console=ttyAMA0 quiet panic=-1 rdinit=/init" </dev/null | tr -d '\r' | tee "$log"

for line in "page size 16384" "ends with 0: /libovrinresize.so" \
    "ends with 3: /small-pages/libovrinresize.so"; do
    if ! grep -qxF "$line" "$log"; then
        echo "FAIL: it did not say '$line'"
        exit 1
    fi
done
echo "On a kernel with 16 KB pages the library runs, and its twin with 4 KB alignment is refused"
