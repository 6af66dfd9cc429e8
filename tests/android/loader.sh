#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# loader.sh PROGRAM: builds the loader with the golden cases, as a program for Linux that needs no
# other file. shims.cpp comes first; it says why.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
tests=$here/..

aarch64-linux-gnu-g++ -std=c++17 -O2 -static -Wall -Wextra -Wconversion -Wshadow -Werror \
    -I "$tests/../include" -I "$tests" "$here/loader/shims.cpp" "$here/loader/image.cpp" \
    "$here/loader/main.cpp" "$tests"/golden/*cases.cpp "$tests/golden/content.cpp" \
    "$tests/golden/file.cpp" -o "$1"
