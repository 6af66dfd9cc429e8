#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Whatever ends the ovrinresize command, and whenever: nothing is left beside OUT, and OUT is whole, or
# what it was before.
# Usage: interruption_test.sh PATH_OF_OVRINRESIZE PATH_OF_no_nameless_files.so
source "$(dirname "${BASH_SOURCE[0]}")/support.sh"
no_nameless_files=$(preloadable "$2")
# A child that a signal ends before it has become the tool would act on the trap too.
trap - EXIT

rounds=$((100 / ${OVRIN_TEST_DIVISOR:-1}))
RANDOM=${OVRIN_TEST_SEED:-1}
{
    printf 'P6\n900 700\n255\n'
    head -c $((900 * 700 * 3)) /dev/urandom
} >in.ppm
arguments=(in.ppm folder/out.ppm -s 1000x800 -e lanczos)
mkdir folder
started=$(date +%s%N)
works "${arguments[@]}"
# Within that time of its start a run is interrupted. It follows the machine's load, so that some runs
# end before and some after.
span_ns=$((($(date +%s%N) - started) * 5 / 4))
mv folder/out.ppm whole.ppm
ended=0
finished=0

# One run with the tool's environment in $@, ended by $signal at a random time, or twice.
interrupted_run() {
    local pause_ns pause status
    rm -f folder/out.ppm
    if ((RANDOM % 2)); then echo older >folder/out.ppm; fi
    # Background jobs of a script ignore some signals unless told otherwise.
    env --default-signal=INT,QUIT "$@" "$tool" "${arguments[@]}" &
    pause_ns=$(((RANDOM << 30 | RANDOM << 15 | RANDOM) % span_ns))
    printf -v pause '%d.%09d' $((pause_ns / 1000000000)) $((pause_ns % 1000000000))
    sleep "$pause"
    kill "-$signal" $! 2>/dev/null
    if ((RANDOM % 2)); then kill "-$signal" $! 2>/dev/null; fi
    wait $! 2>/dev/null
    status=$?
    if ((status > 128)); then
        ended=$((ended + 1))
        span_ns=$((span_ns + span_ns / 32))
    else
        finished=$((finished + 1))
        span_ns=$((span_ns - span_ns / 8))
    fi
}

beside_out() {
    find folder -mindepth 1 ! -name out.ppm
}

# The process that replaces OUT outlives the tool's, for some microseconds: what it has under way is
# waited for, and OUT is looked at once, in a copy.
check_folder() {
    for _ in $(seq 2000); do
        [ -n "$(beside_out)" ] || break
        sleep 0.01
    done
    [ -z "$(beside_out)" ] || complain "$1: left after SIG$signal: $(ls -A folder)"
    cp folder/out.ppm seen.ppm 2>/dev/null || return 0
    cmp -s whole.ppm seen.ppm || [ "$(head -c 6 seen.ppm)" = older ] ||
        complain "$1: a part of OUT after SIG$signal"
}

for signal in TERM INT HUP QUIT KILL; do
    for ((round = 0; round < rounds; ++round)); do
        interrupted_run
        check_folder nameless
    done
done
echo "files without a name: $ended runs ended, $finished finished"
((ended > 0 && finished > 0)) || complain "$ended runs ended, $finished finished: nothing was tried"

# Where the file system has no files without a name, SIGKILL leaves one; other signals do not, though a
# temporary file is seen to be there.
mkfifo never_ending
rm folder/out.ppm
for signal in TERM INT HUP QUIT; do
    env --default-signal=INT,QUIT "LD_PRELOAD=$no_nameless_files" \
        "$tool" never_ending folder/out.ppm -s 16x8 --format rgba --input-size 99x99 &
    exec 9>never_ending
    for _ in $(seq 400); do
        [ -n "$(ls -A folder)" ] && break
        sleep 0.05
    done
    [ -n "$(ls -A folder)" ] || complain "no temporary file to interrupt"
    kill -"$signal" $!
    wait $! 2>/dev/null && complain "success after SIG$signal"
    exec 9>&-
    check_folder fallback

    for ((round = 0; round < rounds; ++round)); do
        interrupted_run "LD_PRELOAD=$no_nameless_files"
        check_folder fallback
    done
    rm -f folder/out.ppm
done

rm -rf "$folder"
finish
