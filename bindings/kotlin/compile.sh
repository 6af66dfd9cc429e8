#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# compile.sh BUILD: fetches the Kotlin compiler into BUILD/compiler, if it is not there, and compiles
# the binding's classes into BUILD/classes.
set -euo pipefail
here=$(dirname "${BASH_SOURCE[0]}")
build=$1
source "$here/compiler/compiler.sh"

fetch_compiler "$build"
rm -rf "$build/classes"
# Android's older libraries are those of Java 8.
kotlinc "$build" -Werror -jvm-target 1.8 -Xjdk-release=1.8 -d "$build/classes" \
    "$here"/main/ovrin/resize/*.kt
