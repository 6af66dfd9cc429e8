#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# readme.sh README FLAGS...: its C++ compiles.
set -euo pipefail
readme=$1
shift
awk '/^```cpp$/ { inside = 1; next } /^```$/ { inside = 0 } inside' "$readme" |
    "$CXX" -std=c++17 -Wall -Wextra -Wconversion -Wpedantic -Werror -fsyntax-only "$@" -x c++ -
