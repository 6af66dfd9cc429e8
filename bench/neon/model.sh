#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Models the inner loops of the NEON kernels: no Arm processor is needed, and none is measured.
# Every kernel file is compiled for aarch64 with both compilers; llvm-mca tells how many cycles a
# loop takes when all data lie in the first-level cache. Prints one table.
#
# A loop is a block that ends in a branch to its own beginning and stores whole vectors. "stack"
# counts its accesses to the stack, which spilled registers would cause. Where a loop calls a
# function, a compiler did not inline what it should have, and nothing can be modelled.
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/../.."

# The Neoverse N1 is the Cortex-A76 of servers; for the A76 itself there is only its ancestor's model.
processors="cortex-a55 cortex-a510 neoverse-n1 neoverse-v2"
flags="-std=c++17 -O3 -fPIC -fno-exceptions -fno-rtti -ffp-contract=off -Iinclude -Isrc"

work=$(mktemp -d)
trap 'rm -r "$work"' EXIT

# split_loops DIRECTORY: cuts the loops out of the assembly on standard input, one file each. A
# file is named number.vector_bytes.stack_accesses; its first line holds the function as a comment.
split_loops() {
    awk -v directory="$1" '
        function vector_bytes(line) {
            if (line ~ /^\tstr\tq/) return 16
            if (line ~ /^\tstp\tq/) return 32
            if (line ~ /^\tst[1-4]\t.*16b/) return 16 * substr(line, 4, 1)
            return 0
        }
        /^[_A-Za-z][_A-Za-z0-9]*:/ { name = substr($1, 1, index($1, ":") - 1) }
        /^\.L[_A-Za-z0-9]*:/ { label = substr($1, 1, index($1, ":") - 1); block = ""; bytes = stack = 0; next }
        /^\t[a-z]/ {
            block = block $0 "\n"
            bytes += vector_bytes($0)
            if ($0 ~ /\[sp/) ++stack
            if ($NF == label && bytes > 0) {
                file = sprintf("%s/%03d.%d.%d", directory, ++count, bytes, stack)
                printf "// %s\n%s", name, block > file
                close(file)
            }
        }'
}

# model FILE PROCESSOR: cycles of one round of the loop.
model() {
    local rounds=1000
    llvm-mca-19 -mtriple=aarch64 -mcpu="$2" -iterations=$rounds "$1" |
        awk -v rounds=$rounds '/^Total Cycles:/ { printf "%.2f", $3 / rounds }'
}

print_loops() { # COMPILER
    local loop bytes stack name processor
    for loop in "$work/loops"/*; do
        [[ -e $loop ]] || return 0
        IFS=. read -r _ bytes stack <<<"${loop##*/}"
        name=$(head -n 1 "$loop" | cut -c4- | c++filt |
            sed 's/(anonymous namespace):://g; s/ovrin:://g; s/^void //; s/(.*//')
        printf '| %-28s | %-5s | %5d | %12d | %5d |' "$name" "$1" "$bytes" \
            "$(grep -c '^	' "$loop")" "$stack"
        bench/neon/even_out.py <"$loop" >"$work/evened"
        for processor in $processors; do
            if grep -q '^	bl	' "$loop"; then
                printf ' %11s |' calls
                continue
            fi
            printf ' %11.3f |' "$(awk -v c="$(model "$work/evened" "$processor")" -v b="$bytes" 'BEGIN { print c / b }')"
        done
        echo
    done
}

compile() { # COMPILER SOURCE
    # shellcheck disable=SC2086 # a list
    case $1 in
        clang) clang++ --target=aarch64-linux-gnu $flags -S -o - "$2" ;;
        g++) aarch64-linux-gnu-g++ $flags -S -o - "$2" ;;
    esac
}

echo "Cycles for one byte of output, modelled by $(llvm-mca-19 --version | sed -n 's/.*version /LLVM /p'):"
echo
printf '| %-28s | %-5s | %5s | %12s | %5s |' kernel by bytes instructions stack
for processor in $processors; do printf ' %11s |' "$processor"; done
printf '\n|------------------------------|-------|------:|-------------:|------:|'
for processor in $processors; do printf -- '------------:|'; done
echo
for source in src/kernels/*_neon.cpp; do
    for compiler in clang g++; do
        rm -rf "$work/loops"
        mkdir "$work/loops"
        compile "$compiler" "$source" | split_loops "$work/loops"
        print_loops "$compiler"
    done
done
