#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# examples.sh DOCUMENT FOLDER LIBRARY FLAGS...: compiles each program of the document, a block of cpp,
# runs it, and compares what it prints with the block of text that follows.
set -euo pipefail
document=$1
folder=$2
library=$3
shift 3

rm -rf "$folder"
mkdir -p "$folder"
awk -v folder="$folder" '
    /^```cpp$/ { ++programs; file = folder "/" programs ".cpp"; next }
    /^```text$/ { ++outputs; file = folder "/" outputs ".expected"; next }
    /^```$/ { file = ""; next }
    file { print >file }
    END { if (!programs || programs != outputs) exit 1; print programs >(folder "/count") }
' "$document"

programs=$(<"$folder/count")
for ((i = 1; i <= programs; ++i)); do
    "$CXX" -std=c++17 -Wall -Wextra -Wconversion -Wshadow -Wpedantic -Werror "$@" \
        "$folder/$i.cpp" -o "$folder/$i" "$library" -Wl,-rpath,"$(dirname "$library")"
    # shellcheck disable=SC2086 # the emulator's own arguments
    $EMULATOR "$folder/$i" >"$folder/$i.printed"
    diff -u "$folder/$i.expected" "$folder/$i.printed"
done
echo "$programs programs compiled and run"
