#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# The ovrinresize command on tables of cases, cases/*.txt. A case is a line:
#
#   ARGUMENTS | STATUS | SIZE | MESSAGE | CHECK => EXPECTED ;; CHECK => EXPECTED ...
#
# ARGUMENTS are the shell's words. SIZE is that of OUT, the second argument, as another program sees
# it; empty: not looked at. MESSAGE is a pattern that standard error must match; empty: nothing is said.
# A CHECK is a command that must print what is EXPECTED: what another program says of the result.
# Where the first of the ARGUMENTS is info, compare or selftest, what it prints lies in the file stdout.
# Usage: cases_test.sh PATH_OF_OVRINRESIZE NAME_OF_TABLE
source "$(dirname "${BASH_SOURCE[0]}")/support.sh"
table=$2
tables=$OLDPWD/$(dirname "${BASH_SOURCE[0]}")/cases
case ${BASH_SOURCE[0]} in /*) tables=$(dirname "${BASH_SOURCE[0]}")/cases ;; esac

for program in convert identify compare exiftool pngcheck djpeg ffmpeg ffprobe python3; do
    if ! command -v "$program" >/dev/null; then
        echo "skipped: no $program"
        exit 77
    fi
done

# shellcheck source=SCRIPTDIR/fixtures.sh

source "$(dirname "$tables")/fixtures.sh"
make_fixtures
[ "$table" != inputs ] || make_inputs

trim() {
    local text=${1#"${1%%[![:space:]]*}"}
    echo "${text%"${text##*[![:space:]]}"}"
}

# succeeds MESSAGE ARGUMENT...
succeeds() {
    local message=$1
    shift
    "$tool" "$@" >stdout 2>stderr || complain "exit code $? of: $*: $(cat stderr)"
    [ ! -s stdout ] || complain "standard output of: $*"
    if [ -z "$message" ]; then
        [ ! -s stderr ] || complain "message of: $*: $(cat stderr)"
    else
        grep -q -e "$message" stderr || complain "no '$message' from: $*: $(cat stderr)"
    fi
}

# answers STATUS MESSAGE COMMAND ARGUMENT...: it may print something.
answers() {
    local wanted=$1 message=$2 status
    shift 2
    "$tool" "$@" >stdout 2>stderr
    status=$?
    [ "$status" = "$wanted" ] || complain "exit code $status, not $wanted, of: $*: $(cat stderr)"
    if [ -z "$message" ]; then
        [ ! -s stderr ] || complain "message of: $*: $(cat stderr)"
    else
        grep -q -e "^ovrinresize: .*$message" stderr || complain "no '$message' from: $*: $(cat stderr)"
    fi
}

run_checks() {
    local rest="$1 ;;" check expected actual
    while [ "$(trim "$rest")" ]; do
        check=${rest%%;;*}
        rest=${rest#*;;}
        [ "$(trim "$check")" ] || continue
        expected=$(trim "${check##*=>}")
        actual=$(eval "${check%=>*}" 2>&1)
        [ "$actual" = "$expected" ] ||
            complain "line $number: $(trim "${check%=>*}"): '$actual', not '$expected'"
    done
}

run_case() {
    local arguments status size message checks
    IFS='|' read -r arguments status size message checks <<<"$1"
    eval "set -- $arguments"
    status=$(trim "$status")
    size=$(trim "$size")
    message=$(trim "$message")
    if [[ ${1-} == @(info|compare|selftest) ]]; then
        answers "$status" "$message" "$@"
    elif [ "$status" = 0 ]; then
        succeeds "$message" "$@"
    else
        fails "$status" "$message" "$@"
    fi
    [ -z "$size" ] || [ "$(identify -format '%wx%h' "$2[0]")" = "$size" ] ||
        complain "line $number: $2 is $(identify -format '%wx%h' "$2[0]"), not $size"
    run_checks "$checks"
}

number=0
cases=0
while IFS= read -r line; do
    number=$((number + 1))
    case $line in '' | '#'*) continue ;; esac
    run_case "$line"
    cases=$((cases + 1))
done <"$tables/$table.txt"
echo "$cases cases"
finish
