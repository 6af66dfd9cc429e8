#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# objects.sh OBJECT...: what the library's object files must not hold.
set -euo pipefail
source "$(dirname "${BASH_SOURCE[0]}")/skip.sh"

failures=0
kernels=0
for object in "$@"; do
    # Of a weak function the linker keeps one copy: it could be the one compiled for a processor
    # that is not the user's.
    if [[ $object == */kernels/* ]]; then
        kernels=$((kernels + 1))
        weak=$("$NM" --defined-only "$object" | awk '$2 ~ /[WVu]/ { print $3 }')
        if [[ $weak ]]; then
            echo "FAIL: $object defines weak symbols: $weak"
            failures=$((failures + 1))
        fi
    fi
    if "$READELF" -SW "$object" | grep -E '\.(init_array|ctors|preinit_array)'; then
        echo "FAIL: $object has a static constructor"
        failures=$((failures + 1))
    fi
done
echo "$# objects, $kernels of them kernels"
((failures == 0 && kernels > 0))
