#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# determinism.sh BUILD_DIR [COMPILER...]: builds the library with each compiler and each set of flags,
# careless ones among them, and compares all results, of every set of kernels and of the shared
# library, with the golden file. A table of what was equal; fails when something was not.
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/../.."
build=$1
shift
compilers=("$@")
(($#)) || compilers=(g++ clang++ clang++-16 clang++-19)
golden=tests/golden/golden.txt
flags=(-O0 -O1 -O2 -O3 -Os "-O2 -flto" "-O2 -march=native" "-O3 -ffast-math")

# compare DIRECTORY: the sets that are equal, or the first that is not.
compare() {
    local set outcome equal=()
    for set in scalar avx2 avx512 shared; do
        outcome=0
        if [[ $set == shared ]]; then
            "$1/tests/golden/golden_shared" "$golden" >>"$1.log" 2>&1 || outcome=$?
        else
            "$1/tests/golden/golden_sets" "$set" "$golden" >>"$1.log" 2>&1 || outcome=$?
        fi
        case $outcome in
            0) equal+=("$set") ;;
            77) ;;
            *) echo "$set DIFFERS, see $1.log" && return 1 ;;
        esac
    done
    echo "${equal[*]}"
}

mkdir -p "$build"
failures=0
for compiler in "${compilers[@]}"; do
    for options in "${flags[@]}"; do
        directory=$build/$compiler${options//[^-A-Za-z0-9]/_}
        c_compiler=${compiler/clang++/clang}
        c_compiler=${c_compiler/g++/gcc}
        linker=
        [[ $compiler != clang* || $options != *lto* ]] || linker=-fuse-ld=lld-19
        # No flags but these, and those that the project insists on.
        if cmake -G Ninja -S . -B "$directory" -DCMAKE_BUILD_TYPE=None -DOVRINRESIZE_BUILD_TESTS=ON \
            -DCMAKE_C_COMPILER="$c_compiler" -DCMAKE_CXX_COMPILER="$compiler" -DCMAKE_CXX_FLAGS="$options" \
            -DCMAKE_EXE_LINKER_FLAGS="$linker" -DCMAKE_SHARED_LINKER_FLAGS="$linker" >"$directory.log" 2>&1 &&
            cmake --build "$directory" --parallel "$(nproc)" --target golden_sets golden_shared \
                >>"$directory.log" 2>&1; then
            outcome=$(compare "$directory") || failures=$((failures + 1))
        else
            outcome="NOT BUILT, see $directory.log"
            failures=$((failures + 1))
        fi
        printf '%-12s %-18s %s\n' "$compiler" "$options" "$outcome"
        rm -rf "$directory"
    done
done
echo "$failures of $((${#compilers[@]} * ${#flags[@]})) differ or were not built"
((failures == 0))
