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
    walkers tasks drivers pool cpp extents)
readers=(png jpeg pnm y4m exif icc geometry template)
# Runs of a quick check: about as long for each but those with threads. A tenth of that under
# sanitizers, a hundredth under emulation, as many as there are inputs where both.
declare -A quick=([packed]=100000 [canvas]=100000 [planar]=80000 [semi_planar]=100000
    [nearest]=150000 [bilinear]=40000 [bilinear_bands]=50000 [lanczos]=10000 [lanczos_bands]=150000
    [walkers]=40000 [tasks]=100000 [drivers]=1500 [pool]=40000 [cpp]=40000 [extents]=10000
    [png]=60000 [jpeg]=60000 [pnm]=100000 [y4m]=100000 [exif]=100000 [icc]=2000
    [geometry]=200000 [template]=200000)
# Bytes of their longest inputs, where the usual ones are too short for a file.
declare -A longest=([png]=512 [jpeg]=1024 [pnm]=128 [y4m]=256 [exif]=512 [icc]=512)

work=build/fuzzing
build=$1
amount=$2
shift 2
# The memory sanitizer knows nothing of what the system's libraries write, and those for aarch64 are not
# here. AFL++ is for what is written by people, or called by them with anything.
case $build in
    *msan | *aarch64*) ;;
    *afl) fuzzers=("${readers[@]}" cpp extents) ;;
    *) fuzzers+=("${readers[@]}") ;;
esac
(($# == 0)) || fuzzers=("$@")

emulator=()
slower=1
[[ $build != *san ]] || slower=10
if [[ $build == *aarch64* ]]; then
    emulator=(qemu-aarch64 -L /usr/aarch64-linux-gnu)
    slower=$((slower * 100))
fi
# Leaks are looked for by way of a debugger, of which the emulator has none.
export ASAN_OPTIONS=halt_on_error=1:detect_leaks=$((${#emulator[@]} == 0)):detect_stack_use_after_return=1
export UBSAN_OPTIONS=halt_on_error=1:print_stacktrace=1

# How long to run, as libFuzzer is told.
limits() {
    local runs=$((${quick[$1]} / slower))
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
    echo "$grown"
}

# run_libfuzzer NAME CORPUS LOG: sets `runs` and `rate`.
run_libfuzzer() {
    # shellcheck disable=SC2046 # a list
    "${emulator[@]}" "build/$build/fuzz/fuzz_$1" -max_len="${longest[$1]:-96}" -len_control=0 -timeout=60 \
        -reload=0 -print_final_stats=1 -verbosity=1 -artifact_prefix="$work/crashes/$1-" $(limits "$1") \
        "$2" "fuzz/corpus/$1" >"$3" 2>&1 || return 1
    runs=$(statistic number_of_executed_units "$3")
    rate=$(statistic average_exec_per_sec "$3")
}

# run_afl NAME CORPUS LOG: likewise. AFL++ takes inputs from one folder and keeps its own in another.
run_afl() {
    local folder=$work/afl/$1 limit found
    limit=$(limits "$1" | sed 's/-runs=/-E /; s/-max_total_time=/-V /; s/-seed=/-s /')
    rm -rf "$folder"
    mkdir -p "$folder/in"
    find "$2" "fuzz/corpus/$1" -type f -exec cp -t "$folder/in" {} +
    # It hands over each input and waits: on one processor that takes half as long. Neither the
    # processor's clock nor the kernel's handling of crashes is to be changed for it.
    # shellcheck disable=SC2086 # a list
    env -u ASAN_OPTIONS -u UBSAN_OPTIONS \
        AFL_NO_UI=1 AFL_TRY_AFFINITY=1 AFL_SKIP_CPUFREQ=1 AFL_I_DONT_CARE_ABOUT_MISSING_CRASHES=1 \
        AFL_BENCH_UNTIL_CRASH=1 \
        afl-fuzz -i "$folder/in" -o "$folder" -G "${longest[$1]:-96}" -t 60000 $limit \
        -- "build/$build/fuzz/fuzz_$1" >"$3" 2>&1 || return 1
    found=$(find "$folder"/default/{crashes,hangs} -name 'id*')
    if [[ $found ]]; then
        # shellcheck disable=SC2086 # a list
        cp --backup=numbered $found "$work/crashes"
        echo "$found" >>"$3"
        return 1
    fi
    # Named as libFuzzer names them.
    find "$folder/default/queue" -name 'id*' ! -name '*orig*' -exec sha1sum {} + |
        while read -r hash file; do cp "$file" "$2/$hash"; done
    runs=$(sed -n 's/^execs_done *: //p' "$folder/default/fuzzer_stats")
    rate=$(sed -n 's/^execs_per_sec *: //p' "$folder/default/fuzzer_stats")
    rate=${rate%.*}
}

total=0
mkdir -p "$work/crashes" "$work/logs"
printf '%-17s %12s %10s %8s\n' "$build" executions per-second corpus
for name in "${fuzzers[@]}"; do
    log=$work/logs/$build-$name.log
    corpus=$(corpus_of "$name")
    # The memory sanitizer does not know that permutations of 32-bit words move what is not
    # initialised along with the rest; bilinear rows end in such.
    unset OVRIN_FUZZ_SETS
    case $build-$name in *msan-bilinear* | *msan-extents | *msan-cpp | *msan-drivers) export OVRIN_FUZZ_SETS=1 ;; esac
    engine=run_libfuzzer
    [[ $build != *afl ]] || engine=run_afl
    if ! "$engine" "$name" "$corpus" "$log"; then
        tail -n 40 "$log"
        echo "$name failed; what it was given lies in $work/crashes, its log is $log"
        exit 1
    fi
    total=$((total + runs))
    printf '%-17s %12d %10d %8d\n' "$name" "$runs" "$rate" "$(find "$corpus" -type f | wc -l)"
done
printf '%-17s %12d\n' total "$total"
