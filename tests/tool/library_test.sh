#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# The self-test of another library: of one that is right, of one that is not, of what is none.
# Usage: library_test.sh PATH_OF_OVRINRESIZE LIBRARY LIBRARY_WITH_A_WRONG_FUNCTION OTHER_LIBRARY
library=$(realpath "$2")
wrong=$(realpath "$3")
other=$(realpath "$4")
source "$(dirname "${BASH_SOURCE[0]}")/support.sh"

# A name without a folder is that of a file in this one.
ln -s "$library" here.so
for name in "$library" here.so; do
    "$tool" selftest --library "$name" >stdout 2>stderr || complain "exit code $? of $name: $(cat stderr)"
    grep -Eqx "$name: all [0-9]+ results are right" stdout || complain "$name: $(cat stdout)"
done

"$tool" selftest --library "$wrong" >stdout 2>stderr
[ $? = 1 ] || complain "exit code of a library with a wrong function"
count=$(grep -c '^  ' stdout)
[ "$count" -ge 1 ] || complain "no result is named: $(cat stdout)"
[ "$(grep -c '^  .*rgb888' stdout)" = "$count" ] || complain "others than rgb888 are named: $(cat stdout)"
grep -Eq "^$wrong: $count of [0-9]+ results are wrong:$" stdout || complain "head: $(head -n 1 stdout)"

"$tool" selftest --library "$wrong" --json >stdout && complain "success in JSON with a wrong function"
grep -q '"wrong":\["[^"]*rgb888' stdout || complain "JSON: $(cat stdout)"

fails 1 'has no ovrin_' selftest --library "$other"
fails 1 'absent.so: ' selftest --library absent.so

finish
