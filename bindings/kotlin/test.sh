#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# test.sh BUILD: tests the binding with the native libraries in the folder BUILD.
set -euo pipefail
here=$(dirname "${BASH_SOURCE[0]}")
root=$here/../..
build=$(cd "$1" && pwd)
source "$here/compiler/compiler.sh"

calls=${OVRIN_TEST_CALLS:-100000}
seed=${OVRIN_TEST_SEED:-1}
classes=$build/test-classes
# JUnit, as Debian installs it.
junit=/usr/share/java/junit4.jar:/usr/share/java/hamcrest-core.jar

class_path=$build/classes:$build/stubs:$classes:$junit:$(kotlin_stdlib "$build")

fail() {
    echo "FAIL: $*"
    exit 1
}

# The documentation's example is compiled and run as it stands there.
take_example() {
    local page=$root/docs/kotlin.md
    awk '/^```kotlin$/ { on = 1; next } /^```$/ { on = 0 } on' "$page" >"$build/Example.kt"
    awk '/^It prints$/ { on = 1 } /^From Java/ { on = 0 } on && sub(/^    /, "")' "$page" \
        >"$build/example.expected"
    [[ -s $build/Example.kt && -s $build/example.expected ]] || fail "no example in $page"
}

compile_tests() {
    rm -rf "$classes"
    kotlinc "$build" -Werror -classpath "$build/classes:$build/stubs:$junit" \
        -Xfriend-paths="$build/classes" -d "$classes" \
        "$here"/{test,examples}/*.kt "$here"/test/*.java "$build/Example.kt"
    javac -Xlint:all -Xlint:-options -Werror --release 8 -d "$classes" \
        -classpath "$class_path" "$here"/test/*.java
}

make_known_results() {
    gcc -std=c99 -Wall -Wextra -Wpedantic -Werror -O1 -I "$root/include" "$here/test/expected.c" \
        -o "$build/expected" -L "$build" -lovrinresize -Wl,-rpath,"$build"
    "$build/expected" >"$build/expected.txt"
}

# Classes with tests, by their names.
test_classes() {
    (cd "$classes" && grep -lr 'Lorg/junit/Test;' . | grep -v '\$' | sed 's,^\./,,; s,/,.,g; s,\.class$,,' | sort)
}

# run NAME CLASS ARGUMENT...: what -Xcheck:jni has to say goes to either stream.
run() {
    local output=$build/$1.out
    java -Xcheck:jni -Djava.library.path="$build" -Dovrin.expected="$build/expected.txt" \
        -Dovrin.calls="$calls" -Dovrin.seed="$seed" \
        -classpath "$class_path" "${@:2}" >"$output" 2>&1 || {
        cat "$output"
        fail "$2 gave $?"
    }
    cat "$output"
    ! grep -Ei 'warning|fatal' "$output" || fail "-Xcheck:jni complains"
}

# The library that Java loads exports nothing but its entry, and needs no C++ run-time library.
check_native_half() {
    local library=$build/libovrinresize_jni.so exported needed undefined
    exported=$(nm -D --defined-only "$library" | awk '{ print $3 }')
    [[ $exported == JNI_OnLoad ]] || fail "exports: $exported"
    needed=$(readelf -dW "$library" | sed -n 's/.*(NEEDED).*\[\(.*\)\].*/\1/p' | sort | xargs)
    [[ $needed == "libc.so.6 libjnigraphics.so libovrinresize.so.1" ]] || fail "needs: $needed"
    undefined=$(nm -D --undefined-only "$library" | awk '{ print $2 }' |
        grep -E '^(_Z|__cxa_|__gxx_|_Unwind_)' | grep -v '^__cxa_finalize' || true)
    [[ ! $undefined ]] || fail "needs of the C++ run-time library: $undefined"
}

check_native_half
bash "$here/compile.sh" "$build"
take_example
compile_tests
make_known_results
mapfile -t tests < <(test_classes)
run tests org.junit.runner.JUnitCore "${tests[@]}"
grep -q '^OK (' "$build/tests.out" || fail "the tests did not reach their end"
run example ExampleKt
diff "$build/example.expected" "$build/example.out" || fail "the example prints something else"
