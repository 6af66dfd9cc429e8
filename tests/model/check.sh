#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# check.sh BUILD_DIR: goes through every state of the models in this folder, the pool with 2 to 4
# workers and 2 to 6 tasks, bands with up to 3 workers and 3 bands or 4 and 2, in up to 2 passes. Shows
# with variants broken on purpose that each property can be violated.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
build=$1

# explore MODEL [DEFINITION...]: prints what the search found.
explore() {
    local folder
    folder=$build/$(basename "$1" .pml)$(printf '%s' "${@:2}" | tr -c 'A-Za-z0-9_' _)
    mkdir -p "$folder"
    (
        cd "$folder"
        spin "${@:2}" -a "$here/$1" >&2
        # What spin generates is not ours to warn about.
        gcc "$optimise" -w -DSAFETY -DNOCLAIM -DCOLLAPSE -o pan pan.c
        ./pan -m1000000 -n
    )
}

failures=0
fail() {
    echo "FAIL: $*"
    failures=$((failures + 1))
}

# holds MODEL [DEFINITION...]: the search was complete and found nothing.
holds() {
    local report optimise=-O2
    report=$(explore "$@")
    if grep -q 'errors: 0$' <<<"$report" && ! grep -Eq 'not completed|too small' <<<"$report"; then
        echo "$*: $(awk '/states, stored/ { print $1 }' <<<"$report") states, no error"
    else
        echo "$report"
        fail "$* does not hold"
    fi
}

# caught PATTERN MODEL [DEFINITION...]: the search complains of what the pattern says.
caught() {
    local report optimise=-O0 # the search is short
    report=$(explore "${@:2}")
    if grep -Eq "^pan:1: $1" <<<"$report"; then
        echo "${*:2}: caught, $(sed -n 's/^pan:1: //p' <<<"$report")"
    else
        echo "$report"
        fail "${*:2} is not caught"
    fi
}

deadlock='invalid end state'
ran_once='assertion violated .*runs\['
unfinished='assertion violated .*finished\['

holds pool.pml
caught "$deadlock" pool.pml -DBREAK_WAKE_UP # a sleeping worker is not told of a task
caught "$deadlock" pool.pml -DBREAK_STOP    # ... nor of the end
caught "$deadlock" pool.pml -DBREAK_SLOT    # a submitter is told of a slot too early
caught "$ran_once" pool.pml -DBREAK_DRAIN   # the end leaves tasks queued

holds bands.pml
holds bands.pml -DMAX_WORKERS=4 -DMAX_BANDS=2
caught "$ran_once" bands.pml -DBREAK_CLAIM   # looks and claims in two steps
caught "$ran_once" bands.pml -DBREAK_PASS    # a thread that lags sets the count back
caught "$unfinished" bands.pml -DBREAK_LEAVE # every thread leaves a pass to the others
caught "$unfinished" bands.pml -DBREAK_STOP  # the caller does not wait for the workers

((failures == 0))
