#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# run.sh BUILD (quick | SECONDS | xN | -runs=N) [FUZZER...]: runs the fuzzers of the preset BUILD one
# after another and prints what they did.
#
#   quick      a fixed number of runs from the repository's corpus, with a fixed seed
#   xN         N times as many, with any seed, from that corpus and what earlier runs have added to it
#   SECONDS    so long for each fuzzer
#   -runs=N    so many for each fuzzer
#
# What they find is kept: new corpus in build/fuzzing/corpus, crashes in build/fuzzing/crashes.
set -euo pipefail
cd "$(dirname "${BASH_SOURCE[0]}")/.."

fuzzers=(packed canvas planar semi_planar nearest bilinear bilinear_bands lanczos lanczos_bands
    walkers tasks drivers pool cpp)
readers=(png jpeg pnm y4m exif icc geometry template)
# Runs of a quick check: about as long for each but those with threads, or a tenth of that under
# sanitizers.
declare -A quick=([packed]=100000 [canvas]=100000 [planar]=80000 [semi_planar]=100000
    [nearest]=150000 [bilinear]=40000 [bilinear_bands]=50000 [lanczos]=1000 [lanczos_bands]=150000
    [walkers]=40000 [tasks]=100000 [drivers]=500 [pool]=40000 [cpp]=40000 [png]=60000 [jpeg]=60000
    [pnm]=100000 [y4m]=100000 [exif]=100000 [icc]=2000 [geometry]=200000 [template]=200000)
# Bytes of their longest inputs, where the usual ones are too short for a file.
declare -A longest=([png]=512 [jpeg]=1024 [pnm]=128 [y4m]=256 [exif]=512 [icc]=512)

work=build/fuzzing
build=$1
amount=$2
shift 2
# The memory sanitizer knows nothing of what the system's libraries write.
[[ $build == *msan ]] || fuzzers+=("${readers[@]}")
(($# == 0)) || fuzzers=("$@")

export ASAN_OPTIONS=halt_on_error=1:detect_leaks=1:detect_stack_use_after_return=1
export UBSAN_OPTIONS=halt_on_error=1:print_stacktrace=1

# What libFuzzer is told about how long to run.
limits() {
    local runs=${quick[$1]}
    [[ $build != *san ]] || runs=$((runs / 10))
    case $amount in
        quick) echo "-runs=$runs -seed=1" ;;
        x*) echo "-runs=$((runs * ${amount#x}))" ;;
        -runs=*) echo "$amount" ;;
        *) echo "-max_total_time=$amount" ;;
    esac
}

# The last number on the line of a statistic.
statistic() {
    sed -n "s/^stat::$1: *//p" "$2"
}

# A quick check starts from the repository's corpus alone, so that it repeats.
corpus_of() {
    local grown=$work/corpus/$1
    if [[ $amount == quick ]]; then
        grown=$work/quick/$1
        rm -rf "$grown"
    fi
    mkdir -p "$grown"
    echo "$grown fuzz/corpus/$1"
}

total=0
mkdir -p "$work/crashes" "$work/logs"
printf '%-16s %12s %10s %8s\n' "$build" executions per-second corpus
for name in "${fuzzers[@]}"; do
    log=$work/logs/$build-$name.log
    corpora=$(corpus_of "$name")
    # The memory sanitizer does not know that permutations of 32-bit words move what is not
    # initialised along with the rest; bilinear rows end in such.
    unset OVRIN_FUZZ_SETS
    case $build-$name in *msan-bilinear* | *msan-cpp | *msan-drivers) export OVRIN_FUZZ_SETS=1 ;; esac
    # shellcheck disable=SC2046,SC2086 # lists
    if ! "build/$build/fuzz/fuzz_$name" -max_len="${longest[$name]:-96}" -len_control=0 -timeout=60 -print_final_stats=1 -verbosity=1 \
        -artifact_prefix="$work/crashes/$name-" $(limits "$name") $corpora >"$log" 2>&1; then
        tail -n 40 "$log"
        echo "$name failed; what it was given lies in $work/crashes, its log is $log"
        exit 1
    fi
    runs=$(statistic number_of_executed_units "$log")
    total=$((total + runs))
    printf '%-16s %12d %10d %8d\n' "$name" "$runs" "$(statistic average_exec_per_sec "$log")" \
        "$(find "${corpora%% *}" -type f | wc -l)"
done
printf '%-16s %12d\n' total "$total"
