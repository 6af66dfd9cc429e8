# SPDX-License-Identifier: Apache-2.0
# shellcheck shell=bash
# Sourced by scripts that compile Kotlin: the compiler, in the version that package-lock.json names.

# fetch_compiler BUILD
fetch_compiler() {
    local here folder=$1/compiler
    here=$(dirname "${BASH_SOURCE[0]}")
    if cmp -s "$here/package-lock.json" "$folder/fetched.json"; then return; fi
    rm -rf "$folder"
    mkdir -p "$folder"
    cp "$here/package.json" "$here/package-lock.json" "$folder"
    npm ci --prefix "$folder" --ignore-scripts --no-audit --no-fund --fetch-retries 5
    cp "$here/package-lock.json" "$folder/fetched.json"
}

compiler_package() {
    echo "$1/compiler/node_modules/kotlin-compiler"
}

# kotlinc BUILD ARGUMENT...
kotlinc() {
    bash "$(compiler_package "$1")/bin/kotlinc" "${@:2}"
}

# The library that compiled Kotlin needs.
kotlin_stdlib() {
    echo "$(compiler_package "$1")/lib/kotlin-stdlib.jar"
}
