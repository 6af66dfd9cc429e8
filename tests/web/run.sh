#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# run.sh BUILD TEST...: tests of the package and of the page, or screenshots.mjs. Copies them to where
# the packages are that package-lock.json names, and fetches those when they are not there.
set -euo pipefail
here=$(dirname "${BASH_SOURCE[0]}")
folder=$1
OVRIN_ROOT=$(cd "$here/../.." && pwd)
export OVRIN_ROOT

if ! cmp -s "$here/package-lock.json" "$folder/fetched.json"; then
    rm -rf "$folder"
    mkdir -p "$folder"
    cp "$here/package.json" "$here/package-lock.json" "$folder"
    npm ci --prefix "$folder" --ignore-scripts --no-audit --no-fund --fetch-retries 5
    cp "$here/package-lock.json" "$folder/fetched.json"
fi
cp "$here"/*.mjs "$here"/*.ts "$folder"
cd "$folder"
exec "${@:2}"
