#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# readme.sh SOURCE_DIR COMPILER...: the README's C compiles.
set -euo pipefail
source_dir=$1
shift
code=$(awk '/^```c$/ { inside = 1; next } /^```$/ { inside = 0 } inside' "$source_dir/README.md")
if [[ $code != *ovrin_resize_* ]]; then
    echo "no example found in README.md"
    exit 1
fi
"$@" -std=c99 -I "$source_dir/include" -fsyntax-only -x c - <<<"$code"
