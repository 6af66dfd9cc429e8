#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# --threads keeps what it promises: no thread is started where it allows too few.
# Usage: threads_test.sh PATH_OF_OVRINRESIZE IGNORED IGNORED PATH_OF_NO_THREADS
source "$(dirname "${BASH_SOURCE[0]}")/support.sh"
no_threads=$(preloadable "$4")

# alone ARGUMENT...: the tool, which ends when it starts a thread.
alone() {
    LD_PRELOAD=$no_threads "$tool" "$@" --quiet 2>stderr
}

head -c $((40 * 1200 * 4)) /dev/zero >high.rgba
head -c $((40 * 1200 * 3 / 2)) /dev/zero >high.i420
head -c $((40 * 1200 * 3 / 2)) /dev/zero >high.nv21
make_picture >picture.ppm

for format in rgba i420 nv21; do
    for engine in quarter thumbnail lanczos bilinear; do
        for size in "-s 20x600!" "-s 20x600! -c 40x700"; do
            # shellcheck disable=SC2086 # words
            alone "high.$format" "out.$format" --format $format --input-size 40x1200 $size -e $engine --threads 4 ||
                complain "exit code $? of $format, $engine, $size with four threads"
        done
    done
done
cp picture.ppm other.ppm
alone picture.ppm other.ppm -s 10 -o "%s.png" --threads 1 || complain "exit code $? of two pictures with one thread"

# Threads that the system does not have cost time, nothing else.
cp picture.ppm third.ppm
for engine in quarter thumbnail lanczos bilinear; do
    "$tool" high.rgba with.rgba --format rgba --input-size 40x1200 -s 15x400! -e $engine ||
        complain "exit code $? of $engine"
    THREADS=refused alone high.rgba without.rgba --format rgba --input-size 40x1200 -s 15x400! -e $engine ||
        complain "exit code $? of $engine without threads: $(cat stderr)"
    cmp -s with.rgba without.rgba || complain "$engine gives other bytes without threads"
done
mkdir many
THREADS=refused alone picture.ppm other.ppm third.ppm -s 10 -o "many/%s.png" --jobs 3 ||
    complain "exit code $? of three pictures without threads: $(cat stderr)"
[ "$(find many -name '*.png' | wc -l)" = 3 ] || complain "without threads only: $(ls many)"

# That can fail.
alone high.rgba out.rgba --format rgba --input-size 40x1200 -s 20x600 -e quarter --threads 5 &&
    complain "no thread was started where five are allowed"
alone picture.ppm other.ppm -s 10 -o "%s.png" --threads 2 && complain "one thread for two jobs"

finish
