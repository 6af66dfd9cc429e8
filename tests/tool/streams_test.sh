#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# Raw frames and Y4M through the ovrinresize command: files, pipes, damage, interruption.
# Usage: streams_test.sh PATH_OF_OVRINRESIZE
source "$(dirname "${BASH_SOURCE[0]}")/support.sh"

frame_bytes=$((32 * 16 * 3 / 2))

# frame N: an I420 frame of 32 x 16 pixels, different for each N.
frame() {
    LC_ALL=C awk -v n="$1" -v bytes="$frame_bytes" 'BEGIN {
        for (i = 0; i < bytes; ++i) printf "%c", 1 + (i * 7 + n * 31) % 251
    }'
}

# y4m COUNT [TAGS]
y4m() {
    local tags=${2-F30000:1001 Ip A1:1 C420jpeg XNOTE=1} n
    echo "YUV4MPEG2 W32 H16 $tags"
    for ((n = 0; n < $1; ++n)); do
        echo "FRAME"
        frame "$n"
    done
}

frames() {
    local n
    for ((n = 0; n < $1; ++n)); do frame "$n"; done
}

y4m 3 >in.y4m
frames 3 >in.i420
raw=(--format i420 --input-size 32x16)

# ---- Raw frames ----

works in.i420 out.i420 "${raw[@]}" --size 16x8
[ "$(stat -c %s out.i420)" = $((192 * 3)) ] || complain "3 raw frames became another count"
for n in 0 1 2; do
    frame $n >one.i420
    works one.i420 one_out.i420 "${raw[@]}" --size 16x8
    cat one_out.i420 >>one_by_one.i420
done
cmp -s out.i420 one_by_one.i420 || complain "frames in one file differ from frames in files of their own"

"$tool" - - "${raw[@]}" -s 16x8 <in.i420 >piped.i420 || complain "exit code $? of raw frames in a pipe"
cmp -s out.i420 piped.i420 || complain "raw frames in a pipe differ"

# The same samples in another order; there and back gives the same file.
works in.i420 in.nv21 "${raw[@]}" --size 32x16
works in.nv21 back.yuv --format nv21 --input-size 32x16 --size 32x16
works in.i420 again.i420 "${raw[@]}" --size 32x16
cmp -s again.i420 back.yuv || complain "NV21 and I420 do not convert into each other"

works one.i420 one.png "${raw[@]}" --size 16x8
has_size one.png 16x8
works one.png one.nv21 --size 400x300!
[ "$(stat -c %s one.nv21)" = $((400 * 300 * 3 / 2)) ] || complain "size of one.nv21"
works one.png one.rgb --size 5x3!
[ "$(stat -c %s one.rgb)" = 45 ] || complain "size of one.rgb"

head -c 45 /dev/urandom >odd.rgb
works odd.rgb odd.rgba --format rgb --input-size 5x3 -s 3x3!
[ "$(stat -c %s odd.rgba)" = 36 ] || complain "size of odd.rgba"

for cut in 1 $((frame_bytes - 1)); do
    head -c $((frame_bytes + cut)) in.i420 >cut.i420
    fails 1 "cut.i420: frame 2 is cut short: $cut of $frame_bytes bytes" cut.i420 no.i420 "${raw[@]}" -s 9x9
done
: >empty.i420
fails 1 'empty.i420: holds no frame' empty.i420 no.i420 "${raw[@]}" -s 9x9
fails 1 'no.png: an image file holds one picture' in.i420 no.png "${raw[@]}" -s 9x9
fails 1 'the name must end in' in.i420 no.bin "${raw[@]}" -s 9x9
fails 1 'raw frames need --format' in.i420 no.i420 -s 9x9
fails 2 '--format requires --input-size' in.i420 no.i420 -s 9x9 --format i420
fails 2 '--input-size requires --format' in.i420 no.i420 -s 9x9 --input-size 32x16
fails 2 "--format: 'yv12' is none of: nv21 i420 rgba rgb" in.i420 no.i420 -s 9x9 --format yv12
fails 2 '--input-size: .*at least 1' in.i420 no.i420 -s 9x9 --format i420 --input-size 0x16

# Some of the frames.
frames_are() {
    local range=$1 n
    shift
    rm -f chosen.i420
    for n in "$@"; do tail -c +$((n * 192 + 1)) out.i420 | head -c 192 >>chosen.i420; done
    works in.i420 some.i420 "${raw[@]}" --size 16x8 --frames "$range"
    cmp -s chosen.i420 some.i420 || complain "--frames $range gives others"
}
frames_are 1:3 0 1 2
frames_are 2:3 1 2
frames_are 2: 1 2
frames_are :2 0 1
frames_are 2 1
frames_are 3:99 2
works in.i420 one.png "${raw[@]}" -s 9x9 --frames 2
fails 1 'in.i420: holds no such frame' in.i420 no.i420 "${raw[@]}" -s 9x9 --frames 4
for range in : 0 0:2 3:2 a 1:b 1:2:3 -1:2; do
    fails 2 "--frames: '$range' are no frames" in.i420 no.i420 "${raw[@]}" -s 9x9 "--frames=$range"
done

# ---- Y4M ----

works in.y4m out.y4m --size 16x8
[ "$(head -n 1 out.y4m)" = "YUV4MPEG2 W16 H8 A1:1 F30000:1001 Ip C420jpeg XNOTE=1" ] ||
    complain "Y4M header: $(head -n 1 out.y4m)"
[ "$(grep -ac '^FRAME$' out.y4m)" -ge 1 ] || complain "no frame in out.y4m"
{
    head -n 1 out.y4m
    for n in 0 1 2; do
        echo FRAME
        tail -c +$((n * 192 + 1)) out.i420 | head -c 192
    done
} >expected.y4m
cmp -s expected.y4m out.y4m || complain "Y4M frames differ from the same raw frames"
works in.y4m from_y4m.i420 --size 16x8
cmp -s out.i420 from_y4m.i420 || complain "Y4M written as I420 differs"
works in.y4m from_y4m.nv21 --size 16x8

"$tool" - - --size 16x8 <in.y4m >piped.y4m || complain "exit code $? of Y4M in a pipe"
cmp -s out.y4m piped.y4m || complain "Y4M in a pipe differs"
"$tool" - - --size 64x64! <in.y4m | "$tool" - - --size 16x8 | "$tool" - last.y4m --canvas 16x16 ||
    complain "exit code $? of a chain of three"
head -n 1 last.y4m | grep -q '^YUV4MPEG2 W16 H16 ' || complain "end of a chain: $(head -n 1 last.y4m)"

# Headers with parameters of the frame, without optional tags, with other names of the same layout.
{ y4m 0 && echo 'FRAME Ip XA=1' && frame 0; } >parameters.y4m
works parameters.y4m parameters_out.y4m --size 16x8
for tags in '' C420 C420mpeg2 C420paldv 'I? A0:0'; do
    y4m 1 "$tags" >tags.y4m
    works tags.y4m tags_out.y4m --size 16x8
done

# Squeezing a picture changes the shape of its pixels, except where its proportions are kept.
y4m 1 A16:15 >shape.y4m
works shape.y4m shape_out.y4m --size 16x16!
head -n 1 shape_out.y4m | grep -q ' A32:15' || complain "pixel shape: $(head -n 1 shape_out.y4m)"
works shape.y4m shape_out.y4m --size 17x17
head -n 1 shape_out.y4m | grep -q ' A16:15' || complain "pixel shape: $(head -n 1 shape_out.y4m)"

for tags in C411 C444alpha C420p8 C420p17 C42010 C420p10x Cmonop10 C4; do
    y4m 1 "$tags" >other.y4m
    fails 1 "other.y4m: Y4M of type $tags is not handled, only 4:2:0, 4:2:2, 4:4:4 and mono" other.y4m no.y4m -s 9x9
done
for tags in It Ib Im; do
    y4m 1 "$tags" >other.y4m
    fails 1 'other.y4m: interlaced' other.y4m no.y4m -s 9x9
done

size=$(stat -c %s in.y4m)
head_size=$(head -n 1 in.y4m | wc -c)
for keep in 10 20 $((head_size - 1)) $((head_size + 3)) $((head_size + 6)) $((head_size + 7)) \
    $((head_size + 6 + frame_bytes + 5)) $((size - frame_bytes)) $((size - 1)); do
    head -c "$keep" in.y4m >cut.y4m
    fails 1 'cut.y4m: ' cut.y4m no.y4m -s 9x9
done
fails 1 'cut.y4m: frame 3 is cut short' cut.y4m no.y4m -s 9x9
head -c "$head_size" in.y4m >none.y4m
fails 1 'none.y4m: holds no frame' none.y4m no.y4m -s 9x9
"$tool" - - -s 16x8 <cut.y4m >/dev/null 2>stderr && complain "success with a Y4M pipe that is cut short"
grep -q '^ovrinresize: -: frame 3 is cut short' stderr || complain "a cut pipe gives: $(cat stderr)"

for header in 'YUV4MPEG2 W0 H16' 'YUV4MPEG2 W32' 'YUV4MPEG2 W32 H-16' 'YUV4MPEG2 W32 Hx' \
    'YUV4MPEG2 W70000 H16' 'YUV4MPEG2 W60000 H60000' 'YUV4MPEG2 W99999999999999999999 H1' \
    'YUV4MPEG2 W32 H16 A1' 'YUV4MPEG2 W32 H16 A1:x'; do
    echo "$header" >bad.y4m
    fails 1 'bad.y4m: ' bad.y4m no.y4m -s 9x9
done
{ echo "YUV4MPEG2 W32 H16" && echo FRANE && frame 0; } >bad.y4m
fails 1 'bad.y4m: damaged Y4M' bad.y4m no.y4m -s 9x9
{ printf 'YUV4MPEG2 W32 H16 X' && head -c 100000 /dev/zero | tr '\0' x; } >bad.y4m
fails 1 'bad.y4m: damaged Y4M' bad.y4m no.y4m -s 9x9

fails 1 'Y4M can be written as' in.y4m no.png -s 9x9
fails 1 'Y4M can be written as' in.y4m no.rgba -s 9x9
fails 1 'only Y4M can be written as Y4M' one.png no.y4m -s 9x9

# ---- Engines and canvas ----

fails 1 'nearest engine handles rgba, not i420' in.y4m no.y4m -s 9x9 --engine nearest
fails 1 'a picture of 20x8 does not fit on a canvas of 19x30' in.y4m no.y4m -s 20x8 -c 19x30 -f exact
works one.png near.png --size 4x4! --engine nearest
has_size near.png 4x4

# ---- Long inputs ----

# Frames pass one at a time: 60 MB of them go through 64 MB of address space. Sanitizers need more.
if [ -z "${INSTRUMENTED:-}" ]; then
    (
        ulimit -v 65536
        head -c 60000000 /dev/zero | "$tool" - - --format rgba --input-size 500x300 -s 50x30 >long.rgba
    ) || complain "exit code $? of a long stream in little memory"
    (
        ulimit -v 400000
        fails 1 'in.i420: not enough memory' in.i420 no.rgba --format rgba --input-size 15000x15000 -s 9x9
        exit "$failures"
    ) || failures=$((failures + 1))
    [ "$(stat -c %s long.rgba)" = 600000 ] || complain "size of long.rgba"
fi

# slowly: a Y4M stream whose second frame comes late; so late that the tool has a progress to show, which
# counts the time from before it opens a file.
slowly() {
    y4m 1
    sleep 0.7
    echo FRAME
    frame 1
}

late_picture() {
    sleep 0.7
    cat one.png
}

# A busy machine may make a long job of a short one, but not every time.
short_job_is_silent() {
    local _
    for _ in $(seq 20); do
        script -qec "'$tool' in.y4m progress.y4m -s 16x8" terminal >/dev/null </dev/null
        grep -q 'frames' terminal || return 0
    done
    return 1
}

if ! script -qec true /dev/null </dev/null >/dev/null 2>&1; then
    echo "skipped: progress on a terminal; this system gives none"
else
    mkfifo slow
    slowly >slow &
    script -qec "'$tool' slow progress.y4m -s 16x8" terminal >/dev/null </dev/null ||
        complain "exit code $? on a terminal"
    grep -q '2 frames, [0-9.]* per second' terminal || complain "no progress on a terminal"
    short_job_is_silent || complain "progress on a terminal for a short job"
    script -qec "'$tool' in.y4m - -s 16x8" terminal >/dev/null </dev/null &&
        complain "success when writing frames to a terminal"
    grep -q 'standard output is a terminal' terminal || complain "frames go to a terminal"
    late_picture >slow &
    script -qec "'$tool' slow large.png -s 6000x5000!" terminal >/dev/null </dev/null ||
        complain "exit code $? for a large picture on a terminal"
    grep -q '%  writing' terminal || complain "no progress within a large picture"
    slowly | "$tool" - progress.y4m -s 16x8 2>stderr || complain "exit code $? without a terminal"
    [ ! -s stderr ] || complain "progress without a terminal: $(cat stderr)"
    wait
fi

"$tool" in.y4m many.y4m -s 16x8 -v 2>stderr || complain "exit code $? of -v"
grep -Eqx 'i420 32x16 to 16x8: 3 frames resized by quarter in [0-9]+\.[0-9]+ ms each' stderr ||
    complain "-v says: $(cat stderr)"

finish
