#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# compile.sh BUILD: fetches the Kotlin compiler into BUILD/compiler, if it is not there, and compiles
# the binding's classes into BUILD/classes. Android's own classes are stubs, in BUILD/stubs.
set -euo pipefail
here=$(dirname "${BASH_SOURCE[0]}")
build=$1
source "$here/compiler/compiler.sh"

fetch_compiler "$build"
rm -rf "$build/classes" "$build/stubs"
find "$here/stubs" -name '*.java' -print0 |
    xargs -0 javac -Xlint:all -Xlint:-options -Werror --release 8 -d "$build/stubs"
# Android's older libraries are those of Java 8.
kotlinc "$build" -Werror -jvm-target 1.8 -Xjdk-release=1.8 -classpath "$build/stubs" \
    -d "$build/classes" "$here"/{main,android}/ovrin/resize/*.kt
