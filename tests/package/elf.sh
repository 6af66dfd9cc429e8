#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# elf.sh LIBRARY: what the loader has to do with it, and with what rights.
set -euo pipefail
source "$(dirname "${BASH_SOURCE[0]}")/skip.sh"
library=$1

failures=0
fail() {
    echo "FAIL: $*"
    failures=$((failures + 1))
}

dynamic=$("$READELF" -dW "$library")
segments=$("$READELF" -lW "$library" | sed '/Section to Segment/,$d')
undefined=$("$NM" -D --undefined-only "$library" | awk '{ sub(/@.*/, "", $NF); print $NF }')

needed=$(sed -n 's/.*(NEEDED).*\[\(.*\)\].*/\1/p' <<<"$dynamic")
[[ $needed ]] || fail "no needed library found"
for name in $needed; do
    [[ $name == libc.so.* || $name == libm.so.* ]] || fail "needs $name"
done

grep -q 'SONAME.*\[libovrinresize\.so\.[0-9]*\]' <<<"$dynamic" || fail "no SONAME"
! grep -q TEXTREL <<<"$dynamic" || fail "relocations in the text (TEXTREL)"
grep -Eq 'BIND_NOW|FLAGS_1.*NOW' <<<"$dynamic" || fail "not bound at load time (BIND_NOW)"
grep -q GNU_RELRO <<<"$segments" || fail "no RELRO"
grep -Eq 'GNU_STACK.* RW +0x' <<<"$segments" || fail "executable stack, or none stated"
! grep -Eq 'LOAD.* RWE ' <<<"$segments" || fail "a segment is writable and executable"

alignments=$(awk '$1 == "LOAD" { print $NF }' <<<"$segments")
[[ $alignments ]] || fail "no LOAD segment found"
for alignment in $alignments; do
    ((alignment % 0x4000 == 0)) || fail "LOAD alignment $alignment is no multiple of 16 KB"
done

# The C++ run-time library. __cxa_finalize belongs to libc.
[[ $undefined ]] || fail "no undefined symbol found"
runtime=$(grep -E '^(_Z|__cxa_|__gxx_|__dynamic_cast|_Unwind_)' <<<"$undefined" |
    grep -vx __cxa_finalize || true)
[[ ! $runtime ]] || fail "needs of the C++ run-time library: $runtime"

((failures == 0))
