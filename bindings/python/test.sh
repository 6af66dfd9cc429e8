#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# test.sh BUILD: tests the wheel in the folder BUILD, installed where nothing else of ours is, and the
# example that runs on a cluster; then the module compiled with sanitizers.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
build=$(cd "$1" && pwd)
# Debian's own interpreter sees Debian's packages; another one may come first in the path.
python=/usr/bin/python3
export PYTHONDONTWRITEBYTECODE=1

fail() {
    echo "FAIL: $*"
    exit 1
}

install_wheel() {
    local found
    rm -rf "$build/venv"
    "$python" -m venv --system-site-packages "$build/venv"
    "$build/venv/bin/pip" install --no-index --no-cache-dir "$build"/ovrinresize-*.whl
    found=$(cd / && "$build/venv/bin/python" -c 'import ovrinresize; print(ovrinresize.__file__)')
    [[ $found == "$build/venv/"* ]] || fail "imported from $found"
}

# The wheel holds the library, and whatever else the package needs.
check_files() {
    local packed needed
    packed=$(unzip -Z1 "$build"/ovrinresize-*.whl | sed 's/cpython[^.]*/TAG/; s/-[0-9.]*dist-info/-dist-info/' |
        sort | xargs)
    [[ $packed == "ovrinresize-dist-info/LICENSE ovrinresize-dist-info/METADATA \
ovrinresize-dist-info/RECORD ovrinresize-dist-info/WHEEL ovrinresize-dist-info/top_level.txt \
ovrinresize/__init__.py ovrinresize/_native.TAG.so ovrinresize/_native.pyi ovrinresize/py.typed" ]] ||
        fail "the wheel holds $packed"
    needed=$(readelf -dW "$build"/venv/lib/python3*/site-packages/ovrinresize/_native.*.so |
        sed -n 's/.*(NEEDED).*\[\(.*\)\].*/\1/p' | sort | xargs)
    [[ $needed == "libc.so.6 libgcc_s.so.1 libm.so.6 libstdc++.so.6" ]] || fail "needs: $needed"
}

# The sources, the stub against the compiled module, and a program of a user's, with the installed types.
check_types() {
    (cd "$here" && mypy --cache-dir="$build/mypy" src)
    PYTHONPATH=$(echo "$build"/venv/lib/python3*/site-packages) stubtest ovrinresize._native
    mypy --cache-dir="$build/mypy" --strict --python-executable "$build/venv/bin/python" \
        "$here/tests/typed_program.py"
    # Pillow and tqdm have no types.
    (cd "$here/../../examples/batch" && mypy --cache-dir="$build/mypy" --strict --ignore-missing-imports \
        --allow-untyped-calls \
        --python-executable "$build/venv/bin/python" thumbnails.py measure.py)
}

# run_tests PYTHON [FOLDER]
run_tests() {
    (cd "${2:-$here/tests}" && "$1" -m pytest -q -c "$here/pyproject.toml" --rootdir="$PWD" --durations=5 .)
}

# The sanitizer's library must come first, before that of Python; what Python never frees is no leak.
run_sanitized_tests() {
    local module
    (cd "$here" && CXXFLAGS="-fsanitize=address,undefined -fno-sanitize-recover=all -g" \
        "$python" setup.py -q build --build-base="$build/sanitized")
    module=$(echo "$build"/sanitized/lib*)
    PYTHONPATH=$module OVRIN_TEST_DIVISOR=10 \
        ASAN_OPTIONS=detect_leaks=0:halt_on_error=1 UBSAN_OPTIONS=halt_on_error=1:print_stacktrace=1 \
        LD_PRELOAD="$(g++ -print-file-name=libasan.so) $(g++ -print-file-name=libstdc++.so.6)" \
        run_tests "$python"
}

install_wheel
check_files
check_types
run_tests "$build/venv/bin/python"
run_tests "$build/venv/bin/python" "$here/../../examples/batch"
run_sanitized_tests
