#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# The ovrinresize command as its users see it: files, messages, exit codes.
# Usage: command_test.sh PATH_OF_OVRINRESIZE
source "$(dirname "${BASH_SOURCE[0]}")/support.sh"

make_picture >in.ppm

# ---- Types of files ----

for type in png jpg jpeg ppm PNG; do
    works in.ppm "out.$type" --size 24x20
done
works in.ppm in.png -s 48x40 -e quarter
works in.ppm in.jpg -s 48x40
for type in ppm png jpg; do
    for to in png jpg ppm; do
        works "in.$type" "from_$type.$to" --size 31x17! --engine quarter
        has_size "from_$type.$to" 31x17
    done
done
has_size out.png 24x20
has_size out.jpg 24x20
# Making in.png dropped the two low bits, which the second time changes nothing.
cmp -s from_ppm.ppm from_png.ppm || complain "PNG and PPM give different pixels"
cmp -s out.png out.PNG || complain "the ending .PNG differs from .png"

# The content decides what a file is, not its name.
cp in.png disguised.jpg
works disguised.jpg from_disguise.ppm -s 31x17! -e quarter
cmp -s from_disguise.ppm from_png.ppm || complain "a PNG called .jpg is read differently"

works in.ppm low.jpg -s 48x40 --quality 5
[ "$(stat -c %s low.jpg)" -lt "$(stat -c %s in.jpg)" ] || complain "--quality 5 makes no smaller file"

# ---- Content ----

# Four samples a quarter and three quarters of the way, each divided by 4 and rounded down.
printf 'P6 4 2 255 \xff\x03\x00\xff\x04\x01\x08\x10\x20\x80\x81\x82\xff\x07\x02\xff\x08\x03\x0b\x13\x23\x40\x41\x42' >tiny.ppm
works tiny.ppm tiny_out.ppm -s 2x1 -e quarter
[ "$(hex tiny_out.ppm)" = "$(printf 'P6\n2 1\n255\n' | od -An -tx1 | tr -d ' \n')fc0400343840" ] ||
    complain "2x1 result is $(hex tiny_out.ppm)"

# ---- Wrong sizes and arguments ----

fails 2 'at least 1' in.ppm no.png --size 0x10
fails 2 'at least 1' in.ppm no.png --size 10x0
fails 2 'at least 1' in.ppm no.png --size=-5x10
fails 2 'a side is at most' in.ppm no.png --size 65536x1
fails 2 'a side is at most' in.ppm no.png --size 1x99999999999999999999999999
fails 2 'at least 1' in.ppm no.png --size=-99999999999999999999999999x1
fails 2 'a picture has at most' in.ppm no.png --size 65535x65535
for size in '' x 10x10x10 % 0% -5% 5%% 0@ 10! 50%^ '10 x' '>' '10 x 10' axb 1e3x5 10x10px; do
    fails 2 "--size: '$size'" in.ppm no.png --size "$size"
done
fails 2 '--size or --canvas is required' in.ppm no.png
fails 2 '--canvas.*at least 1' in.ppm no.png --canvas 0x3
fails 2 '--fit' in.ppm no.png --size 3x3 --fit tightly
fails 2 'IN is required'
fails 2 'OUT is required' in.ppm --size 3x3
fails 2 'more than IN and OUT: more.png' in.ppm no.png more.png --size 3x3
fails 2 'not expected' in.ppm no.png --size 3x3 --frobnicate
fails 2 '--engine' in.ppm no.png --size 3x3 --engine sharpest
fails 2 '--quality' in.ppm no.jpg --size 3x3 --quality 0
fails 2 '--quality' in.ppm no.jpg --size 3x3 --quality 101

# ---- Files that cannot be read ----

fails 1 'absent.png: No such file' absent.png no.png --size 3x3
fails 1 'Is a directory' . no.png --size 3x3
: >empty.png
fails 1 'empty.png: neither PNG' empty.png no.png --size 3x3
echo 'This is a text.' >text.png
fails 1 'text.png: neither PNG' text.png no.png --size 3x3
for type in png jpg ppm; do
    bytes=$(stat -c %s "in.$type")
    for part in 5 25 50 75 90; do
        head -c $((bytes * part / 100)) "in.$type" >"cut.$type"
        fails 1 "cut.$type: " "cut.$type" no.png --size 3x3 --strict
    done
done
# A damaged checksum; data that is not what the compressed stream should hold.
cp in.png damaged.png
printf 'XXXXXXXX' | dd of=damaged.png bs=1 seek=60 conv=notrunc status=none
fails 1 'damaged PNG' damaged.png no.png --size 3x3
printf 'P6 70000 1 255\n' >wide.ppm
fails 1 'wide.ppm: too large' wide.ppm no.png --size 3x3
printf 'P6 40000 40000 255\n' >big.ppm
fails 1 'big.ppm: too large' big.ppm no.png --size 3x3
printf 'P6 0 1 255\n' >flat.ppm
fails 1 'flat.ppm: .*at least 1' flat.ppm no.png --size 3x3
printf 'P6 1 1 70000\nabcdef' >deep.ppm
fails 1 'deep.ppm: damaged PNM' deep.ppm no.png --size 3x3
printf 'P6 99999999999999999999 1 255\nabc' >overflow.ppm
fails 1 'overflow.ppm: damaged PNM' overflow.ppm no.png --size 3x3
# A message is one line even when it quotes a name that is not, and keeps control characters to itself.
fails 1 'two lines ?: No such file' "$(printf 'two\nlines\177?')" no.png --size 3x3

# ---- Files that cannot be written ----

fails 1 'must end in one of: .png' in.ppm no.gif --size 3x3
fails 1 'must end in one of: .png' in.ppm no --size 3x3
fails 1 'absent/no.png: cannot be written' in.ppm absent/no.png --size 3x3
fails 1 'cannot be written' in.ppm /proc/no.png --size 3x3
mkdir folder.png
fails 1 'folder.png: Is a directory' in.ppm folder.png --size 3x3
mkdir locked
chmod a-w locked
# The superuser writes anyway.
[ "$(id -u)" = 0 ] || fails 1 'cannot be written' in.ppm locked/no.png --size 3x3
# A full disk, played by a limit on the size of files that what coverage counts fits into.
{
    printf 'P6\n1000 1000\n255\n'
    head -c 3000000 /dev/urandom
} >noise.ppm
for type in png jpg ppm; do
    (
        ulimit -f 1024
        fails 1 "no.$type: .*\(Write Error\|disk space?\|File too large\)" noise.ppm "no.$type" -s 1000x1000! -q 100
        exit "$failures"
    ) || failures=$((failures + 1))
done
fails 1 'at most 65500\|65500 pixels' in.ppm no.jpg --size 65501x1!

# ---- Folders that cannot be read to their end ----

# Each level takes a descriptor.
deep=deep/$(seq -s / 30)
mkdir -p "$deep"
cp in.ppm "$deep"
(
    ulimit -n 20
    fails 1 'deep: Too many open files' deep -r -s 3 -o '%s.png'
    exit "$failures"
) || failures=$((failures + 1))
"$tool" deep -r -s 3 -o '%s.png' --quiet || complain "exit code $? of a deep folder"

# ---- Standard input and output ----

works in.ppm expected.ppm --size 24x20
"$tool" - - -s 24x20 <in.ppm >piped.ppm || complain "exit code $? of: - -"
cmp -s expected.ppm piped.ppm || complain "standard input and output give another picture"
"$tool" in.png - -s 24x20 >piped.png || complain "exit code $? of: in.png -"
has_size piped.png 24x20
# A full device: what is written at once, and what is written at the end.
for type in ppm pam rgb nv21 jpg png; do
    for size in 300x300! 3x3!; do
        "$tool" in.ppm - -s $size -t $type -e nearest >/dev/full 2>stderr &&
            complain "success with a full standard output: $type, $size"
        grep -q '^ovrinresize: -: .*\(No space left\|Write Error\|disk space?\)' stderr ||
            complain "full standard output gives: $(cat stderr)"
    done
done

# ---- Memory ----

# Two pictures fit into memory, but not what they are compared as. Sanitizers need more.
if [ -z "${INSTRUMENTED:-}" ]; then
    truncate -s 144000000 large.rgba
    (
        ulimit -v 350000
        fails 1 'not enough memory' compare large.rgba large.rgba --format rgba --input-size 6000x6000
        exit "$failures"
    ) || failures=$((failures + 1))
    rm large.rgba
fi

# ---- What was done ----

"$tool" in.ppm out.png -s 24x20 --verbose 2>stderr || complain "exit code $? of --verbose"
grep -Eqx 'rgba 48x40 to 24x20: resized by thumbnail in [0-9]+\.[0-9]+ ms' stderr ||
    complain "--verbose says: $(cat stderr)"
"$tool" in.ppm out.png -c 96x40 -v 2>stderr || complain "exit code $? of -v"
grep -Eqx 'rgba 48x40 to 48x40 on 96x40: resized by lanczos in [0-9]+\.[0-9]+ ms' stderr ||
    complain "-v says: $(cat stderr)"

# ---- What stands under the name of the result ----

cp in.ppm keep.png
fails 1 'cut.ppm' cut.ppm keep.png --size 3x3
cmp -s in.ppm keep.png || complain "a failure changed the older file"
chmod 640 keep.png
works in.ppm keep.png --size 3x3!
has_size keep.png 3x3
[ "$(stat -c %a keep.png)" = 640 ] || complain "permissions of the older file were lost"
(umask 027 && "$tool" in.ppm masked.png -s 3x3!)
[ "$(stat -c %a masked.png)" = 640 ] || complain "permissions do not follow the umask"
ln -s keep.png link.png
works in.ppm link.png --size 4x4!
[ -L link.png ] || complain "a link was replaced by a file"
has_size keep.png 4x4
mkfifo pipe.ppm
cat pipe.ppm >through_pipe.ppm &
works in.ppm pipe.ppm --size 24x20
wait
[ -p pipe.ppm ] || complain "a pipe was replaced by a file"
cmp -s expected.ppm through_pipe.ppm || complain "a named pipe gives another picture"
cp in.ppm same.ppm
works same.ppm same.ppm --size 5x5!
has_size same.ppm 5x5
[ -z "$(find . -name '.ovrinresize*')" ] || complain "temporary files: $(find . -name '.ovrinresize*')"

# ---- Help ----

for flag in --help -h; do
    "$tool" "$flag" >help 2>stderr || complain "exit code $? of $flag"
    grep -q '^Usage: ovrinresize IN OUT --size SIZE' help || complain "no usage in $flag"
    [ ! -s stderr ] || complain "$flag writes to standard error"
    awk 'length > 100 { exit 1 }' help || complain "$flag has lines over 100 columns"
done
for option in --size --canvas --fit --gravity --engine --output --output-type --recursive --jobs --frames --format --input-size --quality --background --premultiply --no-rotate --strip --strict --max-pixels --quiet --json --verbose --help --version; do
    grep -q -e " ${option}[ ,]" help || complain "no $option in --help"
done
for flag in --help --version; do
    "$tool" "$flag" >/dev/full 2>stderr && complain "success of $flag with a full standard output"
    grep -q '^ovrinresize: standard output cannot be written' stderr || complain "$flag: $(cat stderr)"
done
"$tool" in.ppm out.png -s 3x3 --json >/dev/full 2>stderr && complain "success of --json, unprinted"
for flag in --version -V; do
    "$tool" "$flag" | grep -Eq '^libovrinresize [0-9.]+, kernels: (scalar|avx2|avx512|neon)$' || complain "$flag"
    "$tool" "$flag" | grep -Eq '^ovrinresize [0-9]+\.[0-9]+\.[0-9]+$' || complain "$flag"
done

finish
