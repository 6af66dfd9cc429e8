#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# test.sh BUILD SANITIZED_BUILD: tests the binding with the native libraries in the folder BUILD, then once
# more with those of the other folder, which g++ has built with its address sanitizer.
set -euo pipefail
here=$(dirname "${BASH_SOURCE[0]}")
root=$here/../..
build=$(cd "$1" && pwd)
sanitized=$(cd "$2" && pwd)
source "$here/compiler/compiler.sh"

calls=${OVRIN_CALLS:-1000000}
sanitized_calls=$((calls / 10))
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

# run NAME LIBRARIES CALLS CLASS ARGUMENT...: what -Xcheck:jni has to say goes to either stream.
run() {
    local output=$build/$1.out status=0
    java -Xcheck:jni -Djava.library.path="$2" -Dovrin.expected="$build/expected.txt" \
        -Dovrin.calls="$3" -Dovrin.seed="$seed" -Dovrin.faults="$build/libfaults.so" \
        -classpath "$class_path" "${@:4}" >"$output" 2>&1 || status=$?
    grep -v '^\.\+$' "$output"
    ((status == 0)) || fail "$4 gave $status"
    ! grep -Ei 'warning|fatal' "$output" || fail "-Xcheck:jni complains"
}

# run_tests NAME LIBRARIES CALLS CLASS...
run_tests() {
    run "$1" "$2" "$3" org.junit.runner.JUnitCore "${@:4}"
    grep -q '^OK (' "$build/$1.out" || fail "the tests did not reach their end"
}

make_faults() {
    local jni_h
    jni_h=$(dirname "$(find /usr/lib/jvm/*/include "${JAVA_HOME:-/nonexistent}" -name jni.h 2>/dev/null |
        head -n 1)")
    gcc -std=c11 -Wall -Wextra -Werror -O1 -shared -fPIC -I "$jni_h" -I "$jni_h/linux" \
        "$here/test/faults.c" -o "$build/libfaults.so"
}

# The virtual machine handles faults of its own in compiled code, so the sanitizer must not; and it keeps
# memory until it ends, which is no leak of ours: those are counted by faults.c.
run_sanitized() {
    local runtime
    runtime=$(g++ -print-file-name=libasan.so):$(g++ -print-file-name=libubsan.so)
    grep -q __asan_report <<<"$(nm -D "$sanitized/libovrinresize_jni.so")" || fail "no sanitizer in $sanitized"
    LD_PRELOAD=$runtime ASAN_OPTIONS=handle_segv=0:detect_leaks=0:halt_on_error=1 \
        UBSAN_OPTIONS=halt_on_error=1:print_stacktrace=1 run_tests sanitized "$sanitized" "$sanitized_calls" "$@"
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
make_faults
mapfile -t tests < <(test_classes | grep -v '\.Memory')
run_tests tests "$build" "$calls" "${tests[@]}"
run_sanitized "${tests[@]}"
mapfile -t memory_tests < <(test_classes | grep '\.Memory')
# Found by its folder, since the name in LD_PRELOAD would end at a space.
LD_LIBRARY_PATH=$build LD_PRELOAD=libfaults.so run_tests memory "$build" "$calls" "${memory_tests[@]}"
run example "$build" "$calls" ExampleKt
diff "$build/example.expected" "$build/example.out" || fail "the example prints something else"
