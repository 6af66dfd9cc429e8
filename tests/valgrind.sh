#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# valgrind.sh BUILD: the test programs of a build under memcheck, and some under Helgrind. Valgrind's
# processor has AVX2 and no AVX-512.
set -euo pipefail
suppressions=$(dirname "${BASH_SOURCE[0]}")/helgrind.supp
tests=$1/tests
# A program that is slow already takes few of its random rounds.
export OVRIN_TEST_DIVISOR=100

failures=0

# check PROGRAM OPTION...: the options are for valgrind.
check() {
    valgrind --quiet --error-exitcode=99 "${@:2}" "$tests/$1" --gtest_brief=1 >"$tests/valgrind.log" 2>&1 || {
        tail -n 60 "$tests/valgrind.log"
        echo "FAIL: $*"
        failures=$((failures + 1))
    }
}

programs=(bad_arguments band_tasks band_walkers bilinear bilinear_bands bilinear_ex bilinear_kernels
    copy_kernels engine_kernels extremes keep_ratio_rgba lanczos lanczos_kernels nearest placement pool
    pool_faults quarter_kernels refusals rgb888 rgba8888 threaded_formats turns wrappers yuv420
    fault/engines_faults fault/every_entry_point fault/quarter_faults soak/soak)
for program in "${programs[@]}"; do check "$program" --leak-check=full; done
threaded=(pool threaded_formats)
for program in "${threaded[@]}"; do check "$program" --tool=helgrind --suppressions="$suppressions"; done
echo "${#programs[@]} programs under memcheck, ${#threaded[@]} under Helgrind; $failures with findings"
((failures == 0))
