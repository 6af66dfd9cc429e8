#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# check.sh BUILD_DIR [EXECUTIONS]: runs the pool and the bands under the memory model of C11, then
# shows that faults put in on purpose are found; and looks whether the documents give a reason for
# the order of every atomic operation.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
project=$here/../../..
build=$1
executions=${2:-50000}
mkdir -p "$build"

# compile NAME [OPTION...]: Relacy's headers are not ours to warn about, and have no sized delete.
compile() {
    g++ -O2 -std=c++17 -w -fno-sized-deallocation -I "$project/include" -I "$project/src" "${@:2}" \
        "$here/pool_test.cpp" -o "$build/$1"
}

compile pool
"$build/pool" "$executions" | tee "$build/pool.log"

for fault in BROKEN_EXCHANGE BROKEN_JOIN; do
    compile "$fault" "-D$fault"
    if "$build/$fault" "$executions" >"$build/$fault.log"; then
        echo "FAIL: $fault was not found"
        exit 1
    fi
    echo "$fault: found, $(sed -n 2p "$build/$fault.log")"
done

"$here/atomics.py"
