#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# verify.sh DIRECTORY: all that can be said about the library for Android without Android. Links
# it as the NDK would, holds the file against what Android's loader and packaging ask for, and
# runs that very file on emulated processors, with pages of either size. See docs/android.md.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
source_dir=$here/../..
directory=$(realpath -m "$1")
library=$directory/lib/libovrinresize.so
jni_library=$directory/lib/libovrinresize_jni.so
small_pages=$directory/twins/small-pages/libovrinresize.so
golden_file=$source_dir/tests/golden/golden.txt

heading() {
    echo
    echo "---- $*"
}

fail() {
    echo "FAIL: $*"
    exit 1
}

# emulated PROCESSOR PAGE_SIZE LIBRARY [GOLDEN_FILE]: runs the golden cases on it. The loader's
# status says how it went.
emulated() {
    qemu-aarch64 -cpu "$1" -p "$2" "$directory/android_loader" "$3" "${4:-$golden_file}"
}

# ends_with STATUS PROCESSOR PAGE_SIZE LIBRARY [GOLDEN_FILE]
ends_with() {
    local status=0
    heading "on $2, pages of $3, should end with $1: $4"
    emulated "${@:2}" || status=$?
    ((status == $1)) || fail "ended with $status"
}

heading "the android-arm64 preset, with a stand-in for the NDK"
bash "$here/library.sh" "$directory"

heading "what Android asks of the file"
clang -E "$source_dir/include/ovrinresize.h" | awk -f "$here/../package/declared.awk" \
    >"$directory/declared.txt"
"$here/check_elf.py" "$library" "$here/imports.txt" "$directory/declared.txt"

heading "what Android asks of the binding's library"
sed 's/^/libovrinresize.so /' "$directory/declared.txt" >"$directory/of-core.txt"
echo JNI_OnLoad >"$directory/declared-jni.txt"
"$here/check_elf.py" "$jni_library" <(cat "$here/imports_jni.txt" "$directory/of-core.txt") \
    "$directory/declared-jni.txt"

heading "files that Android would not take"
rm -rf "$directory/twins"
"$here/check_elf_test.py" "$directory/lib" "$here/imports.txt" "$directory/declared.txt" \
    "$directory/twins"

heading "a loader for it"
bash "$here/loader.sh" "$directory/android_loader" "$directory/android_jni_loader"

same=0 different=1 refused=3
ends_with $same cortex-a53 4096 "$library"
ends_with $same max 16384 "$library"
# The loader refuses what must be refused, and that for its alignment: with small pages it is a
# library like any other.
ends_with $same cortex-a53 4096 "$small_pages"
ends_with $refused max 16384 "$small_pages"
ends_with $refused cortex-a53 4096 "$directory/twins/long-relro/libovrinresize.so"
ends_with $refused cortex-a53 4096 "$directory/twins/imports-another/libovrinresize.so"
heading "the binding's library, bound to that"
qemu-aarch64 -cpu cortex-a53 -p 4096 "$directory/android_jni_loader" "$library" "$jni_library"
qemu-aarch64 -cpu max -p 16384 "$directory/android_jni_loader" "$library" "$jni_library"
# A single other hash is noticed.
sed '$s/ .*/ 0123456789abcdef/' "$golden_file" >"$directory/other-golden.txt"
ends_with $different cortex-a53 4096 "$library" "$directory/other-golden.txt"
echo
echo "The library for Android is what it should be"
