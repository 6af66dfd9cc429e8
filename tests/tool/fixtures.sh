# SPDX-License-Identifier: Apache-2.0
# shellcheck shell=bash
# Sourced by cases_test.sh: pictures made by programs other than ours, and what the tables ask of them.

: "${tool:?path of ovrinresize}"
profiles=/usr/share/color/icc  # of Debian's icc-profiles-free

# photoN.jpg: one scene, stored in each of EXIF's eight ways to lie; the scene itself is upright.png.
make_photographs() {
    local n
    local -a stored=('' '' '-flop' '-rotate 180' '-flip' '-transpose' '-rotate 270' '-transverse'
        '-rotate 90')
    convert -size 400x300 gradient:red-blue -seed 1 -swirl 90 -fill white -draw 'circle 90,90 130,90' \
        -fill black -draw 'rectangle 250,200 390,290' upright.png
    convert upright.png -resize 160x120 thumbnail.jpg
    for n in 1 2 3 4 5 6 7 8; do
        # shellcheck disable=SC2086 # words
        convert upright.png ${stored[n]} -quality 95 "photo$n.jpg"
        exiftool -q -overwrite_original -n "-Orientation=$n" -Make=Maker -ISO=200 \
            "-ThumbnailImage<=thumbnail.jpg" -ExifImageWidth=400 "photo$n.jpg"
        convert "photo$n.jpg" "photo$n.png"
        exiftool -q -overwrite_original -n "-Orientation=$n" "photo$n.png" 2>exiftool.log
    done
    for n in 0 9 60000; do
        cp photo1.jpg "photo_of_$n.jpg"
        exiftool -q -overwrite_original -n "-Orientation=$n" "photo_of_$n.jpg"
    done
    # EXIF that is damaged: its first directory lies outside.
    LC_ALL=C sed 's/Exif\x00\x00MM\x00\*\x00\x00\x00\x08/Exif\x00\x00MM\x00*\x7f\xff\x00\x08/' photo6.jpg \
        >damaged_exif.jpg
}

# Pictures that say what their colours mean, in every way there is.
make_coloured() {
    local type
    convert -size 60x40 gradient:'#203040'-'#c0b0a0' -strip PNG24:plain.png
    convert plain.png plain.jpg
    convert plain.png -colorspace Gray -strip gray.png
    convert gray.png gray.jpg
    convert gray.png -alpha set -channel A -evaluate set 50% gray_alpha.png
    for type in png jpg; do
        exiftool -q -q "-ICC_Profile<=$profiles/compatibleWithAdobeRGB1998.icc" -o "wide.$type" "plain.$type"
        exiftool -q -q "-ICC_Profile<=$profiles/Gray.icc" -o "gray_profile.$type" "gray.$type"
    done
    # Longer than one marker of a JPEG.
    exiftool -q -q "-ICC_Profile<=$profiles/ITULab.icc" -o long_profile.jpg plain.jpg
    # A profile for colours in a file of greys.
    exiftool -q -q "-ICC_Profile<=$profiles/sRGB.icc" -o gray_in_colours.jpg gray.jpg
    exiftool -q -q -n -SRGBRendering=1 -o srgb.png plain.png
    exiftool -q -q -n -ColorSpace=1 -o exif_srgb.jpg plain.jpg
    exiftool -q -q -n -ColorSpace=65535 -o exif_uncalibrated.jpg plain.jpg
    exiftool -q -q -n -ColorSpace=1 -o exif_and_profile.jpg wide.jpg
    exiftool -q -Gamma=1 -o linear.png plain.png
    convert plain.png -density 300 -units PixelsPerInch 300dpi.png
    convert plain.png -density 300 -units PixelsPerInch 300dpi.jpg
    convert plain.png -density 100x50 -units PixelsPerCentimeter 100dpcm.jpg
    exiftool -q -q -n -Orientation=6 -o 100dpcm6.jpg 100dpcm.jpg
    convert plain.png -density 3x2 -units Undefined pixels_of_3x2.jpg
    convert plain.png -depth 16 deep.png
    convert plain.png -colors 8 PNG8:palette.png
    convert gray.png -depth 1 -threshold 50% bits.png
    convert plain.png -interlace PNG interlaced.png
    convert plain.png -interlace JPEG progressive.jpg
}

# Pictures of 40 x 20 pixels with alpha; the colours of transparent pixels should never be seen.
make_transparent() {
    convert plain.png -alpha on PNG32:opaque.png
    convert -size 20x20 xc:'rgba(200,0,0,1)' xc:'rgba(0,255,0,0)' +append PNG32:halo.png
    convert -size 20x20 xc:'gray(200)' xc:'graya(90,0)' +append -colorspace Gray gray_halo.png
    convert -size 40x20 xc:'rgba(100,50,200,0.5)' PNG32:half.png
    convert -size 40x20 xc:'rgba(100,50,200,0)' PNG32:nothing.png
    convert half.png -alpha off PNG24:shown.png
    convert halo.png -channel A -threshold 50% +channel -colors 4 PNG8:palette_halo.png
    exiftool -q -q "-ICC_Profile<=$profiles/Gray.icc" -o gray_halo_profile.png gray_halo.png
}

# Fine lines, text and a landscape, 1600 x 1200 pixels: the project's own sample picture.
make_sample() {
    "$(dirname "$tool")/make_sample" sample.png
    convert sample.png -alpha set -channel A -evaluate set 60% +channel PNG32:sample_alpha.png
    convert sample.png -quality 95 sample.jpg
    convert -size 64x64 xc:white white.png
    head -c $(($(stat -c %s photo1.jpg) * 7 / 10)) photo1.jpg >cut.jpg
    head -c $(($(stat -c %s photo1.jpg) - 2)) photo1.jpg >no_end.jpg
    head -c 300 photo1.jpg >head.jpg
    # A few bytes of the middle are others.
    cp photo1.jpg scratched.jpg
    printf '\xff\xd9\x00\x00\xff\xc0' |
        dd of=scratched.jpg bs=1 seek=$(($(stat -c %s photo1.jpg) * 3 / 4)) conv=notrunc status=none
    convert sample.png -crop 800x800+400+200 +repage -depth 8 RGB:sample.rgb
}

# A PNG of which one chunk announces a gigabyte of text.
make_announcement() {
    {
        head -c 33 plain.png # up to the end of its first chunk
        printf '\x40\0\0\0tEXt'
        tail -c +34 plain.png
    } >long_text.png
}

# album/: photographs in folders, and what is none. empty/ holds nothing.
make_album() {
    mkdir -p album/2025/may album/2026 empty
    cp photo6.jpg album/2025/may/beach.jpg
    cp photo1.jpg album/2025/hill.JPG
    cp plain.png album/2026/drawing.png
    cp plain.png album/cover.png
    echo 'Holidays' >album/notes.txt
    echo 'no picture' >broken.jpg
}

# The family of Netpbm, as binary and as text; samples of 16 bits.
make_netpbm() {
    local type
    for type in ppm pam; do
        convert plain.png "plain.$type"
        convert plain.png -depth 16 "deep.$type"
    done
    ffmpeg -nostdin -v error -i gray.png -pix_fmt gray gray.pam
    convert plain.png -compress none text.ppm
    for type in pgm pnm; do convert gray.png "gray.$type"; done
    convert gray.png -compress none text.pgm
    convert gray.png -depth 16 deep.pgm
    convert bits.png bits.pbm
    convert bits.png -compress none text.pbm
    convert halo.png halo.pam
    convert gray_halo.png gray_halo.pam
    convert gray.png -depth 16 deep_gray.png
    head -c 60 gray.pgm >cut.pgm
    head -c 60 text.pgm >cut_text.pgm
    head -c 15 bits.pbm >cut.pbm
    head -c 90 plain.pam >cut.pam
    sed 's/TUPLTYPE.*/TUPLTYPE CMYK/' plain.pam >odd.pam
}

# in_FORMAT.y4m: three frames of the scene, in each format of samples.
make_videos() {
    local format
    for format in yuv420p yuv422p yuv444p gray yuv420p10le yuv422p10le yuv444p12le gray10le yuv411p; do
        ffmpeg -nostdin -v error -loop 1 -i upright.png -frames:v 3 -pix_fmt "$format" -strict -1 \
            -f yuv4mpegpipe "in_$format.y4m" 2>ffmpeg.log
    done
    # Samples of 0, 2, 1022 and 65535, of 10 bits.
    printf 'YUV4MPEG2 W4 H1 Cmono10\nFRAME\n\x00\x00\x02\x00\xfe\x03\xff\xff' >steps.y4m
    head -c 30 steps.y4m >no_samples.y4m
    head -c 100000 in_yuv420p10le.y4m >cut.y4m
}

# The scene as JPEG with chroma of each size, and in inks.
make_jpegs() {
    local factors
    for factors in 1x1 2x1 2x2 1x2 4x1; do
        convert upright.png -quality 95 -sampling-factor "$factors" "chroma_$factors.jpg"
    done
    convert upright.png -crop 399x299+0+0 +repage -quality 95 -sampling-factor 2x2 odd_sides.jpg
    convert upright.png -quality 95 -sampling-factor 2x2 -interlace JPEG in_passes.jpg
    convert upright.png -colorspace CMYK -quality 95 cmyk.jpg
    exiftool -q -q "-ICC_Profile<=$profiles/ITULab.icc" -o cmyk_profile.jpg cmyk.jpg
    head -c $(($(stat -c %s chroma_2x2.jpg) * 7 / 10)) chroma_2x2.jpg >cut_2x2.jpg
    for n in 1 2 3 4 5 6 7 8; do
        convert "photo$n.jpg" -sampling-factor 2x2 "photo_2x2_$n.jpg"
    done
}

# What only the table of inputs needs.
make_inputs() {
    make_jpegs
    make_netpbm
    make_videos
}

# Frames of one colour, which video knows by these numbers.
make_frames() {
    local colour
    for colour in red lime blue white black; do
        convert -size 8x8 "xc:$colour" "PNG24:pure_$colour.png"
    done
    {
        echo 'YUV4MPEG2 W8 H8 F25:1 Ip A1:1 C420jpeg'
        for _ in 1 2 3; do
            echo FRAME
            head -c 64 /dev/zero | tr '\0' '\100'
            head -c 32 /dev/zero | tr '\0' '\200'
        done
    } >three.y4m
    sed '2,$!d' three.y4m >headless
    { head -n 1 three.y4m; head -c $((2 * (6 + 96))) headless; } >two.y4m
    head -n 1 three.y4m >no_frame.y4m
    { cat no_frame.y4m; head -c $((6 + 96)) headless; } >one.y4m
    convert -size 8x8 xc:'gray(64)' gray64.png
    { echo 'YUV4MPEG2 W8 H8 C422'; echo FRAME; head -c 128 /dev/zero; } >in_8x8_422.y4m
    tr '\100' '\103' <three.y4m >brighter.y4m
    tail -c 96 three.y4m >gray.i420
}

# What info and compare only look at.
make_others() {
    convert plain.png -resize 60x41! tall.png
    { printf 'P6 4 2 255\n'; head -c 24 sample.rgb; } >in_4x2.ppm
    { printf 'P7\nWIDTH 4\nHEIGHT 2\nDEPTH 4\nMAXVAL 255\nTUPLTYPE RGB_ALPHA\nENDHDR\n'; head -c 32 sample.rgb; } >in_4x2.pam
}

make_fixtures() {
    make_photographs
    make_coloured
    make_transparent
    make_sample
    make_announcement
    make_frames
    make_album
    make_others
}

# tag NAME FILE: what exiftool says; nothing where there is none.
tag() {
    exiftool -s3 -n "-$1" "$2"
}

# like FILE REFERENCE: whether FILE shows what REFERENCE, scaled to its size, shows.
like() {
    local psnr
    convert "$1" -strip PNG32:seen.png
    convert "$2" -strip -resize "$(identify -format '%wx%h!' seen.png)" -depth 8 PNG32:expected.png
    psnr=$(compare -metric PSNR seen.png expected.png null: 2>&1)
    awk -v psnr="$psnr" 'BEGIN { print (psnr == "inf" || psnr >= 25) ? "yes" : "no: " psnr " dB" }'
}

# video FILE: what another program says that it holds.
video() {
    ffprobe -v error -count_frames -show_entries stream=pix_fmt,width,height,nb_read_frames -of csv=p=0 "$1"
}

# frame FILE: its last one, as a PNG of that name.
frame() {
    ffmpeg -nostdin -v error -y -i "$1" -update 1 "$1.png"
    echo "$1.png"
}

# samples FILE COUNT: its last ones.
samples() {
    tail -c "$2" "$1" | od -An -v -tu1 | xargs
}

# head_of FILE: its first two bytes.
head_of() {
    head -c 2 "$1"
}

# way IN OUT OPTION...: the format in which the tool resizes it.
way() {
    "$tool" "$@" -v 2>&1 >/dev/null | sed -n 's/^\([a-z0-9]*\) [0-9]*x.*/\1/p'
}

# alike FILE REFERENCE DB: whether both, of the same size, are that near to each other.
alike() {
    local psnr
    psnr=$(compare -metric PSNR "$1" "$2" null: 2>&1)
    awk -v psnr="$psnr" -v db="$3" 'BEGIN { print (psnr == "inf" || psnr >= db) ? "yes" : "no: " psnr " dB" }'
}

# pixel FILE X,Y: its channels, 0 to 255, alpha where the file has it.
pixel() {
    convert "$1" -depth 8 -format "%[pixel:p{$2}]" info: |
        sed -E 's/^s?rgba?\((.*)\)$/\1/; s/^graya?\((.*)\)$/\1/; s/^black$/0,0,0/; s/^white$/255,255,255/'
}

# profile FILE: the hash of its colour profile, which is that of the file itself; nothing without one.
profile() {
    exiftool -b -ICC_Profile "$1" >seen.icc
    [ ! -s seen.icc ] || md5sum <seen.icc | cut -c 1-8
}

profile_of() {
    md5sum <"$profiles/$1.icc" | cut -c 1-8
}

# chunks FILE: those of a PNG that say something about colours.
chunks() {
    pngcheck -v "$1" | grep -oE 'chunk (sRGB|iCCP|gAMA|cHRM)' | cut -d ' ' -f 2 | paste -sd ' '
}

# channels FILE: of the file itself, not of what a reader makes of it.
channels() {
    case $1 in
        *.png) pngcheck -v "$1" | grep -oE '(grayscale|RGB)(\+alpha)?' | head -n 1 ;;
        *.jpg) exiftool -s3 -n -ColorComponents "$1" ;;
    esac
}

# alpha FILE X,Y: 0 to 255.
alpha() {
    convert "$1" -alpha extract -depth 8 -format "%[fx:round(255*p{$2})]" info:
}

# greenest FILE: the largest green sample of pixels that are not all but transparent.
greenest() {
    convert "$1" -depth 8 RGBA:- | od -An -v -tu1 -w4 | awk '$4 > 4 && $2 > most { most = $2 } END { print most + 0 }'
}

# close_to R,G,B SEEN: whether no channel is more than 6 off.
close_to() {
    awk -v a="$1" -v b="$2" 'BEGIN {
        n = split(a, p, ","); split(b, q, ",")
        for (i = 1; i <= n; ++i) if (p[i] - q[i] > 6 || q[i] - p[i] > 6) bad = 1
        print bad ? "no: " b : "yes"
    }'
}

# psnr FILE REFERENCE: in whole dB; of REFERENCE the mean of the pixels that each of FILE's covers. The
# ratio of their sizes is a whole number.
psnr() {
    convert "$2" -strip -filter box -resize "$(identify -format '%wx%h!' "$1")" -depth 8 PNG32:expected.png
    convert "$1" -strip PNG32:seen.png
    compare -metric PSNR seen.png expected.png null: 2>&1 | awk '{ print ($1 == "inf") ? 99 : int($1) }'
}

at_least() {
    [ "$2" -ge "$1" ] && echo yes || echo "no: $2"
}

at_most() {
    [ "$2" -le "$1" ] && echo yes || echo "no: $2"
}

# json IN OUT -s SIZE ... KEY...: what the tool says of itself, by a reader of JSON that is not ours. Keys
# are the arguments that do not start with - behind the last option's value.
json() {
    local arguments=("${@:1:4}") keys
    shift 4
    while [[ ${1:-} == -* ]]; do
        arguments+=("$1" "$2")
        shift 2
    done
    keys=$*
    "$tool" "${arguments[@]}" --json | python3 -c '
import json, re, sys
report = json.loads(sys.stdin.read())
def value(key):
    names = re.findall(r"\w+", key)
    found = report
    for name in names: found = found[name]
    return str(found)
print(*map(value, sys.argv[1].split()))' "$keys"
}

# is_light ARGUMENT...: whether the tool, so called, takes less than half a gigabyte of memory.
is_light() {
    python3 - "$tool" "$@" 2>&1 <<'END'
import resource, subprocess, sys
subprocess.run(sys.argv[1:], stderr=subprocess.DEVNULL)
kilobytes = resource.getrusage(resource.RUSAGE_CHILDREN).ru_maxrss
print("yes" if kilobytes < 500000 else f"no: {kilobytes} KB")
END
}

# yuv FILE: luma, U and V of the first pixel of an I420 picture of 8 x 8.
yuv() {
    od -An -v -tu1 "$1" | xargs | awk '{ print $1, $65, $81 }'
}

# of_json KEY...: of the line in the file stdout, by a reader of JSON that is not ours.
of_json() {
    python3 -c '
import json, sys
found = json.load(open("stdout"))
print(*(eval("found" + key) for key in sys.argv[1:]))' "$@"
}

# sizes FILE...: of each.
sizes() {
    identify -format '%wx%h ' "$@" | sed 's/ $//'
}
