#!/usr/bin/env bash
# SPDX-License-Identifier: Apache-2.0
# recipes.sh FOLDER: the recipes for vcpkg and Conan, which are not in Debian, as far as can be seen
# without them: they parse, name this version, and the port's own steps run.
set -euo pipefail
here=$(cd "$(dirname "${BASH_SOURCE[0]}")" && pwd)
folder=$1
port=$SOURCE_DIR/packaging/vcpkg/ovrinresize
conan=$SOURCE_DIR/packaging/conan
command -v python3 >/dev/null || { echo "skipped: no Python here" && exit 77; }

python3 - "$conan/conanfile.py" "$conan/test_package/conanfile.py" <<'END'
import ast, sys
for path in sys.argv[1:]:
    ast.parse(open(path).read(), path)
END

# named KEY: a value of vcpkg.json.
named() {
    python3 -c 'import json, sys; print(json.load(open(sys.argv[1]))[sys.argv[2]])' "$port/vcpkg.json" "$1"
}
version=$(sed -n 's/^#define OVRINRESIZE_VERSION "\(.*\)"/\1/p' "$SOURCE_DIR/include/ovrinresize.h")
if [[ $(named name) != ovrinresize || $(named version-semver) != "$version" ]]; then
    echo "FAIL: vcpkg.json is of $(named name) $(named version-semver), not of ovrinresize $version"
    exit 1
fi

rm -rf "$folder"
mkdir -p "$folder/packages/"{debug/include,include,share/doc}
"$CMAKE" -DPORT_FOLDER="$port" -DPACKAGES="$folder/packages" -P "$here/port.cmake"
left=$(cd "$folder/packages" && find . -mindepth 1 | sort | tr '\n' ' ')
if [[ $left != "./debug ./include ./share ./share/ovrinresize ./share/ovrinresize/usage " ]]; then
    echo "FAIL: the port leaves $left"
    exit 1
fi
