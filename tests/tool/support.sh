# SPDX-License-Identifier: Apache-2.0
# shellcheck shell=bash
# Sourced by the tests of the ovrinresize command; their first argument is its path. They run in a
# folder of their own that is removed at the end.
set -u
tool=$(realpath "$1")
folder=$(mktemp -d)
trap 'rm -rf "$folder"' EXIT
cd "$folder" || exit 1
failures=0

complain() {
    echo "FAILED: $*" >&2
    failures=$((failures + 1))
}

# Runs the tool; it must succeed and say nothing.
works() {
    "$tool" "$@" >stdout 2>stderr || complain "exit code $? of: $*: $(cat stderr)"
    if [ -s stdout ] || [ -s stderr ]; then complain "output of: $*: $(cat stdout stderr)"; fi
}

# fails CODE PATTERN ARGUMENT...: the tool must end with that exit code and one line on standard error
# that matches; nothing on standard output, no new file, temporary ones included.
fails() {
    local code=$1 pattern=$2 before after status
    shift 2
    before=$(find . | sort)
    "$tool" "$@" >"$folder.stdout" 2>"$folder.stderr"
    status=$?
    after=$(find . | sort)
    [ "$status" = "$code" ] || complain "exit code $status, not $code, of: $*"
    [ "$(wc -l <"$folder.stderr")" = 1 ] || complain "not one line from: $*: $(cat "$folder.stderr")"
    grep -q -e "^ovrinresize: .*$pattern" "$folder.stderr" ||
        complain "no '$pattern' from: $*: $(cat "$folder.stderr")"
    [ ! -s "$folder.stdout" ] || complain "standard output of: $*"
    [ "$before" = "$after" ] || complain "files left by: $*"
    rm -f "$folder.stdout" "$folder.stderr"
}

# preloadable FILE: a name of it for LD_PRELOAD, which takes a space for the end of a name.
preloadable() {
    ln -s "$1" "$folder"
    echo "$folder/${1##*/}"
}

hex() {
    od -An -v -tx1 "$1" | tr -d ' \n'
}

# Width and height that a file's own header states.
dimensions() {
    local hexadecimal
    case $1 in
        *.png) hexadecimal=$(hex "$1" | sed -E 's/^.{32}(.{8})(.{8}).*/\1 \2/') ;;
        *.jpg | *.jpeg) hexadecimal=$(hex "$1" | sed -E 's/.*ffc0....08(....)(....).*/\2 \1/') ;;
        *.ppm) sed -n '2{s/ /x/p;q}' "$1" && return ;;
    esac
    echo "$((16#${hexadecimal% *}))x$((16#${hexadecimal#* }))"
}

has_size() {
    [ "$(dimensions "$1")" = "$2" ] || complain "$1 is $(dimensions "$1"), not $2"
}

# A PPM of 48 x 40 pixels.
make_picture() {
    printf 'P6\n48 40\n255\n'
    LC_ALL=C awk 'BEGIN {
        for (i = 0; i < 48 * 40; ++i) printf "%c%c%c", 1 + i % 48 * 5, 1 + int(i / 48) * 6, 1 + i % 251
    }'
}

finish() {
    [ "$failures" = 0 ] || exit 1
    echo "all passed"
}
