#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# test.sh AARCH64_BUILD CLASSES FOLDER: makes an AAR of stand-ins for what an NDK would build, and
# looks at it with tools that had no part in it. The stand-ins are the aarch64 build's objects, linked
# the way Android wants it by a compiler for Linux.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
root=$here/../..
aarch64_build=$1
classes=$2
folder=$3
version=1.2.3
ndk=27

failures=0
fail() {
    echo "FAIL: $*"
    failures=$((failures + 1))
}

# ---- Stand-ins --------------------------------------------------------------------------------

cross=aarch64-linux-gnu-g++

# stand_in FILE SONAME ARGUMENT...: an aarch64 library; undefined functions stay so.
stand_in() {
    $cross -shared -fPIC -nostdlib -o "$folder/$1" ${2:+"-Wl,-soname,$2"} \
        -Wl,-z,max-page-size="${page:-16384}" "${@:3}"
}

# with_alignment N: a library whose segments claim this alignment, and lie where they did.
with_alignment() {
    python3 -c '
import struct, sys
data = bytearray(sys.stdin.buffer.read())
table, = struct.unpack_from("<Q", data, 32)
for header in range(table, table + 56 * data[56], 56):
    if data[header] == 1:
        struct.pack_into("<Q", data, header + 48, int(sys.argv[1], 0))
sys.stdout.buffer.write(data)' "$1"
}

make_stand_ins() {
    local name objects jni_h
    rm -rf "$folder"
    mkdir -p "$folder/system"
    # Empty libraries with the names of Android's.
    for name in libc.so libm.so libjnigraphics.so libc++_shared.so; do
        stand_in "system/$name" "$name" -x c /dev/null
    done
    local system=("-Wl,--no-as-needed" "$folder/system/libc.so" "$folder/system/libm.so")
    mapfile -t objects < <(find "$aarch64_build/CMakeFiles/ovrinresize_objects.dir" -name '*.o' | sort)
    local unversioned=$folder/exports.map
    sed '1s/.*/{/' "$aarch64_build/exports.map" >"$unversioned"
    local objects_and_exports=("${objects[@]}" "-Wl,--version-script=$unversioned")
    stand_in libovrinresize.so libovrinresize.so "${objects_and_exports[@]}" "${system[@]}"

    jni_h=$(dirname "$(find /usr/lib/jvm/*/include "${JAVA_HOME:-/nonexistent}" -name jni.h 2>/dev/null |
        head -n 1)")
    local jni=("$root"/bindings/jni/{bitmap,camera,checks,extents,methods}.cpp -std=c++17 -O2
        -fno-exceptions -fno-rtti -mno-outline-atomics -fvisibility=hidden
        -DOVRINRESIZE_JNI_BITMAPS -I "$root/bindings/jni/stubs" -I "$root/include" -I "$jni_h"
        -I "$jni_h/linux" "-Wl,--version-script=$root/bindings/jni/exports.map")
    stand_in libovrinresize_jni.so libovrinresize_jni.so "${jni[@]}" "${system[@]}" \
        "$folder/libovrinresize.so" "$folder/system/libjnigraphics.so"

    # And libraries that must be refused.
    local any=(-x c /dev/null)
    stand_in other_name.so libovrinresize.so.1 "${any[@]}"
    stand_in no_name.so "" "${any[@]}"
    page=4096 stand_in small_pages.so libovrinresize.so "${any[@]}"
    with_alignment 0x1000 <"$folder/libovrinresize.so" >"$folder/small_alignment.so"
    with_alignment 0x4000 <"$folder/small_pages.so" >"$folder/false_alignment.so"
    stand_in with_cxx.so libovrinresize.so -Wl,--no-as-needed "$folder/system/libc++_shared.so"
    stand_in with_bitmaps.so libovrinresize.so -Wl,--no-as-needed "$folder/system/libjnigraphics.so"
    stand_in alone_jni.so libovrinresize_jni.so "${any[@]}"
    g++ -shared -nostdlib -o "$folder/x86.so" -Wl,-soname,libovrinresize.so \
        -Wl,-z,max-page-size=16384 "${any[@]}"
    head -c 500 "$folder/libovrinresize.so" >"$folder/short.so"
    echo "no library" >"$folder/text.so"
}

# ---- The archive ------------------------------------------------------------------------------

make_aar() {
    "$here/make_aar.py" --version "$version" --ndk "$ndk" --output "$folder/$1" "${@:2}"
}

# refused TEXT ARGUMENT...: no archive, and a message that says why.
refused() {
    local output
    rm -f "$folder/refused.aar"
    if output=$(make_aar refused.aar "${@:2}" 2>&1); then
        fail "accepted: ${*:2}"
    fi
    [[ $output == *"$1"* ]] || fail "the message does not say '$1': $output"
    [[ ! -e $folder/refused.aar ]] || fail "an archive was left: ${*:2}"
}

check_refusals() {
    local core=$folder/libovrinresize.so
    refused "SONAME" "$folder/other_name.so"
    refused "SONAME" "$(readlink -f "$aarch64_build/libovrinresize.so")"
    refused "SONAME" "$folder/no_name.so"
    refused "not for AArch64" "$folder/x86.so"
    refused "16 KB" "$folder/small_pages.so"
    refused "16 KB" "$folder/small_alignment.so"
    refused "16 KB" "$folder/false_alignment.so"
    refused "libc++_shared.so" "$folder/with_cxx.so"
    refused "libjnigraphics.so" "$folder/with_bitmaps.so"
    refused "damaged" "$folder/short.so"
    refused "not an ELF file" "$folder/text.so"
    refused "No such file" "$folder/missing.so"
    refused "is not linked to libovrinresize.so" "$core" "$folder/alone_jni.so" --classes "$classes"
    refused "SONAME" "$core" "$core" --classes "$classes"
    refused "binding's classes" "$core" "$folder/libovrinresize_jni.so" --classes "$folder/system"
    refused "go together" "$core" "$folder/libovrinresize_jni.so"
    refused "go together" "$core" --classes "$classes"
    version=1.0-beta refused "a version is" "$core"
    ndk=r27 refused "--ndk" "$core"
}

expected_entries() {
    cat <<'END'
AndroidManifest.xml
LICENSE
R.txt
classes.jar
jni/arm64-v8a/libovrinresize.so
jni/arm64-v8a/libovrinresize_jni.so
prefab/modules/ovrinresize/include/ovrinresize.h
prefab/modules/ovrinresize/include/ovrinresize.hpp
prefab/modules/ovrinresize/libs/android.arm64-v8a/abi.json
prefab/modules/ovrinresize/libs/android.arm64-v8a/libovrinresize.so
prefab/modules/ovrinresize/module.json
prefab/prefab.json
proguard.txt
END
}

# json FILE EXPECTED: the whole content, so that nothing is missing and nothing is left over.
json() {
    python3 - "$@" <<'END' || fail "$1 is not $2"
import json, sys
sys.exit(json.load(open(sys.argv[1])) != json.loads(sys.argv[2]))
END
}

check_json() {
    local module=prefab/modules/ovrinresize
    json prefab/prefab.json '{"schema_version": 2, "name": "ovrinresize", "version": "1.2.3",
        "dependencies": []}'
    json $module/module.json '{"export_libraries": [], "library_name": "libovrinresize"}'
    json $module/libs/android.arm64-v8a/abi.json '{"abi": "arm64-v8a", "api": 21, "ndk": 27,
        "stl": "none", "static": false}'
}

# What the metadata say of a library, and what the library says.
check_library() {
    local dynamic needed
    dynamic=$(readelf -dW "$1")
    grep -q 'Machine: *AArch64' <<<"$(readelf -hW "$1")" || fail "$1 is not for AArch64"
    grep -q "SONAME.*\[$(basename "$1")\]" <<<"$dynamic" || fail "$1 has another SONAME"
    needed=$(sed -n 's/.*(NEEDED).*\[\(.*\)\].*/\1/p' <<<"$dynamic" | sort | xargs)
    [[ $needed == "$2" ]] || fail "$1 needs $needed"
    ! readelf -lW "$1" | awk '$1 == "LOAD" && $NF != "0x4000"' | grep . ||
        fail "$1 is not aligned to 16 KB"
}

check_libraries() {
    local lib=prefab/modules/ovrinresize/libs/android.arm64-v8a/libovrinresize.so
    check_library $lib "libc.so libm.so"
    cmp $lib jni/arm64-v8a/libovrinresize.so || fail "two libraries of one name"
    check_library jni/arm64-v8a/libovrinresize_jni.so \
        "libc.so libjnigraphics.so libm.so libovrinresize.so"
    # Every function of the header that goes along can be linked.
    local declared missing
    declared=$(sed -n 's/^OVRIN_API [^(]*[ *]\([A-Za-z_0-9]*\)(.*/\1/p' \
        prefab/modules/ovrinresize/include/ovrinresize.h | LC_ALL=C sort)
    [[ $declared == *ovrin_resize_rgba8888* ]] || fail "no function found in the header"
    missing=$(comm -23 <(echo "$declared") <(readelf --dyn-syms -W $lib |
        awk '$4 == "FUNC" && $7 != "UND" { print $8 }' | LC_ALL=C sort))
    [[ ! $missing ]] || fail "not in the library: $missing"
}

check_manifest() {
    grep -q 'package="ovrin.resize"' AndroidManifest.xml || fail "the manifest's package"
    grep -q 'minSdkVersion="21"' AndroidManifest.xml || fail "the manifest's minSdkVersion"
    python3 -c 'import sys, xml.dom.minidom; xml.dom.minidom.parse("AndroidManifest.xml")' ||
        fail "the manifest is not XML"
}

check_classes() {
    diff <(unzip -Z1 classes.jar) <(cd "$classes" && find . -type f | sed 's,^\./,,' | LC_ALL=C sort) ||
        fail "classes.jar does not hold the classes"
    grep -q 'static final void rgba(' <<<"$(javap -classpath classes.jar ovrin.resize.Resizer)" ||
        fail "classes.jar cannot be read"
    ! unzip -Z1 classes.jar | grep -v '^ovrin/resize/\|^META-INF/' || fail "classes.jar holds others' classes"
    local native
    for native in ovrin.resize.Native ovrin.resize.NativeBitmaps; do
        # The name by which the native library looks the class up is the one that is kept.
        grep -qx -- "-keep class $native { \*; }" proguard.txt || fail "the keep rule"
        grep -q "${native//./\/}" jni/arm64-v8a/libovrinresize_jni.so || fail "the class's name"
        javap -classpath classes.jar $native >/dev/null || fail "no class $native"
    done
}

# zipalign prints where the data of each entry begins.
check_alignment() {
    local offset name seen=0
    while read -r offset name _; do
        [[ $name == *.so ]] || continue
        seen=$((seen + 1))
        ((offset % 16384 == 0)) || fail "$name begins at $offset"
    done < <(zipalign -c -v 4 "$1" | grep -E '^ *[0-9]+ ')
    ((seen == 3)) || fail "$seen libraries seen by zipalign"
    zipalign -c -p 4 "$1" || fail "zipalign does not like the alignment"
}

check_aar() {
    local aar=$1
    unzip -tq "$aar" || fail "unzip finds errors"
    diff <(unzip -Z1 "$aar") <(expected_entries) || fail "other entries"
    [[ $(unzip -Z -v "$aar" | grep -c 'compression method: *none') -eq 13 ]] || fail "compressed"
    check_alignment "$aar"
    rm -rf "$folder/open"
    mkdir "$folder/open"
    unzip -q "$aar" -d "$folder/open"
    cd "$folder/open"
    check_json
    check_manifest
    check_libraries
    check_classes
    cmp LICENSE "$root/LICENSE" || fail "another licence"
    diff prefab/modules/ovrinresize/include "$root/include" || fail "other headers"
    cd - >/dev/null
}

# Neither dates nor rights nor the order of files reach the archive.
check_repetition() {
    local copy=$folder/copy
    mkdir -p "$copy"
    cp -r "$classes" "$copy/classes"
    cp "$folder"/libovrinresize{,_jni}.so "$copy"
    find "$copy" -type f -exec chmod 600 {} + -exec touch -d 2001-02-03 {} +
    (
        cd "$copy"
        umask 077
        TZ=Asia/Tokyo make_aar again.aar libovrinresize.so libovrinresize_jni.so --classes classes
    )
    cmp "$folder/ovrinresize.aar" "$folder/again.aar" || fail "a second archive is another one"
}

check_without_jni() {
    make_aar native.aar "$folder/libovrinresize.so"
    diff <(unzip -Z1 "$folder/native.aar") <(expected_entries | grep -Ev '_jni|proguard') ||
        fail "other entries without the binding"
}

# Rules of the repository, twins that break them, and the same bytes once more.
check_repository() {
    local repository=$folder/maven
    rm -rf "$repository" "$folder/maven-again" "$folder/maven-native"
    make_repository maven "$folder"/libovrinresize{,_jni}.so --classes "$classes"
    "$here/check_repository.py" "$repository" || fail "the repository"
    cmp "$repository/ovrin/ovrinresize/$version/ovrinresize-$version.aar" "$folder/ovrinresize.aar" ||
        fail "another archive in the repository"
    "$here/check_repository_test.py" "$repository" "$folder/maven-twins" || fail "twins"
    TZ=Asia/Tokyo make_repository maven-again "$folder"/libovrinresize{,_jni}.so --classes "$classes"
    diff -r "$repository" "$folder/maven-again" || fail "a second repository is another one"
    make_repository maven-native "$folder/libovrinresize.so"
    "$here/check_repository.py" "$folder/maven-native" || fail "the repository without the binding"
}

make_repository() {
    "$here/make_aar.py" --version "$version" --ndk "$ndk" --repository "$folder/$1" "${@:2}"
}

make_stand_ins
folder=$(cd "$folder" && pwd)
classes=$(cd "$classes" && pwd)
make_aar ovrinresize.aar "$folder"/libovrinresize{,_jni}.so --classes "$classes"
check_aar "$folder/ovrinresize.aar"
check_repetition
check_without_jni
check_repository
check_refusals
((failures == 0))
echo "all passed"
